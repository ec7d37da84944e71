#!/usr/bin/env bash
# Runs the installed vlx tool as a user would and checks what it prints and
# writes.  Usage: cli_test.sh PATH/TO/bin/vlx
set -u
vlx=$1
tmp=$(mktemp -d)
trap 'rm -rf "$tmp"' EXIT
passed=0 failed=0
ok()   { passed=$((passed + 1)); }
fail() { failed=$((failed + 1)); echo "FAIL: $*"; }
# near VALUE TARGET TOLERANCE
near() { awk -v a="$1" -v b="$2" -v t="$3" 'BEGIN { d = a - b; if (d < 0) d = -d; exit !(d <= t) }'; }
# The peak line of a readout: "peak  FREQ Hz  LEVEL dB".
peak_freq()  { awk '/^peak/ { print $2 }' "$1"; }
peak_level() { awk '/^peak/ { print $4 }' "$1"; }

# The demonstration: readout and picture.
if "$vlx" spectrum --tone 1000:-6 --rate 48000 --noise -100 --window flattop --average 16 \
     --png "$tmp/spectrum.png" > "$tmp/demo.txt" 2> "$tmp/demo.err"; then
  f=$(peak_freq "$tmp/demo.txt"); l=$(peak_level "$tmp/demo.txt")
  near "$f" 1000 0.1 && near "$l" -6 0.01 && ok || fail "demo readout: $f Hz $l dB"
  size=$(stat -c %s "$tmp/spectrum.png" 2>/dev/null || echo 0)
  [ "$(head -c 8 "$tmp/spectrum.png" | od -An -tx1 | tr -d ' \n')" = 89504e470d0a1a0a ] && [ "$size" -gt 10000 ] \
    && ok || fail "demo picture: $size bytes"
else
  fail "demo run: $(cat "$tmp/demo.err")"
fi

# A tone written as a text sample file, converted to audio in several forms,
# each read back for its spectrum.
awk 'BEGIN { n = 48000; print "#VLX points = " n; print "#VLX delta = " 1/48000;
             for (i = 0; i < n; i++) printf "%.12g\n", 0.25 * cos(2 * 3.141592653589793 * 3000 * i / 48000) }' \
  > "$tmp/tone.txt"
for ext in wav flac aiff; do
  if "$vlx" convert "$tmp/tone.txt" "$tmp/tone.$ext" 2> "$tmp/conv.err" \
     && "$vlx" spectrum "$tmp/tone.$ext" --window hann > "$tmp/s.txt" 2>&1; then
    f=$(peak_freq "$tmp/s.txt"); l=$(peak_level "$tmp/s.txt")
    near "$f" 3000 1 && near "$l" -12.04 0.5 && ok || fail "$ext spectrum: $f Hz $l dB"
  else
    fail "$ext: $(cat "$tmp/conv.err" "$tmp/s.txt" 2>/dev/null | head -n 2)"
  fi
done

# Round trip text -> binary -> text keeps every value to the text form's digits.
"$vlx" convert "$tmp/tone.txt" "$tmp/tone.bin" && "$vlx" convert "$tmp/tone.bin" "$tmp/back.txt" --format text \
  && "$vlx" info "$tmp/tone.bin" > "$tmp/i1" && "$vlx" info "$tmp/back.txt" > "$tmp/i2" && cmp -s "$tmp/i1" "$tmp/i2" \
  && ok || fail "convert round trip"

# Resampling keeps the tone's frequency; the length follows the ratio.
if "$vlx" resample "$tmp/tone.txt" "$tmp/r.bin" --to 44100 2> "$tmp/r.err"; then
  pts=$("$vlx" info "$tmp/r.bin" | sed -n 's/^\[\([0-9]*\)\/.*/\1/p')
  [ "$pts" = 44100 ] && ok || fail "resampled length $pts"
  "$vlx" spectrum "$tmp/r.bin" > "$tmp/rs.txt" 2>&1
  f=$(peak_freq "$tmp/rs.txt")
  near "$f" 3000 1 && ok || fail "resampled tone at $f Hz"
else
  fail "resample: $(cat "$tmp/r.err")"
fi

# The catalogue lists 32 windows.
[ "$("$vlx" windows | grep -c '^ *[0-9]')" = 32 ] && ok || fail "windows listing"

# Every error: status 2, one line on stderr, no output file left behind.
printf 'not a number\n' > "$tmp/corrupt.txt"
expect_error() {
  local out=$1; shift
  "$@" > /dev/null 2> "$tmp/err"
  local status=$?
  if [ $status -eq 2 ] && [ "$(wc -l < "$tmp/err")" -eq 1 ] && { [ -z "$out" ] || ! ls "$out"* > /dev/null 2>&1; }; then
    ok
  else
    fail "error path ($status, $(wc -l < "$tmp/err") lines): $*"
  fi
}
expect_error "$tmp/x1" "$vlx" convert "$tmp/missing.bin" "$tmp/x1"
expect_error "$tmp/x2" "$vlx" convert "$tmp/corrupt.txt" "$tmp/x2"
expect_error "$tmp/x3" "$vlx" spectrum --tone 1000 --window hannn --out "$tmp/x3"
expect_error "" "$vlx" spectrum --tone 1000 --nfft abc
expect_error "" "$vlx" spectrum --tone 1000:loud
expect_error "" "$vlx" spectrum --tone 1000 --no-such-option
expect_error "$tmp/x4" "$vlx" resample "$tmp/tone.txt" "$tmp/x4"
grep -q "nearest: Hann" <("$vlx" spectrum --tone 1000 --window hannn 2>&1) && ok || fail "window suggestion"

echo "$passed passed, $failed failed"
[ "$failed" -eq 0 ]

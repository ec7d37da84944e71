#!/usr/bin/env python3
"""Writes the seed corpus of the reader's fuzzer: small valid files in both
forms, every binary form in both byte orders, and text with every key."""
import os
import struct
import sys

out = sys.argv[1] if len(sys.argv) > 1 else os.path.join(os.path.dirname(__file__), "corpus")
os.makedirs(out, exist_ok=True)


def binary(form, order, width, points, cplx, delta, scalars):
    code = {8: "d", 4: "f"}[width]
    head = struct.pack(order + "I", [0, 0xEB0110BE, 0xEB0220BE, 0xEB0330BE][form])
    if form == 3:
        head += struct.pack(order + "I", 0x400 | width)
    head += struct.pack(order + "ii", points, cplx) + struct.pack(order + code, delta)
    return head + b"".join(struct.pack(order + code, x) for x in scalars)


files = {}
for order, name in (("<", "le"), (">", "be")):
    files[f"form1_{name}"] = binary(1, order, 8, 3, 0, 0.5, [1.0, -2.5, 3e300])
    files[f"form2_{name}"] = binary(2, order, 4, 2, 1, 0.25, [1.0, 2.0, -3.0, 4.5])
    files[f"form3_d_{name}"] = binary(3, order, 8, 2, 1, 1.0, [0.0, -0.0, float("inf"), float("nan")])
    files[f"form3_f_{name}"] = binary(3, order, 4, 4, 0, 2.0, [1.0, 2.0, 3.0, 4.0])
files["form3_two"] = binary(3, "<", 8, 1, 0, 1.0, [7.0]) + binary(3, "<", 4, 0, 0, 1.0, [])
files["text_real"] = (b"#VLX ASCII data from libvlx package\n#VLX points = 3\n#VLX complex = 0\n"
                      b"#VLX type = 8\n#VLX delta = 0.5\n1.5\n-2\n0.1\n")
files["text_complex"] = (b"#VLX ASCII data from libvlx package\n#VLX points = 2\n#VLX complex = 1\n"
                         b"#VLX type = 4\n#VLX delta = 0.125\n1 2\n-3.5e-3 nan\n")
files["text_plain"] = b"1 2 3 # comment\n0x1F -0x10 0.0x10 inf -0\n#VLX complex = 1"
files["text_two"] = files["text_real"] + files["text_complex"]
for name, data in files.items():
    with open(os.path.join(out, name), "wb") as f:
        f.write(data)

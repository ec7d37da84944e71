/* A first look at libvlx from C: build a vector, grow it, compare it. */
#include <stdio.h>

#include "libvlx.h"

int main(void) {
    vlx_t a, b;
    int32_t order = 0, i;

    vlx_lib_init();
    vlx_init(&a);
    vlx_init(&b);

    /* a ramp of 8 real samples, 1 ms apart */
    a.points = 8;
    if (vlx_alloc(&a) < 0) return 1;
    a.delta = 1e-3;
    for (i = 0; i < a.points; ++i) a.data[i] = (double)i;

    /* copy it, turn the copy complex, pad it to 12 points */
    if (vlx_copy(&b, &a) < 0 || vlxi_rtoc(&b) < 0 || vlxi_zpad(&b, 12) < 0) return 1;
    printf("libvlx %d.%02d\n", vlx_version() / 100, vlx_version() % 100);
    printf("b: %d complex points, capacity %d scalars, delta %g\n", b.points, b.alloc, b.delta);

    /* trim b back to its first 8 points and compare with a: b's imaginary
     * parts are 0, so the two are equal (0) */
    vlxu_subvec(&b, &b, 0, 8);
    vlx_cmp(&a, &b, 1e-12, &order);
    printf("a compared with b[0..7]: %d\n", order);

    vlx_destroy(&a);
    vlx_destroy(&b);
    vlx_free_internal();
    return 0;
}

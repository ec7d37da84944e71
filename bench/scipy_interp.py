#!/usr/bin/env python3
"""Times scipy's CubicSpline on the table and queries of bench_interp.cpp.

Usage: scipy_interp.py REPS.  Prints two lines per repetition, each with the
wall and the processor seconds: "eval WALL CPU" (evaluation of the queries on
a spline built beforehand) and "full WALL CPU" (construction with not-a-knot
ends plus evaluation).
"""
import sys
import time

import numpy as np
from scipy.interpolate import CubicSpline

N = 1000
M = 1000000


def table():
    i = np.arange(N, dtype=np.float64)
    x = i + 0.3 * np.sin(i)
    y = np.sin(0.05 * x) + 0.1 * np.cos(0.37 * x)
    j = np.arange(M, dtype=np.float64)
    q = x[0] + (x[-1] - x[0]) * (j / (M - 1))
    return x, y, q


def main():
    reps = int(sys.argv[1]) if len(sys.argv) > 1 else 5
    x, y, q = table()
    spline = CubicSpline(x, y, bc_type="not-a-knot")
    spline(q)  # warm up
    for _ in range(reps):
        w0, c0 = time.perf_counter(), time.process_time()
        r = spline(q)
        w1, c1 = time.perf_counter(), time.process_time()
        print("eval %.9f %.9f" % (w1 - w0, c1 - c0))
        w0, c0 = time.perf_counter(), time.process_time()
        r = CubicSpline(x, y, bc_type="not-a-knot")(q)
        w1, c1 = time.perf_counter(), time.process_time()
        print("full %.9f %.9f" % (w1 - w0, c1 - c0))
    del r
    sys.stdout.flush()


if __name__ == "__main__":
    main()

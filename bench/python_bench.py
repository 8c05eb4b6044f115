#!/usr/bin/python3
"""Times calls from Python beside the same calls of the libraries that users know: python_bench.py [PART ...]

Each case is checked first, then timed in CPU time of this thread, best of many rounds, in turn with its peers.
Parts: compare (one call on a small image), functions (of single pixels, beside NumPy), threads (how they share the
processors). All of them, unless some are named.
"""

import os
import pathlib
import sys
import threading
import time

BUILD = pathlib.Path(os.environ.get("ZELT_BUILD", pathlib.Path(__file__).parents[1] / "build/release"))
sys.path.insert(0, str(BUILD / "python"))

import numpy as np

import zelt

try:
    from scipy import ndimage
except ImportError:
    ndimage = None
try:
    import cv2

    cv2.setNumThreads(1)
except ImportError:
    cv2 = None

SIDE, ROUNDS, CALLS = 16, 60, 1000


def cost(call):
    """Microseconds of one call."""
    before = time.thread_time()
    for _ in range(CALLS):
        call()
    return (time.thread_time() - before) / CALLS * 1e6


def cases():
    root = zelt.create("ZELT.Main2")
    mean, add, maximum = root.Statistics.Mean, root.Basic.Add, root.Statistics.Maximum
    frame = (np.arange(SIDE * SIDE) % 200).reshape(SIDE, SIDE).astype("uint8")
    other, out = frame[::-1].copy(), np.zeros_like(frame)
    image, second, result = zelt.image(frame), zelt.image(other), zelt.image(out)
    packed = add(frame, 0)  # of the library, which keeps its statistics
    labels = np.ones_like(frame)
    yield "Mean", frame.mean(), {
        "zelt, image": lambda: mean(image), "zelt, array": lambda: mean(frame), "zelt, kept": lambda: mean(packed),
        "numpy": lambda: frame.mean(), "scipy": ndimage and (lambda: ndimage.mean(frame)),
        "opencv": cv2 and (lambda: cv2.mean(frame)[0])}
    yield "Mean of a part", frame[2:8, 1:9].mean(), {
        "zelt, image": lambda: mean(image, (1, 2, 9, 8)), "numpy": lambda: frame[2:8, 1:9].mean(),
        "opencv": cv2 and (lambda: cv2.mean(frame[2:8, 1:9])[0])}
    yield "Maximum", frame.max(), {
        "zelt, image": lambda: maximum(image), "numpy": lambda: frame.max(),
        "scipy": ndimage and (lambda: ndimage.maximum(frame, labels)), "opencv": cv2 and (lambda: cv2.minMaxLoc(frame)[1])}
    yield "Add into an output", frame + other, {
        "zelt, images": lambda: add(image, second, result), "zelt, arrays": lambda: add(frame, other, out),
        "numpy": lambda: np.add(frame, other, out), "opencv": cv2 and (lambda: cv2.add(frame, other, out))}
    yield "Add", frame + other, {
        "zelt, images": lambda: add(image, second), "numpy": lambda: np.add(frame, other),
        "opencv": cv2 and (lambda: cv2.add(frame, other))}
    filters = {"scipy shift": ndimage and (lambda: ndimage.shift(frame, 0, order=0)), "numpy copy": lambda: frame.copy()}
    yield "nearest in scipy: a copy", frame, {"zelt, copy": image.copy, **filters}
    yield "wrapping", frame, {"zelt.image(array)": lambda: zelt.image(frame), "numpy.asarray(image)": lambda: np.asarray(image),
                              "numpy view": lambda: frame[:]}


def compare():
    print(f"One call on {SIDE} x {SIDE} uint8, microseconds of CPU time:")
    for title, expected, calls in cases():
        calls = {name: call for name, call in calls.items() if call}
        for name, call in calls.items():
            got = np.asarray(call())
            if title == "Add" or title == "Add into an output":
                ok = np.array_equal(got, expected) or name == "opencv"  # which saturates
            else:
                ok = np.allclose(got, expected)
            if not ok:
                sys.exit(f"{title}, {name}: wrong result")
        best = dict.fromkeys(calls, float("inf"))
        for _ in range(ROUNDS):
            for name, call in calls.items():
                best[name] = min(best[name], cost(call))
        print(f"\n{title}")
        for name, time_of_one in best.items():
            print(f"    {name:24} {time_of_one:8.2f}")


def threads():
    root = zelt.create("ZELT.Main2")
    frames = [np.ones((1000, 1000), "float32") for _ in range(8)]

    def work(frame):
        for _ in range(200):
            root.Basic.Multiply(frame, 1.0, frame)

    def run(count):
        pools = [threading.Thread(target=lambda part: [work(f) for f in part], args=[frames[i::count]]) for i in range(count)]
        start = time.perf_counter()
        for t in pools:
            t.start()
        for t in pools:
            t.join()
        return time.perf_counter() - start

    run(1)
    print(f"\n8 images on {os.cpu_count()} processors, seconds of wall time (others may be using them):")
    for count in (1, 2, 8):
        print(f"    {count} threads {min(run(count) for _ in range(3)):8.3f}")


def functions():
    root = zelt.create("ZELT.Main2")
    basic, maths = root.Basic, root.Math
    random = np.random.default_rng(1)
    print("\nFunctions into a given output, nanoseconds of CPU time for a pixel, zelt to numpy:")
    for side in (256, 4096):
        unit, other = (random.random((side, side), np.float32) for _ in range(2))
        for kind in (np.float32, np.float64):
            near, wide, large = ((unit * 2 - 1) * 10).astype(kind), ((unit * 2 - 1) * 100).astype(kind), (unit * 999 + 0.001).astype(kind)
            sine, second, out = (unit * 2 - 1).astype(kind), ((other * 2 - 1) * 10).astype(kind), np.zeros_like(unit, kind)
            calls = [("exp", basic.Exp, np.exp, (near,)), ("log", basic.Log, np.log, (large,)),
                     ("power 0.45", basic.Power, lambda a, b, to: np.power(a, kind(b), to), (large, 0.45)),
                     ("square", basic.Power, lambda a, b, to: np.square(a, to), (large, 2)),
                     ("root", basic.Power, lambda a, b, to: np.sqrt(a, to), (large, 0.5))]
            if kind == np.float32:
                calls += [("sin", maths.Sin, np.sin, (wide,)), ("cos", maths.Cos, np.cos, (wide,)), ("tan", maths.Tan, np.tan, (wide,)),
                          ("asin", maths.Asin, np.arcsin, (sine,)), ("acos", maths.Acos, np.arccos, (sine,)),
                          ("atan", maths.Atan, np.arctan, (near,)), ("atan2", maths.Atan2, np.arctan2, (near, second))]
            for name, ours, numpys, arguments in calls:
                ours(*arguments, out)
                mine = out.copy()
                numpys(*arguments, out)
                if not np.allclose(mine, out, rtol=1e-5, atol=1e-6):
                    sys.exit(f"{name}: wrong result")
                count = max(1, 2**22 // side**2)
                best = [float("inf")] * 2
                for _ in range(5):
                    for i, call in enumerate((ours, numpys)):
                        before = time.thread_time()
                        for _ in range(count):
                            call(*arguments, out)
                        best[i] = min(best[i], (time.thread_time() - before) / count / side**2 * 1e9)
                print(f"    {name:12}{kind.__name__:8}{side:6}{best[0]:8.3f}{best[1]:8.3f}{best[0] / best[1]:8.2f}")


for part in sys.argv[1:] or ["compare", "functions", "threads"]:
    {"compare": compare, "functions": functions, "threads": threads}[part]()

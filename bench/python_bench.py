#!/usr/bin/python3
"""Times one call from Python on a small image beside the same call of the libraries that users know: python_bench.py

Each case is checked first, then timed in CPU time of this thread, best of many rounds, in turn with its peers.
The last part shows how threads share the processors.
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


compare()
threads()

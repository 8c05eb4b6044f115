#!/usr/bin/python3
"""Corrects a stack of camera frames on all processors: correct_stack.py [FOLDER] [--frames 500] [--side 1024] [--files]

Simulates a camera (dark signal, uneven gain, noise), corrects every frame on a cluster of local processes, and writes
mean.tif, the mean of the corrected frames, and statistics.csv, a line for each frame. With --files the frames lie in files
and the corrected ones are written to files beside them, none of them passing through this process.
"""

import argparse
import csv
import pathlib
import time

import dask
import dask.array
import distributed
import numpy as np

import zelt.dask


def camera(side):
    """Dark signal and gain of each pixel."""
    random = np.random.RandomState(1)
    y, x = np.mgrid[-1:1:side * 1j, -1:1:side * 1j]
    dark = random.normal(100, 3, (side, side)).round().astype("uint16")
    return dark, ((1 + 0.4 * (x * x + y * y)) * random.normal(1, 0.02, (side, side))).astype("float32")


def exposure(number, dark, gain):
    """What the camera gives for a scene that is 1000 bright everywhere and brighter by one from frame to frame."""
    light = np.random.RandomState(number).poisson((1000 + number) / gain)
    return (light + dark).astype("uint16")


def simulated(count, dark, gain):
    """The stack, made where it is worked on. The camera travels as the references do."""
    there = [dask.delayed(array, traverse=False) for array in (dark, gain)]
    make = dask.delayed(lambda n, dark, gain: exposure(n, dark, gain)[None])
    return dask.array.concatenate([
        dask.array.from_delayed(make(n, *there), (1, *dark.shape), "uint16") for n in range(count)])


def write_frames(count, dark, gain, folder):
    names = [folder / f"raw{n:04}.tif" for n in range(count)]
    zelt.dask.to_files(simulated(count, dark, gain), names).compute()
    return names


def main():
    options = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    options.add_argument("folder", nargs="?", type=pathlib.Path, default="corrected-stack")
    options.add_argument("--frames", type=int, default=500)
    options.add_argument("--side", type=int, default=1024, help="of the square frames")
    options.add_argument("--workers", type=int, help="as many processes as processors without")
    options.add_argument("--files", action="store_true", help="from files to files")
    options = options.parse_args()
    options.folder.mkdir(parents=True, exist_ok=True)

    dark, gain = camera(options.side)
    with distributed.LocalCluster(options.workers, threads_per_worker=1, dashboard_address=":0") as cluster, \
            distributed.Client(cluster):
        start = time.perf_counter()
        correction = zelt.dask.correction(dark, gain)
        if options.files:
            raw = zelt.dask.frames(write_frames(options.frames, dark, gain, options.folder))
            start = time.perf_counter()
            corrected = zelt.dask.apply(correction, raw)
            names = [options.folder / f"corrected{n:04}.tif" for n in range(len(corrected))]
            measures = zelt.dask.to_files(corrected, names)
        else:
            corrected = zelt.dask.apply(correction, simulated(options.frames, dark, gain))
            measures = zelt.dask.statistics(corrected)
        mean, measures = dask.compute(corrected.mean(axis=0), measures)
        seconds = time.perf_counter() - start

    zelt.imwrite(options.folder / "mean.tif", mean.astype("float32"))
    with open(options.folder / "statistics.csv", "w", newline="") as file:
        table = csv.writer(file)
        table.writerow(("frame", *zelt.dask.MEASURES))
        table.writerows((n, *(f"{m:.6g}" for m in line)) for n, line in enumerate(measures))
    print(f"{options.frames} frames of {options.side} x {options.side} in {seconds:.1f} s; mean {mean.mean():.2f}, "
          f"unevenness of the mean {mean.std() / mean.mean():.4f}; see {options.folder}")


if __name__ == "__main__":
    main()

"""Stacks of frames by dask: the same pixels as frame by frame, lazily, on processes that may be lost."""

import os
import pathlib
import pickle
import signal
import subprocess
import sys
import time

import dask
import dask.array
import distributed
import numpy as np
import pytest
from conftest import BUILD

import zelt
import zelt.dask
from zelt.dask import FRAME

RANDOM = np.random.RandomState(5)
STACK = RANDOM.randint(300, 4000, (12, 40, 30)).astype("uint16")
DARK = RANDOM.randint(90, 110, (40, 30)).astype("uint16")
GAIN = RANDOM.uniform(0.5, 2, (40, 30)).astype("float32")


@pytest.fixture(scope="module")
def client():
    os.environ["PYTHONPATH"] = str(BUILD / "python") + os.pathsep + os.path.dirname(__file__)
    with dask.config.set({"distributed.worker.daemon": True, "distributed.comm.timeouts.connect": "20s"}):
        with distributed.LocalCluster(2, threads_per_worker=1, dashboard_address=":0") as cluster:
            with distributed.Client(cluster) as client:
                yield client


def corrected(frame):
    return (frame.astype("float32") - DARK) * GAIN


def by_hand(root, frame):
    out = np.zeros(frame.shape, "float32")
    root.FlatFielding.Flatten(out, frame, DARK, GAIN)
    return np.asarray(root.Filters.Gauss(out, 1.5))


def test_a_stack_is_what_its_frames_are(root):
    steps = zelt.dask.correction(DARK, GAIN).Filters.Gauss(FRAME, sigma=1.5)
    expected = np.stack([by_hand(root, frame) for frame in STACK])
    for chunks in [(1, 40, 30), (5, 17, 30), (12, 40, 7)]:
        done = zelt.dask.apply(steps, dask.array.from_array(STACK, chunks=chunks))
        assert (done.shape, done.dtype) == (expected.shape, expected.dtype)
        with dask.config.set(scheduler="threads"):
            assert np.array_equal(done.compute(), expected), chunks
    assert np.array_equal(steps(STACK[0]), expected[0])
    assert repr(steps) == (
        "steps().Conversions.RecodeEx(FRAME, (30, 40, 32, 'Float'))"
        ".FlatFielding.FlattenEx(FRAME, 'Float', <array 0>, <array 1>).Filters.Gauss(FRAME, sigma=1.5)")


def test_size_type_and_colour_of_results_follow_the_steps(root):
    stack = dask.array.from_array(STACK, chunks=(4, -1, -1))
    whole = zelt.dask.apply(zelt.dask.correction(DARK, encoding="Signed"), stack)
    assert np.array_equal(whole.compute(scheduler="sync"), STACK.astype("int16") - DARK.astype("int16"))
    assert whole.dtype == "int16"
    colour = dask.array.from_array(RANDOM.randint(0, 255, (3, 8, 9, 3)).astype("uint8"), chunks=(2, 4, -1, -1))
    grey = zelt.dask.apply(zelt.dask.steps().Conversions.RecodeEx(FRAME, (9, 8, 8, "Unsigned")), colour)
    luminance = np.rint(colour.compute(scheduler="sync") @ [0.299, 0.587, 0.114])
    assert grey.shape == (3, 8, 9) and np.abs(grey.compute(scheduler="sync") - luminance).max() <= 1
    levels = zelt.dask.apply(zelt.dask.steps(bits=12).Conversions.RecodeEx(FRAME, (30, 40, 8, "Unsigned")), stack)
    assert levels.dtype == "uint8"


def test_faults_are_told_before_anything_is_sent(root):
    steps, stack = zelt.dask.steps(), dask.array.from_array(STACK, chunks=(4, -1, -1))
    with pytest.raises(AttributeError, match="no facet 'Filter'"):
        steps.Filter
    with pytest.raises(AttributeError, match="IFilters2 has no method 'Blur'"):
        steps.Filters.Blur
    with pytest.raises(ValueError, match="needs FRAME"):
        steps.Basic.Add(DARK, 1)
    with pytest.raises(TypeError, match="Statistics.Mean.. gives no image"):
        zelt.dask.apply(steps.Statistics.Mean(FRAME), stack)
    with pytest.raises(zelt.Error):
        zelt.dask.apply(zelt.dask.correction(DARK[:5]), stack)
    with pytest.raises(ValueError, match="not 2"):
        zelt.dask.apply(steps, stack[0])
    with pytest.raises(ValueError, match="2 names for 12 frames"):
        zelt.dask.to_files(stack, ["a", "b"])


def test_arrays_among_the_arguments_are_one_node_each():
    stack = dask.array.from_array(np.zeros((50, 40, 30), "uint16"), chunks=(1, -1, -1))
    done, = dask.optimize(zelt.dask.apply(zelt.dask.correction(DARK, GAIN), stack))
    graph = dict(done.__dask_graph__())
    references = [key for key in graph if "zelt-reference" in str(key)]
    assert len(references) == 2
    source = [key for key in graph if isinstance(graph[key], np.ndarray)]
    for key, task in graph.items():
        if key not in references and key not in source:
            assert len(pickle.dumps(task)) < DARK.nbytes, key


def written(folder, count=12):
    files = []
    for n in range(count):
        files.append(folder / f"frame{n}.tif")
        zelt.imwrite(files[-1], STACK[n])
    return files


def test_files_come_back_as_files(client, tmp_path):
    stack = zelt.dask.frames(written(tmp_path))
    assert (stack.shape, stack.dtype, stack.numblocks) == (STACK.shape, STACK.dtype, (12, 1, 1))
    names = [tmp_path / f"corrected{n}.tif" for n in range(12)]
    measures = zelt.dask.to_files(zelt.dask.apply(zelt.dask.correction(DARK, GAIN), stack), names)
    assert not names[0].exists()
    measures = measures.compute()
    for n, name in enumerate(names):
        frame = np.asarray(zelt.imread(name))
        assert np.array_equal(frame, corrected(STACK[n])), n
        expected = [frame.mean(dtype=float), frame.std(dtype=float), frame.min(), frame.max()]
        assert np.allclose(measures[n], expected, rtol=1e-5), n
    zelt.imwrite(tmp_path / "frame5.tif", STACK[5, :7])
    with pytest.raises(ValueError, match=r"frame5.tif: uint16 \(7, 30\) in a stack"):
        stack.compute(scheduler="sync")


def slowly(block):
    time.sleep(0.05)
    return block


def test_a_lost_worker_loses_no_frame(client):
    stack = dask.array.from_array(np.tile(STACK, (4, 1, 1)), chunks=(1, -1, -1)).map_blocks(slowly, dtype=STACK.dtype)
    done = zelt.dask.apply(zelt.dask.correction(DARK, GAIN), stack)
    processes = client.run(os.getpid)
    running = client.compute([done, zelt.dask.statistics(done)])
    time.sleep(0.4)
    assert not all(f.done() for f in running)
    os.kill(next(iter(processes.values())), signal.SIGKILL)
    pixels, measures = client.gather(running)
    assert np.array_equal(pixels, corrected(np.tile(STACK, (4, 1, 1))))
    assert np.allclose(measures[:, 0], pixels.mean(axis=(1, 2), dtype=float))
    client.wait_for_workers(2, timeout=60)
    assert set(client.run(os.getpid).values()) != set(processes.values())


def received(dask_worker):
    """Keys that came to a worker from others, as often as they came."""
    return [str(key) for transfer in dask_worker.transfer_incoming_log for key in transfer["keys"]]


def test_a_reference_goes_to_a_worker_once(client):
    dark = DARK + 1  # of this test alone
    stack = dask.array.from_array(np.tile(STACK, (3, 1, 1)), chunks=(1, -1, -1)).map_blocks(slowly, dtype=STACK.dtype)
    client.run(lambda dask_worker: dask_worker.transfer_incoming_log.clear())
    done = zelt.dask.apply(zelt.dask.correction(dark, encoding="Signed"), stack).persist()
    distributed.wait(done)
    came = [[key for key in keys if "zelt-reference" in key] for keys in client.run(received).values()]
    assert sorted(map(len, came)) == [0, 1], came  # one worker has it from the scheduler, the other from that one
    places = {worker for where in client.who_has(done).values() for worker in where}
    assert len(places) == 2


@pytest.mark.parametrize("way", [[], ["--files"]])
def test_the_example_evens_a_stack(tmp_path, way):
    script = pathlib.Path(__file__).parents[2] / "examples/correct_stack.py"
    done = subprocess.run([sys.executable, script, tmp_path, "--frames", "6", "--side", "48", "--workers", "2", *way],
                          env={**os.environ, "PYTHONPATH": str(BUILD / "python")}, capture_output=True, text=True, timeout=120)
    assert done.returncode == 0, done.stderr
    table = np.genfromtxt(tmp_path / "statistics.csv", delimiter=",", names=True)
    mean = np.asarray(zelt.imread(tmp_path / "mean.tif"))
    # Photons of 6 frames: 1000 / gain each, so the mean has a deviation of about sqrt(1000 * 1.3 / 6).
    assert np.allclose(table["mean"], 1000 + np.arange(6), atol=5) and mean.std() < 20
    assert len(list(tmp_path.glob("corrected*.tif"))) == (6 if way else 0)
    if way:
        frame = np.asarray(zelt.imread(tmp_path / "corrected0003.tif"))
        assert np.isclose(frame.mean(dtype=float), table["mean"][3], rtol=1e-5)

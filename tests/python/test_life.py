"""What holds over time and across threads and processes."""

import contextlib
import multiprocessing
import os
import signal
import subprocess
import sys
import threading
import time

import numpy as np
import pytest
from conftest import BUILD

import zelt

FRAME = np.arange(4096, dtype="uint16").reshape(64, 64)


def resident_bytes():
    with open("/proc/self/statm") as file:
        return int(file.read().split()[1]) * os.sysconf("SC_PAGE_SIZE")


def test_ten_thousand_calls_leave_memory_flat():
    root = zelt.create("ZELT.Main2")
    image = zelt.image(FRAME)
    small = np.zeros((1, 1), "uint16")

    def refused(call):
        try:
            call()
        except (zelt.Error, TypeError, ValueError, OverflowError):
            return
        pytest.fail("this call must fail")

    calls = {
        "number": lambda: root.Statistics.Mean(FRAME, (0, 0, 9, 9)),
        "tuple": lambda: root.Statistics.MaximumPosition(image),
        "result": lambda: np.asarray(root.Basic.Add(image, FRAME)),
        "complex": lambda: root.Basic.Add(FRAME.astype("complex64"), 1j),
        "dlpack": lambda: np.from_dlpack(zelt.image(FRAME[::-1])),
        "capsules": lambda: (image.__dlpack__(), image.__dlpack__(max_version=(1, 0))),
        "array": lambda: zelt.Variant("VT_ARRAY|VT_R8", FRAME).value,
        "values": lambda: zelt.Variant("VT_ARRAY|VT_BOOL", [True] * 50).value,
        "descriptor": lambda: root.Conversions.RecodeEx(FRAME, zelt.descriptor(64, 64, 8)),
        "library": lambda: refused(lambda: root.Basic.Add(FRAME, small)),
        "divisor": lambda: refused(lambda: root.Basic.Divide(FRAME, 0)),
        "third argument": lambda: refused(lambda: root.Basic.Add(FRAME, FRAME, "no image")),
        "name": lambda: refused(lambda: root.Basic.Add(FRAME, b=small, c=small)),
        "overflow": lambda: refused(lambda: root.Statistics.Moment(FRAME, 1, 2**70)),
        "no array": lambda: refused(lambda: zelt.image([[1]])),
    }
    for name, call in calls.items():
        for _ in range(500):
            call()
        blocks, memory, arrays = sys.getallocatedblocks(), resident_bytes(), sys.getrefcount(FRAME)
        for _ in range(10_000):
            call()
        assert sys.getrefcount(FRAME) == arrays, name
        assert sys.getallocatedblocks() - blocks < 200, name
        assert resident_bytes() - memory < 1 << 20, name


def test_other_threads_run_on_during_a_call():
    root = zelt.create("ZELT.Main2")
    slow = np.ones((3000, 3000)).T
    ticks, done = [0], threading.Event()

    def tick():
        while not done.is_set():
            ticks[0] += 1
            time.sleep(0.0005)

    ticker = threading.Thread(target=tick)
    interval = sys.getswitchinterval()
    sys.setswitchinterval(1000)  # a thread gives way only where it lets go of the lock
    try:
        ticker.start()
        before = ticks[0]
        for _ in range(3):
            root.Basic.Add(slow, slow[::-1], slow)
        counted = ticks[0] - before
    finally:
        sys.setswitchinterval(interval)
        done.set()
        ticker.join()
    assert counted > 10


def runnable_threads():
    """How many threads of this process, besides this one, want a processor: a count that a busy machine leaves alone."""
    count = 0
    for thread in os.listdir("/proc/self/task"):
        with contextlib.suppress(FileNotFoundError, ProcessLookupError), open(f"/proc/self/task/{thread}/stat") as file:
            count += int(thread) != threading.get_native_id() and file.read().rsplit(")", 1)[1].split()[0] == "R"
    return count


def test_eight_threads_work_at_once():
    filters, stop = zelt.create("ZELT.Main2").Filters, threading.Event()

    def work():
        frame = np.ones((800, 800), "float32")
        while not stop.is_set():
            filters.Gauss(frame, 2.0)

    threads = [threading.Thread(target=work) for _ in range(8)]
    for t in threads:
        t.start()
    seen = []
    for _ in range(100):
        time.sleep(0.005)
        seen.append(runnable_threads())
    stop.set()
    for t in threads:
        t.join()
    # Threads that wait for the interpreter or for a lock sleep: one at a time would be 1.
    assert np.mean(seen) > 4, seen


def test_threads_share_a_facet():
    root = zelt.create("ZELT.Main2")
    failures = []

    def work(seed):
        frame = np.random.RandomState(seed).randint(0, 999, (50 + seed, 40), "uint16")
        for i in range(300):
            if not np.array_equal(np.asarray(root.Basic.Add(frame, i)), frame + np.uint16(i)):
                failures.append(seed)
            if root.Statistics.Maximum(frame) != frame.max():
                failures.append(-seed)

    threads = [threading.Thread(target=work, args=[n]) for n in range(1, 9)]
    for t in threads:
        t.start()
    for t in threads:
        t.join()
    assert not failures


def corrected(seed):
    frame = np.random.RandomState(seed).randint(200, 4000, (300, 200), "uint16")
    flat = zelt.create("ZELT.Main2").FlatFielding
    return np.array(flat.FlattenEx(frame, "Unsigned", np.full((300, 200), 100, "uint16"), None))


@pytest.mark.parametrize("way", ["fork", "spawn"])
def test_processes_start_afresh(way):
    flat = zelt.create("ZELT.Main2").FlatFielding
    dark = np.full((300, 200), 100, "uint16")
    here = [corrected(n) for n in range(4)]
    with multiprocessing.get_context(way).Pool(2) as pool:
        for mine, theirs in zip(here, pool.map_async(corrected, range(4)).get(timeout=120)):
            assert np.array_equal(mine, theirs)


def use_after_fork(facet, image, answer):
    answer.put((facet.FlattenEx(image, "Unsigned", FRAME).copy().shape, zelt.create("ZELT.Main2").Statistics.Mean(image)))


def test_a_child_uses_the_objects_of_its_parent():
    context = multiprocessing.get_context("fork")
    flat, image, answer = zelt.create("ZELT.Main2").FlatFielding, zelt.image(FRAME), context.Queue()
    flat.FlattenEx(image, "Unsigned", FRAME)
    child = context.Process(target=use_after_fork, args=(flat, image, answer))
    child.start()
    assert answer.get(timeout=60) == ((64, 64), FRAME.mean())
    child.join(60)
    assert child.exitcode == 0


def test_a_child_works_though_threads_of_its_parent_were_at_work():
    big, stop = np.ones((1500, 1500), "uint16"), threading.Event()

    def work():
        root = zelt.create("ZELT.Main2")
        while not stop.is_set():
            root.Basic.Add(big, 1)
            with pytest.raises(zelt.Error):
                root.Basic.Add(big, FRAME)

    threads = [threading.Thread(target=work) for _ in range(2)]
    for t in threads:
        t.start()
    try:
        for _ in range(20):
            child = os.fork()
            if child == 0:
                signal.alarm(60)  # a child that hangs is ended
                root = zelt.create("ZELT.Main2")
                try:
                    root.Basic.Add(big, FRAME)
                except zelt.Error:
                    os._exit(0 if (np.asarray(root.Basic.Add(big, 1)) == 2).all() else 1)
                os._exit(2)
            assert os.waitpid(child, 0)[1] == 0
    finally:
        stop.set()
        for t in threads:
            t.join()


INTERRUPTED = """
import os, signal, sys, threading, time
import numpy as np, zelt
filters = zelt.create("ZELT.Main2").Filters
big, kernel, small = np.ones((1500, 1500)), np.ones((41, 41)), np.ones((8, 8))

def interrupted(call, after=0.2):
    threading.Timer(after, os.kill, (os.getpid(), signal.SIGINT)).start()
    start = time.perf_counter()
    try:
        call()
        time.sleep(5)
    except KeyboardInterrupt:
        return time.perf_counter() - start
    sys.exit("nobody was interrupted")

def alone(call):
    start = time.perf_counter()
    call()
    return time.perf_counter() - start

whole = alone(lambda: filters.Convolve(big, kernel, 20, 20))
taken = interrupted(lambda: filters.Convolve(big, kernel, 20, 20), min(0.2, whole / 10))
assert taken < whole * 0.7, (taken, whole)
assert filters.Convolve(small, [[1, 0], [0, 0]], 0, 0).shape == (8, 8)
interrupted(lambda: filters.Sobel(np.ones((4000, 4000))), 0.01)   # looks for no request
assert filters.Convolve(small, [[1]], 0, 0).shape == (8, 8)
seen = []
signal.signal(signal.SIGINT, lambda *_: seen.append(1))
threading.Timer(min(0.2, whole / 10), os.kill, (os.getpid(), signal.SIGINT)).start()
try:
    filters.Convolve(big, kernel, 20, 20)
except zelt.Error as e:
    assert "cancelled" in e.description and seen
else:
    sys.exit("the call was not cancelled")
"""


def test_an_interrupt_cancels_the_call():
    done = subprocess.run([sys.executable, "-c", INTERRUPTED], env={**os.environ, "PYTHONPATH": str(BUILD / "python")},
                          capture_output=True, text=True, timeout=120)
    assert done.returncode == 0, done.stderr

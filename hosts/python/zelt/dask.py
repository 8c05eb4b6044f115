"""Stacks of frames, corrected and filtered by many processes with dask.

    import dask.array, zelt.dask
    from zelt.dask import FRAME

    steps = zelt.dask.correction(dark, gain).Filters.Gauss(FRAME, 1.5)     # any calls of facets, one after the other
    stack = zelt.dask.frames(files)                                        # or any dask.array of (frame, y, x)
    smooth = zelt.dask.apply(steps, stack)                                 # a dask.array; nothing is read yet
    smooth.mean(axis=0).compute()
    zelt.dask.to_files(smooth, names).compute()                            # writes them, gives their statistics

Frames stay lazy. Dark frames, gains and other arrays among the arguments are nodes of the graph of their own: each goes
to a worker once, however many frames it works on, and is sent again when the worker that had it is lost. A frame that a
lost worker had is made again by another.
"""

import threading
import weakref

import dask
import dask.array
import numpy
from dask.base import tokenize
from dask.highlevelgraph import HighLevelGraph

import zelt

__all__ = ["FRAME", "MEASURES", "Steps", "apply", "correction", "frames", "statistics", "steps", "to_files"]

MEASURES = ("mean", "deviation", "minimum", "maximum")  # columns of statistics
_ROOT = "ZELT.Main2"
_here = threading.local()  # facets are made at first use, by one thread


def _root():
    if not hasattr(_here, "root"):
        _here.root = zelt.create(_ROOT)
    return _here.root


_copies = {}  # of arrays that lie in the middle of a message, by the id of the array, with a reference that tells its end


def _aligned(array):
    """An array that came from another process may begin at any address, and the library wants elements at theirs. The copy
    is kept as long as the array: a reference is copied once, too."""
    if not isinstance(array, numpy.ndarray) or array.flags.aligned:
        return array
    known = _copies.get(id(array))
    if known is None or known[0]() is not array:
        place = id(array)
        known = _copies[place] = (weakref.ref(array, lambda _: _copies.pop(place, None)), array.copy())
    return known[1]


class _Frame:
    """Stands for the frame, as the steps before have left it."""

    def __repr__(self):
        return "FRAME"

    def __reduce__(self):
        return "FRAME"  # one object, also after a journey


FRAME = _Frame()


class _Reference:
    """Stands for an array among the arguments: its place in the list that comes with each block."""

    def __init__(self, place):
        self.place = place

    def __repr__(self):
        return f"<array {self.place}>"


class Steps:
    """Calls of facets that are made on each frame, one after the other. Never changed: each call gives a longer one.

    bits, encoding   what the arrays of frames do not say, as in zelt.image
    """

    def __init__(self, bits=None, encoding=None):
        self._options = (bits, encoding)
        self._calls = ()
        self._references = ()

    def __getattr__(self, facet):
        if facet.startswith("_") or not isinstance(getattr(type(_root()), facet, None), property):
            raise AttributeError(f"there is no facet '{facet}'")
        return _Facet(self, facet)

    def __repr__(self):
        return "steps()" + "".join(f".{facet}.{method}({', '.join([*map(repr, args), *(f'{n}={a!r}' for n, a in names.items())])})"
                                   for facet, method, args, names in self._calls)

    def __getstate__(self):
        return self.__dict__

    def __setstate__(self, state):
        self.__dict__.update(state)

    def _longer(self, facet, method, args, names):
        if not any(a is FRAME for a in [*args, *names.values()]):
            raise ValueError(f"{facet}.{method}() needs FRAME among its arguments")
        references = list(self._references)

        def kept(argument):
            if not isinstance(argument, (numpy.ndarray, zelt.Image)):
                return argument
            references.append(argument)
            return _Reference(len(references) - 1)

        longer = Steps(*self._options)
        longer._calls = (*self._calls, (facet, method, tuple(map(kept, args)), {n: kept(a) for n, a in names.items()}))
        longer._references = tuple(references)
        return longer

    def _apart(self):
        """The steps without their arrays, and these."""
        bare = Steps(*self._options)
        bare._calls = self._calls
        return bare, self._references

    def __call__(self, frame, references=None):
        """The result for one frame, at once."""
        references = self._references if references is None else references
        image = frame if isinstance(frame, zelt.Image) else zelt.image(frame, *self._options)

        def filled(argument):
            if argument is FRAME:
                return image
            return _aligned(references[argument.place]) if isinstance(argument, _Reference) else argument

        for facet, method, args, names in self._calls:
            call = getattr(getattr(_root(), facet), method)
            image = call(*map(filled, args), **{n: filled(a) for n, a in names.items()})
            if not isinstance(image, zelt.Image):
                raise TypeError(f"{facet}.{method}() gives no image, so no step can follow it")
        return numpy.asarray(image)


class _Facet:
    def __init__(self, before, name):
        self._before, self._name = before, name

    def __getattr__(self, method):
        facet = type(getattr(_root(), self._name))
        if method.startswith("_") or not callable(getattr(facet, method, None)):
            raise AttributeError(f"{facet.__name__} has no method '{method}'")
        return lambda *args, **names: self._before._longer(self._name, method, args, names)


def steps(bits=None, encoding=None):
    """No steps yet: the facets are its attributes, and each call of a method of theirs adds one."""
    return Steps(bits, encoding)


def correction(dark, gain=None, encoding="Float", bits=None):
    """Dark and gain correction of camera frames by FlatFielding.FlattenEx. Float makes 32-bit floats of frames, dark and
    gain first and keeps what is below zero; the other encodings keep the type of the frames, and round and wrap as told
    there."""
    if encoding != "Float":
        return steps(bits).FlatFielding.FlattenEx(FRAME, encoding, dark, gain)
    dark = numpy.asarray(dark, "float32")
    gain = None if gain is None else numpy.asarray(gain, "float32")
    floats = (dark.shape[1], dark.shape[0], 32, "Float")
    return steps(bits).Conversions.RecodeEx(FRAME, floats).FlatFielding.FlattenEx(FRAME, "Float", dark, gain)


def _whole_frames(stack):
    """The stack in chunks of whole frames, as many in each as there were."""
    if stack.ndim not in (3, 4):
        raise ValueError(f"a stack has the axes (frame, y, x) or (frame, y, x, colour), not {stack.ndim}")
    return stack.rechunk({axis: -1 for axis in range(1, stack.ndim)})


def _apply_block(block, steps, references):
    return numpy.stack([steps(frame, references) for frame in _aligned(block)])


def apply(steps, stack):
    """The results of the steps for every frame of a stack, as lazy as the stack. The steps are tried at once on a frame of
    ones, which tells size and type of the results, and faults before anything is sent around."""
    stack = _whole_frames(stack)
    like = steps(numpy.ones(stack.shape[1:], stack.dtype))
    bare, references = steps._apart()
    nodes = [dask.delayed(r, name="zelt-reference-" + tokenize(numpy.asarray(r), getattr(r, "bits", None)), traverse=False)
             for r in references]
    axes = range(1, stack.ndim)
    return stack.map_blocks(_apply_block, steps=bare, references=nodes, dtype=like.dtype,
                            drop_axis=[a for a in axes if a > like.ndim], new_axis=[a for a in range(1, like.ndim + 1) if a >= stack.ndim],
                            chunks=(stack.chunks[0], *((n,) for n in like.shape)),
                            meta=numpy.empty((0,) * (like.ndim + 1), like.dtype))


def _read(path, page, bits, shape, dtype):
    frame = numpy.asarray(zelt.imread(path, bits, page))
    if frame.shape != shape or frame.dtype != dtype:
        raise ValueError(f"{path}: {frame.dtype} {frame.shape} in a stack of {dtype} {shape}")
    return frame[None]


def frames(files, bits=None):
    """A stack of the images in files, one after the other, all pages of each. They are read when they are needed, wherever
    that is; only the first is read at once, and the others are counted."""
    files = list(files)
    if not files:
        raise ValueError("no files")
    first = numpy.asarray(zelt.imread(files[0], bits, 1))
    pages = [(str(path), page) for path in files for page in range(1, zelt.imcount(path) + 1)]
    name = "zelt-frames-" + tokenize(pages, bits)
    graph = {(name, n, *(0,) * first.ndim): (_read, path, page, bits, first.shape, first.dtype)
             for n, (path, page) in enumerate(pages)}
    return dask.array.Array(HighLevelGraph.from_collections(name, graph), name,
                            ((1,) * len(pages), *((n,) for n in first.shape)), first.dtype)


def _measures(frame):
    s = _root().Statistics
    image = zelt.image(frame)
    mean = s.Mean(image)
    variance = s.SumSquares(image) / (image.width * image.height) - mean * mean
    return [mean, numpy.sqrt(numpy.maximum(variance, 0)), s.Minimum(image), s.Maximum(image)]


def _measure_block(block):
    return numpy.array([_measures(frame) for frame in _aligned(block)])


def _write_block(block, names):
    measures = []
    for frame, name in zip(_aligned(block), names):
        zelt.imwrite(str(name), frame)
        measures.append(_measures(frame))
    return numpy.array(measures)


def _table(function, stack, *others):
    axes = "fyxc"[:stack.ndim]
    return dask.array.blockwise(function, "fm", stack, axes, *(o for other in others for o in (other, "f")),
                                new_axes={"m": len(MEASURES)}, concatenate=True, dtype=float, meta=numpy.empty((0, 0)))


def statistics(stack):
    """MEASURES of each grey frame: a lazy array of (frame, measure)."""
    return _table(_measure_block, _whole_frames(stack))


def to_files(stack, names):
    """A lazy array like that of statistics; each frame is written to the file of its name on the way. A file appears whole
    or not at all, also when a worker is lost while it writes."""
    stack, names = _whole_frames(stack), numpy.array([str(n) for n in names])
    if len(names) != len(stack):
        raise ValueError(f"{len(names)} names for {len(stack)} frames")
    return _table(_write_block, stack, dask.array.from_array(names, chunks=(stack.chunks[0],)))

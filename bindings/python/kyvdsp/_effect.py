"""An effect at work: an instance with its context, its memory and its frames."""

import ctypes
import math
import threading
from typing import Any, Optional, Tuple

import numpy as np
from numpy.typing import NDArray

from . import _records as records
from ._catalog import EffectInfo, Parameter, effect_info
from ._errors import Error
from ._values import Value

Frame = NDArray[np.uint8]

_FORMATS = {"argb": records.ARGB, "ayuv": records.AYUV}
_FIELDS = {None: records.FRAME, "first": records.FIRST_FIELD, "second": records.SECOND_FIELD}
_MOST_SIDE = 1 << 15


def _units(seconds: float) -> int:
    """100 ns units, the nearest."""
    if not math.isfinite(seconds) or not 0 <= seconds <= 1e9:
        raise ValueError(f"{seconds!r} is not a time in seconds, 0 or more")
    return math.floor(seconds * 1e7 + 0.5)


def _whole(what: str, value: Any, least: int, most: int) -> int:
    if isinstance(value, bool) or not isinstance(value, (int, np.integer)) or not (
        least <= value <= most
    ):
        raise ValueError(f"{what}: {value!r} is not a whole number, {least} to {most}")
    return int(value)


def _word(what: str, value: Any, words: dict) -> int:
    if value not in words:
        raise ValueError(f"{what}: {value!r} is not one of {', '.join(map(repr, words))}")
    return words[value]


class Effect:
    """An effect that renders frames of one size.

    `effect` is a name ("bubble"), an identifier or an EffectInfo; `effects()` lists all. Parameters
    are keyword arguments, by key or by name with "_" for "-": `P3=0.8`, `bubble_density=0.8`.

    `format` "argb" takes frames of B, G, R, A, as OpenCV has them, with straight alpha, "ayuv" frames
    of V, U, Y, A. `duration` is the clip's length in seconds: particles fade in and out with it, and
    with 0 they do not. `threads` is how many threads the effect may use and `level` how far it may
    go with the processor's instructions; neither changes a byte. With `stereo` a frame holds two
    views of `width` side by side. `aspect` is the shape of the display where pixels are not
    square, `seed` starts the random strokes, and `wide` lets the picture-in-picture show pictures
    of more than 1024 columns or rows whole.

    An Effect holds memory of the module's until `close()`, or the end of a `with` block. Calls of one Effect
    from several threads wait for each other; Effects of their own run side by side.
    """


    def __init__(
        self,
        effect: "str | EffectInfo",
        width: int,
        height: int,
        *,
        format: str = "argb",
        duration: float = 10.0,
        threads: int = 1,
        level: int = 5,
        stereo: bool = False,
        aspect: Optional[Tuple[int, int]] = None,
        seed: int = 0,
        wide: bool = False,
        **parameters: Any,
    ):
        self._lock = threading.Lock()
        self._begun = False
        self.info = effect if isinstance(effect, EffectInfo) else effect_info(effect)
        record = self.info._record
        self._calls = record.callbacks
        self.width = _whole("width", width, 1, _MOST_SIDE)
        self.height = _whole("height", height, 1, _MOST_SIDE)
        self._views = (
            (records.LEFT_HALF, records.RIGHT_HALF) if stereo else (records.MONO,)
        )

        self._data = (ctypes.c_uint64 * ((record.instanceDataSize + 7) // 8))()
        size = sum(p._type.size for p in self.info.parameters)
        self._params = (ctypes.c_uint8 * max(size, 1))()
        self._context = context = records.EffectContext()
        context.descriptor = ctypes.addressof(record)
        context.instanceData = ctypes.addressof(self._data)
        context.params = ctypes.addressof(self._params)
        context.width, context.height = self.width, self.height
        context.stereoLayout = self._views[0]
        context.pixelFormat = _word("format", format, _FORMATS)
        context.threadCount = _whole("threads", threads, 1, 1024)
        context.cpuLevel = _whole("level", level, 0, 5) | (records.WIDE_MAP if wide else 0)
        context.randomSeed = _whole("seed", seed, 0, 0xFFFFFFFF)
        context.duration = _units(duration)
        if aspect is not None:
            x, y = aspect
            context.displayAspectX = _whole("aspect", x, 1, 100000)
            context.displayAspectY = _whole("aspect", y, 1, 100000)

        self._call("InitInstance", self._calls.InitInstance)
        self._begun = True  # from here on there is something to release
        try:
            self.set(**parameters)
            self._call("BeginProcessing", self._calls.BeginProcessing)
        except BaseException:
            self.close()
            raise

    def _call(self, name: str, callback, *arguments: Any) -> None:
        status = callback(*arguments, ctypes.byref(self._context))
        if status != records.OK:
            raise Error(f"{self.info.name}: {name} failed with status {status:#010x}", status)

    # ------------------------------------------------------------------------------ parameters

    def _bytes_of(self, parameter: Parameter) -> "ctypes.Array[ctypes.c_uint8]":
        kind = ctypes.c_uint8 * parameter._type.size
        return kind.from_buffer(self._params, parameter._offset)

    def set(self, **parameters: Any) -> None:
        """Sets parameters by key or by name, from the next frame on. All of them or none."""
        found = [(name, self.info.parameter(name), value) for name, value in parameters.items()]
        encoded = [(p, p._type.encode(name, value)) for name, p, value in found]
        with self._lock:
            for parameter, data in encoded:
                self._bytes_of(parameter)[:] = data

    def __setitem__(self, name: str, value: Any) -> None:
        self.set(**{name: value})

    def __getitem__(self, name: str) -> Value:
        parameter = self.info.parameter(name)
        return parameter._type.decode(bytes(self._bytes_of(parameter)))

    # ---------------------------------------------------------------------------------- frames

    @property
    def shape(self) -> Tuple[int, int, int]:
        """The shape of a frame: rows, columns (of both views in stereo), 4."""
        return self.height, self.width * len(self._views), 4

    def _check(self, what: str, frame: Any) -> None:
        wanted = f"a NumPy array of shape {self.shape} and type uint8"
        if not isinstance(frame, np.ndarray):
            raise ValueError(f"{what} is {type(frame).__name__}, not {wanted}")
        if frame.shape != self.shape or frame.dtype != np.uint8:
            raise ValueError(
                f"{what} has shape {frame.shape} and type {frame.dtype}; wanted is {wanted}"
            )

    def render(
        self,
        frame: Frame,
        second: Optional[Frame] = None,
        *,
        position: float = 0.0,
        out: Optional[Frame] = None,
        field: Optional[str] = None,
        preview: Optional[float] = None,
    ) -> Frame:
        """Renders one frame and returns the result, which is `out` when that is given.

        `frame` is the first input and `second` the other one of effects with two: the picture in
        the picture, or the clip that a transition goes to. Arrays whose rows follow each other
        are read and written where they are; other views (a crop, every other row) are copied on the
        way. `out` may be one of the inputs, at the price of a copy. Inputs are never changed.

        `position` is the time in seconds since the start of the clip; frames may come in any order.
        `field` "first" or "second" treats only the even or the odd rows and leaves the input's in
        the others. `preview`, 0 to 1, shows the moment that the effect has for previews.
        """
        self._check("frame", frame)
        inputs = [np.ascontiguousarray(frame)]
        if self.info.inputs > 1:
            if second is None:
                raise ValueError(f"{self.info.name} needs a second input: render(frame, second)")
            self._check("second", second)
            inputs.append(np.ascontiguousarray(second))
        elif second is not None:
            raise ValueError(f"{self.info.name} has one input, not two")
        if out is None:
            out = np.empty(self.shape, np.uint8)
        else:
            self._check("out", out)
            if not out.flags.writeable:
                raise ValueError("out is read-only")
        aliased = any(np.may_share_memory(out, given) for given in inputs)
        target = out if out.flags.c_contiguous and not aliased else np.empty(self.shape, np.uint8)
        if preview is not None and not 0 <= preview <= 1:
            raise ValueError(f"preview: {preview!r} is not a number, 0 to 1")
        units, selector = _units(position), _word("field", field, _FIELDS)
        if selector != records.FRAME:
            np.copyto(target, inputs[0])

        with self._lock:
            if not self._begun:
                raise ValueError(f"this {self.info.name} is closed")
            context = self._context
            context.position, context.fieldSelector = units, selector
            context.preview = preview is not None
            context.previewFraction = preview or 0.0
            # The right view may use what the left view's call has prepared.
            for view in self._views:
                context.stereoLayout = view
                for index, given in enumerate(inputs):
                    context.frame = given.ctypes.data
                    self._call("SetInputFrame", self._calls.SetInputFrame, index)
                context.frame = target.ctypes.data
                self._call("ProcessFrame", self._calls.ProcessFrame)
            context.frame = None
        if target is not out:
            np.copyto(out, target)
        return out

    # -------------------------------------------------------------------------------- lifetime

    def close(self) -> None:
        """Gives back what the effect holds. May be called again."""
        with self._lock:
            if self._begun:
                self._begun = False
                context = ctypes.byref(self._context)
                self._calls.EndProcessing(context)
                self._calls.DestroyInstance(context)

    def __enter__(self) -> "Effect":
        return self

    def __exit__(self, *_: Any) -> None:
        self.close()

    def __del__(self) -> None:
        if getattr(self, "_begun", False):
            self.close()

    def __repr__(self) -> str:
        state = "" if self._begun else ", closed"
        return f"<kyvdsp.Effect {self.info.name} {self.width}x{self.height}{state}>"


def class_of(info: EffectInfo) -> type:
    """A class for one effect, with the module's texts as its docstring."""

    def __init__(self, width: int, height: int, **options: Any):
        Effect.__init__(self, info, width, height, **options)

    name = class_name(info)
    members = {"__init__": __init__, "__doc__": info.describe(), "__module__": "kyvdsp"}
    return type(name, (Effect,), members)


def class_name(info: EffectInfo) -> str:
    """ "ColorTemperature" """
    return "".join(word.capitalize() for word in info.name.split("-"))

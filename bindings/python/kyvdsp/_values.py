"""Values of parameters: from what people write in Python to the bytes of the parameter buffer."""

import ctypes
import math
import re
import struct
from typing import Any, Callable, List, Tuple, Union

from . import _records as records
from ._names import bare_key

#: What a parameter's value may be given as, and what it is read as.
Value = Union[bool, int, float, str, Tuple[float, ...], Tuple[int, int, int]]

_TYPE_NAMES = {
    records.BYTE: "byte",
    records.CHOICE: "count",
    records.INT: "integer",
    records.FLOAT: "float",
    records.COLOR: "color",
    records.BOOL: "switch",
    records.MASK_RECT: "rectangle",
    records.POSITION: "position",
}
_NUMBERS = (records.BYTE, records.CHOICE, records.INT, records.FLOAT)


class ValueType:
    """How the values of one parameter read and write."""

    def __init__(self, record: records.ParamDescriptor):
        self.size = record.valueSize
        self.type = record.type
        name_key = record.nameKey.decode()
        self.labels: List[str] = name_key.split(";")[1:]
        # The comparison is declared as a switch and has a further mode, side by side.
        self._modes = 2 if bare_key(name_key) == "IDS_Co_Param_CompareImage_Name" else 1
        self.name = "choice" if self.labels else _TYPE_NAMES.get(record.type, "unknown")
        self.default = self._load(record.defaultValue)
        self.minimum = self.maximum = None
        if self.type in _NUMBERS and not self.labels and record.minimum and record.maximum:
            minimum, maximum = self._load(record.minimum), self._load(record.maximum)
            if minimum < maximum:
                self.minimum, self.maximum = minimum, maximum

    def _format(self) -> str:
        if self.type in (records.FLOAT, records.MASK_RECT, records.POSITION):
            return f"<{self.size // 4}f"
        return "<B" if self.size == 1 else "<i"

    def _load(self, pointer: int) -> Value:
        return self.decode(ctypes.string_at(pointer, self.size))

    def decode(self, data: bytes) -> Value:
        """The value of the bytes: numbers, bool, a label, "#RRGGBB" or a tuple of floats."""
        if self.type == records.COLOR:
            return "#{:02X}{:02X}{:02X}".format(*data)
        numbers = struct.unpack(self._format(), data)
        if self.type in (records.MASK_RECT, records.POSITION):
            return tuple(map(_shortest, numbers))
        number = numbers[0]
        if self.type == records.FLOAT:
            return _shortest(number)
        if self.type == records.BOOL and number in (0, 1):
            return bool(number)
        if 0 <= number < len(self.labels):
            return self.labels[number]
        return number

    def wanted(self) -> str:
        """What a value may be, for messages and documents."""
        if self.labels:
            return "one of " + ", ".join(self.labels)
        if self.minimum is not None:
            kind = "a number" if self.type == records.FLOAT else "a whole number"
            return f"{kind}, {self.minimum:g} to {self.maximum:g}"
        if self.type == records.BOOL:
            return "True or False" + (", or 2 for side by side" if self._modes == 2 else "")
        return {
            records.COLOR: '"#RRGGBB" or (red, green, blue), 0 to 255',
            records.MASK_RECT: "(left, top, right, bottom), fractions of the frame",
            records.POSITION: "(x, y), fractions of the frame",
        }.get(self.type, "a number")

    def encode(self, name: str, value: Any) -> bytes:
        """The bytes of a value. Raises ValueError, with name, for what it cannot be."""

        def refuse() -> ValueError:
            return ValueError(f"{name}: {value!r} is not {self.wanted()}")

        try:
            return self._encode(value, refuse)
        except (TypeError, OverflowError, struct.error):
            raise refuse() from None

    def _encode(self, value: Any, refuse: Callable[[], ValueError]) -> bytes:
        if self.type == records.COLOR:
            return _color(value, refuse)
        if self.type in (records.MASK_RECT, records.POSITION):
            numbers = tuple(float(number) for number in value)
            if len(numbers) * 4 != self.size or not all(map(math.isfinite, numbers)):
                raise refuse()
            return struct.pack(self._format(), *numbers)
        if isinstance(value, str) and self.type == records.BOOL:
            number = {"off": 0, "on": 1}.get(value.lower(), -1)
        elif isinstance(value, str):
            if value.lower() not in [label.lower() for label in self.labels]:
                raise refuse()
            number = [label.lower() for label in self.labels].index(value.lower())
        elif self.type == records.FLOAT:
            number = float(value)
            if not math.isfinite(number):
                raise refuse()
            # The bounds are singles: 0.4 itself is below the single nearest to it.
            number = struct.unpack("<f", struct.pack("<f", number))[0]
        else:
            number = int(value)
            if number != value:
                raise refuse()
        least, most = self._bounds()
        if not least <= number <= most:
            raise refuse()
        return struct.pack(self._format(), number)

    def _bounds(self) -> Tuple[float, float]:
        if self.labels:
            return 0, len(self.labels) - 1
        if self.type == records.BOOL:
            return 0, self._modes
        if self.minimum is not None:
            return _single(self.minimum), _single(self.maximum)
        return -math.inf, math.inf


def _single(number: float) -> float:
    return struct.unpack("<f", struct.pack("<f", number))[0]


def _shortest(number: float) -> float:
    """The number with the fewest digits that is the same single: 0.2, not 0.20000000298."""
    for digits in range(1, 10):
        short = float(f"{number:.{digits}g}")
        if _single(short) == number:
            return short
    return number


def _color(value: Any, refuse: Callable[[], ValueError]) -> bytes:
    if isinstance(value, str):
        if not re.fullmatch(r"#?[0-9A-Fa-f]{6}", value):
            raise refuse()
        return bytes.fromhex(value[-6:]) + b"\0"
    parts = tuple(value)
    if len(parts) != 3 or any(int(part) != part or not 0 <= part <= 255 for part in parts):
        raise refuse()
    return bytes(int(part) for part in parts) + b"\0"

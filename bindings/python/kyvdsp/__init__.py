"""The KYV DSP video effects on NumPy arrays.

    import kyvdsp

    with kyvdsp.Effect("bubble", width, height, P3=0.8) as bubble:
        result = bubble.render(frame, position=1.5)

A frame is an array of shape (height, width, 4) and type uint8: B, G, R, A. `effects()` lists the
effects with their parameters; every effect has a class as well, `kyvdsp.Bubble(width, height)`, whose
docstring lists them: `help(kyvdsp.Bubble)`.

A wrong argument raises ValueError, a failed call of the module `kyvdsp.Error`. The module is found
beside this package, where it was built or where the system has it; the environment variable
KYV_DSP_MODULE names any other file.
"""

from typing import Any, List

from ._catalog import EffectInfo, Parameter, effect_info, effects
from ._effect import Effect, class_name, class_of
from ._errors import Error, ModuleError
from ._module import module as _module
from ._version import __version__

__all__ = [
    "Effect",
    "EffectInfo",
    "Error",
    "ModuleError",
    "Parameter",
    "effect_info",
    "effects",
    "module_file",
]


def module_file() -> str:
    """The file of the module in use."""
    return str(_module().file)


def __getattr__(name: str) -> Any:
    # The classes are made when they are asked for, so that importing needs no module.
    if not name.startswith("_"):
        for info in effects():
            if class_name(info) == name:
                made = globals()[name] = class_of(info)
                return made
    raise AttributeError(f"module 'kyvdsp' has no attribute {name!r}")


def __dir__() -> List[str]:
    return sorted(set(globals()) | {class_name(info) for info in effects()})

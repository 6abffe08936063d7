"""What effects there are, with their parameters and the module's own texts for them."""

from dataclasses import dataclass, field
from functools import lru_cache
from typing import Optional, Tuple

from . import _names as names
from . import _records as records
from ._module import Module, module
from ._values import Value, ValueType


@dataclass(frozen=True)
class Parameter:
    """A parameter of an effect."""

    key: str  #: "P3", unique in the effect and never changed
    name: str  #: "bubble-density", unique in the effect and the same in every language
    title: str  #: "Bubble density", in the user's language
    description: str  #: a sentence in the user's language; may be empty
    type: str  #: float, integer, byte, count, choice, color, switch, rectangle or position
    default: Value
    minimum: Optional[float]  #: None where the type itself is the range
    maximum: Optional[float]
    choices: Tuple[str, ...]  #: the labels of a choice
    wanted: str  #: what values it takes, in words
    _type: ValueType = field(repr=False, compare=False)
    _offset: int = field(repr=False, compare=False)


@dataclass(frozen=True)
class EffectInfo:
    """An effect of the module."""

    identifier: str  #: what projects store
    name: str  #: "color-temperature", the same in every language
    title: str  #: "Color temperature", in the user's language
    description: str  #: a sentence in the user's language; may be empty
    inputs: int  #: 1, or 2 for transitions and the picture-in-picture
    is_transition: bool
    parameters: Tuple[Parameter, ...]
    _record: records.EffectDescriptor = field(repr=False, compare=False)

    def parameter(self, name: str) -> Parameter:
        """The parameter of a key, a name or a part of a name that no other one has."""
        rows = [[p.name, p.key, p.title] for p in self.parameters]
        if not rows:
            raise ValueError(f"{self.name} has no parameters")
        return self.parameters[names.find(f"parameter of {self.name}", name, rows)]

    def describe(self) -> str:
        """The effect and its parameters in words, as its class's docstring has them."""
        lines = [f"{self.title}.", ""]
        if self.description:
            lines = [f"{self.description}.", ""]
        lines += ["Parameters, each by name or by key:", ""]
        for p in self.parameters:
            lines.append(f"    {p.name.replace('-', '_')} ({p.key}): {p.wanted}; default {p.default!r}")
            if p.description:
                lines.append(f"        {p.description}")
        return "\n".join(lines)


def _first_text(loaded: Module, *keys: Optional[str]) -> str:
    for key in keys:
        text = loaded.text(key) if key and key != "none" else ""
        if text:
            return text
    return ""


def _parameter(loaded: Module, effect_key: str, record, offset: int) -> Parameter:
    key, name_key = record.key.decode(), names.bare_key(record.nameKey.decode())
    desc_key = record.descKey.decode() if record.descKey else None
    kind = ValueType(record)
    own_name = f"{effect_key};{key}"
    own_description = own_name.replace("_Name;", "_Desc;")
    # Some records repeat the name's key for the description.
    desc_key = None if desc_key == name_key else desc_key
    title = _first_text(loaded, own_name, name_key)
    return Parameter(
        key=key,
        name=names.short_param_name(key, name_key),
        title=title or names.words_of_key(name_key),
        description=_first_text(
            loaded, own_description, desc_key, name_key.replace("_Name", "_Desc")
        ),
        type=kind.name,
        default=kind.default,
        minimum=kind.minimum,
        maximum=kind.maximum,
        choices=tuple(kind.labels),
        wanted=kind.wanted(),
        _type=kind,
        _offset=offset,
    )


def _effect(loaded: Module, record) -> EffectInfo:
    name_key = record.nameKey.decode()
    parameters, offset = [], 0
    for i in range(record.paramCount):
        parameters.append(_parameter(loaded, name_key, record.params[i], offset))
        offset += record.params[i].valueSize
    title = loaded.text(name_key) or names.effect_name_of_key(name_key)
    description = _first_text(loaded, record.descKey.decode() if record.descKey else None)
    return EffectInfo(
        identifier=record.identifier.decode(),
        name=names.short_effect_name(name_key),
        title=title,
        description="" if description == title else description,
        inputs=record.properties.inputCount,
        is_transition=bool(record.properties.isTransition),
        parameters=tuple(parameters),
        _record=record,
    )


@lru_cache(maxsize=None)
def effects() -> Tuple[EffectInfo, ...]:
    """All effects of the module, in its order."""
    loaded = module()
    descriptor = loaded.descriptor
    return tuple(_effect(loaded, descriptor.effects[i]) for i in range(descriptor.effectCount))


def effect_info(name: str) -> EffectInfo:
    """The effect of a name, an identifier or a part of a name that no other effect has."""
    rows = [[e.name, e.identifier, e.title] for e in effects()]
    return effects()[names.find("effect", name, rows)]

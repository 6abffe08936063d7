"""Names of effects and parameters: the same in every language, and what people may write for them.

The rules are those of kyvhost; a test compares the names.
"""

import difflib
import re
from pathlib import Path
from typing import Dict, List, Sequence, Tuple

_ROW = re.compile(r'^KYV_PARAM_NAME\("([^"]+)", "([^"]*)", "([^"]+)"\)$', re.MULTILINE)


def _param_names() -> Dict[Tuple[str, str], str]:
    text = (Path(__file__).parent / "ParamNames.inc").read_text(encoding="ascii")
    return {(key, param): name for key, param, name in _ROW.findall(text)}


_PARAM_NAMES = _param_names()


def bare_key(name_key: str) -> str:
    """A name key without the labels of a choice list."""
    return name_key.split(";")[0]


def _family(key: str) -> str:
    match = re.match(r"(?:IDS_)?(?:DSP_)?([A-Z][a-z])_.", key)
    return match.group(1) if match else ""


def words_of_key(key: str) -> str:
    """ "Bubble min size" of "IDS_Vi_Param_BubbleMinSize_Name"."""
    key = re.sub(r"^IDS_", "", bare_key(key))
    key = re.sub(r"^DSP_", "", key)
    if _family(key):
        key = key[3:]
    key = re.sub(r"^Param_", "", key)
    key = re.sub(r"(_Name|_Desc)$", "", key)
    words = re.sub(r"(?<=[a-z])(?=[A-Z0-9])|(?<=[A-Z])(?=[A-Z][a-z])", "_", key).split("_")
    # Capitals at the start and in "A", "X" or "3D" stay.
    rest = [w[0].lower() + w[1:] if re.match(r"[A-Z][a-z]", w) else w for w in words[1:]]
    return " ".join(words[:1] + rest)


def effect_name_of_key(name_key: str) -> str:
    """ "Color temperature": the words of the key with what they leave out."""
    words = words_of_key(name_key).rstrip("0123456789 ")
    family = _family(name_key)
    if family == "Co" and " " not in words:
        return "Color " + words.lower()
    if family == "Tr" and "transition" not in words:
        return words + " transition"
    return words + " picture-in-picture" if family == "Pi" else words


def short_effect_name(name_key: str) -> str:
    """ "color-temperature" """
    return effect_name_of_key(name_key).lower().replace(" ", "-")


def short_param_name(key: str, name_key: str) -> str:
    """ "shadow-opacity" """
    name_key = bare_key(name_key)
    name = _PARAM_NAMES.get((name_key, key)) or _PARAM_NAMES.get((name_key, ""))
    return name or words_of_key(name_key).lower().replace(" ", "-")


def normalized(text: str) -> str:
    """What is equal after this is the same name."""
    kept = "".join(c for c in text.lower() if c.isalnum())
    return kept.replace("colour", "color")


def find(what: str, text: str, names: Sequence[Sequence[str]]) -> int:
    """The index of the row that text means: a name of it, or a part that fits no other row.

    A row has its name, which messages show, its key, and its title, which it may share.
    """
    wanted = normalized(text)
    own = [i for i, row in enumerate(names) if wanted in map(normalized, row[:2])]
    whole = [i for i, row in enumerate(names) if wanted in map(normalized, row)]
    parts: List[int] = []
    if len(wanted) >= 2:
        parts = [i for i, row in enumerate(names) if any(wanted in normalized(n) for n in row)]
    for found in (own, whole, parts):
        if len(found) == 1:
            return found[0]
        if found:
            several = ", ".join(names[i][0] for i in found)
            raise ValueError(f'"{text}" may be more than one {what}: {several}')
    near = difflib.get_close_matches(text.lower(), [name for row in names for name in row], 1)
    every = ", ".join(row[0] for row in names)
    hint = f'; the nearest is "{near[0]}"' if near else f"; there are {every}"
    raise ValueError(f'no {what} "{text}"{hint}')

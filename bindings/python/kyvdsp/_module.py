"""The module: found, loaded and initialised once in a process, and the texts of its keys."""

import ctypes
import os
import sys
import threading
from pathlib import Path
from typing import List, Optional

from . import _records as records
from ._errors import ModuleError

_WINDOWS = sys.platform == "win32"
_FILE_NAME = "KyvDsp.dll" if _WINDOWS else "libKyvDsp.so"

_lock = threading.Lock()
_module: Optional["Module"] = None


def _candidates() -> List[Path]:
    """Where the module may lie, in the order of the search."""
    named = os.environ.get("KYV_DSP_MODULE")
    if named:
        return [Path(named)]
    here = Path(__file__).resolve().parent
    folders = [here, here.parents[2] / "module"]  # a wheel, the build tree
    if not _WINDOWS:
        multiarch = getattr(sys.implementation, "_multiarch", "")
        # Installed with this package, elsewhere on the system.
        for libraries in (here.parents[2], Path("/usr/local/lib"), Path("/usr/lib")):
            folders += [libraries / multiarch / "kyvdsp", libraries / "kyvdsp"]
    return [folder / _FILE_NAME for folder in folders]


class Module:
    """The loaded module. It stays loaded as long as the process runs."""

    def __init__(self, file: Path):
        self.file = file
        try:
            self._library = ctypes.CDLL(str(file))
        except OSError as error:
            raise ModuleError(f"{file} cannot be loaded: {error}") from None
        try:
            init = self._library.KYV_DSP_InitModule
        except AttributeError:
            raise ModuleError(f"{file} is not a KYV DSP module") from None
        init.restype = ctypes.c_uint32
        descriptor = ctypes.POINTER(records.ModuleDescriptor)()
        status = init(ctypes.byref(descriptor))
        if status != records.OK:
            raise ModuleError(f"{file} refuses to start: status {status:#010x}", status)
        self.descriptor = descriptor.contents
        if self.descriptor.formatNumber != records.FORMAT_NUMBER:
            raise ModuleError(
                f"{file} has interface format {self.descriptor.formatNumber}; "
                f"this package needs {records.FORMAT_NUMBER}"
            )
        self._texts = self._find_texts()

    def _find_texts(self):
        """The texts of the user's language, else of the English library beside the module."""
        libraries = []
        if self.descriptor.ResourceLibrary:
            libraries.append(
                ctypes.CDLL(str(self.file), handle=self.descriptor.ResourceLibrary)
            )
        # The module cuts its path at the first dot of all, so that it finds no library below a
        # folder such as python3.11.
        english = self.file.with_name(self.file.stem + "_ENU.DLL")
        if english.exists():
            try:
                libraries.append(ctypes.CDLL(str(english)))
            except OSError:
                pass
        for library in libraries:
            try:
                find = library.KYV_DSP_LanguageText
            except AttributeError:
                continue
            find.argtypes = [ctypes.c_char_p]
            find.restype = ctypes.c_char_p
            return find
        return lambda key: None

    def text(self, key: Optional[str]) -> str:
        """The text of a key in the user's language; empty when there is none."""
        text = self._texts(key.encode()) if key else None
        return text.decode() if text else ""


def module() -> Module:
    """The module, loaded when it is asked for first."""
    global _module
    with _lock:
        if _module is None:
            candidates = _candidates()
            found = next((file for file in candidates if file.is_file()), None)
            if found is None:
                looked = ", ".join(str(file.parent) for file in candidates)
                raise ModuleError(
                    f"no {_FILE_NAME} in {looked}; name the file in KYV_DSP_MODULE"
                )
            _module = Module(found)
        return _module

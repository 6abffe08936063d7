"""What goes wrong beyond a wrong argument, which is a ValueError."""


class Error(RuntimeError):
    """A call of the module failed; `status` is what it returned."""

    def __init__(self, text: str, status: int = 0):
        super().__init__(text)
        self.status = status


class ModuleError(Error):
    """The module is missing or cannot be used."""

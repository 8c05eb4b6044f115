"""How calls fail."""


class Error(RuntimeError):
    """A call of the library failed.

    hresult      the code as an unsigned number: 0x80070057 is an invalid argument
    description  what was wrong
    source       which class says so
    """

    def __init__(self, hresult, description, source=""):
        super().__init__(hresult, description, source)
        self.hresult = hresult
        self.description = description
        self.source = source

    def __str__(self):
        return f"{self.description or 'the call failed'} (0x{self.hresult:08X})"


Error.__module__ = "zelt"

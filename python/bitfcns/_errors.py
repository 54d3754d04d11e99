"""The error of a refused call (kept apart so that the extension can import it)."""

from __future__ import annotations


class BitfcnsError(ValueError):
    """A call that the library refused.

    Attributes
    ----------
    identifier : str or None
        The message identifier of the refusal, exactly as the library raises
        it, such as ``'VESPRA:bitshift:outOfRange'``; None for the one error
        that has none, a non-ASCII character met in a type name.
    message : str
        The sentence of the host's message catalogue for the identifier.

    Examples
    --------
    >>> try:
    ...     bitfcns.bitcmp(np.array([1.5]))
    ... except bitfcns.BitfcnsError as error:
    ...     print(error.identifier)
    VESPRA:bitcmp:outOfRange
    """

    def __init__(self, message: str, identifier: str | None = None) -> None:
        super().__init__(message, identifier)
        self.message = message
        self.identifier = identifier

    def __str__(self) -> str:
        if self.identifier is None:
            return self.message
        return f"{self.message} ({self.identifier})"


BitfcnsError.__module__ = "bitfcns"

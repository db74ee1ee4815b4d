"""The package's exceptions: one class for each kind of failure the tool reports.

Every exception carries the tool's one-line message, and ``exit_code`` the exit
code the ``veltmarquist`` tool gives the same failure. Bad values are also
``ValueError``, unreadable or unwritable files also ``OSError`` (a missing
file ``FileNotFoundError``), so plain ``except`` clauses work as usual.
"""
import errno
import os


class Error(Exception):
    """A failure of the package; ``exit_code`` is the tool's code for it."""

    exit_code = 1


class UsageError(Error, ValueError):
    """Arguments that do not exist or do not go together (a layout, a format, an ink limit)."""

    exit_code = 2


class UnreadableFileError(Error, OSError):
    """An input file cannot be opened or read."""

    exit_code = 3


class MissingFileError(UnreadableFileError, FileNotFoundError):
    """An input file does not exist."""


class FileFormatError(Error, ValueError):
    """An input file is not readable CGATS / IT8 text."""

    exit_code = 4


class ContentError(Error, ValueError):
    """Unsupported content: unknown spectral layout, missing fields, bad or out-of-range values."""

    exit_code = 5


class MissingPatchError(Error, ValueError):
    """A patch the calculation needs is not in the file (test-form patch, solid, white)."""

    exit_code = 6


class DuplicatePatchError(Error, ValueError):
    """One sample identifier names two different patches."""

    exit_code = 7


class OutputError(Error, OSError):
    """An output file cannot be written."""

    exit_code = 8


class CalculationError(Error):
    """The library rejected or failed the calculation, or its result is not finite."""

    exit_code = 9


class CoverageScaleWarning(UserWarning):
    """Coverages that all lie within 0-1: coverages are percent, so these were most likely fractions."""


_BY_EXIT_CODE = {cls.exit_code: cls for cls in (UsageError, UnreadableFileError, FileFormatError, ContentError,
                                                 MissingPatchError, DuplicatePatchError, OutputError,
                                                 CalculationError)}


def error_class(exit_code, message):
    """The class for a failure the tool would end with ``exit_code`` (the extension raises it)."""
    if exit_code == UnreadableFileError.exit_code and message.endswith(os.strerror(errno.ENOENT)):
        return MissingFileError
    return _BY_EXIT_CODE.get(exit_code, Error)

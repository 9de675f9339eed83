"""Message codes of libqel as Python exceptions."""

__all__ = ["Error", "RandomVariateError", "NoFitError", "NoConvergenceError", "OutOfMemoryError",
           "BadEnumValueError", "NotPositiveDefiniteError", "NotImplementedInLibraryError",
           "UnknownSelectorError", "SingularError", "DegenerateDataError", "FloatingPointTrap"]


class Error(Exception):
    """A failure reported by libqel: `code` is the message code, `name` its name."""

    def __init__(self, code, name, message=""):
        text = f"{name} ({code})" + (f": {message}" if message else "")
        super().__init__(text)
        self.code = code
        self.name = name


class RandomVariateError(Error):
    """A random variate could not be drawn (20003)."""


class NoFitError(Error):
    """A fit did not converge (20004)."""


class NoConvergenceError(Error):
    """An iteration did not converge (30000)."""


class OutOfMemoryError(Error, MemoryError):
    """The library ran out of memory (30001)."""


class BadEnumValueError(Error, ValueError):
    """An enumeration value out of range (30002)."""


class NotPositiveDefiniteError(Error, ValueError):
    """A covariance matrix that is not positive definite (30006)."""


class NotImplementedInLibraryError(Error, NotImplementedError):
    """A function the interface names but the library does not provide (30011)."""


class UnknownSelectorError(Error, ValueError):
    """An unknown selector, such as a quantile type (30017)."""


class SingularError(Error, ValueError):
    """A singular system (30019)."""


class DegenerateDataError(Error, ValueError):
    """Data on which the statistic does not exist, such as identical values (30023)."""


class FloatingPointTrap(Error, FloatingPointError):
    """A floating-point trap that no kernel expected; the thread's state was reset."""


CODES = {
    20003: ("qelFailRandomVariate", RandomVariateError),
    20004: ("qelFailNoFit", NoFitError),
    30000: ("qelFailNoConvergence", NoConvergenceError),
    30001: ("qelFailOutOfMemory", OutOfMemoryError),
    30002: ("qelFailBadEnumValue", BadEnumValueError),
    30006: ("qelFailNotPositiveDefinite", NotPositiveDefiniteError),
    30011: ("qelFailNotImplemented", NotImplementedInLibraryError),
    30017: ("qelFailUnknownSelector", UnknownSelectorError),
    30019: ("qelFailSingular", SingularError),
    30020: ("qelFailRootNoValue", Error),
    30021: ("qelFailRootNoBracket", Error),
    30023: ("qelFailDegenerateData", DegenerateDataError),
    99998: ("qelFailSignalHandler", Error),
}


def from_code(code, message=""):
    """The exception object of a message code."""
    name, cls = CODES.get(code, (f"code {code}", Error))
    return cls(code, name, message)


def trap(message):
    return FloatingPointTrap(None, "floating-point trap", message)

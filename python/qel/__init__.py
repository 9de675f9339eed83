"""libqel for Python: distributions with accurate far tails, sampling,
descriptive and order statistics, tests and intervals, contingency tables.

Distribution families are submodules: ``qel.normal.cdf(x, mean=0, sigma=1,
upper=False)``. Functions take numbers or NumPy arrays (a contiguous float64
array is read in place) and give a float for a number, an array otherwise.
Tests return result objects with named fields; a failure code of the
library raises :class:`qel.Error` (``code`` and ``name``)."""
from . import _qel
from . import _errors
from . import power  # noqa: F401
from ._errors import *  # noqa: F401,F403
from ._qel import *  # noqa: F401,F403

__all__ = [name for name in dir(_qel) if not name.startswith("_")] + _errors.__all__

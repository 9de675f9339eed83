"""Power and sample size: for each design, give two of the sample size, the
effect and the power (a number or a list each) and the third is solved for
every pair, as ``qelcalc power`` does, with its option names and defaults::

    qel.power.t_test(effect=0.5, power=[0.8, 0.9], two_sample=True)

Designs: ``t_test``, ``z_test``, ``paired_t``, ``welch``, ``equivalence``
(two one-sided tests), ``proportion``, ``variance``, ``poisson``,
``factorial`` and ``general_factorial``. Each returns :class:`Results`, a
list of result objects with named fields."""
from ._power import *  # noqa: F401,F403
from . import _power

__all__ = [name for name in dir(_power) if not name.startswith("_")] + ["Results"]


class Results(list):
    """The rows of a power request, in qelcalc's order. `solved` names the
    quantity that was computed; `extents` is the (low, high) x range of a
    power curve when asked for with ``extents=True``, None otherwise."""

    def __init__(self, rows, solved, extents=None):
        super().__init__(rows)
        self.solved = solved
        self.extents = extents

    def __repr__(self):
        extra = "" if self.extents is None else f", extents={self.extents!r}"
        return f"Results(solved={self.solved!r}, rows={list.__repr__(self)}{extra})"

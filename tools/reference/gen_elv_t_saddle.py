"""Reference lower tails of the noncentral t in its far lower tail,
t < 0 < delta, for degrees of freedom from 10 to 1e6: the region of the
closed saddle-point form t_saddle_approx, plus a few points at df 1e7
and 1e8 and at the edges of its domain (delta = 0, t >= 0). The tails come from the same
40-digit integral E[Phi(t W - delta)] over the chi density of W as
elv_t_noncentral.csv, written to tests/data/elv_t_saddle.csv.
"""
import os
import sys

sys.path.insert(0, os.path.dirname(__file__))
from gen_elv_t_noncentral import OUT, tail  # noqa: E402
from refdata import d, write_rows  # noqa: E402


def gen_saddle():
    rows = []
    dfs = [10.0, 30.0, 100.0, 300.0, 1000.0, 3000.0, 1e4, 1e5, 1e6]
    deltas = [0.5, 3.0, 12.0, 21.0]
    ts = [-0.5, -3.0, -20.0, -200.0]
    for df in dfs:
        for delta in deltas:
            for t in ts:
                rows.append([repr(t), repr(df), repr(delta), tail(d(t), d(df), d(delta), False)])
        print(df, file=sys.stderr)
    # Beyond the grid: the largest df, and the edges of the form's domain
    # (delta = 0, t >= 0 with the boundary still beyond the mode).
    extra = [(-0.5, 1e7, 0.5), (-3.0, 1e7, 3.0), (-0.5, 1e8, 0.5), (-3.0, 1e8, 3.0),
             (-5.0, 50.0, 0.0), (-2.0, 400.0, 0.0), (1.0, 200.0, 8.0), (0.0, 100.0, 3.0)]
    for t, df, delta in extra:
        rows.append([repr(t), repr(df), repr(delta), tail(d(t), d(df), d(delta), False)])
    write_rows(os.path.join(OUT, "elv_t_saddle.csv"), "t,df,delta,lower", rows)


if __name__ == "__main__":
    gen_saddle()

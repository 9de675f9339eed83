"""qel.power across the binding: values against R (tests/data/python_power_r.json),
every design against the qelcalc of the same build, result objects, argument
checks before the library runs, the GIL released during a solve."""
import dataclasses
import math
import os
import subprocess
import threading
import time

import pytest
import qel
from conftest import reference

DESIGNS = {"t_test": "t", "z_test": "z", "paired_t": "paired", "welch": "welch",
           "equivalence": "tost", "proportion": "prop", "variance": "variance",
           "poisson": "poisson", "factorial": "factorial", "general_factorial": "gff"}

CASES = [
    ("t_test", dict(effect=0.5, power=[0.8, 0.9], two_sample=True, extents=True)),
    ("z_test", dict(n=[10, 20], effect=[0.3, -0.4], sigma=2.0, alternative="less")),
    ("paired_t", dict(n=[8, 30], power=0.85, alpha=0.01, extents=True)),
    ("welch", dict(effect=1.0, power=0.8, sd1=1.0, sd2=2.0, alternative="greater")),
    ("equivalence", dict(n=20, power=[0.8, 0.999], lower=-1.0, upper=1.0, extents=True)),
    ("equivalence", dict(effect=1.05, power=0.8, lower=0.8, upper=1.25, ratio=True, paired=True)),
    ("proportion", dict(n=50, power=0.8, null=0.4, two_sample=True, extents=True)),
    ("variance", dict(n=[10, 20], effect=[1.5, 0.5], method="bonett", kurtosis=1.0)),
    ("variance", dict(effect=2.0, power=0.9, method="chisq", ratio_sd=True, alternative="greater")),
    ("poisson", dict(n=10, power=0.9, rate=2.0, length=[1.0, 2.0], two_sample=True)),
    ("factorial", dict(reps=[1, 2], center_points=0, power=0.8, factors=3, runs=8)),
    ("factorial", dict(center_points=[0, 3], effect=1.5, power=0.9, factors=5, runs=16, blocks=2,
                       terms=3, cp_in_model=True)),
    ("general_factorial", dict(effect=1.0, power=[0.8, 0.9], levels=[3, 4], order=1)),
]


def command_line(function, kwargs):
    args = [os.environ["QELCALC"], "power", DESIGNS[function]]
    for key, value in kwargs.items():
        option = "--" + key.replace("_", "-")
        if value is True:
            args.append(option)
        else:
            values = value if isinstance(value, list) else [value]
            args += [option, ",".join(str(v) for v in values)]
    return args


def same(expected_text, got):
    if expected_text == "NaN":
        return got is None or math.isnan(got)
    return got == float(expected_text)


@pytest.mark.parametrize("row", reference("python_power_r.json"), ids=lambda r: f"{r[0]}-{r[3]}")
def test_against_r(row):
    function, kwargs, index, field, expected, rtol = row
    got = getattr(getattr(qel.power, function)(**kwargs)[index], field)
    assert got == pytest.approx(expected, rel=rtol, abs=0)


@pytest.mark.skipif("QELCALC" not in os.environ, reason="QELCALC names the qelcalc to compare with")
@pytest.mark.parametrize("function, kwargs", CASES, ids=[c[0] for c in CASES])
def test_same_rows_as_qelcalc(function, kwargs):
    lines = subprocess.run(command_line(function, kwargs), capture_output=True, text=True,
                           check=True).stdout.split("\n")[:-1]
    header = [{"centerpoints": "center_points"}.get(h, h) for h in lines[0].split()]
    extents = [line.split()[1:] for line in lines if line.startswith("extents")]
    rows = [line.split() for line in lines[1:] if not line.startswith("extents")]
    got = getattr(qel.power, function)(**kwargs)
    assert len(got) == len(rows) and len(rows) > 0
    for row, result in zip(rows, got):
        assert [f.name for f in dataclasses.fields(result)] == header
        assert all(same(text, getattr(result, name)) for text, name in zip(row, header)), result
    assert (got.extents is None) == (not extents)
    if extents:
        assert all(same(text, value) for text, value in zip(extents[0], got.extents))


def test_results_are_lists_of_readable_frozen_objects():
    got = qel.power.t_test(effect=0.5, power=[0.8, 0.9], two_sample=True)
    assert isinstance(got, list) and got.solved == "n" and got.extents is None
    assert repr(got[0]) == "PowerResult(n=64, effect=0.5, power=0.80146, target=0.8)"
    assert repr(got).startswith("Results(solved='n', rows=[PowerResult(n=64, ")
    with pytest.raises(dataclasses.FrozenInstanceError):
        got[0].n = 1
    assert got[1].asdict()["n"] == 86
    # A target above the peak power of an equivalence test has no solution.
    high = qel.power.equivalence(n=5, power=0.99, lower=-0.1, upper=0.1)
    assert high.solved == "effect" and math.isnan(high[0].effect)
    assert qel.power.factorial(reps=1, center_points=0, power=0.8, factors=3, runs=8)[0].runs == 8


def test_arguments_are_checked_before_the_library_runs():
    power = qel.power
    type_errors = [lambda: power.t_test(n=10), lambda: power.t_test(n=10, effect=1, power=0.8),
                   lambda: power.t_test(n=["a"], effect=1), lambda: power.t_test(n=[True], effect=1),
                   lambda: power.factorial(reps=1, effect=1, factors=3, runs=8),
                   lambda: power.general_factorial(reps=2, effect=1.0, levels=[3], order=[1, 2])]
    value_errors = [lambda: power.t_test(n=2.5, effect=1), lambda: power.t_test(n=0, effect=1),
                    lambda: power.t_test(n=[[10]], effect=1), lambda: power.t_test(n=[], effect=1),
                    lambda: power.t_test(n=10, effect=float("nan")),
                    lambda: power.t_test(n=10, power=0.04), lambda: power.t_test(n=10, effect=1, alpha=1),
                    lambda: power.t_test(n=10, effect=1, sigma=0),
                    lambda: power.t_test(n=10, effect=1, alternative="unequal"),
                    lambda: power.proportion(n=10, effect=0.6), lambda: power.variance(n=10, effect=0),
                    lambda: power.variance(n=10, effect=2, method="f"),
                    lambda: power.poisson(n=10, effect=-1), lambda: power.poisson(n=10, effect=1, length=[1, 2, 3]),
                    lambda: power.equivalence(n=10, effect=0, lower=-1, upper=1, paired=True, one_sample=True),
                    lambda: power.factorial(reps=1, center_points=0, power=0.8, factors=3, runs=16),
                    lambda: power.factorial(reps=1, center_points=0, power=1.0, factors=3, runs=8),
                    lambda: power.factorial(reps=1, center_points=0, power=0.8, factors=3, runs=8, terms=8),
                    lambda: power.general_factorial(reps=2, effect=-1.0, levels=[3, 4])]
    for errors, cls in ((type_errors, TypeError), (value_errors, ValueError)):
        for i, call in enumerate(errors):
            with pytest.raises(cls):
                call()
                pytest.fail(f"case {i} passed")


def test_gil_is_released_during_a_solve():
    sizes = list(range(2, 202))
    start = time.perf_counter()
    qel.power.t_test(n=sizes, effect=0.5)
    scale = max(1, int(0.2 / max(time.perf_counter() - start, 1e-4)))
    ticks = []
    worker = threading.Thread(target=lambda: qel.power.t_test(n=sizes * scale, effect=0.5))
    start = time.perf_counter()
    worker.start()
    while worker.is_alive():
        ticks.append(time.perf_counter())
    assert time.perf_counter() - start > 0.05, "the call should be long enough to observe"
    assert len(ticks) > 1000  # with the GIL held the main thread could not have run

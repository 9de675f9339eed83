"""Distribution functions across the binding: values against SciPy and
mpmath (tests/data/python_distributions.json), types, shapes, no copy of
the input, the GIL released."""
import threading
import time
import tracemalloc

import numpy as np
import pytest
import qel
from conftest import reference

ROWS = reference("python_distributions.json")


@pytest.mark.parametrize("module", sorted({r[0] for r in ROWS}))
def test_reference_values(module):
    for _, fn, args, kwargs, expected, rtol in (r for r in ROWS if r[0] == module):
        got = getattr(getattr(qel, module), fn)(*args, **kwargs)
        assert type(got) is float
        assert got == pytest.approx(expected, rel=rtol, abs=0), (fn, args, kwargs)


def test_far_tail_prints_to_the_last_digit():
    assert repr(qel.normal.cdf(-30.0)) == "4.906713927148187e-198"


def test_arrays_keep_shape_and_match_scalars():
    x = np.linspace(-3, 3, 12).reshape(3, 4)
    for given in (x, x.tolist(), x.astype(np.float32), np.asfortranarray(x), x[:, ::2]):
        got = qel.logistic.cdf(given, location=0.5, upper=True)
        assert isinstance(got, np.ndarray) and got.dtype == np.float64
        assert got.shape == np.shape(given)
        flat = np.asarray(given, dtype=float).ravel()
        assert got.ravel().tolist() == [qel.logistic.cdf(v, location=0.5, upper=True) for v in flat]
    assert qel.poisson.cdf(np.arange(5), 2.0).shape == (5,)
    assert type(qel.normal.cdf(np.float32(1.0))) is float
    assert type(qel.normal.cdf(np.array(1.0))) is float


def test_nan_stays_nan_and_bad_parameters_give_nan():
    assert np.isnan(qel.normal.cdf(float("nan")))
    assert np.isnan(qel.normal.cdf(1.0, sigma=-1.0))
    out = qel.gamma.inv(np.array([0.5, np.nan, 1.5]), 2.0)
    assert not np.isnan(out[0]) and np.isnan(out[1:]).all()


def test_wrong_types_and_shapes_are_refused():
    for bad in ("1.5", [1 + 2j], [True, False], None, [object()]):
        with pytest.raises(TypeError):
            qel.normal.cdf(bad)
    with pytest.raises(TypeError):
        qel.binomial.pdf(3, n=10.5, p=0.5)  # an int parameter
    x = np.zeros(4)
    with pytest.raises(TypeError):
        qel.normal.cdf(x, out=np.zeros(4, dtype=np.float32))
    with pytest.raises(ValueError):
        qel.normal.cdf(x, out=np.zeros(5))
    with pytest.raises(ValueError):
        qel.normal.cdf(np.zeros((4, 2)), out=np.zeros((4, 2)).T)  # not C-contiguous
    with pytest.raises(ValueError):
        qel.t.pvalue(2.0, 10, alternative="both")


def test_contiguous_float64_input_is_not_copied():
    x = np.linspace(-5, 5, 1 << 20)  # 8 MB
    tracemalloc.start()
    try:
        qel.normal.cdf(x)
        _, peak_new = tracemalloc.get_traced_memory()
        tracemalloc.reset_peak()
        qel.normal.cdf(x, out=x)
        _, peak_in_place = tracemalloc.get_traced_memory()
        tracemalloc.reset_peak()
        qel.normal.cdf(x[::2])  # strided: one converted copy of the input
        _, peak_strided = tracemalloc.get_traced_memory()
    finally:
        tracemalloc.stop()
    assert peak_new < 1.5 * x.nbytes  # the output only
    assert peak_in_place < 0.1 * x.nbytes
    assert peak_strided > 0.9 * x.nbytes  # half-size copy and half-size output
    assert x[0] == qel.normal.cdf(-5.0)


def test_gil_is_released_during_a_call():
    # One call sized to last about 0.2 s on this machine.
    x = np.linspace(-10, 10, 10_000)
    start = time.perf_counter()
    qel.t.cdf(x, df=3.5, noncentrality=1.5)
    per_element = (time.perf_counter() - start) / x.size
    x = np.linspace(-10, 10, min(int(0.2 / per_element), 20_000_000))
    ticks = []

    def worker():
        qel.t.cdf(x, df=3.5, noncentrality=1.5)

    t = threading.Thread(target=worker)
    start = time.perf_counter()
    t.start()
    while t.is_alive():
        ticks.append(time.perf_counter())
    elapsed = time.perf_counter() - start
    assert elapsed > 0.05, "the call should be long enough to observe"
    # With the GIL held, the main thread could not run during the call.
    assert len(ticks) > 1000

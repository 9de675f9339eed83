"""Tests, intervals, tables, sampling and errors across the binding: values
against SciPy (tests/data/python_tests.json), result objects, message codes
as exceptions, argument checks before the library runs."""
import dataclasses

import numpy as np
import pytest
import qel
from conftest import reference

X = np.array([5.1, 4.9, 5.6, 5.8, 6.0, 5.3, 5.5, 6.2, 4.7])


@pytest.mark.parametrize("row", reference("python_tests.json"), ids=lambda r: f"{r[0]}-{r[3]}")
def test_against_scipy(row):
    function, args, kwargs, field, expected, rtol = row
    got = getattr(qel, function)(*args, **kwargs)
    if field is not None:
        got = getattr(got, field)
    np.testing.assert_allclose(got, expected, rtol=rtol, atol=0)


def test_result_objects_are_named_frozen_and_readable():
    r = qel.one_sample_t(X, mu=5.0, alternative="greater")
    assert dataclasses.is_dataclass(r)
    assert type(r).__name__ == "OneSampleT" and r.n == 9 and r.status == 0
    assert r.upper_limit == np.inf  # the interval follows the alternative
    assert repr(r).startswith("OneSampleT(n=9, mean=5.45556, ")
    assert r.asdict()["p_value"] == r.p_value
    with pytest.raises(dataclasses.FrozenInstanceError):
        r.p_value = 0.0
    lower = qel.one_sample_t(X, interval="upper")
    assert lower.lower_limit == -np.inf
    groups = qel.kruskal_wallis([X, X + 1.0, X - 0.5]).groups
    assert [g.n for g in groups] == [9, 9, 9]


def test_codes_become_exceptions_with_code_and_name():
    cases = [
        (lambda: qel.Sampler(7).pareto(3), qel.NotImplementedInLibraryError, 30011),
        (lambda: qel.mann_whitney([2.0, 2.0, 2.0], [2.0, 2.0]), qel.DegenerateDataError, 30023),
        (lambda: qel.curve_fit([1.0, np.inf], [1.0, 2.0]), qel.SingularError, 30019),
        (lambda: qel.quantiles(X, [0.5], type=12), qel.UnknownSelectorError, 30017),
    ]
    for call, cls, code in cases:
        with pytest.raises(cls) as info:
            call()
        assert isinstance(info.value, qel.Error)
        assert info.value.code == code
        assert info.value.name.startswith("qelFail") and str(code) in str(info.value)


def test_arguments_are_checked_before_the_library_runs():
    with pytest.raises(ValueError):
        qel.one_sample_t(X.reshape(3, 3))
    with pytest.raises(TypeError):
        qel.one_sample_t(["a", "b"])
    with pytest.raises(ValueError):
        qel.paired_t(X, X[:-1])
    with pytest.raises(ValueError):
        qel.two_sample_t(X, X, confidence=1.5)
    with pytest.raises(ValueError):
        qel.wilcoxon(X, alternative="unequal")
    with pytest.raises(ValueError):
        qel.one_proportion(12, 10)
    with pytest.raises(ValueError):
        qel.contingency_table([1, 2, 3])
    with pytest.raises(ValueError):
        qel.contingency_table([[1, 2], [3, 4]], want="chisq,nonsense")
    with pytest.raises(ValueError):
        qel.kruskal_wallis([X])


def test_nan_in_data_stays_nan():
    assert np.isnan(qel.mean([1.0, np.nan, 3.0]))
    assert np.isnan(qel.one_sample_t([1.0, np.nan, 3.0]).p_value)


def test_contingency_table_shapes_and_two_by_two_marks():
    t = qel.contingency_table(np.array([[1, 2, 3], [4, 5, 6]]), want=["expected", "fisher"])
    assert t.expected.shape == (2, 3)
    assert t.expected.sum() == pytest.approx(21.0)
    assert np.isnan(t.fisher_p_value)  # 2 x 2 only
    assert not hasattr(t, "chisq")


def test_sampler_streams_repeat_from_a_seed():
    a = qel.Sampler(12345)
    first = a.normal(50, mean=3.0, sigma=2.0)
    position = a.seed
    more = a.poisson(20, mean=4.0)
    a.seed = position
    assert np.array_equal(a.poisson(20, mean=4.0), more)
    assert np.array_equal(qel.Sampler(12345).normal(50, mean=3.0, sigma=2.0), first)
    assert first.dtype == np.float64 and first.shape == (50,)
    assert qel.Sampler(1).mvnormal(4, [0.0, 1.0], np.eye(2)).shape == (4, 2)
    drawn = qel.Sampler(3).random_sample(10, 10)
    assert sorted(drawn.tolist()) == list(range(10))
    with pytest.raises(ValueError):
        qel.Sampler(3).random_sample(5, 6)
    with pytest.raises(qel.NotPositiveDefiniteError):
        qel.Sampler(1).mvnormal(2, [0.0, 0.0], [[1.0, 2.0], [2.0, 1.0]])

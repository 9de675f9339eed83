"""Result objects of the tests and intervals: frozen dataclasses made on
first use, one class per kind of result, with the fields in the library's
order and a readable repr."""
import dataclasses
import math

_classes = {}


def _format(value):
    if isinstance(value, float):
        return "nan" if math.isnan(value) else f"{value:.6g}"
    return repr(value)


def _repr(self):
    parts = (f"{f.name}={_format(getattr(self, f.name))}" for f in dataclasses.fields(self))
    return f"{type(self).__name__}({', '.join(parts)})"


def _asdict(self):
    return {f.name: getattr(self, f.name) for f in dataclasses.fields(self)}


def make(name, fields):
    """An instance of the result class `name` with the given fields."""
    key = (name, tuple(fields))
    cls = _classes.get(key)
    if cls is None:
        cls = dataclasses.make_dataclass(name, list(fields), frozen=True, eq=False,
                                         namespace={"__repr__": _repr, "asdict": _asdict})
        cls.__module__ = "qel"
        _classes[key] = cls
    return cls(**fields)

#!/usr/bin/env python3
"""Generates the Python bindings of the exported distribution families.

Reads the family and P-value tables of gen_distribution_api.py (the one
source of the exported functions) and writes
  python/src/distributions_table.inc

For each family a submodule qel.<family> gets pdf, cdf and inv with the
family's parameters as keyword arguments (the defaults of qelcalc, no
default where qelcalc has none), `upper` for the upper tail of cdf and
`out` for an output array; the P-value and critical-value functions go to
the submodule of their family. Run after editing the tables:
python3 tools/codegen/gen_python_distributions.py
"""
import os
import sys

sys.path.insert(0, os.path.dirname(__file__))
import gen_distribution_api as api  # noqa: E402

ROOT = api.ROOT

# Python names of parameters that are keywords or clash with the `upper`
# tail flag.
PY_NAMES = {"lambda": "lam", "lower": "low", "upper": "high"}

# Submodule and function name of each P-value / critical-value function.
PVALUE_TARGETS = {
    "BinomialPValue": ("binomial", "pvalue"),
    "ChiSqPValue": ("chisq", "pvalue"),
    "ChiSqCritValue": ("chisq", "crit"),
    "FPValue": ("f", "pvalue"),
    "FCritValue": ("f", "crit"),
    "HypergeometricPValue": ("hypergeometric", "pvalue"),
    "NormalPValue": ("normal", "pvalue"),
    "NormalCritValue": ("normal", "crit"),
    "TPValue": ("t", "pvalue"),
    "TCritValue": ("t", "crit"),
    "TSidakCritValue": ("t", "sidak_crit"),
}


# Submodule names that are Python keywords.
MODULE_NAMES = {"lambda": "lambda_"}


def py_name(name):
    return PY_NAMES.get(name, name)


def default_of(family, name):
    defaults = dict(api.CLI_DEFAULTS, **family.get("cli_defaults", {}))
    return defaults.get(name)


def arg_specs(family, params):
    """pybind11 argument declarations; a required parameter after a
    defaulted one would be a syntax error in Python, so the table must not
    have one."""
    specs, seen_default = [], False
    for _, n in params:
        d = default_of(family, n)
        if d is None:
            assert not seen_default, f"{family['name']}: {n} has no default after a default"
            specs.append(f'py::arg("{py_name(n)}")')
        else:
            seen_default = True
            specs.append(f'py::arg("{py_name(n)}") = {d}')
    return specs


def cxx_params(params):
    return ", ".join(f"{t} {py_name(n)}" for t, n in params)


def cxx_args(params):
    return ", ".join(py_name(n) for _, n in params)


def family_bindings(f):
    nm = f["name"]
    out = [f'{{  // {nm}', f'  py::module_ m = parent.def_submodule("{MODULE_NAMES.get(nm.lower(), nm.lower())}", {doc_literal(f["doc"])});']
    for suffix, params, var, tail in api.function_sets(f):
        pyfn = {"Pdf": "pdf", "Cdf": "cdf", "InvCdf": "inv"}[suffix]
        tail_param = ", bool upper" if tail else ""
        tail_arg = ", upper" if tail else ""
        args = cxx_args(params)
        specs = [f'py::arg("{var}")'] + arg_specs(f, params) + ["py::kw_only()"]
        if tail:
            specs.append('py::arg("upper") = false')
        specs.append('py::arg("out") = py::none()')
        out.append(f'  m.def("{pyfn}", [](py::handle {var}, {cxx_params(params)}{tail_param}, py::handle out) {{')
        out.append(f"    return evaluate({var}, out,")
        out.append(f"        [=](double v) {{ return qel::{nm}{suffix}(v, {args}{tail_arg}); }},")
        out.append(f"        [=](double* o, const double* i, unsigned long c) {{ qel::{nm}{suffix}(o, i, c, {args}{tail_arg}); }});")
        out.append(f"  }}, {', '.join(specs)});")
    for name, first, rest, _ in api.PVALUES:
        sub, pyfn = PVALUE_TARGETS[name]
        if sub != nm.lower():
            continue
        plain = [(t, n) for t, n in rest if t != "EAlternative"]
        args = ", ".join(["v"] + [py_name(n) if t != "EAlternative" else "alt" for t, n in rest])
        guard = ""
        if first[0] == "int":
            # A statistic that is not a whole int has no P-value.
            args = args.replace("v", "static_cast<int>(v)", 1)
            guard = "if (!isWholeInt(v)) return kNaN; "
        specs = [f'py::arg("{first[1]}")'] + [f'py::arg("{py_name(n)}")' for _, n in plain if n != "k"]
        specs.append('py::arg("alternative") = "two-sided"')
        if any(n == "k" for _, n in plain):
            specs.append('py::arg("k") = 1')
        extra_sig = "".join(f", {t} {py_name(n)}" for t, n in plain if n != "k")
        k_sig = ", int k" if any(n == "k" for _, n in plain) else ""
        out.append(f'  m.def("{pyfn}", [](py::handle {first[1]}{extra_sig}, const std::string& alternative{k_sig}) {{')
        out.append("    const qel::EAlternative alt = alternativeOf(alternative);")
        out.append(f"    auto one = [=](double v) {{ {guard}return qel::{name}({args}); }};")
        out.append(f"    return evaluate({first[1]}, py::none(), one, loopOver(one));")
        out.append(f"  }}, {', '.join(specs)});")
    out.append("}")
    return out


def doc_literal(text):
    return '"' + text.replace("\\", "\\\\").replace('"', '\\"').replace("\n", " ") + '"'


def main():
    lines = ["// GENERATED by tools/codegen/gen_python_distributions.py from the tables of",
             "// gen_distribution_api.py; edit those, not this file.",
             "// Included by python/src/distributions.cpp inside registerFamilies(parent)."]
    for f in api.FAMILIES:
        lines += family_bindings(f)
    path = os.path.join(ROOT, "python", "src", "distributions_table.inc")
    with open(path, "w") as inc:
        inc.write("\n".join(lines) + "\n")
    api.format_in_place(path)
    print("wrote python/src/distributions_table.inc")


if __name__ == "__main__":
    main()

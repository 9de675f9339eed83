#!/usr/bin/env python3
"""Generates the exported distribution families from one table.

Writes
  include/qel/distributions.h                        declarations (readable)
  src/interfaces/math/random_distributions_table.inc definitions (frames)

Each family stands for six exported functions: scalar and array forms of
Pdf, Cdf (with a final bool upperTail) and InvCdf. The scalar form takes the
variable first; the array form takes out, in, count, then the same
parameters. Run after editing the table: python3 tools/codegen/gen_distribution_api.py
"""
import os

ROOT = os.path.normpath(os.path.join(os.path.dirname(__file__), "..", ".."))

D = "double"
I = "int"

# name, parameter list (type, name) shared by the three functions unless
# overridden, frame ("armed" or "bare"), overrides, comment.
# Overrides: pdf/cdf/inv -> parameter list; kernel_pdf/kernel_cdf/kernel_inv
# -> kernel expression name (default m<Name>Pdf etc.).
FAMILIES = [
    dict(name="Beta", domain="positive(a) && positive(b)",
         params=[(D, "a"), (D, "b")], doc="Beta(a, b) on [0, 1]."),
    dict(name="Binomial", domain="n >= 0 && probability(p)",
         domain_cdf="count(n) && probability(p)",
         params=[(I, "n"), (D, "p")], cdf=[(D, "n"), (D, "p")],
         doc="Binomial(n, p). Pdf and InvCdf take an int n, Cdf a double n.\n"
             "The upper tail includes the point: P(X >= x)."),
    dict(name="Cauchy", domain="finite(location) && positive(scale)",
         params=[(D, "location"), (D, "scale")], doc="Cauchy(location, scale)."),
    dict(name="ChiSq", domain="positive(df) && nonNegative(noncentrality)",
         params=[(D, "df"), (D, "noncentrality")], pdf=[(D, "df")],
         doc="Chi-square with df degrees of freedom and a noncentrality (0: central).\n"
             "The density is that of the central law."),
    dict(name="Exponential", domain="positive(scale) && finite(threshold)",
         params=[(D, "scale"), (D, "threshold")],
         doc="Exponential(scale) shifted by threshold."),
    dict(name="F", domain="positive(df1) && positive(df2) && nonNegative(noncentrality)",
         params=[(D, "df1"), (D, "df2"), (D, "noncentrality")],
         pdf=[(D, "df1"), (D, "df2")],
         doc="F(df1, df2) with a noncentrality (0: central). The density is central."),
    dict(name="Gamma", domain="positive(shape) && positive(scale) && finite(threshold)",
         params=[(D, "shape"), (D, "scale"), (D, "threshold")],
         doc="Gamma(shape, scale) shifted by threshold."),
    dict(name="Geometric", domain="p > 0.0 && p <= 1.0",
         params=[(D, "p")],
         kernel_pdf="geometricPdf", kernel_cdf="geometricCdf", kernel_inv="geometricInvCdf",
         doc="Geometric: the number of trials up to the first success (negative\n"
             "binomial with r = 1)."),
    dict(name="HalfNormal", domain="positive(scale) && finite(location)",
         params=[(D, "scale"), (D, "location")],
         doc="Half-normal(scale) above location."),
    dict(name="Hypergeometric", domain="N >= 0 && M >= 0 && n >= 0 && M <= N && n <= N",
         params=[(I, "N"), (I, "M"), (I, "n")],
         doc="Hypergeometric: population N, M of them marked, sample n. The upper\n"
             "tail includes the point."),
    dict(name="IntegerUniform", domain="lower <= upper",
         params=[(I, "lower"), (I, "upper")],
         doc="Discrete uniform on the integers lower..upper."),
    dict(name="LargestExtremeValue", domain="finite(location) && positive(scale)",
         params=[(D, "location"), (D, "scale")],
         doc="Largest extreme value (Gumbel) distribution."),
    dict(name="Lambda", domain="finite(lambda) && finite(location) && positive(scale)",
         params=[(D, "lambda"), (D, "location"), (D, "scale")],
         doc="Tukey's lambda distribution."),
    dict(name="Laplace", domain="finite(location) && positive(scale)",
         params=[(D, "location"), (D, "scale")], doc="Laplace(location, scale)."),
    dict(name="Logistic", domain="finite(location) && positive(scale)",
         params=[(D, "location"), (D, "scale")], doc="Logistic(location, scale)."),
    dict(name="LogLogistic", domain="finite(location) && positive(scale) && finite(threshold)",
         params=[(D, "location"), (D, "scale"), (D, "threshold")],
         doc="Log-logistic: log(X - threshold) is Logistic(location, scale)."),
    dict(name="LogNormal", domain="finite(location) && positive(scale) && finite(threshold)",
         params=[(D, "location"), (D, "scale"), (D, "threshold")],
         doc="Log-normal: log(X - threshold) is Normal(location, scale)."),
    dict(name="NegBinomial", domain="p > 0.0 && p <= 1.0 && count(r) && r >= 1.0",
         params=[(D, "p"), (D, "r")],
         doc="Negative binomial: the number of trials up to the r-th success\n"
             "(support starts at r)."),
    dict(name="Normal", domain="finite(mean) && positive(sigma)",
         params=[(D, "mean"), (D, "sigma")], doc="Normal(mean, sigma)."),
    dict(name="Poisson", domain="nonNegative(mean)",
         params=[(D, "mean")], doc="Poisson(mean). The upper tail includes the point."),
    dict(name="SmallestExtremeValue", domain="finite(location) && positive(scale)",
         params=[(D, "location"), (D, "scale")],
         kernel_pdf="smallestExtremeValuePdf", doc="Smallest extreme value distribution."),
    dict(name="T", domain="positive(df) && finite(noncentrality)",
         params=[(D, "df"), (D, "noncentrality")],
         doc="Student's t with df degrees of freedom and a noncentrality (0: central)."),
    dict(name="Triangular", domain="finite(lower) && finite(upper) && lower <= mode && mode <= upper && lower < upper && finite(upper - lower)",
         params=[(D, "lower"), (D, "mode"), (D, "upper")],
         doc="Triangular on [lower, upper] with its peak at mode."),
    dict(name="Uniform", domain="finite(lower) && finite(upper) && lower < upper && finite(upper - lower)",
         params=[(D, "lower"), (D, "upper")], frame="bare",
         cli_defaults={"lower": "0.0", "upper": "1.0"},
         doc="Uniform on [lower, upper]. Bare frame: no floating-point state change and\n"
             "no parameter check (lower == upper divides by zero and gives infinity)."),
    dict(name="Weibull", domain="positive(shape) && positive(scale) && finite(threshold)",
         params=[(D, "shape"), (D, "scale"), (D, "threshold")],
         doc="Weibull(shape, scale) shifted by threshold."),
]

# P-value and critical-value functions: name, parameters after the first
# argument (all armed, kernel m<name>).
PVALUES = [
    ("BinomialPValue", (D, "x"), [(I, "n"), (D, "p"), ("EAlternative", "alternative")],
     "n >= 0 && probability(p)"),
    ("ChiSqPValue", (D, "x"), [(D, "df"), ("EAlternative", "alternative")], "positive(df)"),
    ("ChiSqCritValue", (D, "alpha"), [(D, "df"), ("EAlternative", "alternative")], "positive(df)"),
    ("FPValue", (D, "x"), [(D, "df1"), (D, "df2"), ("EAlternative", "alternative")],
     "positive(df1) && positive(df2)"),
    ("FCritValue", (D, "alpha"), [(D, "df1"), (D, "df2"), ("EAlternative", "alternative")],
     "positive(df1) && positive(df2)"),
    ("HypergeometricPValue", (I, "x"), [(I, "N"), (I, "M"), (I, "n"),
                                        ("EAlternative", "alternative")],
     "N >= 0 && M >= 0 && n >= 0 && M <= N && n <= N"),
    ("NormalPValue", (D, "z"), [("EAlternative", "alternative")], "true"),
    ("NormalCritValue", (D, "alpha"), [("EAlternative", "alternative")], "true"),
    ("TPValue", (D, "t"), [(D, "df"), ("EAlternative", "alternative")], "positive(df)"),
    ("TCritValue", (D, "alpha"), [(D, "df"), ("EAlternative", "alternative"), (I, "k")],
     "positive(df) && k >= 1"),
    ("TSidakCritValue", (D, "alpha"), [(D, "df"), ("EAlternative", "alternative"), (I, "k")],
     "positive(df) && k >= 1"),
]

PREDICATES = ("finite", "positive", "nonNegative", "probability", "count")

# Families on the integers: a mass instead of a density, an upper tail that
# includes the point.
DISCRETE = {"Binomial", "Geometric", "Hypergeometric", "IntegerUniform", "NegBinomial", "Poisson"}

# One Doxygen line for each P-value and critical-value function.
PVALUE_DOCS = {
    "BinomialPValue": "P-value of the count x under Binomial(n, p).",
    "ChiSqPValue": "P-value of a chi-square statistic x on df degrees of freedom.",
    "ChiSqCritValue": "Critical value of the chi-square law on df degrees of freedom at level alpha.",
    "FPValue": "P-value of an F statistic x on df1 and df2 degrees of freedom.",
    "FCritValue": "Critical value of the F law on df1 and df2 degrees of freedom at level alpha.",
    "HypergeometricPValue": "P-value of the count x under Hypergeometric(N, M, n).",
    "NormalPValue": "P-value of a standard normal statistic z.",
    "NormalCritValue": "Critical value of the standard normal law at level alpha.",
    "TPValue": "P-value of a t statistic on df degrees of freedom.",
    "TCritValue": "Critical value of t on df degrees of freedom at level alpha / k (Bonferroni).",
    "TSidakCritValue": "Critical value of t on df degrees of freedom at level 1 - (1 - alpha)^(1/k)\n"
                       "(Sidak).",
}


def qualified(expr):
    """The domain expression with its predicates in namespace domain."""
    import re
    return re.sub(r"\b(%s)\(" % "|".join(PREDICATES), r"domain::\1(", expr)


def domain_check(f, suffix, params):
    """The family's domain clauses that speak only of this function's
    parameters (ChiSqPdf has no noncentrality, for instance)."""
    import re
    expr = f.get("domain_" + suffix.lower(), f["domain"])
    family_names = {n for _, n in f["params"]} | {n for k in ("pdf", "cdf", "inv")
                                                   for _, n in f.get(k, [])}
    present = {n for _, n in params}
    clauses = []
    for clause in expr.split(" && "):
        used = set(re.findall(r"\b[A-Za-z_]\w*\b", clause)) & family_names
        if used <= present:
            clauses.append(clause)
    return qualified(" && ".join(clauses)) if clauses else "true"


def plist(params):
    return ", ".join(f"{t} {n}" for t, n in params)


def alist(params):
    return ", ".join(n for _, n in params)


def function_sets(f):
    base = f["params"]
    inv = f.get("inv", base)
    # The probability argument is p, unless a parameter already has that name.
    pname = "probability" if any(n == "p" for _, n in inv) else "p"
    return [
        ("Pdf", f.get("pdf", base), "x", False),
        ("Cdf", f.get("cdf", base), "x", True),
        ("InvCdf", inv, pname, False),
    ]


def function_docs(name, discrete, pname="p"):
    """One Doxygen line for each of the six functions of a family, in the
    order scalar Pdf, Cdf, InvCdf, then the array forms."""
    upper = "P(X >= x)" if discrete else "P(X > x)"
    return [
        ("Mass" if discrete else "Density") + " at x.",
        f"P(X <= x), or {upper} when upperTail is true.",
        f"Quantile: the inverse of the lower tail at {pname}.",
        f"{name}Pdf at each of count values of x, into out.",
        f"{name}Cdf at each of count values of x, into out.",
        f"{name}InvCdf at each of count values of {pname}, into out.",
    ]


def group(out, title, doc, declarations):
    """A Doxygen member group: a heading, its description, the members."""
    out.append("")
    out.append(f"/// \\name {title}")
    for line in doc.split("\n"):
        out.append("/// " + line)
    out.append("//@{")
    for text, declaration in declarations:
        for line in text.split("\n"):
            out.append("/// " + line)
        out.append(declaration)
    out.append("//@}")


def declarations():
    out = []
    for f in FAMILIES:
        decls = []
        for suffix, params, var, tail in function_sets(f):
            ps = params + ([("bool", "upperTail")] if tail else [])
            decls.append(f"QEL_API double {f['name']}{suffix}(double {var}, {plist(ps)});")
        for suffix, params, var, tail in function_sets(f):
            ps = params + ([("bool", "upperTail")] if tail else [])
            decls.append(f"QEL_API void {f['name']}{suffix}(double* out, const double* {var}, "
                         f"unsigned long count, {plist(ps)});")
        docs = function_docs(f["name"], f["name"] in DISCRETE, function_sets(f)[2][2])
        group(out, f["name"], f["doc"], list(zip(docs, decls)))
    dparams = "const double* values, const double* probabilities, int size"
    decls = [
        f"QEL_API double DiscretePdf(double x, {dparams});",
        f"QEL_API double DiscreteCdf(double x, {dparams}, bool upperTail);",
        f"QEL_API double DiscreteInvCdf(double p, {dparams});",
        f"QEL_API void DiscretePdf(double* out, const double* x, unsigned long count, {dparams});",
        f"QEL_API void DiscreteCdf(double* out, const double* x, unsigned long count, {dparams},\n"
        f"                         bool upperTail);",
        f"QEL_API void DiscreteInvCdf(double* out, const double* p, unsigned long count,\n"
        f"                            {dparams});",
    ]
    group(out, "Discrete",
          "Discrete distribution on values with probabilities (size pairs). Bare\n"
          "frame. The first occurrence of a repeated value wins.",
          list(zip(function_docs("Discrete", True), decls)))
    decls = [(PVALUE_DOCS[name], f"QEL_API double {name}({first[0]} {first[1]}, {plist(rest)});")
             for name, first, rest, _ in PVALUES]
    group(out, "P-values and critical values",
          "P-values of test statistics (the tail or tails that the alternative\n"
          "names) and critical values at level alpha. TCritValue divides alpha by k\n"
          "(Bonferroni), TSidakCritValue uses 1 - (1 - alpha)^(1/k).", decls)
    return "\n".join(out)


HEADER = """/// \\file
/// Exported distribution functions. GENERATED by tools/codegen/gen_distribution_api.py
/// from its family table; edit the table, not this file.
///
/// Each family has a density (or mass), a cumulative probability and an
/// inverse, on one number and on an array. Scalar forms answer NaN when no
/// value exists. Every ...Cdf takes a final upperTail flag: false gives
/// P(X <= x), true gives the upper tail computed as a tail of its own (P(X > x)
/// for continuous laws, P(X >= x) for discrete ones), so that a tiny upper
/// tail keeps its relative accuracy.
///
/// Array forms: output first, input second, count third, then the parameters
/// of the scalar form; one floating-point state switch serves the whole
/// column. out may equal the input array.
///
/// Parameters outside a family's domain (a scale, sigma or df that is not
/// positive, a probability outside [0, 1], a count that is not a whole
/// number, NaN, an infinity or the missing value) give NaN, and so does a NaN
/// argument; at x = -inf or +inf a Cdf gives the limit and a Pdf 0. A Cdf is
/// in [0, 1], a Pdf >= 0, a quantile in the support; the missing value is
/// never returned. Exceptions: see the contract at RegisterLynSigfpeHandler
/// in <qel/basic_types.h> (no catch here; a host recovers with catch and
/// ResetFpuStates()).
///
/// Subnormal numbers (magnitude below DBL_MIN = 2.2e-308): the armed state
/// reads a subnormal operand as zero, so a subnormal argument x or p counts as
/// a zero of its sign (GammaCdf(1e-308, 1e-139, 1, 0, false) is the value at
/// 0, namely 0), and a subnormal scale, sigma or df is outside the domain
/// (NaN). Intermediate quantities are kept away from the subnormal range, so
/// normal arguments get the full accuracy.
#ifndef QEL_DISTRIBUTIONS_H
#define QEL_DISTRIBUTIONS_H

#include <qel/basic_types.h>

namespace qel {
%s

/// \\name Studentized range
/// Studentized range (Tukey). The Is...Possible rules mark where critical
/// values are trusted and are asked first. The P-value and critical value run
/// in the armed frame and return the missing value itself (not NaN) for bad
/// arguments (k < 2, df <= 0, alpha outside (0, 1), NaN). Critical values are
/// rounded to two decimals except for k = 2.
//@{
/// True where the critical value of the studentized range of k means on df
/// degrees of freedom at level alpha is trusted.
QEL_API bool IsStudentizedRangePossible(int k, double df, double alpha);
/// The same rule for the studentized maximum (that of the maximum modulus).
QEL_API bool IsStudentizedMaximumPossible(int k, double df, double alpha);
/// The same rule for the studentized maximum modulus.
QEL_API bool IsStudentizedMaximumModulusPossible(int k, double df, double alpha);
/// The q whose upper tail P(Q > q) is alpha, for k means and df degrees of
/// freedom.
QEL_API double GetStudentizedRangeCritValue(double alpha, int k, double df);
/// The upper tail P(Q > q) of the studentized range of k means on df degrees
/// of freedom.
QEL_API double GetStudentizedRangePValue(double q, int k, double df);
//@}

/// \\name Studentized maximum and maximum modulus
/// The studentized maximum (one-sided) and maximum modulus (two-sided) of
/// count normal variables with correlations lambda_i lambda_j (|lambda| < 1;
/// 1/sqrt(2) for comparisons with one control), over an independent estimate
/// of sigma with df degrees of freedom (df = inf: sigma known). Armed frame;
/// the missing value itself for count 0, a null array, |lambda| >= 1, df <= 0,
/// alpha outside (0, 1) or NaN arguments. P-values are upper tails: 1 for the
/// modulus at x <= 0; the maximum takes any x. Critical values are rounded to
/// two decimals except for count 1 (Student's t quantile).
//@{
/// The x whose upper tail P(max_i Z_i / s > x) is alpha.
QEL_API double GetStudentizedMaximumCritValue(double alpha, double df, const double* lambdas,
                                              unsigned count);
/// The upper tail P(max_i Z_i / s > x).
QEL_API double GetStudentizedMaximumPValue(double x, double df, const double* lambdas,
                                           unsigned count);
/// The x whose upper tail P(max_i |Z_i| / s > x) is alpha.
QEL_API double GetStudentizedMaximumModulusCritValue(double alpha, double df, const double* lambdas,
                                                     unsigned count);
/// The upper tail P(max_i |Z_i| / s > x).
QEL_API double GetStudentizedMaximumModulusPValue(double x, double df, const double* lambdas,
                                                  unsigned count);
//@}

namespace v0 {

/// \\name Normal range
/// The range of k independent standard normal variables: P(R <= r) or, with
/// upperTail, P(R > r), each tail to full relative precision; and the r with
/// P(R <= r) = p. Armed frame; NaN for k < 2, NaN arguments or p outside [0, 1).
//@{
/// P(R <= r), or P(R > r) when upperTail is true.
QEL_API double NormalRangeCdf(double r, int k, bool upperTail);
/// The r with P(R <= r) = p.
QEL_API double NormalRangeInvCdf(double p, int k);
//@}

}  // namespace v0
}  // namespace qel

#endif
"""


def definitions():
    out = ["// GENERATED by tools/codegen/gen_distribution_api.py; edit its table instead.",
           "// Included by random_distributions.cpp inside namespace qel."]
    for f in FAMILIES:
        bare = f.get("frame") == "bare"
        frame = "frame::bare" if bare else "frame::armed"
        array = "frame::checkedBareArray" if bare else "frame::checkedArmedArray"
        for suffix, params, var, tail in function_sets(f):
            kernel = f.get("kernel_" + {"Pdf": "pdf", "Cdf": "cdf", "InvCdf": "inv"}[suffix],
                           f"m{f['name']}{suffix}")
            ps = params + ([("bool", "upperTail")] if tail else [])
            # The cast picks the overload with this parameter list (several
            # Cdf kernels also have a both-tails form).
            types = ", ".join(["double"] + [t for t, _ in ps])
            kernel = f"static_cast<double (*)({types})>({kernel})"
            out.append(f"QEL_DEFINE_FAMILY_FUNCTION({f['name']}{suffix}, domain::Kind::k{suffix},")
            out.append(f"                           {kernel},")
            out.append(f"                           {frame}, {array},")
            out.append(f"                           ({plist(ps)}), ({alist(ps)}),")
            out.append(f"                           {domain_check(f, suffix, params)},")
            out.append(f"                           {'upperTail' if tail else 'false'})")
    for name, first, rest, dom in PVALUES:
        out.append(f"double {name}({first[0]} {first[1]}, {plist(rest)}) {{")
        if dom != "true":
            out.append(f"  if (!({qualified(dom)})) return mQuietNaN();")
        if first[0] == D:
            out.append("  double answer;")
            if first[1] == "alpha":
                out.append(f"  if (domain::decidedLevel({first[1]}, &answer)) return answer;")
            else:
                out.append(f"  if (domain::decidedStatistic({first[1]}, alternative, &answer)) "
                           "return answer;")
        out.append(f"  return frame::armed(m{name}, {first[1]}, {alist(rest)});")
        out.append("}")
    return "\n".join(out) + "\n"


def format_in_place(path):
    """clang-format with the repository's style, where it is installed."""
    import shutil
    import subprocess
    if shutil.which("clang-format"):
        subprocess.run(["clang-format", "-i", path], check=True)


def main():
    header = os.path.join(ROOT, "include", "qel", "distributions.h")
    with open(header, "w") as h:
        h.write(HEADER % declarations())
    format_in_place(header)
    with open(os.path.join(ROOT, "src", "interfaces", "math", "random_distributions_table.inc"),
              "w") as inc:
        inc.write(definitions())
    print("wrote include/qel/distributions.h and src/interfaces/math/random_distributions_table.inc")


if __name__ == "__main__":
    main()


def demangled_names():
    """The demangled names of the generated functions, as nm -C prints them."""
    def t(ty):
        return {"EAlternative": "qel::EAlternative"}.get(ty, ty)

    names = []
    for f in FAMILIES:
        for suffix, params, var, tail in function_sets(f):
            types = [t(ty) for ty, _ in params] + (["bool"] if tail else [])
            names.append(f"qel::{f['name']}{suffix}({', '.join(['double'] + types)})")
            names.append(f"qel::{f['name']}{suffix}(double*, double const*, unsigned long, "
                         f"{', '.join(types)})")
    d = "double const*, double const*, int"
    for suffix, tail in (("Pdf", False), ("Cdf", True), ("InvCdf", False)):
        extra = ", bool" if tail else ""
        names.append(f"qel::Discrete{suffix}(double, {d}{extra})")
        names.append(f"qel::Discrete{suffix}(double*, double const*, unsigned long, {d}{extra})")
    for name, first, rest, _ in PVALUES:
        names.append(f"qel::{name}({', '.join([t(first[0])] + [t(ty) for ty, _ in rest])})")
    return names


# Defaults of qelcalc's options; parameters not listed must be given.
CLI_DEFAULTS = {"location": "0.0", "scale": "1.0", "threshold": "0.0", "mean": "0.0",
                "sigma": "1.0", "noncentrality": "0.0"}


def cli_table():
    """Entries of qelcalc's family table: one lambda per function."""
    out = ["// GENERATED by tools/codegen/gen_distribution_api.py; edit its table instead.",
           "// Included by apps/qelcalc/distribution_mode.cpp."]
    for f in FAMILIES:
        names = []
        for _, params, _, _ in function_sets(f):
            for _, n in params:
                if n not in names:
                    names.append(n)

        def args(params):
            parts = []
            for ty, n in params:
                v = f"v[{names.index(n)}]"
                parts.append(f'toInt({v}, "{n}")' if ty == "int" else v)
            return ", ".join(parts)

        defaults = dict(CLI_DEFAULTS, **f.get("cli_defaults", {}))
        plist_cli = ", ".join("{\"%s\", %s}" % (n, defaults.get(n, "NAN")) for n in names)
        (_, pdf, _, _), (_, cdf, _, _), (_, inv, _, _) = function_sets(f)
        nm = f["name"]
        out.append("{\"%s\", {%s}," % (nm.lower(), plist_cli))
        out.append(f" [](double x, const Values& v) {{ return qel::{nm}Pdf(x, {args(pdf)}); }},")
        out.append(f" [](double x, const Values& v, bool u) {{ return qel::{nm}Cdf(x, {args(cdf)}, u); }},")
        out.append(f" [](double x, const Values& v) {{ return qel::{nm}InvCdf(x, {args(inv)}); }},")
        out.append(f" [](double* o, const double* x, unsigned long c, const Values& v) {{ qel::{nm}Pdf(o, x, c, {args(pdf)}); }},")
        out.append(f" [](double* o, const double* x, unsigned long c, const Values& v, bool u) {{ qel::{nm}Cdf(o, x, c, {args(cdf)}, u); }},")
        out.append(f" [](double* o, const double* x, unsigned long c, const Values& v) {{ qel::{nm}InvCdf(o, x, c, {args(inv)}); }}}},")
    return "\n".join(out) + "\n"


if __name__ == "__main__":
    with open(os.path.join(ROOT, "apps", "qelcalc", "families_table.inc"), "w") as inc:
        inc.write(cli_table())


def signature_test():
    """A program linked against libqel.so that takes the address of every
    generated function as a pointer of its exact type: a missing export or a
    changed signature fails to link or to compile."""
    out = ["// GENERATED by tools/codegen/gen_distribution_api.py; edit its table instead.",
           "// Links against the shared library: every exported distribution function",
           "// must be there with exactly this signature.",
           "#include <qel/distributions.h>", "", "#include <cstdio>", "",
           "int main() {", "  int count = 0;",
           "  auto check = [&count](const void* address) { count += address != nullptr; };"]

    def emit(ret, name, types):
        out.append(f"  check(reinterpret_cast<const void*>(static_cast<{ret} (*)({', '.join(types)})>(&qel::{name})));")

    for f in FAMILIES:
        for suffix, params, var, tail in function_sets(f):
            types = [t for t, _ in params] + (["bool"] if tail else [])
            emit("double", f"{f['name']}{suffix}", ["double"] + types)
            emit("void", f"{f['name']}{suffix}", ["double*", "const double*", "unsigned long"] + types)
    d = ["const double*", "const double*", "int"]
    for suffix, tail in (("Pdf", False), ("Cdf", True), ("InvCdf", False)):
        extra = ["bool"] if tail else []
        emit("double", f"Discrete{suffix}", ["double"] + d + extra)
        emit("void", f"Discrete{suffix}", ["double*", "const double*", "unsigned long"] + d + extra)
    for name, first, rest, _ in PVALUES:
        emit("double", name, [first[0]] + [("qel::" + t if t == "EAlternative" else t) for t, _ in rest])
    out += ['  std::printf("%d exported distribution functions linked\\n", count);',
            f"  return count == {len(demangled_names())} ? 0 : 1;", "}"]
    return "\n".join(out) + "\n"


if __name__ == "__main__":
    with open(os.path.join(ROOT, "tests", "exported_signatures.cpp"), "w") as t:
        t.write(signature_test())

#!/usr/bin/env python3
"""qelcalc as people use it: round-trip printing, domain errors, per-mode help
with runnable examples, and the SVG pictures (parsed, and their coordinates
checked against values computed here from the data).

Usage: check_qelcalc_output.py QELCALC WORKDIR printing|domain|help|svg|render
"""
import math
import os
import re
import shutil
import statistics
import subprocess
import sys
import xml.etree.ElementTree as ET

QELCALC, WORK, WHAT = os.path.abspath(sys.argv[1]), os.path.abspath(sys.argv[2]), sys.argv[3]
NUMBER = re.compile(r"^-?(\d+\.?\d*|\.\d+)(e[-+]?\d+)?$")
failures = []


def run(args, stdin="", env=None, shell=False):
    return subprocess.run(args if shell else [QELCALC] + args, input=stdin, text=True,
                          capture_output=True, cwd=WORK, env=env, shell=shell)


def check(ok, what):
    if not ok:
        failures.append(what)


def mantissa_digits(token):
    return len(re.sub(r"^0+|0+$", "", re.sub(r"e.*$|[-.]", "", token))) or 1


def printing():
    column = "0.1\n2.5\n-3\n7e-12\n123456.789\n"
    cases = [(["normal", "cdf", "-30"], ""), (["normal", "cdf", "1.96", "--upper"], ""),
             (["t", "inv", "0.975", "--df", "7"], ""), (["gamma", "pdf", "--shape", "3"], column),
             (["describe"], column), (["summary", "-"], column), (["quad", "legendre", "5"], ""),
             (["power", "t", "--n", "10,20", "--effect", "1"], ""), (["ticks", "0.1", "0.7"], ""),
             (["pvalue", "t", "2.1", "--df", "15"], ""), (["fit", "-", "--dist", "normal"], "1\n2\n4\n")]
    for args, stdin in cases:
        short, full = run(args, stdin), run(args + ["--digits", "17"], stdin)
        three = run(["--digits", "3"] + args, stdin)
        a, b, c = short.stdout.split(), full.stdout.split(), three.stdout.split()
        check(short.returncode == 0 and len(a) == len(b) == len(c) and a, f"{args}: outputs differ")
        for s, f, t in zip(a, b, c):
            if not NUMBER.match(s):
                continue
            # 17 significant digits name one double; the short form must name the same.
            check(float(s) == float(f), f"{args}: {s} does not read back as {f}")
            k = mantissa_digits(s)
            check(k == 1 or float("%.*g" % (k - 1, float(s))) != float(s), f"{args}: {s} not shortest")
            check(mantissa_digits(t) <= min(3, mantissa_digits(f)) and math.isclose(float(t), float(f), rel_tol=5e-3),
                  f"{args}: --digits 3 gave {t}")
    check(run(["uniform", "inv", "0.1"]).stdout == "0.1\n", "0.1 is not printed as 0.1")
    check(run(["cauchy", "inv", "1", "--digits", "5"]).stdout == "NaN\n", "NaN is not printed as NaN")
    check(run(["normal", "pdf", "1", "--digits", "18"]).returncode == 2, "--digits 18 taken")


def domain():
    cases = [("normal cdf 1 --sigma 0", "--sigma"), ("logistic cdf 1 --scale -2", "--scale"),
             ("t cdf 1 --df -1", "--df"), ("f cdf 1 --df1 2 --df2 0", "--df2"),
             ("binomial cdf 3 --n 10 --p 1.5", "--p"), ("binomial cdf 3 --n 10.5 --p 0.5", "--n"),
             ("hypergeometric pdf 1 --N 10 --M 3.5 --n 2", "--M"), ("normal inv 1.5", "X"),
             ("crit t -0.1 --df 3", "ALPHA"), ("pvalue t 1 --df 0", "--df"),
             ("sample normal 3 --sd -1", "--sd"), ("sample binomial 3 --n 2.5", "--n"),
             ("ttest - --confidence 1.2", "--confidence"), ("power t --n 10 --effect 1 --sigma 0", "--sigma"),
             ("power t --n 10 --effect 1 --alpha 2", "--alpha"), ("tukey crit 0.05 --k 3 --df 0", "--df"),
             ("summary - --svg x.svg --confidence 1.5", "--confidence"),
             ("test proportion --events 3 --trials 10 --p0 1.5", "--p0")]
    for line, name in cases:
        r = run(line.split(), "1\n2\n3\n")
        check(r.returncode == 2 and r.stdout == "" and r.stderr.count("\n") == 1 and
              r.stderr.startswith("qelcalc: " + name + ": ") and re.search(r"[\[(]", r.stderr),
              f"{line}: exit {r.returncode}, {r.stderr!r}")
    for line in ["binomial cdf 3 --n 10 --p 0", "binomial cdf 3 --n 10 --p 1", "normal inv 0",
                 "normal cdf 1 --sigma 1e-300", "crit t 1 --df 3"]:
        check(run(line.split()).returncode == 0, f"{line}: refused on the edge of its domain")


def help_texts():
    modes = re.findall(r"^  qelcalc (\w+)", run(["--help"]).stdout, re.M)
    check(len(set(modes)) > 20, f"too few modes in --help: {modes}")
    env = dict(os.environ, PATH=os.path.dirname(os.path.abspath(QELCALC)) + os.pathsep + os.environ["PATH"])
    for mode in sorted(set(modes)):
        word = "normal" if mode == "FAMILY" else mode
        a, b = run(["help", word]), run([word, "--help"])
        check(a.returncode == 0 and a.stdout == b.stdout, f"help {word} differs from {word} --help")
        blocks = re.findall(r"^  qelcalc (\S+)", a.stdout.split("example:")[0], re.M)
        check(blocks and set(blocks) == {mode}, f"help {word}: blocks {blocks}")
        example = re.search(r"^example:\n  (.*)$", a.stdout, re.M)
        check(example and re.search(r"\bqelcalc " + word + r"\b", example.group(1)), f"help {word}: no example")
        if example:
            r = run(example.group(1), env=env, shell=True)
            check(r.returncode == 0 and r.stdout, f"example of {word} fails: {r.stderr}")
    check(run(["help", "nosuchmode"]).returncode == 2, "help of an unknown mode")


def scale(labels, convert):
    """Pixel = a + b * value from the tick labels; every label must agree."""
    pts = [(convert(float(t.text)), float(t.get(axis))) for t, axis in labels]
    (v0, p0), (v1, p1) = pts[0], pts[-1]
    b = (p1 - p0) / (v1 - v0)
    for v, p in pts:
        check(abs(p0 + b * (v - v0) - p) < 0.05, f"tick {v} off its axis")
    return lambda v: p0 + b * (v - v0)


def svg_elements(path, cls):
    root = ET.parse(path).getroot()
    return [e for e in root.iter() if e.get("class") == cls]


def near(a, b, what):
    check(abs(float(a) - b) < 0.05, f"{what}: {a} where {b:.3f} belongs")


def pplot_svg():
    x = [4.1, 5.3, 2.2, 6.8, 5.0, 3.9, 4.4, 7.5, 5.9, 4.8, 3.1, 5.6]
    path = os.path.join(WORK, WHAT + "_plot.svg")
    r = run(["pplot", "-", "--dist", "normal", "--svg", path], "\n".join(map(str, x)) + "\n")
    check(r.returncode == 0, f"pplot --svg: {r.stderr}")
    x.sort()
    n, nd = len(x), statistics.NormalDist()
    sx = scale([(t, "x") for t in svg_elements(path, "xtick-label")], lambda v: v)
    sy = scale([(t, "y") for t in svg_elements(path, "ptick-label")], lambda v: nd.inv_cdf(v / 100))
    points = svg_elements(path, "point")
    check(len(points) == n, "pplot: one circle per value")
    for i, (v, c) in enumerate(zip(x, points)):  # median ranks (i + 0.7) / (n + 0.4)
        near(c.get("cx"), sx(v), f"point {v} x")
        near(c.get("cy"), sy(nd.inv_cdf((i + 0.7) / (n + 0.4))), f"point {v} y")
    mean, sd = statistics.fmean(x), statistics.stdev(x)
    (fit,) = svg_elements(path, "fit")
    for end in "12":  # both ends of the fitted line on score = (x - mean) / sd
        value = (float(fit.get("x" + end)) - sx(0)) / (sx(1) - sx(0))
        near(fit.get("y" + end), sy((value - mean) / sd), "fitted line")
    z = [nd.cdf((v - mean) / sd) for v in x]
    a2 = -n - sum((2 * i + 1) * (math.log(z[i]) + math.log1p(-z[n - 1 - i])) for i in range(n)) / n
    notes = " ".join(t.text for t in svg_elements(path, "note"))
    m = re.search(r"AD = (\S+)", notes)
    check(m and abs(float(m.group(1)) - a2) < 5e-4 * a2 and "P-value" in notes, f"notes {notes!r}, AD {a2}")


def boxplot_svg():
    x = [3, 5, 4, 6, 5, 19, 4.5, 5.5, 6.1, 3.9, 4.2, 5.2, -4]  # n = 13: hinges at depth 4
    path = os.path.join(WORK, WHAT + "_box.svg")
    r = run(["summary", "-", "--svg", path], "\n".join(map(str, x)) + "\n")
    check(r.returncode == 0, f"summary --svg: {r.stderr}")
    s = sorted(x)
    low, high, median = s[3], s[-4], s[6]
    fence = 1.5 * (high - low)
    inside = [v for v in s if low - fence <= v <= high + fence]
    sy = scale([(t, "y") for t in svg_elements(path, "ytick-label")], lambda v: v)
    (box,) = svg_elements(path, "box")
    ys = [float(p.split(",")[1]) for p in box.get("points").split()]
    near(max(ys), sy(low), "lower hinge")
    near(min(ys), sy(high), "upper hinge")
    (line,) = svg_elements(path, "median")
    near(line.get("y1"), sy(median), "median")
    caps = sorted(float(c.get("y1")) for c in svg_elements(path, "whisker-cap"))
    near(caps[0], sy(max(inside)), "upper whisker")
    near(caps[1], sy(min(inside)), "lower whisker")
    outliers = sorted(float(c.get("cy")) for c in svg_elements(path, "outlier"))
    check(len(outliers) == 2, "two outliers")
    near(outliers[0], sy(19), "outlier 19")
    near(outliers[1], sy(-4), "outlier -4")
    limits = sorted(float(c.get("y1")) for c in svg_elements(path, "notch-limit"))
    check(len(limits) == 2 and limits[0] <= sy(median) <= limits[1], "notch around the median")


def render():
    browser = shutil.which("chromium") or shutil.which("chromium-browser")
    if not browser:
        print("chromium is absent: skipped")
        sys.exit(77)
    pplot_svg()
    boxplot_svg()
    for name, size in [(WHAT + "_plot", (640, 480)), (WHAT + "_box", (420, 480))]:
        png = os.path.join(WORK, name + ".png")
        if os.path.exists(png):
            os.remove(png)
        subprocess.run([browser, "--headless", "--no-sandbox", "--disable-gpu", "--hide-scrollbars",
                        f"--window-size={size[0]},{size[1]}", "--screenshot=" + png,
                        "file://" + os.path.join(WORK, name + ".svg")], capture_output=True, timeout=120)
        data = open(png, "rb").read() if os.path.exists(png) else b""
        width, height = (int.from_bytes(data[16:20], "big"), int.from_bytes(data[20:24], "big"))
        # A blank page compresses to a few hundred bytes; a drawn plot does not.
        check(data[:8] == b"\x89PNG\r\n\x1a\n" and (width, height) == size and len(data) > 5000,
              f"{png}: {len(data)} bytes, {width}x{height}")


{"printing": printing, "domain": domain, "help": help_texts,
 "svg": lambda: (pplot_svg(), boxplot_svg()), "render": render}[WHAT]()
for f in failures:
    print("FAIL:", f)
sys.exit(1 if failures else 0)

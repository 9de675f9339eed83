// Quantiles from the smaller tail (see tail_quantile.h).
//
// The equation log T(x) = log t, T the smaller tail and t its target, is
// monotone and close to linear in a coordinate c(x) that opens the support
// onto the real line (log x, logit x, asinh x). A bracket is found by steps
// of doubling length in c from the start, and then narrowed by the Illinois
// variant of regula falsi (Dowell & Jarratt 1971), in c while the bracket is
// wide and in x once it is narrow, so that the answer is resolved to the last
// unit of x whatever its size.
#include "utilities/distributions/tail_quantile.h"

#include <cmath>
#include <limits>

#include "utilities/LYNBasicTypes.h"
#include "utilities/elv/precision.h"

namespace qel {

namespace {

constexpr double kInfinity = std::numeric_limits<double>::infinity();
constexpr int kBracketSteps = 60;  // doubling step lengths in c, up to the whole range
constexpr int kNarrowingSteps = 400;

double toCoordinate(double x, TailSupport s) {
  switch (s) {
    case TailSupport::Positive:
      return std::log(x);
    case TailSupport::Unit:
      return std::log(x) - std::log1p(-x);
    case TailSupport::RealLine:
      break;
  }
  return std::asinh(x);
}

double fromCoordinate(double c, TailSupport s) {
  switch (s) {
    case TailSupport::Positive:
      return std::exp(std::fmax(std::fmin(c, 709.0), -708.0));
    case TailSupport::Unit:
      return c > 0.0 ? 1.0 / (1.0 + std::exp(-std::fmin(c, 708.0)))
                     : std::exp(std::fmax(c, -708.0)) / (1.0 + std::exp(std::fmax(c, -708.0)));
    case TailSupport::RealLine:
      break;
  }
  return std::sinh(std::fmax(std::fmin(c, 709.0), -709.0));
}

bool inside(double x, TailSupport s) {
  if (!std::isfinite(x)) return false;
  if (s == TailSupport::RealLine) return true;
  return x > 0.0 && (s == TailSupport::Positive || x < 1.0);
}

// The increasing function whose root is the quantile; NaN when the tails
// failed.
struct Equation {
  const TailPair& tails;
  bool upper;
  double logTarget;

  double operator()(double x) const {
    double lower = 0.0, up = 0.0;
    if (!tails(x, &lower, &up) || std::isnan(lower) || std::isnan(up)) return NAN;
    const double tail = upper ? up : lower;
    if (!(tail > 0.0)) return upper ? kInfinity : -kInfinity;
    const double g = std::log(tail) - logTarget;
    return upper ? -g : g;
  }
};

struct Point {
  double x, g;
};

// Doubling steps in c from the start until g changes sign.
bool bracket(const Equation& eq, TailSupport s, double start, double firstStep, Point* a,
             Point* b) {
  Point p{start, eq(start)};
  if (std::isnan(p.g)) return false;
  if (p.g == 0.0) {
    *a = *b = p;
    return true;
  }
  const double direction = p.g < 0.0 ? 1.0 : -1.0;
  const double c0 = toCoordinate(start, s);
  double step = firstStep;
  double previous = start;
  for (int i = 0; i < kBracketSteps; ++i, step += step) {
    const double x = fromCoordinate(c0 + direction * std::fmin(step, 2000.0), s);
    if (!inside(x, s) || x == previous) return false;  // the end of the support
    previous = x;
    const Point q{x, eq(x)};
    if (std::isnan(q.g)) return false;
    if ((q.g >= 0.0) != (p.g >= 0.0) || q.g == 0.0) {
      *a = direction > 0.0 ? p : q;
      *b = direction > 0.0 ? q : p;
      return true;
    }
    p = q;
  }
  return false;
}

// Next trial point in (a, b) from the secant in the right coordinate.
// The point a fraction w of the way from a to b, for ends of one sign, formed
// from their ratio: near 1e-300 their difference would be subnormal, which
// the armed floating-point state reads as 0.
double between(double a, double b, double w) {
  return a * (1.0 + w * (b / a - 1.0));
}

// Whether a and b are of one sign and within a relative distance r.
bool within(double a, double b, double r) {
  if (!((a > 0.0 && b > 0.0) || (a < 0.0 && b < 0.0))) return false;
  return std::fabs(a) <= std::fabs(b) ? std::fabs(b) / std::fabs(a) - 1.0 < r
                                      : std::fabs(a) / std::fabs(b) - 1.0 < r;
}

double trialPoint(const Point& a, const Point& b, double ga, double gb, TailSupport s) {
  const bool finite = std::isfinite(ga) && std::isfinite(gb);
  const double w = finite ? ga / (ga - gb) : 0.5;
  if (within(a.x, b.x, 0.25) && s != TailSupport::Unit) return between(a.x, b.x, w);
  if (s == TailSupport::Unit && std::fabs(b.x - a.x) < 0.25 * std::fmin(a.x, 1.0 - b.x)) {
    return a.x + w * (b.x - a.x);
  }
  const double ca = toCoordinate(a.x, s), cb = toCoordinate(b.x, s);
  return fromCoordinate(ca + w * (cb - ca), s);
}

double narrow(const Equation& eq, TailSupport s, Point a, Point b) {
  double ga = a.g, gb = b.g;  // Illinois: the retained end's value is halved
  int side = 0;
  for (int i = 0; i < kNarrowingSteps; ++i) {
    if (a.g == 0.0) return a.x;
    if (b.g == 0.0) return b.x;
    double x = trialPoint(a, b, ga, gb, s);
    if (!(x > a.x && x < b.x))
      x = within(a.x, b.x, 1.0) ? between(a.x, b.x, 0.5) : a.x + 0.5 * (b.x - a.x);
    if (!(x > a.x && x < b.x)) break;  // adjacent doubles
    const Point m{x, eq(x)};
    if (std::isnan(m.g)) return mGetMissingValueCode();
    if (m.g < 0.0) {
      a = m;
      ga = m.g;
      if (side == -1) gb *= 0.5;
      side = -1;
    } else {
      b = m;
      gb = m.g;
      if (side == 1) ga *= 0.5;
      side = 1;
    }
    // Ends of one sign stop on their ratio (their difference may be
    // subnormal), ends around 0 on their distance.
    const bool oneSign = (a.x > 0.0) == (b.x > 0.0);
    if (oneSign ? within(a.x, b.x, 2e-16)
                : b.x - a.x <= 2e-16 * std::fmax(std::fabs(a.x), std::fabs(b.x))) {
      break;
    }
  }
  return std::fabs(a.g) <= std::fabs(b.g) ? a.x : b.x;
}

}  // namespace

double mTailQuantile(const TailPair& tails, double p, TailSupport support, double start,
                     double firstStep) {
  if (!(p > 0.0 && p < 1.0) || !inside(start, support)) return mGetMissingValueCode();
  const bool upper = p > 0.5;
  const Equation eq{tails, upper, std::log(upper ? 1.0 - p : p)};
  Point a{}, b{};
  if (!bracket(eq, support, start, firstStep, &a, &b)) {
    // On (0, 1) a quantile closer to 1 than the last double below it rounds
    // to 1.
    if (support == TailSupport::Unit && upper) {
      const double below = std::nextafter(1.0, 0.0);
      const double g = eq(below);
      if (!std::isnan(g) && g < 0.0) return 1.0;
    }
    // A lower quantile below the smallest normal double (a gamma or beta law
    // of small shape at a tiny p, whose quantile is p^(1/shape) in order of
    // magnitude) rounds to 0.
    if (support != TailSupport::RealLine && !upper) {
      const double g = eq(fromCoordinate(-kInfinity, support));
      if (!std::isnan(g) && g > 0.0) return 0.0;
    }
    return mGetMissingValueCode();
  }
  if (a.x == b.x) return a.x;
  return narrow(eq, support, a, b);
}

double mPolishedQuantile(const TailPair& tails, double p, TailSupport support, double q) {
  if (elv::elvPrecision() != elv::ElvPrecision::Full || mIsNumericMissing(q) ||
      !inside(q, support) || !(p > 0.0 && p < 1.0)) {
    return q;
  }
  const double polished = mTailQuantile(tails, p, support, q, 1e-9);
  return mIsNumericMissing(polished) ? q : polished;
}

namespace {

// 1 when k reaches p, 0 when not, -1 when the tails failed.
int reaches(const TailPair& tails, double p, double k) {
  double lower = 0.0, above = 0.0;
  if (!tails(k, &lower, &above) || std::isnan(lower) || std::isnan(above)) return -1;
  return (p <= 0.5 ? lower >= p : above <= 1.0 - p) ? 1 : 0;
}

}  // namespace

double mDiscreteTailQuantile(const TailPair& tails, double p, double lo, double start,
                             double last) {
  if (!(p > 0.0 && p < 1.0)) return mGetMissingValueCode();
  double below = lo - 1.0;  // does not reach p
  double high = std::fmax(std::fmin(start, last), lo);
  for (;;) {
    const int r = reaches(tails, p, high);
    if (r < 0) return mGetMissingValueCode();
    if (r == 1) break;
    if (high >= last) return mGetMissingValueCode();
    below = high;
    high = std::fmin(2.0 * high + 1.0, last);
  }
  while (high - below > 1.0) {
    const double mid = std::floor(below + 0.5 * (high - below));
    const int r = reaches(tails, p, mid);
    if (r < 0) return mGetMissingValueCode();
    (r == 1 ? high : below) = mid;
  }
  return high;
}

}  // namespace qel

// Differential sweep of the exported distribution functions against their
// kernels. The exported function runs its kernel armed (denormal operands read
// as zero, traps on invalid, division by zero and overflow); the same kernel is
// run here with deep tails in a reference state: the default state, or with
// --traps the armed state without denormals-are-zero, which isolates that one
// bit. Each disagreement beyond 1e-13 relative, or a 0, NaN or exception
// against a normal number, is printed as a candidate for a check at high
// precision; a summary per function follows.
//
//   daz_sweep [seconds per function] [seed] [--traps]
#include <qel/distributions.h>

#include <algorithm>
#include <cfloat>
#include <chrono>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <random>
#include <string>
#include <vector>

#include "interfaces/math/domains.h"
#include "utilities/LYNBasicTypes.h"
#include "utilities/distributions/kernels.h"
#include "utilities/elv/limits.h"

namespace {

using P = const double*;
using Fn = std::function<double(double, P)>;

// Parameter kinds: positive, signed location, probability, noncentrality,
// count (>= 1), small count (a 32-bit int), lambda of Tukey's family.
enum Kind { kPos, kLoc, kProb, kNcp, kCount, kInt, kLambda };

struct Function {
  std::string name;
  char what;  // 'p' density, 'l' lower tail, 'u' upper tail, 'i' quantile
  std::vector<Kind> kinds;
  Fn kernel, exported, quantile;  // quantile: the kernel's, to place x
  bool discrete;
};

std::mt19937_64 rng;

double uniform(double lo, double hi) {
  return std::uniform_real_distribution<double>(lo, hi)(rng);
}

// 10^e with e uniform over one of the bands: the whole range, the deep
// bands next to the underflow and overflow limits, near 1e-10 and 1e10, or
// ordinary sizes.
double logUniformBand() {
  static const double bands[][2] = {{-300, 300}, {-300, -290}, {-20, -8},   {-3, 3},
                                    {8, 20},     {290, 300},   {-308, -300}};
  const auto& b = bands[rng() % 7];
  return std::pow(10.0, uniform(b[0], b[1]));
}

double draw(Kind kind) {
  switch (kind) {
    case kPos:
      return std::max(logUniformBand(), DBL_MIN);
    case kLoc:
      return rng() % 3 == 0 ? 0.0 : (rng() % 2 ? 1 : -1) * logUniformBand();
    case kProb: {
      const double v = std::min(logUniformBand(), 0.5);
      return rng() % 2 ? v : 1.0 - v;
    }
    case kNcp:
      return rng() % 4 == 0 ? 0.0 : logUniformBand();
    case kCount:
      return std::floor(std::min(1.0 + logUniformBand(), 9e15));
    case kInt:
      return std::floor(std::min(logUniformBand(), 2e9));
    case kLambda:
      return rng() % 4 == 0 ? 0.0 : (rng() % 2 ? 1 : -1) * std::pow(10.0, uniform(-12, 3));
  }
  return 0.0;
}

// Probabilities down to denormals, from either end.
double drawP() {
  const double v = std::min(std::pow(10.0, uniform(-320, 0)), 1.0);
  switch (rng() % 4) {
    case 0:
      return v;
    case 1:
      return 1.0 - v;
    case 2:
      return DBL_MIN * uniform(0.0, 4.0);
    default:
      return std::pow(10.0, uniform(-310, -280));
  }
}

// Parameters that the exported function accepts, in the same ordering
// relations as its domain check.
std::vector<double> drawParameters(const Function& f) {
  std::vector<double> p;
  for (Kind k : f.kinds) p.push_back(draw(k));
  const std::string family = f.name.substr(0, f.name.find(' '));
  if (family == "Triangular" || family == "Uniform") {
    std::sort(p.begin(), p.end());
    if (!std::isfinite(p.back() - p.front()) || p.front() == p.back()) p = {0.0, 0.5, 1.0};
  } else if (family == "Hypergeometric") {
    std::sort(p.begin(), p.end(), std::greater<double>());  // N >= M >= n
  } else if (family == "IntegerUniform") {
    std::sort(p.begin(), p.end());
  }
  return p;
}

void setState(std::uint16_t x87, std::uint32_t mxcsr) {
  __asm__ __volatile__("fnclex\n\tfldcw %0\n\tldmxcsr %1" : : "m"(x87), "m"(mxcsr) : "memory");
}

// Kernel in the reference state; exceptions give NaN and flag *threw.
double reference(const Function& f, double x, P p, bool traps, bool* threw) {
  const qel::elv::DeepTailScope deep;
  *threw = false;
  double r;
  const auto kind = f.what == 'p'   ? qel::domain::Kind::kPdf
                    : f.what == 'i' ? qel::domain::Kind::kInvCdf
                                    : qel::domain::Kind::kCdf;
  if (qel::domain::decidedByArgument(kind, x, f.what == 'u', &r)) return r;
  try {
    if (traps) setState(0x272, 0x1900);
    r = f.kernel(x, p);
    setState(0x37F, 0x1F80);
    if (qel::mIsNumericMissing(r)) r = NAN;
  } catch (const std::exception&) {
    setState(0x37F, 0x1F80);
    *threw = true;
    r = NAN;
  }
  return r;
}

double exported(const Function& f, double x, P p, bool* threw) {
  *threw = false;
  try {
    return f.exported(x, p);
  } catch (const std::exception&) {
    qel::ResetFpuStates();
    *threw = true;
    return NAN;
  }
}

bool normal(double v) {
  return std::isfinite(v) && std::fabs(v) >= DBL_MIN;
}

// A candidate: both normal and apart, or one normal and the other not; a
// reference that overflowed (inf or NaN while the armed run trapped) is no
// candidate, and neither are values below the smallest normal.
bool candidate(double ref, bool refThrew, double arm, bool armThrew) {
  if (refThrew && armThrew) return false;
  // Below 1e-280 only the order of magnitude counts, and 0 is an answer.
  if (std::fabs(ref) < 1e-280 && std::fabs(arm) < 1e-280) return false;
  if (!refThrew && !std::isfinite(ref) && (armThrew || std::isnan(arm))) return false;
  if (normal(ref) && normal(arm))
    return std::fabs(ref - arm) > 1e-13 * std::max(std::fabs(ref), std::fabs(arm));
  return normal(ref) || normal(arm);
}

double drawX(const Function& f, P p) {
  double x;
  if (rng() % 2 && f.quantile) {
    bool threw;
    Function q = f;
    q.kernel = f.quantile;
    x = reference(q, drawP(), p, false, &threw);
    if (threw || !std::isfinite(x)) x = 1.0;
  } else if (rng() % 5 == 0) {
    x = (rng() % 2 ? 1 : -1) * DBL_MIN * uniform(0.0, 2.0);  // denormals and DBL_MIN
  } else {
    x = (rng() % 4 ? 1 : -1) * logUniformBand();
  }
  return f.discrete ? std::floor(x) : x;
}

int I(double v) {
  return static_cast<int>(v);
}

std::vector<Function> functions;

Kind kindOf(char c);

void add(const std::string& family, const std::string& kindCodes, bool discrete, Fn kpdf, Fn epdf,
         std::function<double(double, P, bool)> kcdf, std::function<double(double, P, bool)> ecdf,
         Fn kinv, Fn einv, std::string invCodes = "") {
  if (invCodes.empty()) invCodes = kindCodes;
  std::vector<Kind> kinds, invKinds;
  for (char c : kindCodes) kinds.push_back(kindOf(c));
  for (char c : invCodes) invKinds.push_back(kindOf(c));
  using namespace std::placeholders;
  functions.push_back({family + " pdf", 'p', kinds, kpdf, epdf, kinv, discrete});
  functions.push_back({family + " lower", 'l', invKinds, std::bind(kcdf, _1, _2, false),
                       std::bind(ecdf, _1, _2, false), kinv, discrete});
  functions.push_back({family + " upper", 'u', invKinds, std::bind(kcdf, _1, _2, true),
                       std::bind(ecdf, _1, _2, true), kinv, discrete});
  functions.push_back({family + " inv", 'i', invKinds, kinv, einv, nullptr, discrete});
}

#define FAMILY(Name, kinds, discrete, ...)                                                     \
  add(                                                                                         \
      #Name, kinds, discrete, [](double x, P p) { return qel::m##Name##Pdf(x, __VA_ARGS__); }, \
      [](double x, P p) { return qel::Name##Pdf(x, __VA_ARGS__); },                            \
      [](double x, P p, bool u) { return qel::m##Name##Cdf(x, __VA_ARGS__, u); },              \
      [](double x, P p, bool u) { return qel::Name##Cdf(x, __VA_ARGS__, u); },                 \
      [](double x, P p) { return qel::m##Name##InvCdf(x, __VA_ARGS__); },                      \
      [](double x, P p) { return qel::Name##InvCdf(x, __VA_ARGS__); })

void registerFunctions() {
  using namespace qel;
  FAMILY(Beta, "pp", false, p[0], p[1]);
  FAMILY(Cauchy, "lp", false, p[0], p[1]);
  FAMILY(Exponential, "pl", false, p[0], p[1]);
  FAMILY(Gamma, "ppl", false, p[0], p[1], p[2]);
  FAMILY(Geometric, "b", true, p[0]);
  FAMILY(HalfNormal, "pl", false, p[0], p[1]);
  FAMILY(Hypergeometric, "iii", true, I(p[0]), I(p[1]), I(p[2]));
  FAMILY(IntegerUniform, "ii", true, I(p[0]), I(p[1]));
  FAMILY(LargestExtremeValue, "lp", false, p[0], p[1]);
  FAMILY(Lambda, "Llp", false, p[0], p[1], p[2]);
  FAMILY(Laplace, "lp", false, p[0], p[1]);
  FAMILY(Logistic, "lp", false, p[0], p[1]);
  FAMILY(LogLogistic, "lpl", false, p[0], p[1], p[2]);
  FAMILY(LogNormal, "lpl", false, p[0], p[1], p[2]);
  FAMILY(NegBinomial, "bc", true, p[0], p[1]);
  FAMILY(Normal, "lp", false, p[0], p[1]);
  FAMILY(Poisson, "n", true, p[0]);
  FAMILY(SmallestExtremeValue, "lp", false, p[0], p[1]);
  FAMILY(T, "pl", false, p[0], p[1]);
  FAMILY(Triangular, "lll", false, p[0], p[1], p[2]);
  FAMILY(Uniform, "ll", false, p[0], p[1]);
  FAMILY(Weibull, "ppl", false, p[0], p[1], p[2]);
  add(
      "Binomial", "ib", true, [](double x, P p) { return mBinomialPdf(x, I(p[0]), p[1]); },
      [](double x, P p) { return BinomialPdf(x, I(p[0]), p[1]); },
      [](double x, P p, bool u) { return mBinomialCdf(x, I(p[0]), p[1], u); },
      [](double x, P p, bool u) { return BinomialCdf(x, I(p[0]), p[1], u); },
      [](double x, P p) { return mBinomialInvCdf(x, I(p[0]), p[1]); },
      [](double x, P p) { return BinomialInvCdf(x, I(p[0]), p[1]); });
  // Noncentral families: the density is central; chi-square and F draw a
  // zero noncentrality one time in four.
  add(
      "ChiSq", "p", false, [](double x, P p) { return mChiSqPdf(x, p[0]); },
      [](double x, P p) { return ChiSqPdf(x, p[0]); },
      [](double x, P p, bool u) { return mChiSqCdf(x, p[0], p[1], u); },
      [](double x, P p, bool u) { return ChiSqCdf(x, p[0], p[1], u); },
      [](double x, P p) { return mChiSqInvCdf(x, p[0], p[1]); },
      [](double x, P p) { return ChiSqInvCdf(x, p[0], p[1]); }, "pn");
  add(
      "F", "pp", false, [](double x, P p) { return mFPdf(x, p[0], p[1]); },
      [](double x, P p) { return FPdf(x, p[0], p[1]); },
      [](double x, P p, bool u) { return mFCdf(x, p[0], p[1], p[2], u); },
      [](double x, P p, bool u) { return FCdf(x, p[0], p[1], p[2], u); },
      [](double x, P p) { return mFInvCdf(x, p[0], p[1], p[2]); },
      [](double x, P p) { return FInvCdf(x, p[0], p[1], p[2]); }, "ppn");
}

Kind kindOf(char c) {
  switch (c) {
    case 'p':
      return kPos;
    case 'l':
      return kLoc;
    case 'b':
      return kProb;
    case 'n':
      return kNcp;
    case 'c':
      return kCount;
    case 'i':
      return kInt;
    default:
      return kLambda;
  }
}

}  // namespace

int main(int argc, char** argv) {
  const double seconds = argc > 1 ? std::atof(argv[1]) : 2.0;
  rng.seed(argc > 2 ? std::strtoull(argv[2], nullptr, 10) : 1);
  const bool traps = argc > 3 && std::strcmp(argv[3], "--traps") == 0;
  qel::RegisterLynSigfpeHandler();
  registerFunctions();
  const char* only = std::getenv("DAZ_SWEEP_ONLY");
  long total = 0;
  for (const Function& f : functions) {
    if (only && f.name.find(only) == std::string::npos) continue;
    long evaluations = 0, candidates = 0;
    const auto stop = std::chrono::steady_clock::now() + std::chrono::duration<double>(seconds);
    while (std::chrono::steady_clock::now() < stop) {
      for (int i = 0; i < 16; ++i, ++evaluations) {
        const std::vector<double> p = drawParameters(f);
        const double x = f.what == 'i' ? drawP() : drawX(f, p.data());
        bool refThrew, armThrew;
        const double ref = reference(f, x, p.data(), traps, &refThrew);
        const double arm = exported(f, x, p.data(), &armThrew);
        if (!candidate(ref, refThrew, arm, armThrew)) continue;
        ++candidates;
        bool denormal = std::fpclassify(x) == FP_SUBNORMAL;
        for (double v : p) denormal = denormal || std::fpclassify(v) == FP_SUBNORMAL;
        std::printf("CAND%s %s x=%.17g", denormal ? "-DENORMAL" : "", f.name.c_str(), x);
        for (double v : p) std::printf(" %.17g", v);
        std::printf(" ref=%s%.17g arm=%s%.17g\n", refThrew ? "throw:" : "", ref,
                    armThrew ? "throw:" : "", arm);
      }
    }
    total += evaluations;
    std::printf("SUMMARY %-28s evaluations %8ld candidates %ld\n", f.name.c_str(), evaluations,
                candidates);
    std::fflush(stdout);
  }
  std::printf("TOTAL %ld\n", total);
}

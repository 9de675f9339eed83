// Sample mode: N random draws of a family, one per line, from a sampler made
// with the given seed (0 or none: the clock). The same seed gives the same
// lines on every run.
#include "sample_mode.h"

#include <qel/sampler.h>

#include <cmath>
#include <functional>
#include <string>
#include <utility>
#include <vector>

#include "cli.h"
#include "domain.h"

namespace qelcalc {
namespace {

using Params = std::vector<double>;
using Draw = std::function<int(qel::ISampler&, double*, unsigned, const Params&)>;

struct Family {
  const char* name;
  std::vector<std::pair<const char*, double>> params;  // name and default
  Draw draw;
};

int toInt(double x, const std::string& what) {
  if (!(x == std::floor(x)) || std::fabs(x) > 2147483647.0)
    throw UsageError(what + " must be a whole number");
  return static_cast<int>(x);
}

const std::vector<Family>& families() {
  using S = qel::ISampler;
  static const std::vector<Family> table = {
      {"normal",
       {{"mean", 0}, {"sd", 1}},
       [](S& s, double* o, unsigned n, const Params& p) { return s.Normal(o, n, p[0], p[1]); }},
      {"uniform",
       {{"lower", 0}, {"upper", 1}},
       [](S& s, double* o, unsigned n, const Params& p) { return s.Uniform(o, n, p[0], p[1]); }},
      {"exponential",
       {{"scale", 1}, {"threshold", 0}},
       [](S& s, double* o, unsigned n, const Params& p) {
         return s.Exponential(o, n, p[0], p[1]);
       }},
      {"gamma",
       {{"shape", 1}, {"scale", 1}, {"threshold", 0}},
       [](S& s, double* o, unsigned n, const Params& p) {
         return s.Gamma(o, n, p[0], p[1], p[2]);
       }},
      {"beta",
       {{"a", 1}, {"b", 1}},
       [](S& s, double* o, unsigned n, const Params& p) { return s.Beta(o, n, p[0], p[1]); }},
      {"chisq",
       {{"df", 1}},
       [](S& s, double* o, unsigned n, const Params& p) { return s.ChiSq(o, n, p[0], 0.0); }},
      {"f",
       {{"df1", 1}, {"df2", 1}},
       [](S& s, double* o, unsigned n, const Params& p) { return s.F(o, n, p[0], p[1], 0.0); }},
      {"t",
       {{"df", 1}, {"noncentrality", 0}},
       [](S& s, double* o, unsigned n, const Params& p) { return s.T(o, n, p[0], p[1]); }},
      {"cauchy",
       {{"location", 0}, {"scale", 1}},
       [](S& s, double* o, unsigned n, const Params& p) { return s.Cauchy(o, n, p[0], p[1]); }},
      {"laplace",
       {{"location", 0}, {"scale", 1}},
       [](S& s, double* o, unsigned n, const Params& p) { return s.Laplace(o, n, p[0], p[1]); }},
      {"logistic",
       {{"location", 0}, {"scale", 1}},
       [](S& s, double* o, unsigned n, const Params& p) { return s.Logistic(o, n, p[0], p[1]); }},
      {"loglogistic",
       {{"location", 0}, {"scale", 1}, {"threshold", 0}},
       [](S& s, double* o, unsigned n, const Params& p) {
         return s.LogLogistic(o, n, p[0], p[1], p[2]);
       }},
      {"lognormal",
       {{"location", 0}, {"scale", 1}, {"threshold", 0}},
       [](S& s, double* o, unsigned n, const Params& p) {
         return s.LogNormal(o, n, p[0], p[1], p[2]);
       }},
      {"largest-extreme-value",
       {{"location", 0}, {"scale", 1}},
       [](S& s, double* o, unsigned n, const Params& p) {
         return s.LargestExtremeValue(o, n, p[0], p[1]);
       }},
      {"smallest-extreme-value",
       {{"location", 0}, {"scale", 1}},
       [](S& s, double* o, unsigned n, const Params& p) {
         return s.SmallestExtremeValue(o, n, p[0], p[1]);
       }},
      {"lambda",
       {{"lambda", 0}, {"location", 0}, {"scale", 1}},
       [](S& s, double* o, unsigned n, const Params& p) {
         return s.Lambda(o, n, p[0], p[1], p[2]);
       }},
      {"triangular",
       {{"lower", 0}, {"mode", 0.5}, {"upper", 1}},
       [](S& s, double* o, unsigned n, const Params& p) {
         return s.Triangular(o, n, p[0], p[1], p[2]);
       }},
      {"weibull",
       {{"shape", 1}, {"scale", 1}, {"threshold", 0}},
       [](S& s, double* o, unsigned n, const Params& p) {
         return s.Weibull(o, n, p[0], p[1], p[2]);
       }},
      {"bernoulli",
       {{"p", 0.5}},
       [](S& s, double* o, unsigned n, const Params& p) { return s.Bernoulli(o, n, p[0]); }},
      {"binomial",
       {{"n", 1}, {"p", 0.5}},
       [](S& s, double* o, unsigned n, const Params& p) {
         return s.Binomial(o, n, toInt(p[0], "--n"), p[1]);
       }},
      {"poisson",
       {{"mean", 1}},
       [](S& s, double* o, unsigned n, const Params& p) { return s.Poisson(o, n, p[0]); }},
      {"geometric",
       {{"p", 0.5}},
       [](S& s, double* o, unsigned n, const Params& p) { return s.Geometric(o, n, p[0], true); }},
      {"negbinomial",
       {{"r", 1}, {"p", 0.5}},
       [](S& s, double* o, unsigned n, const Params& p) {
         const int r = toInt(p[0], "--r");
         if (r < 0) throw UsageError("--r must not be negative");
         return s.NegBinomial(o, n, static_cast<unsigned>(r), p[1], true);
       }},
      {"hypergeometric",
       {{"N", 1}, {"M", 1}, {"n", 1}},
       [](S& s, double* o, unsigned n, const Params& p) {
         return s.Hypergeometric(o, n, toInt(p[0], "--N"), toInt(p[1], "--M"), toInt(p[2], "--n"));
       }},
      {"integer",
       {{"lower", 0}, {"upper", 1}},
       [](S& s, double* o, unsigned n, const Params& p) {
         return s.Uniform(o, n, toInt(p[0], "--lower"), toInt(p[1], "--upper"));
       }},
  };
  return table;
}

}  // namespace

void printSampleUsage(std::ostream& out) {
  out << "  qelcalc sample FAMILY N [--PARAM VALUE ...] [--seed S]\n"
         "    N random draws, one per line; the same seed gives the same draws (no seed or\n"
         "    seed 0: the clock). Families:";
  for (const Family& f : families()) out << " " << f.name;
  out << "\n";
}

int runSampleMode(int argc, char** argv, std::ostream& out) {
  const Arguments args = parseArguments(argc, argv, 2, {});
  if (args.positional.size() != 2) throw UsageError("sample takes a family and a count");
  const Family* family = nullptr;
  for (const Family& f : families())
    if (args.positional[0] == f.name) family = &f;
  if (family == nullptr) throw UsageError("sample: unknown family '" + args.positional[0] + "'");
  const double count = parseNumber(args.positional[1], "the count");
  if (!(count >= 0.0 && count <= 1e8 && count == std::floor(count)))
    throw UsageError("the count must be a whole number from 0 to 1e8");

  Params params;
  double seed = 0.0;
  std::size_t used = 0;
  for (const auto& param : family->params) {
    const auto given = args.options.find(param.first);
    params.push_back(
        given == args.options.end()
            ? param.second
            : checkParameter(parseNumber(given->second, std::string("--") + param.first),
                             param.first));
    used += given != args.options.end();
  }
  if (const auto given = args.options.find("seed"); given != args.options.end()) {
    seed = parseNumber(given->second, "--seed");
    ++used;
  }
  if (used != args.options.size())
    throw UsageError(std::string("sample ") + family->name + ": unknown option");

  int code = 0;
  qel::ISampler* sampler = qel::MakeISampler(&code, seed, qel::kRngCombinedCongruential);
  if (sampler == nullptr)
    throw std::runtime_error("no sampler (code " + std::to_string(code) + ")");
  std::vector<double> draws(static_cast<std::size_t>(count));
  try {
    code = family->draw(*sampler, draws.data(), static_cast<unsigned>(count), params);
  } catch (...) {
    qel::DeleteISampler(&sampler);
    throw;
  }
  qel::DeleteISampler(&sampler);
  if (code != 0) throw std::runtime_error("the sampler reported code " + std::to_string(code));
  for (double x : draws) out << formatNumber(x) << "\n";
  return 0;
}

}  // namespace qelcalc

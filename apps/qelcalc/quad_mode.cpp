// quad mode: nodes and weights of the Gauss rules; sint mode: the sign
// confidence levels around a requested confidence.
#include "quad_mode.h"

#include <string>
#include <vector>

#include "cli.h"
#include "domain.h"
#include "test_input.h"
#include "utilities/MathUtilities.h"

namespace qelcalc {

namespace {

// A whole number from lo to hi.
int countArgument(const std::string& text, const std::string& what, double lo, double hi) {
  const double v = parseNumber(text, what);
  if (!(v >= lo && v <= hi) || v != static_cast<int>(v)) {
    throw UsageError(what + ": a whole number from " + formatNumber(lo) + " to " +
                     formatNumber(hi));
  }
  return static_cast<int>(v);
}

bool helpAsked(int argc, char** argv) {
  return argc == 3 && std::string(argv[2]) == "--help";
}

}  // namespace

void printQuadUsage(std::ostream& out) {
  out << "  qelcalc quad legendre|hermite|laguerre N [--alpha A]\n"
         "    Nodes and weights of the N-point Gauss rule, one \"node weight\" a line:\n"
         "    Legendre on [-1, 1] (the positive half, descending; the rule is symmetric),\n"
         "    Hermite for exp(-x^2), generalised Laguerre for x^A exp(-x) (A > -1).\n";
}

int runQuadMode(int argc, char** argv, std::ostream& out) {
  if (helpAsked(argc, argv)) {
    printQuadUsage(out);
    return 0;
  }
  const Arguments args = parseArguments(argc, argv, 2, {});
  if (args.positional.size() != 2) throw UsageError("quad takes a family and N");
  for (const auto& option : args.options) {
    if (option.first != "alpha") throw UsageError("quad has no option --" + option.first);
  }
  const std::string& family = args.positional[0];
  const auto n = static_cast<unsigned>(countArgument(args.positional[1], "N", 1, 100000));
  if (family != "laguerre" && args.options.count("alpha"))
    throw UsageError("--alpha goes with laguerre");
  std::vector<double> nodes, weights;
  bool ok = false;
  if (family == "legendre") {
    ok = qel::mGaussianQuadratureWeights(n, nodes, weights);
  } else if (family == "hermite") {
    ok = qel::mGaussHermiteQuadratureWeights(n, nodes, weights, false);
  } else if (family == "laguerre") {
    const double alpha = numberOption(args, "alpha", 0.0);
    if (!(alpha > -1.0)) throw UsageError("--alpha: must exceed -1");
    ok = qel::mGaussLaguerreQuadratureWeights(n, nodes, weights, alpha);
  } else {
    throw UsageError("unknown rule '" + family + "' (legendre, hermite or laguerre)");
  }
  if (!ok) {
    out << "eigensystem failed\n";
    return 1;
  }
  for (std::size_t i = 0; i < nodes.size(); ++i) {
    out << formatNumber(nodes[i]) << " " << formatNumber(weights[i]) << "\n";
  }
  return 0;
}

void printSintUsage(std::ostream& out) {
  out << "  qelcalc sint N --confidence C\n"
         "    Sign confidence levels for a sample of N: the achieved confidences of the\n"
         "    order-statistic intervals of depth d and d + 1 around C and the weight\n"
         "    lambda that interpolates between them (kind 1: even the widest interval\n"
         "    falls short of C; kind 2: the search reached the median).\n";
}

int runSintMode(int argc, char** argv, std::ostream& out) {
  if (helpAsked(argc, argv)) {
    printSintUsage(out);
    return 0;
  }
  const Arguments args = parseArguments(argc, argv, 2, {});
  if (args.positional.size() != 1) throw UsageError("sint takes N");
  for (const auto& option : args.options) {
    if (option.first != "confidence") throw UsageError("sint has no option --" + option.first);
  }
  if (!args.options.count("confidence")) throw UsageError("sint needs --confidence");
  const int n = countArgument(args.positional[0], "N", 1, 1e8);
  const double confidence = domainOption(args, "confidence", 0.95, Domain::kLevel);
  std::vector<double> levels;
  int d = 0, kind = 0;
  double lambda = 0.0;
  qel::mSint(n, confidence, levels, &d, &kind, &lambda);
  out << "kind " << kind << "\nd " << d << "\n";
  writeField(out, "level_d", levels[0]);
  if (levels.size() > 1) writeField(out, "level_d_plus_1", levels[1]);
  writeField(out, "lambda", lambda);
  return 0;
}

}  // namespace qelcalc

// P-values of test statistics and critical values at a level, through the
// exported P-value and critical-value functions.
#include "pvalue_mode.h"

#include <qel/distributions.h>

#include <cmath>
#include <functional>
#include <map>
#include <string>
#include <vector>

#include "cli.h"
#include "domain.h"

namespace qelcalc {

namespace {

using Options = std::map<std::string, std::string>;

qel::EAlternative alternativeOf(const Options& options) {
  const auto it = options.find("alternative");
  const std::string a = it == options.end() ? "two-sided" : it->second;
  if (a == "less") return qel::kAlternativeLess;
  if (a == "greater") return qel::kAlternativeGreater;
  if (a == "two-sided") return qel::kAlternativeNotEqual;
  throw UsageError("--alternative must be less, greater or two-sided");
}

double number(const Options& options, const std::string& name) {
  const auto it = options.find(name);
  if (it == options.end()) throw UsageError("needs --" + name);
  return checkParameter(parseNumber(it->second, "--" + name), name);
}

int whole(const Options& options, const std::string& name) {
  const double v = number(options, name);
  if (!(std::fabs(v) <= 2147483647.0) || v != std::floor(v)) {
    throw UsageError("--" + name + " must be a whole number");
  }
  return static_cast<int>(v);
}

struct Entry {
  std::vector<std::string> parameters;
  std::function<double(double, const Options&, qel::EAlternative)> evaluate;
};

const std::map<std::string, Entry>& pvalues() {
  static const std::map<std::string, Entry> table = {
      {"normal",
       {{}, [](double z, const Options&, qel::EAlternative a) { return qel::NormalPValue(z, a); }}},
      {"t",
       {{"df"},
        [](double t, const Options& o, qel::EAlternative a) {
          return qel::TPValue(t, number(o, "df"), a);
        }}},
      {"chisq",
       {{"df"},
        [](double x, const Options& o, qel::EAlternative a) {
          return qel::ChiSqPValue(x, number(o, "df"), a);
        }}},
      {"f",
       {{"df1", "df2"},
        [](double x, const Options& o, qel::EAlternative a) {
          return qel::FPValue(x, number(o, "df1"), number(o, "df2"), a);
        }}},
      {"binomial",
       {{"n", "p"},
        [](double x, const Options& o, qel::EAlternative a) {
          return qel::BinomialPValue(x, whole(o, "n"), number(o, "p"), a);
        }}},
      {"hypergeometric",
       {{"N", "M", "n"},
        [](double x, const Options& o, qel::EAlternative a) {
          if (x != std::floor(x)) throw UsageError("X must be a whole number");
          return qel::HypergeometricPValue(static_cast<int>(x), whole(o, "N"), whole(o, "M"),
                                           whole(o, "n"), a);
        }}},
  };
  return table;
}

const std::map<std::string, Entry>& criticalValues() {
  static const std::map<std::string, Entry> table = {
      {"normal",
       {{},
        [](double alpha, const Options&, qel::EAlternative a) {
          return qel::NormalCritValue(alpha, a);
        }}},
      {"t",
       {{"df", "k"},
        [](double alpha, const Options& o, qel::EAlternative a) {
          const int k = o.count("k") ? whole(o, "k") : 1;
          return o.count("sidak") ? qel::TSidakCritValue(alpha, number(o, "df"), a, k)
                                  : qel::TCritValue(alpha, number(o, "df"), a, k);
        }}},
      {"chisq",
       {{"df"},
        [](double alpha, const Options& o, qel::EAlternative a) {
          return qel::ChiSqCritValue(alpha, number(o, "df"), a);
        }}},
      {"f",
       {{"df1", "df2"},
        [](double alpha, const Options& o, qel::EAlternative a) {
          return qel::FCritValue(alpha, number(o, "df1"), number(o, "df2"), a);
        }}},
  };
  return table;
}

}  // namespace

void printPValueUsage(std::ostream& out) {
  out << "  qelcalc pvalue FAMILY X [--PARAM VALUE ...] [--alternative less|greater|two-sided]\n"
         "    normal; t --df; chisq --df; f --df1 --df2; binomial --n --p;\n"
         "    hypergeometric --N --M --n\n"
         "  qelcalc crit FAMILY ALPHA [--PARAM VALUE ...] [--alternative ...]\n"
         "    normal; t --df [--k K] [--sidak]; chisq --df; f --df1 --df2\n";
}

int runPValueMode(int argc, char** argv, std::ostream& out) {
  const std::string mode = argv[1];
  const Arguments args = parseArguments(argc, argv, 2, {"sidak"});
  if (args.positional.size() != 2) throw UsageError("expected FAMILY and a value");
  const auto& table = mode == "pvalue" ? pvalues() : criticalValues();
  const auto it = table.find(args.positional[0]);
  if (it == table.end()) throw UsageError("no " + mode + " for '" + args.positional[0] + "'");
  Options options = args.options;
  for (const auto& flag : args.flags) options[flag] = "1";
  for (const auto& option : args.options) {
    bool known = option.first == "alternative";
    for (const auto& p : it->second.parameters) known = known || p == option.first;
    if (!known) throw UsageError(args.positional[0] + " has no parameter --" + option.first);
  }
  double value = parseNumber(args.positional[1], mode == "pvalue" ? "X" : "ALPHA");
  if (mode == "crit") value = checkDomain(value, "ALPHA", Domain::kProbability);
  out << formatNumber(it->second.evaluate(value, options, alternativeOf(options))) << "\n";
  return 0;
}

}  // namespace qelcalc

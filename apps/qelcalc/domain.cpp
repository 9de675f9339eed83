#include "domain.h"

#include <cmath>
#include <map>

#include "cli.h"

namespace qelcalc {
namespace {

// Largest count the library's int arguments hold.
constexpr double kLargestCount = 2147483647.0;

bool inDomain(double v, Domain domain) {
  switch (domain) {
    case Domain::kPositive:
      return v > 0 && v < HUGE_VAL;
    case Domain::kProbability:
      return v >= 0 && v <= 1;
    case Domain::kLevel:
      return v > 0 && v < 1;
    case Domain::kCount:
      return v >= 0 && v <= kLargestCount && v == std::floor(v);
    case Domain::kWhole:
      return std::fabs(v) <= kLargestCount && v == std::floor(v);
    case Domain::kAny:
      break;
  }
  return !std::isnan(v);
}

const char* rangeText(Domain domain) {
  switch (domain) {
    case Domain::kPositive:
      return "a positive number (0, inf)";
    case Domain::kProbability:
      return "a probability [0, 1]";
    case Domain::kLevel:
      return "a level strictly between 0 and 1 (0, 1)";
    case Domain::kCount:
      return "a whole number in [0, 2147483647]";
    case Domain::kWhole:
      return "a whole number in [-2147483647, 2147483647]";
    case Domain::kAny:
      break;
  }
  return "a number";
}

}  // namespace

double checkDomain(double value, const std::string& name, Domain domain) {
  if (!inDomain(value, domain)) {
    throw UsageError(name + ": " + formatNumber(value) + " is outside its range, " +
                     rangeText(domain));
  }
  return value;
}

Domain parameterDomain(const std::string& name) {
  static const std::map<std::string, Domain> table = {
      {"sigma", Domain::kPositive}, {"sd", Domain::kPositive},   {"scale", Domain::kPositive},
      {"df", Domain::kPositive},    {"df1", Domain::kPositive},  {"df2", Domain::kPositive},
      {"shape", Domain::kPositive}, {"a", Domain::kPositive},    {"b", Domain::kPositive},
      {"r", Domain::kPositive},     {"p", Domain::kProbability}, {"n", Domain::kCount},
      {"N", Domain::kCount},        {"M", Domain::kCount},
  };
  const auto it = table.find(name);
  return it == table.end() ? Domain::kAny : it->second;
}

double domainOption(const Arguments& args, const std::string& name, double fallback,
                    Domain domain) {
  const auto it = args.options.find(name);
  if (it == args.options.end()) return fallback;
  return checkDomain(parseNumber(it->second, "--" + name), "--" + name, domain);
}

double checkParameter(double value, const std::string& name) {
  return checkDomain(value, "--" + name, parameterDomain(name));
}

}  // namespace qelcalc

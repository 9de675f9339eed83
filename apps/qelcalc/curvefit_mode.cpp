// Curve-fit mode: reads points x y (two numbers a line, separated by blanks,
// tabs or a comma; blank lines and lines starting with '#' skipped; a first
// line that is not numeric is taken as a header) and prints the least-squares
// polynomial's coefficients, the residual standard deviation, R^2 and the
// message code.
#include "curvefit_mode.h"

#include <qel/curve_fit.h>

#include <algorithm>
#include <limits>
#include <sstream>
#include <string>
#include <vector>

#include "cli.h"

namespace qelcalc {
namespace {

struct Points {
  std::vector<double> x, y;
};

Points readPoints(const std::string& path) {
  std::ifstream file;
  std::istream& in = openInput(path, file);
  Points points;
  std::string line;
  for (int number = 1; std::getline(in, line); ++number) {
    std::replace(line.begin(), line.end(), ',', ' ');
    std::istringstream fields(line);
    std::vector<std::string> words;
    for (std::string w; fields >> w;) words.push_back(w);
    if (words.empty() || words[0][0] == '#') continue;
    if (words.size() != 2)
      throw UsageError("line " + std::to_string(number) + ": expected two numbers, x and y");
    const std::string where = "line " + std::to_string(number);
    if (points.x.empty() && number == 1) {
      try {
        parseNumber(words[0], where);
      } catch (const UsageError&) {
        continue;  // a header
      }
    }
    points.x.push_back(parseNumber(words[0], where + " x"));
    points.y.push_back(parseNumber(words[1], where + " y"));
  }
  return points;
}

std::string codeText(int code) {
  if (code == qel::qelFailSingular) return "30019 (no term could be fitted)";
  if (code == qel::qelFailOutOfMemory) return "30001 (out of memory)";
  return std::to_string(code);
}

}  // namespace

void printCurveFitUsage(std::ostream& out) {
  out << "  qelcalc curvefit FILE|- [--degree D] [--no-intercept] [--tolerance T]\n"
         "    Least-squares polynomial of degree D (default 1) through the points of\n"
         "    FILE (x y per line): coefficients (NaN for a collinear term), residual\n"
         "    standard deviation, R^2 and the message code.\n";
}

int runCurveFitMode(int argc, char** argv, std::ostream& out) {
  if (argc == 3 && (std::string(argv[2]) == "--help" || std::string(argv[2]) == "-h")) {
    printCurveFitUsage(out);
    return 0;
  }
  const Arguments args = parseArguments(argc, argv, 2, {"no-intercept"});
  if (args.positional.size() != 1) throw UsageError("expected one FILE argument (or -)");
  double degree = 1.0, tolerance = 0.0;
  for (const auto& option : args.options) {
    if (option.first == "degree") {
      degree = parseNumber(option.second, "--degree");
      if (!(degree >= 0.0 && degree <= 100.0) || degree != static_cast<int>(degree))
        throw UsageError("--degree must be a whole number from 0 to 100");
    } else if (option.first == "tolerance") {
      tolerance = parseNumber(option.second, "--tolerance");
    } else {
      throw UsageError("curvefit has no option --" + option.first);
    }
  }
  const bool intercept =
      std::find(args.flags.begin(), args.flags.end(), "no-intercept") == args.flags.end();
  const Points points = readPoints(args.positional[0]);
  if (points.x.size() > std::numeric_limits<unsigned>::max()) throw UsageError("too many points");
  const auto d = static_cast<unsigned>(degree);
  std::vector<double> coefficients(d + 2);
  double rSquared = 0.0;
  const int code =
      qel::v1::RunLynGrCurveFit(coefficients.data(), &rSquared, points.x.data(), points.y.data(),
                                static_cast<unsigned>(points.x.size()), d, tolerance, intercept);
  out << "n " << points.x.size() << "\n"
      << "degree " << d << "\n"
      << "intercept " << formatNumber(coefficients[0]) << "\n";
  for (unsigned j = 1; j <= d; ++j)
    out << "x^" << j << " " << formatNumber(coefficients[j]) << "\n";
  out << "residual_sd " << formatNumber(coefficients[d + 1]) << "\n"
      << "r_squared " << formatNumber(rSquared) << "\n"
      << "code " << codeText(code) << "\n";
  return 0;
}

}  // namespace qelcalc

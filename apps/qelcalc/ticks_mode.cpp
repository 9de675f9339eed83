// ticks mode: tick marks and extent of a graph axis for a data range.
#include <qel/axis_ticks.h>

#include <cfloat>
#include <string>
#include <vector>

#include "cli.h"
#include "gof_mode.h"
#include "test_input.h"

namespace qelcalc {

std::vector<double> numberList(const std::string& text, const std::string& what, std::size_t count);

namespace {

// The pair of a "--name a,b" option, or the fallback pair.
std::vector<double> pairOption(const Arguments& args, const std::string& name, double first,
                               double second) {
  if (!args.options.count(name)) return {first, second};
  return numberList(args.options.at(name), "--" + name, 2);
}

}  // namespace

void printTicksUsage(std::ostream& out) {
  out << "  qelcalc ticks MIN MAX [--ticks 4,11] [--below 0,0.05] [--above 0,0.05]\n"
         "                [--limits L,U] [--tick-margins 0.5,0.5]\n"
         "    Axis ticks for data from MIN to MAX: tick counts allowed, how far the scale\n"
         "    must and may reach below and above the data (fractions of the range),\n"
         "    limits of the ticks, room beyond the end ticks (in increments). Writes\n"
         "    first, last, scale_min, scale_max, increment, count and the ticks.\n";
}

int runTicksMode(int argc, char** argv, std::ostream& out) {
  if (argc == 3 && std::string(argv[2]) == "--help") {
    printTicksUsage(out);
    return 0;
  }
  const Arguments args = parseArguments(argc, argv, 2, {});
  if (args.positional.size() != 2) throw UsageError("ticks takes MIN and MAX");
  for (const auto& option : args.options) {
    const std::string& o = option.first;
    if (o != "ticks" && o != "below" && o != "above" && o != "limits" && o != "tick-margins")
      throw UsageError("ticks has no option --" + o);
  }
  const double lo = parseNumber(args.positional[0], "MIN");
  const double hi = parseNumber(args.positional[1], "MAX");
  const std::vector<double> counts = pairOption(args, "ticks", 4, 11);
  for (double c : counts) {
    if (!(c >= 0 && c <= 1e6) || c != static_cast<int>(c))
      throw UsageError("--ticks: counts are whole numbers from 0 to 1000000");
  }
  const std::vector<double> below = pairOption(args, "below", 0, 0.05);
  const std::vector<double> above = pairOption(args, "above", 0, 0.05);
  const std::vector<double> limits = pairOption(args, "limits", -DBL_MAX, DBL_MAX);
  const std::vector<double> margins = pairOption(args, "tick-margins", 0.5, 0.5);
  qel::deprecated::TickCalculationResult r;
  qel::deprecated::ComputeTicks(&r, static_cast<int>(counts[0]), static_cast<int>(counts[1]),
                                below[0], below[1], above[0], above[1], limits[0], limits[1],
                                margins[0], margins[1], lo, hi);
  writeField(out, "first", r.firstTick);
  writeField(out, "last", r.lastTick);
  writeField(out, "scale_min", r.scaleMinimum);
  writeField(out, "scale_max", r.scaleMaximum);
  writeField(out, "increment", r.increment);
  out << "count " << r.tickCount << "\nticks";
  for (int k = 0; k < r.tickCount; ++k) {
    // The last tick as computed, not as the sum of increments.
    out << " " << formatNumber(k + 1 == r.tickCount ? r.lastTick : r.firstTick + k * r.increment);
  }
  out << "\n";
  return 0;
}

}  // namespace qelcalc

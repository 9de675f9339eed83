#include "charts.h"

#include <qel/axis_ticks.h>

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <cstdio>

#include "cli.h"
#include "svg.h"

namespace qelcalc {
namespace {

const char* const kStyle =
    ".page{fill:#fff}\n"
    ".frame{fill:none;stroke:#333;stroke-width:1}\n"
    ".grid{stroke:#ddd;stroke-width:1}\n"
    ".tick{stroke:#333;stroke-width:1}\n"
    "text{font-family:Helvetica,Arial,sans-serif;font-size:12px;fill:#222}\n"
    ".title{font-size:15px;font-weight:bold}\n"
    ".axis-title{font-size:13px}\n"
    ".point{fill:#1f5fa8;fill-opacity:0.8;stroke:#0b2e57;stroke-width:0.8}\n"
    ".fit{stroke:#c0392b;stroke-width:1.6}\n"
    ".notes-box{fill:#fff;fill-opacity:0.9;stroke:#999}\n"
    ".box{fill:#dbe8f6;stroke:#1f5fa8;stroke-width:1.4}\n"
    ".median{stroke:#c0392b;stroke-width:2.2}\n"
    ".notch-limit{stroke:#c0392b;stroke-width:1;stroke-dasharray:3,2}\n"
    ".whisker,.whisker-cap{stroke:#1f5fa8;stroke-width:1.4}\n"
    ".outlier{fill:none;stroke:#c0392b;stroke-width:1.4}\n";

// Plot area of a picture, in pixels.
struct Area {
  double left, top, right, bottom;
};

// A label of a tick: at most eight significant digits, so that a tick made
// as first + k * increment shows as the nice number it stands for.
std::string tickLabel(double v) {
  char buffer[32];
  std::snprintf(buffer, sizeof buffer, "%.8g", std::fabs(v) < 1e-12 ? 0.0 : v);
  return buffer;
}

// Ticks of an axis over [lo, hi] from the library's tick search (4 to 11
// ticks); the scale reaches 2% to 8% of the range beyond the data at either
// end, so that no point sits on the frame.
qel::deprecated::TickCalculationResult axisTicks(double lo, double hi) {
  qel::deprecated::TickCalculationResult r;
  qel::deprecated::ComputeTicks(&r, 4, 11, 0.02, 0.08, 0.02, 0.08, -DBL_MAX, DBL_MAX, 0.5, 0.5, lo,
                                hi);
  if (!(r.tickCount > 0) || !std::isfinite(r.scaleMinimum) || !std::isfinite(r.scaleMaximum))
    throw UsageError("no axis for data from " + formatNumber(lo) + " to " + formatNumber(hi));
  return r;
}

std::vector<double> tickValues(const qel::deprecated::TickCalculationResult& r) {
  std::vector<double> ticks;
  for (int k = 0; k < r.tickCount; ++k)
    ticks.push_back(k + 1 == r.tickCount ? r.lastTick : r.firstTick + k * r.increment);
  return ticks;
}

// A scale whose data range may be a single value.
LinearScale scaleOf(double lo, double hi, double p0, double p1) {
  if (!(hi > lo)) lo -= 0.5, hi += 0.5;
  return {lo, hi, p0, p1};
}

void drawFrame(Svg& svg, const Area& a, const std::string& title, double width) {
  svg.rect(a.left, a.top, a.right - a.left, a.bottom - a.top, "frame");
  svg.text(width / 2, a.top / 2, title, "title");
}

void drawNotes(Svg& svg, const Area& a, const std::vector<std::string>& notes) {
  if (notes.empty()) return;
  std::size_t longest = 0;
  for (const auto& n : notes) longest = std::max(longest, n.size());
  const double w = 12 + 6.6 * longest, h = 8 + 16.0 * notes.size();
  svg.rect(a.left + 8, a.top + 8, w, h, "notes-box");
  for (std::size_t i = 0; i < notes.size(); ++i)
    svg.text(a.left + 14, a.top + 20 + 16.0 * i, notes[i], "note", "start");
}

// The listed percentages of a probability axis.
const double kPercents[] = {0.1, 1, 5, 10, 20, 30, 50, 70, 80, 90, 95, 99, 99.9};

// The score range of the probability axis: the points' scores, widened by a
// margin so that no point sits on the frame, then to the nearest listed
// percentages around them (the margin alone where the list ends first).
std::pair<double, double> scoreRange(const ProbabilityPlotPicture& p) {
  const auto mm = std::minmax_element(p.scores.begin(), p.scores.end());
  const double lo = *mm.first, hi = *mm.second;
  const double pad = 0.05 * std::max(hi - lo, 1.0);
  double below = -HUGE_VAL, above = HUGE_VAL;
  for (double pc : kPercents) {
    const double s = p.scoreOf(pc / 100);
    if (s <= lo - pad) below = std::max(below, s);
    if (s >= hi + pad) above = std::min(above, s);
  }
  return {std::isfinite(below) ? below : lo - pad, std::isfinite(above) ? above : hi + pad};
}

double axisValue(const ProbabilityPlotPicture& p, double x) {
  return p.logAxis ? std::log10(x) : x;
}

// A data axis in axis units (log10 of the data on a log axis): its ends and
// its ticks with their labels.
struct DataAxis {
  double lo, hi;
  std::vector<std::pair<double, std::string>> ticks;
};

DataAxis linearAxis(double lo, double hi) {
  const auto r = axisTicks(lo, hi);
  DataAxis axis{r.scaleMinimum, r.scaleMaximum, {}};
  for (double t : tickValues(r)) axis.ticks.push_back({t, tickLabel(t)});
  return axis;
}

// Within a decade the library's ticks of the data, placed at their
// logarithms; over wider ranges 1, 2 and 5 times the powers of ten (the
// powers alone beyond three decades).
DataAxis logAxis(double lo, double hi) {
  const double l0 = std::log10(lo), l1 = std::log10(hi);
  const double pad = 0.04 * std::max(l1 - l0, 0.1);
  DataAxis axis{l0 - pad, l1 + pad, {}};
  std::vector<double> candidates;
  if (hi / lo < 10) {
    candidates = tickValues(axisTicks(lo, hi));
  } else {
    for (double k = std::floor(l0); k <= std::ceil(l1); ++k)
      for (double m : {1.0, 2.0, 5.0})
        if (m == 1.0 || l1 - l0 <= 3) candidates.push_back(m * std::pow(10.0, k));
  }
  for (double c : candidates) {
    if (c > 0 && std::log10(c) >= axis.lo && std::log10(c) <= axis.hi)
      axis.ticks.push_back({std::log10(c), tickLabel(c)});
  }
  if (axis.ticks.size() < 2) axis.ticks = {{l0, tickLabel(lo)}, {l1, tickLabel(hi)}};
  return axis;
}

}  // namespace

void writeProbabilityPlot(const ProbabilityPlotPicture& p, const std::string& path) {
  if (p.x.empty()) throw UsageError("no points to plot");
  for (std::size_t i = 0; i < p.x.size(); ++i) {
    if (p.logAxis && !(p.x[i] > 0)) throw UsageError("a logarithmic axis needs positive data");
    if (!std::isfinite(p.x[i]) || !std::isfinite(p.scores[i]))
      throw UsageError("the plot has a point that is not finite");
  }
  const double width = 640, height = 480;
  const Area a{70, 40, 620, 420};
  Svg svg(width, height, kStyle);
  drawFrame(svg, a, p.title, width);

  const DataAxis axis =
      p.logAxis ? logAxis(p.x.front(), p.x.back()) : linearAxis(p.x.front(), p.x.back());
  const LinearScale sx = scaleOf(axis.lo, axis.hi, a.left, a.right);
  for (const auto& tick : axis.ticks) {
    const double t = tick.first;
    svg.line(sx(t), a.top, sx(t), a.bottom, "grid");
    svg.line(sx(t), a.bottom, sx(t), a.bottom + 5, "tick");
    svg.text(sx(t), a.bottom + 16, tick.second, "xtick-label");
  }
  const auto range = scoreRange(p);
  const LinearScale sy = scaleOf(range.first, range.second, a.bottom, a.top);
  for (double pc : kPercents) {
    const double s = p.scoreOf(pc / 100);
    if (s < range.first - 1e-9 || s > range.second + 1e-9) continue;
    svg.line(a.left, sy(s), a.right, sy(s), "grid");
    svg.line(a.left - 5, sy(s), a.left, sy(s), "tick");
    svg.text(a.left - 8, sy(s), tickLabel(pc), "ptick-label", "end");
  }
  svg.text((a.left + a.right) / 2, a.bottom + 40, p.logAxis ? "Data (log scale)" : "Data",
           "axis-title");
  svg.text(22, (a.top + a.bottom) / 2, "Percent", "axis-title", "middle", -90);

  // The fitted line is straight on these axes; its ends at the scale's ends.
  const double x0 = axis.lo, x1 = axis.hi;
  const auto dataAt = [&p](double v) { return p.logAxis ? std::pow(10.0, v) : v; };
  const double f0 = p.fitted(dataAt(x0)), f1 = p.fitted(dataAt(x1));
  svg.beginClip(a.left, a.top, a.right - a.left, a.bottom - a.top);
  if (std::isfinite(f0) && std::isfinite(f1)) svg.line(sx(x0), sy(f0), sx(x1), sy(f1), "fit");
  for (std::size_t i = 0; i < p.x.size(); ++i)
    svg.circle(sx(axisValue(p, p.x[i])), sy(p.scores[i]), 3.5, "point");
  svg.endClip();
  drawNotes(svg, a, p.notes);
  svg.save(path);
}

void writeBoxplot(const BoxplotPicture& p, const std::string& path) {
  const qel::v1::LynBoxplotHelper& b = p.box;
  if (p.sorted.empty() || !std::isfinite(b.minimum) || !std::isfinite(b.maximum))
    throw UsageError("the boxplot needs finite data");
  const double width = 420, height = 480;
  const Area a{70, 40, 400, 430};
  Svg svg(width, height, kStyle);
  drawFrame(svg, a, p.title, width);

  const auto ticks = axisTicks(b.minimum, b.maximum);
  const LinearScale sy = scaleOf(ticks.scaleMinimum, ticks.scaleMaximum, a.bottom, a.top);
  for (double t : tickValues(ticks)) {
    svg.line(a.left, sy(t), a.right, sy(t), "grid");
    svg.line(a.left - 5, sy(t), a.left, sy(t), "tick");
    svg.text(a.left - 8, sy(t), tickLabel(t), "ytick-label", "end");
  }

  // Tukey's fences: 1.5 hinge spreads beyond the hinges.
  const double spread = b.upperHinge - b.lowerHinge;
  const double lowFence = b.lowerHinge - 1.5 * spread, highFence = b.upperHinge + 1.5 * spread;
  double lowEnd = b.lowerHinge, highEnd = b.upperHinge;
  for (double v : p.sorted) {
    if (v >= lowFence) lowEnd = std::min(lowEnd, v);
    if (v <= highFence) highEnd = std::max(highEnd, v);
  }
  const double cx = (a.left + a.right) / 2, half = 50, cap = 20;
  svg.line(cx, sy(b.lowerHinge), cx, sy(lowEnd), "whisker");
  svg.line(cx, sy(b.upperHinge), cx, sy(highEnd), "whisker");
  svg.line(cx - cap, sy(lowEnd), cx + cap, sy(lowEnd), "whisker-cap");
  svg.line(cx - cap, sy(highEnd), cx + cap, sy(highEnd), "whisker-cap");

  // The notch narrows the box to the median within the median's interval,
  // drawn inside the hinges; the limits themselves are marked as dashes.
  const bool notched = std::isfinite(b.medianLowerLimit) && std::isfinite(b.medianUpperLimit);
  const auto clampToBox = [&b](double v) { return std::clamp(v, b.lowerHinge, b.upperHinge); };
  const double nl = notched ? clampToBox(b.medianLowerLimit) : b.median;
  const double nu = notched ? clampToBox(b.medianUpperLimit) : b.median;
  const double inset = notched ? 0.4 * half : 0;
  const double l = cx - half, r = cx + half;
  svg.polygon({{l, sy(b.lowerHinge)},
               {l, sy(nl)},
               {l + inset, sy(b.median)},
               {l, sy(nu)},
               {l, sy(b.upperHinge)},
               {r, sy(b.upperHinge)},
               {r, sy(nu)},
               {r - inset, sy(b.median)},
               {r, sy(nl)},
               {r, sy(b.lowerHinge)}},
              "box");
  svg.line(l + inset, sy(b.median), r - inset, sy(b.median), "median");
  if (notched) {
    svg.line(r + 4, sy(b.medianLowerLimit), r + 24, sy(b.medianLowerLimit), "notch-limit");
    svg.line(r + 4, sy(b.medianUpperLimit), r + 24, sy(b.medianUpperLimit), "notch-limit");
  }
  for (double v : p.sorted)
    if (v < lowFence || v > highFence) svg.circle(cx, sy(v), 4, "outlier");

  // Notes under the plot, where they cannot cover a whisker or an outlier.
  char note[96];
  std::snprintf(note, sizeof note, "n = %zu; box: hinges; notch: %.6g%% interval of the median",
                p.sorted.size(), 100 * p.confidence);
  svg.text(cx, a.bottom + 22, note, "note");
  svg.save(path);
}

}  // namespace qelcalc

// The distribution-free tests of `qelcalc test`: the sign, Wilcoxon signed
// rank and runs tests on one column (or the differences of two), and the
// Mann-Whitney, Kruskal-Wallis, Mood median and Friedman tests on groups.
// Every field of the library's record is written, one "name value" a line.
#include "rank_test_mode.h"

#include <qel/rank_tests.h>
#include <qel/sign_tests.h>
#include <qel/variances_test.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <map>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include "domain.h"
#include "test_input.h"

namespace qelcalc {

namespace {

// Warning codes: results valid. The sign interval offers only the extreme
// order statistics (10001) or was interpolated toward the median (10002);
// Mood's test raised a flag (10000).
constexpr int kSignExtremeOnly = 10001;
constexpr int kSignTowardMedian = 10002;
constexpr int kMoodFlagged = 10000;

// Samples with the names they are reported under.
struct Groups {
  std::vector<std::string> labels;
  std::vector<std::vector<double>> samples;
};

// The rank machinery compares values within a tolerance relative to the
// largest magnitude; an infinite value would swallow every other value.
void requireFinite(const std::vector<double>& x, const std::string& label) {
  for (double v : x) {
    if (!std::isfinite(v)) throw UsageError("the rank tests take finite numbers (" + label + ")");
  }
}

void checkOptions(const Arguments& args, const std::string& name,
                  const std::set<std::string>& allowed, const std::set<std::string>& flags) {
  for (const auto& option : args.options) {
    if (!allowed.count(option.first)) {
      throw UsageError("test " + name + " has no option --" + option.first);
    }
  }
  for (const auto& flag : args.flags) {
    if (!flags.count(flag)) throw UsageError("--" + flag + " does not go with " + name);
  }
}

std::vector<std::string> filesOf(const Arguments& args) {
  std::vector<std::string> files(args.positional.begin() + 1, args.positional.end());
  if (files.empty()) throw UsageError("test " + args.positional[0] + " needs a data file");
  return files;
}

// "2,3,5" as column numbers from 1.
std::vector<int> columnList(const std::string& text) {
  std::vector<int> columns;
  std::stringstream s(text);
  std::string item;
  while (std::getline(s, item, ',')) {
    const double c = parseNumber(item, "--columns");
    if (!(c >= 1 && c <= 1e6) || c != static_cast<int>(c)) {
      throw UsageError("--columns must list column numbers from 1");
    }
    columns.push_back(static_cast<int>(c));
  }
  if (columns.empty()) throw UsageError("--columns must list column numbers from 1");
  return columns;
}

// Every column that some row reaches.
std::vector<int> allColumns(const std::vector<TableRow>& rows) {
  std::size_t width = 0;
  for (const auto& row : rows) width = std::max(width, row.fields.size());
  std::vector<int> columns;
  for (std::size_t c = 1; c <= width; ++c) columns.push_back(static_cast<int>(c));
  return columns;
}

std::string columnLabel(const std::vector<TableRow>& rows, bool header, int column) {
  if (header && static_cast<int>(rows.front().fields.size()) >= column &&
      !rows.front().fields[column - 1].empty()) {
    return rows.front().fields[column - 1];
  }
  return std::to_string(column);
}

// The groups of a value column split by the labels of a group column, in
// the order the labels first appear.
Groups groupsByLabel(const Arguments& args, const std::string& path) {
  const int valueColumn = columnOption(args, "value-column", 1);
  const int groupColumn = columnOption(args, "group-column", 2);
  if (valueColumn == groupColumn) throw UsageError("the value and group columns must differ");
  const std::vector<TableRow> rows = readTableRows(path);
  Groups groups;
  std::map<std::string, std::size_t> index;
  for (std::size_t r = hasHeader(rows, {valueColumn}) ? 1 : 0; r < rows.size(); ++r) {
    const auto& fields = rows[r].fields;
    const std::string where = "line " + std::to_string(rows[r].lineNumber);
    if (static_cast<int>(fields.size()) < valueColumn || fields[valueColumn - 1].empty()) continue;
    const double value = parseNumber(fields[valueColumn - 1], where);
    if (static_cast<int>(fields.size()) < groupColumn || fields[groupColumn - 1].empty()) {
      throw UsageError(where + ": a value without a group");
    }
    const std::string& label = fields[groupColumn - 1];
    auto it = index.find(label);
    if (it == index.end()) {
      it = index.emplace(label, groups.labels.size()).first;
      groups.labels.push_back(label);
      groups.samples.emplace_back();
    }
    groups.samples[it->second].push_back(value);
  }
  if (groups.samples.empty()) {
    throw UsageError("no numbers in column " + std::to_string(valueColumn) + " of '" + path + "'");
  }
  return groups;
}

// The groups of a test on several samples: one per file (column --column of
// each), one per column of a single file (--columns, or --column and
// --column2, or every column; twoColumns defaults to columns 1 and 2), or a
// value column split by a group column.
Groups gatherGroups(const Arguments& args, bool twoColumns) {
  const std::vector<std::string> files = filesOf(args);
  const bool byLabel = args.options.count("group-column") || args.options.count("value-column");
  const bool listed = args.options.count("columns") != 0;
  const bool pair = args.options.count("column2") != 0;
  if (byLabel + listed + pair > 1) {
    throw UsageError("use one of --columns, --column2 and --value-column/--group-column");
  }
  if (files.size() > 1 && (byLabel || listed || pair)) {
    throw UsageError(
        "several files give one group each; column options other than --column "
        "go with a single file");
  }
  Groups groups;
  if (byLabel) {
    if (args.options.count("column")) throw UsageError("--column does not go with --group-column");
    return groupsByLabel(args, files[0]);
  }
  if (files.size() > 1) {
    const int column = columnOption(args, "column", 1);
    for (const auto& file : files) {
      groups.labels.push_back(file);
      groups.samples.push_back(readTableColumn(file, column));
    }
    return groups;
  }
  const std::vector<TableRow> rows = readTableRows(files[0]);
  std::vector<int> columns;
  if (listed) {
    if (args.options.count("column")) throw UsageError("--column does not go with --columns");
    columns = columnList(args.options.at("columns"));
  } else if (pair || twoColumns) {
    columns = {columnOption(args, "column", 1), columnOption(args, "column2", 2)};
  } else {
    if (args.options.count("column")) throw UsageError("--column needs --column2 or more files");
    columns = allColumns(rows);
  }
  const bool header = hasHeader(rows, columns);
  for (int c : columns) {
    groups.labels.push_back(columnLabel(rows, header, c));
    groups.samples.push_back(tableColumn(rows, c, files[0]));
  }
  return groups;
}

void requireGroupCount(const Groups& groups, const std::string& name, bool exactlyTwo) {
  const std::size_t k = groups.samples.size();
  if (exactlyTwo && k != 2) {
    throw UsageError(name + " compares two samples, not " + std::to_string(k));
  }
  if (k < 2) throw UsageError(name + " needs at least two groups, got one");
  if (k > std::numeric_limits<unsigned int>::max()) throw UsageError("too many groups");
  for (std::size_t g = 0; g < k; ++g) {
    if (groups.samples[g].size() > static_cast<std::size_t>(std::numeric_limits<int>::max())) {
      throw UsageError("too many numbers in group " + groups.labels[g]);
    }
    requireFinite(groups.samples[g], "group " + groups.labels[g]);
  }
}

// One column, or with --column2 the differences column - column2 of the
// rows that hold both (a row with only one of them is an error).
std::vector<double> oneSample(const Arguments& args) {
  const std::vector<std::string> files = filesOf(args);
  if (files.size() != 1) throw UsageError("test " + args.positional[0] + " takes one data file");
  const std::vector<TableRow> rows = readTableRows(files[0]);
  const int first = columnOption(args, "column", 1);
  std::vector<double> x;
  if (!args.options.count("column2")) {
    x = tableColumn(rows, first, files[0]);
  } else {
    const int second = columnOption(args, "column2", 2);
    for (std::size_t r = hasHeader(rows, {first, second}) ? 1 : 0; r < rows.size(); ++r) {
      const auto& f = rows[r].fields;
      const std::string where = "line " + std::to_string(rows[r].lineNumber);
      const bool hasFirst = static_cast<int>(f.size()) >= first && !f[first - 1].empty();
      const bool hasSecond = static_cast<int>(f.size()) >= second && !f[second - 1].empty();
      if (!hasFirst && !hasSecond) continue;
      if (hasFirst != hasSecond) throw UsageError(where + ": a pair misses one of its values");
      x.push_back(parseNumber(f[first - 1], where) - parseNumber(f[second - 1], where));
    }
    if (x.empty()) throw UsageError("no pairs in '" + files[0] + "'");
  }
  if (x.size() > static_cast<std::size_t>(std::numeric_limits<int>::max())) {
    throw UsageError("too many numbers");
  }
  requireFinite(x, "the sample");
  return x;
}

const std::set<std::string> kOneSampleOptions = {"column",      "column2",    "mu",
                                                 "alternative", "confidence", "interval"};
const std::set<std::string> kGroupOptions = {"column", "column2", "columns", "value-column",
                                             "group-column"};

std::string signStatus(int code) {
  if (code == kSignExtremeOnly) {
    return "10001 (the confidence is beyond the sample: extreme order statistics only)";
  }
  if (code == kSignTowardMedian) return "10002 (interpolated toward the median)";
  return std::to_string(code);
}

int runSign(const Arguments& args, std::ostream& out) {
  checkOptions(args, "sign", kOneSampleOptions, {"approximate"});
  const std::vector<double> x = oneSample(args);
  const qel::AlternativeHypothesis alternative = alternativeOf(args);
  const qel::IntervalType type = intervalOf(args, alternative);
  const double confidence = domainOption(args, "confidence", 0.95, Domain::kLevel);
  const double mu = numberOption(args, "mu", 0.0);
  qel::v0::OneSampleSign r;
  r.n = static_cast<unsigned int>(x.size());
  const int code =
      args.flags.empty()
          ? qel::v0::RunOneSampleSign(&r, x.data(), confidence, type, alternative, mu)
          : qel::v0::RunLynOneSampleSign(&r, x.data(), confidence, type, alternative, mu);
  if (code != kSignExtremeOnly && code != kSignTowardMedian) checkCode(code);
  out << "n " << r.n << "\n";
  writeField(out, "median", r.median);
  writeField(out, "narrower_confidence", r.narrowerConfidence);
  writeField(out, "wider_confidence", r.widerConfidence);
  writeField(out, "narrower_lower", r.narrowerLowerLimit);
  writeField(out, "interpolated_lower", r.interpolatedLowerLimit);
  writeField(out, "wider_lower", r.widerLowerLimit);
  writeField(out, "narrower_upper", r.narrowerUpperLimit);
  writeField(out, "interpolated_upper", r.interpolatedUpperLimit);
  writeField(out, "wider_upper", r.widerUpperLimit);
  writeField(out, "narrower_position", r.narrowerPosition);
  writeField(out, "wider_position", r.widerPosition);
  writeField(out, "p", r.pValue);
  writeField(out, "count_below", r.countBelow);
  writeField(out, "count_equal", r.countEqual);
  writeField(out, "count_above", r.countAbove);
  out << "status " << signStatus(code) << "\n";
  return 0;
}

int runWilcoxon(const Arguments& args, std::ostream& out) {
  checkOptions(args, "wilcoxon", kOneSampleOptions, {});
  const std::vector<double> x = oneSample(args);
  const qel::AlternativeHypothesis alternative = alternativeOf(args);
  const qel::IntervalType type = intervalOf(args, alternative);
  qel::v0::OneSampleWilcoxon r;
  r.n = static_cast<int>(x.size());
  checkCode(qel::v0::RunLynOneSampleWilcoxon(&r, x.data(),
                                             domainOption(args, "confidence", 0.95, Domain::kLevel),
                                             type, alternative, numberOption(args, "mu", 0.0)));
  out << "n " << r.n << "\n";
  writeField(out, "estimate", r.estimatedMedian);
  writeField(out, "achieved_confidence", r.achievedConfidence);
  writeField(out, "lower", r.lowerLimit);
  writeField(out, "upper", r.upperLimit);
  writeField(out, "W", r.W);
  writeField(out, "p", r.pValue);
  return 0;
}

int runRuns(const Arguments& args, std::ostream& out) {
  checkOptions(args, "runs", {"column", "k"}, {"approximate"});
  const std::vector<double> x = oneSample(args);
  double mean = 0.0;
  for (double v : x) mean += v;
  mean /= static_cast<double>(x.size());
  const double k = numberOption(args, "k", mean);
  qel::v1::RunsTest r;
  const auto n = static_cast<unsigned int>(x.size());
  checkCode(args.flags.empty() ? qel::v1::RunRunsTest(&r, x.data(), k, n)
                               : qel::v1::RunLynRunsTest(&r, x.data(), k, n));
  writeField(out, "k", k);
  out << "count_below " << r.countBelow << "\ncount_above " << r.countAbove << "\nobserved_runs "
      << r.observedRuns << "\n";
  writeField(out, "expected_runs", r.expectedRuns);
  writeField(out, "p", r.pValue);
  return 0;
}

int runMannWhitney(const Arguments& args, std::ostream& out) {
  std::set<std::string> allowed = kGroupOptions;
  allowed.insert({"alternative", "confidence", "interval"});
  checkOptions(args, "mann-whitney", allowed, {});
  const Groups groups = gatherGroups(args, true);
  requireGroupCount(groups, "mann-whitney", true);
  const qel::AlternativeHypothesis alternative = alternativeOf(args);
  const qel::IntervalType type = intervalOf(args, alternative);
  qel::v0::MannWhitney r;
  r.firstN = static_cast<int>(groups.samples[0].size());
  r.secondN = static_cast<int>(groups.samples[1].size());
  checkCode(qel::v0::RunLynMannWhitney(&r, groups.samples[0].data(), groups.samples[1].data(),
                                       domainOption(args, "confidence", 0.95, Domain::kLevel), type,
                                       alternative));
  out << "first " << groups.labels[0] << "\nsecond " << groups.labels[1] << "\n";
  out << "first_n " << r.firstN << "\nsecond_n " << r.secondN << "\n";
  writeField(out, "first_median", r.firstMedian);
  writeField(out, "second_median", r.secondMedian);
  writeField(out, "estimate", r.estimate);
  writeField(out, "lower", r.lowerLimit);
  writeField(out, "upper", r.upperLimit);
  writeField(out, "achieved_confidence", r.achievedConfidence);
  writeField(out, "W", r.statistic);
  writeField(out, "p", r.pValue);
  writeField(out, "adjusted_p", r.adjustedPValue);
  return 0;
}

std::string groupName(std::size_t g) {
  return "group" + std::to_string(g + 1) + "_";
}

int runKruskalWallis(const Arguments& args, std::ostream& out) {
  checkOptions(args, "kruskal-wallis", kGroupOptions, {});
  const Groups groups = gatherGroups(args, false);
  requireGroupCount(groups, "kruskal-wallis", false);
  std::vector<qel::v0::KruskalWallisGroup> records(groups.samples.size());
  for (std::size_t g = 0; g < records.size(); ++g) {
    records[g].data = groups.samples[g].data();
    records[g].n = static_cast<unsigned int>(groups.samples[g].size());
  }
  qel::v0::KruskalWallis r;
  r.groups = records.data();
  r.groupCount = static_cast<unsigned int>(records.size());
  checkCode(qel::v0::RunLynKruskalWallis(&r));
  writeField(out, "H", r.statistic);
  writeField(out, "df", r.degreesOfFreedom);
  writeField(out, "p", r.pValue);
  writeField(out, "adjusted_H", r.adjustedStatistic);
  writeField(out, "adjusted_p", r.adjustedPValue);
  out << "groups " << r.groupCount << "\n";
  for (std::size_t g = 0; g < records.size(); ++g) {
    const std::string prefix = groupName(g);
    out << prefix << "label " << groups.labels[g] << "\n" << prefix << "n " << records[g].n << "\n";
    writeField(out, prefix + "median", records[g].median);
    writeField(out, prefix + "mean_rank", records[g].meanRank);
    writeField(out, prefix + "z", records[g].z);
  }
  return 0;
}

std::string moodStatus(int code, unsigned int flags) {
  if (code == qel::qelOk) return "0";
  std::string text = std::to_string(code) + " (";
  const char* separator = "";
  const std::pair<unsigned int, const char*> meanings[] = {
      {qel::v0::kMoodFewAbove, "fewer values above the median than groups"},
      {qel::v0::kMoodFewBelow, "fewer values below the median than groups"},
      {qel::v0::kMoodNoDegrees, "no degrees of freedom"},
      {qel::v0::kMoodTiesMovedUp, "values at the median counted above"}};
  for (const auto& m : meanings) {
    if (flags & m.first) {
      text += separator;
      text += m.second;
      separator = "; ";
    }
  }
  return text + ")";
}

int runMood(const Arguments& args, std::ostream& out) {
  checkOptions(args, "mood", kGroupOptions, {});
  const Groups groups = gatherGroups(args, false);
  requireGroupCount(groups, "mood", false);
  std::vector<qel::v0::MoodGroup> records(groups.samples.size());
  for (std::size_t g = 0; g < records.size(); ++g) {
    records[g].data = groups.samples[g].data();
    records[g].n = static_cast<unsigned int>(groups.samples[g].size());
  }
  qel::v0::Mood r;
  r.groups = records.data();
  r.groupCount = static_cast<unsigned int>(records.size());
  const int code = qel::v0::RunLynMood(&r);
  if (code != kMoodFlagged) checkCode(code);
  writeField(out, "overall_median", r.overallMedian);
  writeField(out, "chi_square", r.statistic);
  writeField(out, "df", r.degreesOfFreedom);
  writeField(out, "p", r.pValue);
  writeField(out, "lower", r.lowerLimit);
  writeField(out, "upper", r.upperLimit);
  writeField(out, "achieved_confidence", r.achievedConfidence);
  out << "flags " << r.flags << "\nstatus " << moodStatus(code, r.flags) << "\n";
  out << "groups " << r.groupCount << "\n";
  for (std::size_t g = 0; g < records.size(); ++g) {
    const std::string prefix = groupName(g);
    const qel::v0::MoodGroup& m = records[g];
    out << prefix << "label " << groups.labels[g] << "\n" << prefix << "n " << m.n << "\n";
    writeField(out, prefix + "count_at_or_below", m.countAtOrBelow);
    writeField(out, prefix + "count_above", m.countAbove);
    writeField(out, prefix + "median", m.median);
    writeField(out, prefix + "iqr", m.interquartileRange);
    writeField(out, prefix + "lower", m.lowerLimit);
    writeField(out, prefix + "upper", m.upperLimit);
  }
  return 0;
}

// A blocks x treatments table: every row a block, every chosen column a
// treatment; a block must hold a number for each treatment.
int runFriedman(const Arguments& args, std::ostream& out) {
  checkOptions(args, "friedman", {"columns"}, {});
  const std::vector<std::string> files = filesOf(args);
  if (files.size() != 1) throw UsageError("friedman takes one blocks x treatments table");
  const std::vector<TableRow> rows = readTableRows(files[0]);
  const std::vector<int> columns =
      args.options.count("columns") ? columnList(args.options.at("columns")) : allColumns(rows);
  if (columns.size() < 2) throw UsageError("friedman needs at least two treatments, got one");
  const bool header = hasHeader(rows, columns);
  std::vector<std::vector<double>> table(columns.size());
  for (std::size_t r = header ? 1 : 0; r < rows.size(); ++r) {
    const auto& fields = rows[r].fields;
    const std::string where = "line " + std::to_string(rows[r].lineNumber);
    for (std::size_t t = 0; t < columns.size(); ++t) {
      const int c = columns[t];
      if (static_cast<int>(fields.size()) < c || fields[c - 1].empty()) {
        throw UsageError(where + ": the block has no value in column " + std::to_string(c));
      }
      table[t].push_back(parseNumber(fields[c - 1], where));
    }
  }
  const std::size_t blocks = table[0].size();
  if (blocks < 2) throw UsageError("friedman needs at least two blocks (rows)");
  if (blocks > std::numeric_limits<unsigned int>::max() / columns.size()) {
    throw UsageError("too many numbers");
  }
  for (std::size_t t = 0; t < table.size(); ++t) {
    requireFinite(table[t], "column " + std::to_string(columns[t]));
  }
  std::vector<qel::v0::FriedmanTreatment> treatments(columns.size());
  for (std::size_t t = 0; t < columns.size(); ++t) treatments[t].column = table[t].data();
  qel::v0::Friedman r;
  r.treatments = treatments.data();
  r.blocks = static_cast<unsigned int>(blocks);
  r.treatmentCount = static_cast<unsigned int>(columns.size());
  checkCode(qel::v0::RunLynFriedman(&r));
  out << "blocks " << r.blocks << "\ntreatments " << r.treatmentCount << "\n";
  writeField(out, "grand_median", r.grandMedian);
  writeField(out, "S", r.statistic);
  writeField(out, "df", r.degreesOfFreedom);
  writeField(out, "p", r.pValue);
  writeField(out, "adjusted_S", r.adjustedStatistic);
  writeField(out, "adjusted_p", r.adjustedPValue);
  for (std::size_t t = 0; t < columns.size(); ++t) {
    const std::string prefix = "treatment" + std::to_string(t + 1) + "_";
    out << prefix << "label " << columnLabel(rows, header, columns[t]) << "\n";
    writeField(out, prefix + "median", treatments[t].estimatedMedian);
    writeField(out, prefix + "rank_sum", treatments[t].rankSum);
    // The library replaced the column by the fitted values.
    out << prefix << "fitted";
    for (double v : table[t]) out << " " << formatNumber(v);
    out << "\n";
  }
  return 0;
}

// Equality of the variances of k groups: Bartlett's test (F for two groups)
// with --normal, otherwise the multiple comparison test and Levene's test.
int runVariances(const Arguments& args, std::ostream& out) {
  std::set<std::string> allowed = kGroupOptions;
  allowed.insert("confidence");
  checkOptions(args, "variances", allowed, {"normal"});
  const Groups groups = gatherGroups(args, false);
  requireGroupCount(groups, "variances", false);
  const double confidence = domainOption(args, "confidence", 0.95, Domain::kLevel);
  const bool normal = std::find(args.flags.begin(), args.flags.end(), "normal") != args.flags.end();
  std::vector<qel::v0::VariancesTestSample> records(groups.samples.size());
  for (std::size_t g = 0; g < records.size(); ++g) {
    records[g].data = groups.samples[g].data();
    records[g].n = static_cast<unsigned int>(groups.samples[g].size());
  }
  qel::v0::VariancesTest r;
  r.samples = records.data();
  r.k = static_cast<unsigned int>(records.size());
  checkCode(qel::v0::RunVariancesTest(&r, confidence, normal));
  out << "method " << (normal ? (r.k == 2 ? "F" : "Bartlett") : "multiple-comparisons") << "\n";
  writeField(out, "levene_statistic", r.leveneStatistic);
  writeField(out, "levene_p", r.levenePValue);
  writeField(out, "statistic", r.mainStatistic);
  writeField(out, "p", r.mainPValue);
  writeField(out, "individual_confidence", r.individualConfidence);
  out << "groups " << r.k << "\n";
  for (std::size_t g = 0; g < records.size(); ++g) {
    const std::string prefix = groupName(g);
    out << prefix << "label " << groups.labels[g] << "\n" << prefix << "n " << records[g].n << "\n";
    writeField(out, prefix + "variance", records[g].variance);
    writeField(out, prefix + "lower", records[g].lowerLimit);
    writeField(out, prefix + "upper", records[g].upperLimit);
    writeField(out, prefix + "mc_lower", records[g].thirdWorkValue);
    writeField(out, prefix + "mc_upper", records[g].fourthWorkValue);
  }
  return 0;
}

}  // namespace

bool isRankTest(const std::string& name) {
  return name == "sign" || name == "wilcoxon" || name == "runs" || name == "mann-whitney" ||
         name == "kruskal-wallis" || name == "mood" || name == "friedman" || name == "variances";
}

int runRankTest(const Arguments& args, std::ostream& out) {
  const std::string& name = args.positional[0];
  if (name == "sign") return runSign(args, out);
  if (name == "wilcoxon") return runWilcoxon(args, out);
  if (name == "runs") return runRuns(args, out);
  if (name == "mann-whitney") return runMannWhitney(args, out);
  if (name == "kruskal-wallis") return runKruskalWallis(args, out);
  if (name == "mood") return runMood(args, out);
  if (name == "variances") return runVariances(args, out);
  return runFriedman(args, out);
}

void printRankTestUsage(std::ostream& out) {
  out << "  qelcalc test sign|wilcoxon FILE|- [--column C] [--column2 C2] [--mu M]\n"
         "                [--alternative less|greater|two-sided] [--confidence 0.95]\n"
         "                [--interval two-sided|lower|upper] [--approximate (sign)]\n"
         "    Sign test (exact binomial; --approximate: normal above n = 50) or Wilcoxon\n"
         "    signed rank test of column C, or of the paired differences C - C2.\n"
         "  qelcalc test runs FILE|- [--column C] [--k K] [--approximate]\n"
         "    Runs above and below K (default the mean); exact P-value unless --approximate.\n"
         "  qelcalc test mann-whitney|kruskal-wallis|mood FILE|- [FILE2 ...]\n"
         "                [--columns C1,C2,... | --column C --column2 C2 |\n"
         "                 --value-column V --group-column G] [--confidence 0.95]\n"
         "                [--alternative ...] [--interval ...] (the last three: mann-whitney)\n"
         "    Groups are several files (column C of each), columns of one table (default:\n"
         "    columns 1 and 2 for mann-whitney, every column otherwise), or the values of\n"
         "    column V split by the labels of column G.\n"
         "  qelcalc test variances FILE|- [FILE2 ...] [group options as above]\n"
         "                [--normal] [--confidence 0.95]\n"
         "    Equal variances of k groups: with --normal Bartlett's test (F for two groups)\n"
         "    and chi-square limits; otherwise a multiple comparison test on Bonett's\n"
         "    method with Levene's test (medians). Limits of each variance at the\n"
         "    confidence 1 - (1 - C)/k; mc_lower/mc_upper: the comparison limits.\n"
         "  qelcalc test friedman FILE|- [--columns C1,C2,...]\n"
         "    Friedman test of a blocks x treatments table: one row a block, one column a\n"
         "    treatment (default every column).\n";
}

}  // namespace qelcalc

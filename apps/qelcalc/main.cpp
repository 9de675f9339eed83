// qelcalc: a small command-line host for libqel. It registers the SIGFPE
// handler once, as every host must, and then runs one mode per invocation.
#include <qel/basic_types.h>

#include <exception>
#include <iostream>
#include <string>

#include "cli.h"
#include "curvefit_mode.h"
#include "describe_mode.h"
#include "distribution_mode.h"
#include "fit_mode.h"
#include "matrix_mode.h"
#include "maxmod_mode.h"
#include "power_mode.h"
#include "gof_mode.h"
#include "proportion_variance_mode.h"
#include "group_mode.h"
#include "help.h"
#include "pvalue_mode.h"
#include "quad_mode.h"
#include "rank_test_mode.h"
#include "ranks_mode.h"
#include "sample_mode.h"
#include "sort_mode.h"
#include "summary_mode.h"
#include "table_mode.h"
#include "ttest_mode.h"

namespace {

void printUsage(std::ostream& out) {
  out << "usage:\n";
  qelcalc::printDistributionUsage(out);
  qelcalc::printPValueUsage(out);
  qelcalc::printDescribeUsage(out);
  qelcalc::printSampleUsage(out);
  qelcalc::printTTestUsage(out);
  qelcalc::printTestUsage(out);
  qelcalc::printRankTestUsage(out);
  qelcalc::printProportionVarianceUsage(out);
  qelcalc::printFitUsage(out);
  qelcalc::printCurveFitUsage(out);
  qelcalc::printSummaryUsage(out);
  qelcalc::printTableUsage(out);
  qelcalc::printMatrixUsage(out);
  qelcalc::printPowerUsage(out);
  qelcalc::printGofUsage(out);
  qelcalc::printTicksUsage(out);
  qelcalc::printQuadUsage(out);
  qelcalc::printSintUsage(out);
  qelcalc::printRangeUsage(out);
  qelcalc::printSortUsage(out);
  qelcalc::printGroupUsage(out);
  qelcalc::printRanksUsage(out);
  qelcalc::printTukeyUsage(out);
  qelcalc::printMaxModUsage(out);
  out << "  qelcalc --help\n";
}

}  // namespace

int main(int argc, char** argv) {
  if (qel::RegisterLynSigfpeHandler() != qel::qelOk) {
    std::cerr << "qelcalc: cannot install the floating-point signal handler\n";
    return 1;
  }
  const int answered = qelcalc::runGlobalOptions(argc, argv, printUsage);
  if (answered >= 0) return answered;
  if (argc < 2 || std::string(argv[1]) == "--help" || std::string(argv[1]) == "-h") {
    printUsage(argc < 2 ? std::cerr : std::cout);
    return argc < 2 ? 2 : 0;
  }
  try {
    const std::string mode = argv[1];
    if (mode == "pvalue" || mode == "crit") return qelcalc::runPValueMode(argc, argv, std::cout);
    if (qelcalc::isDistributionFamily(mode))
      return qelcalc::runDistributionMode(argc, argv, std::cout);
    if (mode == "describe") return qelcalc::runDescribeMode(argc, argv, std::cout);
    if (mode == "sample") return qelcalc::runSampleMode(argc, argv, std::cout);
    if (mode == "ttest") return qelcalc::runTTestMode(argc, argv, std::cout);
    if (mode == "test") return qelcalc::runTestMode(argc, argv, std::cout);
    if (mode == "fit") return qelcalc::runFitMode(argc, argv, std::cout);
    if (mode == "curvefit") return qelcalc::runCurveFitMode(argc, argv, std::cout);
    if (mode == "summary") return qelcalc::runSummaryMode(argc, argv, std::cout);
    if (mode == "pplot") return qelcalc::runPPlotMode(argc, argv, std::cout);
    if (mode == "table") return qelcalc::runTableMode(argc, argv, std::cout);
    if (mode == "matrix") return qelcalc::runMatrixMode(argc, argv, std::cout);
    if (mode == "power") return qelcalc::runPowerMode(argc, argv, std::cout);
    if (mode == "gof") return qelcalc::runGofMode(argc, argv, std::cout);
    if (mode == "ticks") return qelcalc::runTicksMode(argc, argv, std::cout);
    if (mode == "quad") return qelcalc::runQuadMode(argc, argv, std::cout);
    if (mode == "sint") return qelcalc::runSintMode(argc, argv, std::cout);
    if (mode == "range") return qelcalc::runRangeMode(argc, argv, std::cout);
    if (mode == "sort") return qelcalc::runSortMode(argc, argv, std::cout);
    if (mode == "group") return qelcalc::runGroupMode(argc, argv, std::cout);
    if (mode == "ranks") return qelcalc::runRanksMode(argc, argv, std::cout);
    if (mode == "tukey") return qelcalc::runTukeyMode(argc, argv, std::cout);
    if (mode == "maxmod") return qelcalc::runMaxModMode(argc, argv, std::cout);
    throw qelcalc::UsageError("unknown family or mode '" + mode + "' (see qelcalc --help)");
  } catch (const qelcalc::UsageError& e) {
    std::cerr << "qelcalc: " << e.what() << "\n";
    return 2;
  } catch (const std::exception& e) {
    // An exception that left the library (for instance an overflow the kernel
    // does not catch) leaves the thread armed; restore it before reporting.
    qel::ResetFpuStates();
    std::string call;
    for (int i = 1; i < argc; ++i) call += (i > 1 ? " " : "") + std::string(argv[i]);
    std::cerr << "qelcalc: the library failed in " << qelcalc::quoted(call) << ": "
              << qelcalc::quoted(e.what()) << "\n";
    return 2;
  }
}

// Per-mode help and the global options of qelcalc, handled before a mode
// runs: "qelcalc help MODE" and "qelcalc MODE --help" print the usage blocks
// of that mode with one example; --digits N sets the printed digits.
#ifndef QELCALC_HELP_H
#define QELCALC_HELP_H

#include <ostream>
#include <string>

namespace qelcalc {

using UsagePrinter = void (*)(std::ostream&);

// Takes the global options out of argv (argc updated) and answers a help
// request with printUsage's blocks for the mode. Returns the exit status
// when the invocation is answered here (0 after help; 2 after a one-line
// error on stderr), or -1 when the mode is still to run.
int runGlobalOptions(int& argc, char** argv, UsagePrinter printUsage);

// The usage blocks of mode (lines from "  qelcalc MODE" to the next block)
// out of the full usage text, then the mode's example; false for a mode
// with no block.
bool printModeHelp(const std::string& mode, const std::string& fullUsage, std::ostream& out);

}  // namespace qelcalc

#endif

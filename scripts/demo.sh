#!/usr/bin/env bash
# Installs what is missing, builds libqel and qelcalc, and runs qelcalc on the
# bundled example column.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/setup.sh
cmake -S . -B build >/dev/null
cmake --build build -j"$(nproc)" --target qelcalc
q=build/apps/qelcalc/qelcalc
set -x
$q logistic cdf 1.5 --location 0 --scale 1 --upper
$q cauchy inv 0.975
$q cauchy cdf -1e300 --location 0 --scale 1
$q triangular inv --lower 0 --mode 2 --upper 3 --file examples/probabilities.txt

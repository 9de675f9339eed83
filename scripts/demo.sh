#!/usr/bin/env bash
# Installs what is missing, builds libqel and qelcalc, and runs qelcalc on the
# bundled examples: distribution tails, a column of probabilities, three
# groups of measurements and a table of counts.
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
$q normal cdf -30
$q t cdf -40 --df 4 --noncentrality 3
$q test mann-whitney examples/groups.csv --columns 1,2
$q test kruskal-wallis examples/groups.csv
$q table examples/table.txt --want chisq,lr,cramer,kappa,gk,concordance

#!/usr/bin/env bash
# Builds and runs the whole test suite: the normal build, the build under
# AddressSanitizer and UndefinedBehaviorSanitizer (the normal build also builds
# the API reference when Doxygen is there), and a consumer project that
# finds the installed library with find_package(qel).
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/setup.sh
jobs=$(nproc)
# ccache, when the machine has it, makes a second run cheap; it changes no result.
launcher=()
command -v ccache >/dev/null && launcher=(-DCMAKE_CXX_COMPILER_LAUNCHER=ccache)

cmake -S . -B build -DQEL_BUILD_TESTS=ON -DQEL_BUILD_PYTHON=ON "${launcher[@]}" >/dev/null
cmake --build build -j"$jobs"
(cd build && ctest --output-on-failure -j"$jobs")
# The API reference: an undocumented public name or a malformed comment fails.
if command -v doxygen >/dev/null; then
  cmake --build build --target docs
fi

cmake -S . -B build-sanitize -DQEL_SANITIZE=ON -DQEL_BUILD_TESTS=ON "${launcher[@]}" >/dev/null
cmake --build build-sanitize -j"$jobs"
(cd build-sanitize && ASAN_OPTIONS=detect_leaks=0 ctest --output-on-failure -j"$jobs")

rm -rf build/_install build/_consumer
cmake --install build --prefix build/_install >/dev/null
cmake -S tests/consumer -B build/_consumer -DCMAKE_PREFIX_PATH="$PWD/build/_install" >/dev/null
cmake --build build/_consumer >/dev/null
LD_LIBRARY_PATH="$PWD/build/_install/lib" build/_consumer/consumer
# The same consumer built through pkg-config alone.
PKG_CONFIG_PATH="$PWD/build/_install/lib/pkgconfig" \
  c++ -std=c++17 tests/consumer/main.cpp -o build/_consumer/consumer_pc \
  $(PKG_CONFIG_PATH="$PWD/build/_install/lib/pkgconfig" pkg-config --cflags --libs qel)
LD_LIBRARY_PATH="$PWD/build/_install/lib" build/_consumer/consumer_pc
# The Python module as installed: imported from the prefix's site-packages,
# finding libqel.so through its RPATH.
python=$(sed -n 's/^Python3_EXECUTABLE:[A-Z]*=//p' build/CMakeCache.txt)
site=$(dirname "$(dirname "$(find "$PWD/build/_install" -name '_qel*.so' | head -1)")")
PYTHONPATH="$site" "$python" -c \
  'import qel; assert repr(qel.normal.cdf(-30.0)) == "4.906713927148187e-198", qel.__file__'
echo "all test stages passed"

#!/usr/bin/env bash
# Builds the project three times and runs the whole test suite in each: optimised with warnings
# as errors; with AddressSanitizer and UndefinedBehaviorSanitizer; and with clang, unoptimised
# and without debug information (quick to build), so that the code stays portable.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/deps.sh
jobs=$(nproc)

cmake -S . -B build/release -G Ninja -DCMAKE_BUILD_TYPE=RelWithDebInfo -DLUN_WERROR=ON >/dev/null
cmake --build build/release -j"$jobs"
(cd build/release && ctest --output-on-failure -j"$jobs")

cmake -S . -B build/sanitize -G Ninja -DCMAKE_BUILD_TYPE=Debug -DLUN_WERROR=ON -DLUN_SANITIZE=ON \
      -DLUN_BENCH=OFF >/dev/null
cmake --build build/sanitize -j"$jobs"
(cd build/sanitize && ASAN_OPTIONS=detect_leaks=1 UBSAN_OPTIONS=print_stacktrace=1 \
    ctest --output-on-failure -j"$jobs")

# A build type CMake does not know adds no flags: no optimisation, no debug information.
CXX=clang++ cmake -S . -B build/clang -G Ninja -DCMAKE_BUILD_TYPE=Portability -DLUN_WERROR=ON -DLUN_BENCH=OFF \
    >/dev/null
cmake --build build/clang -j"$jobs"
(cd build/clang && ctest --output-on-failure -j"$jobs")

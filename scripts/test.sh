#!/usr/bin/env bash
# Builds the project three times and runs the whole test suite in each: optimised with warnings
# as errors; with AddressSanitizer and UndefinedBehaviorSanitizer; and with clang, unoptimised
# and without debug information (quick to build), so that the code stays portable. Then a fuzz
# smoke: every fuzzer (clang, instrumented) runs LUN_FUZZ_SECONDS (30) over the saved corpus,
# its new inputs in a temporary folder; a finding fails the run and shows the fuzzer's report.
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

scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
for dir in fuzz/corpus/*/; do
    target=$(basename "$dir")
    log=$scratch/$target.log
    if ! FUZZ_CORPUS=$scratch/$target FUZZ_ARTIFACTS=build/fuzz/findings/$target FUZZ_BUILD_JOBS=$jobs \
        scripts/fuzz.sh "$target" "${LUN_FUZZ_SECONDS:-30}" >"$log" 2>&1; then
        tail -n 60 "$log"
        echo "fuzz smoke: $target failed; its input is in build/fuzz/findings/$target/ (once fixed, keep it in" \
             "fuzz/regressions/$target/)" >&2
        exit 1
    fi
    echo "fuzz smoke: $target: $(grep -ho 'stat::number_of_executed_units: [0-9]*' "$log" | grep -o '[0-9]*$') inputs," \
         "$(grep -o 'cov: [0-9]* ft: [0-9]*' "$log" | tail -n 1), no finding"
done
echo "fuzzers: $(ls -d fuzz/corpus/*/ | wc -l) passed, 0 failed"

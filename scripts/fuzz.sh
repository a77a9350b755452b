#!/usr/bin/env bash
# Builds the fuzzers (clang, instrumented, in build/fuzz) and runs one for a while over its seed
# corpus with the constraint-language dictionary. New inputs go to build/fuzz/corpus/TARGET
# (or FUZZ_CORPUS); crashes to build/fuzz/artifacts/TARGET/ (or FUZZ_ARTIFACTS). fuzz/corpus
# is only read.
#   scripts/fuzz.sh TARGET SECONDS [-- extra libFuzzer arguments, e.g. -max_len=2000000]
# Targets: annotate yosys native filter repository extract.
set -euo pipefail
cd "$(dirname "$0")/.."
if [ $# -lt 2 ]; then
  sed -n '2,7p' "$0" >&2
  exit 2
fi
target=$1 seconds=$2
shift 2
[ "${1:-}" = "--" ] && shift
[ -d "fuzz/corpus/$target" ] || { echo "fuzz.sh: no target '$target'" >&2; exit 2; }

CXX=${CXX:-clang++} cmake -S . -B build/fuzz -G Ninja -DCMAKE_BUILD_TYPE=RelWithDebInfo -DLUN_FUZZ=ON \
    -DLUN_TESTS=OFF -DLUN_BENCH=OFF >/dev/null
cmake --build build/fuzz -j"${FUZZ_BUILD_JOBS:-$(nproc)}" --target "fuzz_$target"

work=${FUZZ_CORPUS:-build/fuzz/corpus/$target} artifacts=${FUZZ_ARTIFACTS:-build/fuzz/artifacts/$target}
mkdir -p "$work" "$artifacts"
ASAN_OPTIONS=${ASAN_OPTIONS:-detect_leaks=1} UBSAN_OPTIONS=${UBSAN_OPTIONS:-print_stacktrace=1} \
  "build/fuzz/fuzz/fuzz_$target" -max_total_time="$seconds" -dict=fuzz/constraints.dict \
  -artifact_prefix="$artifacts/" -timeout=20 -rss_limit_mb=3000 -print_final_stats=1 "$@" \
  "$work" "fuzz/corpus/$target"

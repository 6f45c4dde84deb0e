#!/usr/bin/env bash
# Builds the libFuzzer targets (clang++-14, ASan + UBSan) in a build dir of
# their own and runs each for a bounded time:
#   scripts/fuzz.sh [SECONDS_PER_TARGET] [TARGET...]
# (default 30 seconds, every target). Each target first runs every seed
# once at full length (fuzz/corpus/<target>, plus the long inputs made
# below), then fuzzes from them for the given time with inputs of up to
# FUZZ_MAX_LEN bytes. Any crash, leak, sanitizer report, timeout or
# out-of-memory fails the script; the input that caused it is kept in
# $BUILD_FUZZ/artifacts/. The executions of each target are printed at the
# end and kept in $BUILD_FUZZ/fuzz-stats.txt.
set -euo pipefail
cd "$(dirname "$0")/.."

SECONDS_PER_TARGET=${1:-30}
shift || true
BUILD_FUZZ=${BUILD_FUZZ:-build-fuzz}
FUZZ_MAX_LEN=${FUZZ_MAX_LEN:-8192}
ALL_TARGETS=(criteria number field_cipher text_cp1252 csv csv_import key_file settings)
TARGETS=("$@")
[ ${#TARGETS[@]} -eq 0 ] && TARGETS=("${ALL_TARGETS[@]}")

if ! command -v clang++-14 >/dev/null; then
  echo "fuzz: clang++-14 is missing; run scripts/install-deps.sh" >&2
  exit 1
fi

if [ ! -f "$BUILD_FUZZ/CMakeCache.txt" ]; then
  cmake -S . -B "$BUILD_FUZZ" -G Ninja -DCMAKE_CXX_COMPILER=clang++-14 \
    -DCMAKE_BUILD_TYPE=RelWithDebInfo -DBELVANE_FUZZ=ON -DBELVANE_BUILD_TESTS=OFF \
    -DBELVANE_BUILD_BENCH=OFF -DBELVANE_BUILD_QT=OFF >/dev/null
fi
cmake --build "$BUILD_FUZZ" -j "$(nproc)" --target fuzz_all

# Inputs too long to keep in the repository: 150,000 terms joined by OR and
# by AND (about 1.6 MB each), deeper nesting than the committed seed.
generated="$BUILD_FUZZ/generated-seeds"
mkdir -p "$generated/criteria"
g="$generated/criteria"
awk 'BEGIN { printf "F"; for (i = 0; i < 150000; i++) printf "%sITEMID = %d", (i ? " OR " : ""), i }' >"$g/or_150000"
awk 'BEGIN { printf "F"; for (i = 0; i < 150000; i++) printf "%srrhour <> %d", (i ? " AND " : ""), i }' >"$g/and_150000"
awk 'BEGIN { printf "f%c%c%c%c%c%c%c%c%c", 0, 0, 0, 0, 0, 0, 0, 0, 0
             for (i = 0; i < 150000; i++) printf "%sITEMID = 1", (i ? " OR " : "") }' >"$g/find_or_150000"
awk 'BEGIN { printf "F"; for (i = 0; i < 100000; i++) printf "("; printf "ITEMID = 1"
             for (i = 0; i < 100000; i++) printf ")" }' >"$g/nested_100000"
awk 'BEGIN { printf "L"; for (i = 0; i < 10000; i++) printf "a"; printf "\n"
             for (i = 0; i < 2000; i++) printf "%%a"; printf "%%b" }' >"$g/like_10000"

stats="$BUILD_FUZZ/fuzz-stats.txt"
: >"$stats"
mkdir -p "$BUILD_FUZZ/artifacts"
export ASAN_OPTIONS=${ASAN_OPTIONS:-detect_leaks=1:abort_on_error=1}
export UBSAN_OPTIONS=${UBSAN_OPTIONS:-print_stacktrace=1:halt_on_error=1}
for t in "${TARGETS[@]}"; do
  bin="$BUILD_FUZZ/fuzz/fuzz_$t"
  seeds="fuzz/corpus/$t"
  work="$BUILD_FUZZ/corpus/$t"
  mkdir -p "$work"
  echo "== fuzz_$t: every seed once, at full length"
  files=("$seeds"/*)
  if [ -d "$generated/$t" ]; then files+=("$generated/$t"/*); fi
  "$bin" -timeout=60 -rss_limit_mb=4096 "${files[@]}" >"$BUILD_FUZZ/fuzz_$t.seeds.log" 2>&1 || {
    tail -n 40 "$BUILD_FUZZ/fuzz_$t.seeds.log" >&2
    echo "fuzz: fuzz_$t failed on a seed" >&2
    exit 1
  }
  echo "== fuzz_$t: fuzzing for ${SECONDS_PER_TARGET}s"
  log="$BUILD_FUZZ/fuzz_$t.log"
  "$bin" -max_total_time="$SECONDS_PER_TARGET" -max_len="$FUZZ_MAX_LEN" -timeout=10 \
    -rss_limit_mb=2048 -print_final_stats=1 -artifact_prefix="$BUILD_FUZZ/artifacts/$t-" \
    "$work" "$seeds" >"$log" 2>&1 || {
    tail -n 60 "$log" >&2
    echo "fuzz: fuzz_$t found a fault; the input is in $BUILD_FUZZ/artifacts/" >&2
    exit 1
  }
  runs=$(sed -n 's/^stat::number_of_executed_units: *//p' "$log" | tail -n 1)
  echo "fuzz_$t ${SECONDS_PER_TARGET}s ${runs:-?} executions" | tee -a "$stats"
done
echo "fuzz: no findings"
cat "$stats"

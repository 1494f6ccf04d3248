#!/usr/bin/env bash
# Builds both builds (native with sanitizers, Windows with mingw-w64) and the
# fuzz targets, checks includes and formatting, runs every test, and ends
# with one line "N passed, N failed".
#   scripts/test.sh            everything
#   FUZZ_SECONDS=N             time per fuzz target (default 20)
set -uo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
cd "$root"
fuzz_seconds=${FUZZ_SECONDS:-20}
jobs=${JOBS:-$(nproc)}

# Installs only what is missing (quiet and quick when nothing is).
bash scripts/setup.sh >/dev/null || { echo "test.sh: scripts/setup.sh failed"; echo "0 passed, 1 failed"; exit 1; }

results=$root/build/results
rm -rf "$results"
mkdir -p "$results"
build_failures=0

# The house rules: each folder includes only the folders its CMake call names
# (all below it), OS headers stay in _win/_posix files, and the code is
# formatted with the repository's .clang-format.
echo "== checking includes and formatting"
if ! python3 scripts/check_includes.py >"$results/includes.log" 2>&1; then
  echo "FAILED: include check"; cat "$results/includes.log"
  build_failures=$((build_failures + 1))
fi
if ! git ls-files '*.c' '*.cpp' '*.h' | xargs clang-format --dry-run --Werror >"$results/format.log" 2>&1; then
  echo "FAILED: formatting (run: git ls-files '*.c' '*.cpp' '*.h' | xargs clang-format -i)"
  head -40 "$results/format.log"
  build_failures=$((build_failures + 1))
fi

build() {  # PRESET [TARGET]
  echo "== building $1"
  if ! { cmake --preset "$1" >"$results/configure-$1.log" 2>&1 &&
         cmake --build --preset "$1" -j "$jobs" ${2:+--target "$2"} >"$results/build-$1.log" 2>&1; }; then
    echo "FAILED: build of $1 (see below)"
    tail -40 "$results/configure-$1.log" "$results/build-$1.log"
    build_failures=$((build_failures + 1))
    return 1
  fi
}

run_ctest() {  # PRESET
  local dir=$root/build/$1
  rm -rf "$dir/test-results"
  mkdir -p "$dir/test-results"
  echo "== testing $1"
  ctest --test-dir "$dir" --output-on-failure --output-junit "$results/ctest-$1.xml" -j "$jobs" 2>&1 | tail -60
}

build native-asan && run_ctest native-asan
# Stage one's workers under ThreadSanitizer: the stage-one table, where several of them fail, cancel and finish.
if build native-tsan patch_tests; then
  echo "== testing stage one's workers with ThreadSanitizer"
  if "$root/build/native-tsan/tests/patch_tests" --gtest_filter='StageOne*' >"$results/tsan.log" 2>&1; then
    echo "PASS stage-one-threads" >>"$results/checks.txt"
  else
    echo "FAIL stage-one-threads" >>"$results/checks.txt"
    echo "FAILED: ThreadSanitizer run"; tail -40 "$results/tsan.log"
  fi
fi
build windows && run_ctest windows

if build fuzz; then
  echo "== fuzzing ($fuzz_seconds s per target)"
  for target in "$root"/build/fuzz/tests/fuzz/*_fuzz; do
    [ -x "$target" ] || continue
    name=$(basename "$target")
    corpus=$root/build/fuzz/corpus/$name
    mkdir -p "$corpus"
    seeds=$root/tests/fuzz/seeds/$name
    seed_maker=$root/tests/fuzz/${name}_seeds.sh
    [ -x "$seed_maker" ] && [ -z "$(ls -A "$corpus")" ] && "$seed_maker" "$corpus" >/dev/null 2>&1
    args=("$corpus")
    [ -d "$seeds" ] && args+=("$seeds")
    if "$target" -max_total_time="$fuzz_seconds" -timeout=10 -rss_limit_mb=2048 \
         -artifact_prefix="$results/$name-" "${args[@]}" >"$results/$name.log" 2>&1; then
      echo "PASS $name" >>"$results/fuzz.txt"
    else
      echo "FAIL $name" >>"$results/fuzz.txt"
      echo "FAILED: fuzz target $name"; tail -30 "$results/$name.log"
    fi
  done
fi

summary=$(python3 "$root/scripts/summarize_tests.py" "$results" "$root/build")
echo "$summary" | head -n -1
passed_failed=$(echo "$summary" | tail -1)
read -r passed failed <<<"$passed_failed"
failed=$((failed + build_failures))
echo "$passed passed, $failed failed"
[ "$failed" -eq 0 ]

#!/usr/bin/env bash
# Builds the fuzz targets of the file readers (the `fuzz` preset: clang,
# libFuzzer, AddressSanitizer, UndefinedBehaviorSanitizer) and runs them.
#
#   scripts/fuzz.sh [SECONDS] [TARGET...]   fuzz each target SECONDS (60)
#   scripts/fuzz.sh --replay [TARGET...]    run each target once over its
#                                           committed corpus, and stop
#
# Targets are the names after fuzz_ in build/fuzz/tests/fuzz (all when none
# is given). A fuzzing run starts from the committed seeds in
# tests/fuzz/corpus/<target> and keeps what it learns in
# build/fuzz/corpus/<target>; an input that crashes, hangs, leaks or passes
# the memory limits is written to build/fuzz/findings/<target>/. Once its
# fault is fixed, copy it into tests/fuzz/corpus/<target> under a name that
# says what it was, so that every later replay runs it.
set -euo pipefail
cd "$(dirname "$0")/.."

replay=0
seconds=60
if [ "${1:-}" = "--replay" ]; then
  replay=1
  shift
elif [[ "${1:-}" =~ ^[0-9]+$ ]]; then
  seconds=$1
  shift
fi

scripts/setup.sh
cmake --preset fuzz >/dev/null
cmake --build --preset fuzz

bin=build/fuzz/tests/fuzz
targets=("$@")
if [ ${#targets[@]} -eq 0 ]; then
  for program in "$bin"/fuzz_*; do
    name=${program##*/fuzz_}
    [ "$name" = seed_maker ] && continue
    targets+=("$name")
  done
fi

# The limits every run holds the readers to: no input may take more than
# 512 MiB in one allocation or 2 GiB in all, or run for 10 s.
limits=(-rss_limit_mb=2048 -malloc_limit_mb=512 -timeout=10)
export ASAN_OPTIONS=detect_leaks=1:allocator_may_return_null=0
export UBSAN_OPTIONS=print_stacktrace=1:halt_on_error=1

failed=()
for target in "${targets[@]}"; do
  program=$bin/fuzz_$target
  seeds=tests/fuzz/corpus/$target
  [ -x "$program" ] || { echo "fuzz: no target '$target'" >&2; exit 2; }
  [ -d "$seeds" ] || { echo "fuzz: no corpus $seeds" >&2; exit 2; }
  dict=()
  [ -f "tests/fuzz/dict/$target.dict" ] && dict=(-dict="tests/fuzz/dict/$target.dict")
  if [ $replay -eq 1 ]; then
    start=$SECONDS
    if "$program" "${limits[@]}" -runs=0 "$seeds" >"build/fuzz/replay-$target.log" 2>&1; then
      echo "fuzz: $target replayed $(find "$seeds" -type f | wc -l) inputs in $((SECONDS - start)) s"
    else
      echo "fuzz: $target FAILED on its corpus; the end of build/fuzz/replay-$target.log:" >&2
      tail -n 40 "build/fuzz/replay-$target.log" >&2
      failed+=("$target")
    fi
    continue
  fi
  mkdir -p "build/fuzz/corpus/$target" "build/fuzz/findings/$target"
  echo "fuzz: $target for $seconds s"
  set +e
  "$program" "${limits[@]}" "${dict[@]}" -max_total_time="$seconds" -print_final_stats=1 \
    -artifact_prefix="build/fuzz/findings/$target/" \
    "build/fuzz/corpus/$target" "$seeds" >"build/fuzz/fuzz-$target.log" 2>&1
  status=$?
  set -e
  grep -E '^(#[0-9]+ +(INITED|DONE)|stat::(number_of_executed_units|average_exec_per_sec|peak_rss_mb)|==[0-9]+==ERROR|SUMMARY|Test unit written)' \
    "build/fuzz/fuzz-$target.log" || true
  [ $status -eq 0 ] || failed+=("$target")
done

if [ ${#failed[@]} -gt 0 ]; then
  echo "fuzz: faults in ${failed[*]}" >&2
  exit 1
fi

#!/usr/bin/env bash
# Builds the libFuzzer targets with clang in build/fuzz and runs each for SECONDS, one at a time.
# Usage: scripts/fuzz.sh SECONDS [TARGET...]   (SECONDS 0: run the seed corpus once and stop)
# Targets: fuzz_generator fuzz_analyzer fuzz_entry_field fuzz_resource fuzz_faults (all by default).
# Seeds are read from tests/fuzz/corpus/TARGET; new inputs go to build/fuzz/corpus/TARGET, crash
# inputs to build/fuzz/crashes/TARGET, logs to build/fuzz/logs. Exit status 1 when a target crashed.
set -euo pipefail
cd "$(dirname "$0")/.."

usage() {
    echo "usage: scripts/fuzz.sh SECONDS [TARGET...]" >&2
    exit 2
}
[[ $# -ge 1 && $1 =~ ^[0-9]+$ ]] || usage
seconds=$1
shift
all=(fuzz_generator fuzz_analyzer fuzz_entry_field fuzz_resource fuzz_faults)
targets=("${@:-${all[@]}}")
for t in "${targets[@]}"; do
    [[ " ${all[*]} " == *" $t "* ]] || { echo "unknown target '$t' (known: ${all[*]})" >&2; exit 2; }
done

out=build/fuzz
cxx=${FUZZ_CXX:-clang++}
command -v "$cxx" >/dev/null || { echo "fuzzing needs clang++ with libFuzzer ($cxx not found)" >&2; exit 2; }
cmake -S . -B "$out" -G Ninja -DCMAKE_CXX_COMPILER="$cxx" -DCMAKE_BUILD_TYPE=RelWithDebInfo \
    -DCMAKE_CXX_FLAGS_RELWITHDEBINFO="-O1 -g" -DZP_BUILD_FUZZ=ON -DZP_BUILD_TESTS=OFF \
    -DZP_BUILD_BENCH=OFF -DZP_BUILD_GUI=OFF >/dev/null
cmake --build "$out" -j 2 --target "${targets[@]}"

export ASAN_OPTIONS=${ASAN_OPTIONS:-detect_leaks=1}
export UBSAN_OPTIONS=${UBSAN_OPTIONS:-print_stacktrace=1:halt_on_error=1}
status=0
for t in "${targets[@]}"; do
    mkdir -p "$out/corpus/$t" "$out/crashes/$t" "$out/logs"
    log="$out/logs/$t.log"
    args=(-timeout=10 -print_final_stats=1 -artifact_prefix="$out/crashes/$t/")
    [[ -f tests/fuzz/$t.dict ]] && args+=(-dict="tests/fuzz/$t.dict")
    if [[ $seconds -eq 0 ]]; then args+=(-runs=0); else args+=(-max_total_time="$seconds"); fi
    echo "== $t (${seconds}s, log $log)"
    if "$out/tests/fuzz/$t" "${args[@]}" "$out/corpus/$t" "tests/fuzz/corpus/$t" >"$log" 2>&1; then
        result=ok
    else
        result="CRASHED, input in $out/crashes/$t"
        status=1
    fi
    # The summary libFuzzer prints at its end: runs, coverage, features and corpus size.
    runs=$(sed -n 's/^stat::number_of_executed_units: *//p' "$log" | tail -1)
    last=$(grep -E '^#[0-9]+' "$log" | tail -1 || true)
    echo "   $result; executions ${runs:-?}; last status: ${last:-none}"
done
exit $status

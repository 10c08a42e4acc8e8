#!/bin/sh
# run-fuzz.sh <build folder> <seconds> [harness...]
# Fuzzes each harness (all of them by default) for <seconds>, starting from
# its seeds and regression cases. The corpus grows in <build>/fuzz-corpus/,
# inputs that fail are kept in <build>/fuzz-artifacts/. Fails when any
# harness found a fault.
set -u
build=$1
seconds=$2
shift 2
src=$(cd "$(dirname "$0")" && pwd)
names=${*:-$(ls "$build/fuzz" | sed -n 's/^fuzz_\([a-z]*\)$/\1/p')}
failed=""
for name in $names; do
    corpus="$build/fuzz-corpus/$name"
    mkdir -p "$corpus" "$build/fuzz-artifacts"
    cp "$build/fuzz/seeds/$name"/* "$corpus/"
    if [ -d "$src/regressions/$name" ]; then
        find "$src/regressions/$name" -type f ! -name '.*' | while read -r f; do
            cp "$f" "$corpus/regression-$(basename "$f")"
        done
    fi
    echo "== fuzz_$name for ${seconds}s"
    if ! "$build/fuzz/fuzz_$name" "$corpus" -max_total_time="$seconds" -timeout=30 \
        -print_final_stats=1 -artifact_prefix="$build/fuzz-artifacts/$name-" 2>"$build/fuzz-$name.log"; then
        tail -n 60 "$build/fuzz-$name.log"
        failed="$failed $name"
    else
        grep -E '^(stat::number_of_executed_units|#[0-9]+.*DONE)' "$build/fuzz-$name.log" || true
    fi
done
if [ -n "$failed" ]; then
    echo "fuzzing found faults in:$failed (inputs in $build/fuzz-artifacts/)" >&2
    exit 1
fi

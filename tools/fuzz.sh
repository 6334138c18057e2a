#!/usr/bin/env bash
# Runs every fuzz target, or the named ones, in parallel, and adds the inputs that reach new code to tests/fuzz/corpus.
# Usage: tools/fuzz.sh MINUTES [TARGET...]
#        tools/fuzz.sh --coverage [TARGET...]    prints how much of the code under test the corpus reaches
# Exit status: 0 no fault found; 1 a target failed, its input is named; 2 bad arguments.
set -euo pipefail
program=$0
cd "$(dirname "${BASH_SOURCE[0]}")/.."

fail() {
    echo "$program: $1" >&2
    exit 2
}

[ $# -gt 0 ] || fail "MINUTES: missing, expected a whole number or --coverage"
minutes=$1
shift
[[ $minutes == --coverage || $minutes =~ ^[1-9][0-9]{0,4}$ ]] || fail "$minutes: not a whole number of minutes"

build=build-fuzz
folder=$build/tests/fuzz
corpus=tests/fuzz/corpus
tools/install-packages.sh test
cmake -S . -B $build -G Ninja -DTELIX_BUILD_TESTS=ON -DTELIX_FUZZ_COVERAGE=ON >/dev/null
cmake --build $build --target fuzz

if [ $# -eq 0 ]; then
    for binary in "$folder"/*-fuzz; do
        set -- "$@" "$(basename "$binary" -fuzz)"
    done
fi
for target in "$@"; do
    [ -x "$folder/$target-fuzz" ] || fail "$target: unknown fuzz target"
done

# Rows of a table: the sources under test, their lines, and how many of them the corpus reaches. What it does not reach at all
# is there to link; the target itself does not count.
print_coverage() {
    local profile=$folder/$1.profraw
    LLVM_PROFILE_FILE=$profile "$folder/$1-fuzz" -runs=0 "$corpus/$1" >/dev/null 2>&1
    llvm-profdata-14 merge -o "$folder/$1.profdata" "$profile"
    llvm-cov-14 export "$folder/$1-fuzz" -instr-profile="$folder/$1.profdata" -summary-only \
        -ignore-filename-regex='tests/fuzz|/usr/' | python3 -c "
import json, os, sys
for file in json.load(sys.stdin)['data'][0]['files']:
    lines = file['summary']['lines']
    if lines['covered']:
        print(f'| $1 | \`{os.path.relpath(file[\"filename\"])}\` | {lines[\"count\"]} | {lines[\"percent\"]:.0f} % |')"
}

if [ "$minutes" = --coverage ]; then
    echo '| Target | Source | Lines | Reached |'
    echo '|---|---|---|---|'
    for target in "$@"; do
        print_coverage "$target"
    done
    exit 0
fi

# One target: new inputs go into a folder of the build, then those that reach new code into the tree.
run_target() {
    local found=$folder/$1-found dictionary=()
    [ -f "tests/fuzz/$1.dict" ] && dictionary=(-dict="tests/fuzz/$1.dict")
    mkdir -p "$found"
    LLVM_PROFILE_FILE=/dev/null "$folder/$1-fuzz" -max_total_time=$((60 * minutes)) -max_len=16384 -timeout=10 \
        -rss_limit_mb=1024 -malloc_limit_mb=256 "${dictionary[@]}" -artifact_prefix="$found/" \
        "$found" "$corpus/$1" >"$folder/$1.log" 2>&1
    LLVM_PROFILE_FILE=/dev/null "$folder/$1-fuzz" -merge=1 "$corpus/$1" "$found" >>"$folder/$1.log" 2>&1
}

declare -A running
for target in "$@"; do
    run_target "$target" &
    running[$target]=$!
done
status=0
for target in "$@"; do
    if wait "${running[$target]}"; then
        echo "$target: no fault, $(find "$corpus/$target" -type f | wc -l) inputs"
    else
        echo "$target: fault, $(grep -a 'Test unit written to' "$folder/$target.log" || echo "see $folder/$target.log")"
        status=1
    fi
done
exit $status

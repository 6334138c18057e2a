#!/usr/bin/env bash
# Runs pages with random steps on each engine, each seed with and without sanitizers, for some minutes.
# Usage: tools/random-pages.sh MINUTES [FIRST-SEED]
# A round is one seed of 10,000 steps in each test of random pages; the round that runs at the end of the time is finished.
# Exit status: 0 no fault found; 1 a seed failed, its output precedes; 2 bad arguments.
set -euo pipefail
program=$0
cd "$(dirname "${BASH_SOURCE[0]}")/.."

fail() {
    echo "$program: $1" >&2
    exit 2
}

[ $# -gt 0 ] || fail "MINUTES: missing, expected a whole number"
[ $# -lt 3 ] || fail "$3: unknown argument"
minutes=$1
seed=${2:-1}
[[ $minutes =~ ^[1-9][0-9]{0,4}$ ]] || fail "$minutes: not a whole number of minutes"
[[ $seed =~ ^[1-9][0-9]{0,8}$ ]] || fail "$seed: not a seed, expected a whole number from 1"

tools/install-packages.sh run test
cmake --preset release -DTELIX_BUILD_TESTS=ON -DTELIX_BUILD_DESKTOP=ON -DTELIX_BUILD_BROWSER=ON -DTELIX_BUILD_BRIDGE=ON \
    >/dev/null
cmake --build --preset release
cmake --preset asan -DTELIX_TEST_OBJECTS="$PWD/build" >/dev/null
cmake --build --preset asan

export TELIX_RANDOM_SEEDS=1 TELIX_RANDOM_STEPS=10000
end=$((SECONDS + 60 * minutes))
rounds=0
failures=0
while [ $SECONDS -lt $end ]; do
    for preset in asan release; do
        if ! output=$(TELIX_RANDOM_FIRST=$seed ctest --preset $preset -R random --output-on-failure); then
            echo "$output"
            echo "seed $seed: fault in the build $preset" >&2
            failures=$((failures + 1))
        fi
    done
    rounds=$((rounds + 1))
    seed=$((seed + 1))
done
echo "$rounds seeds, the last one $((seed - 1)); $failures faults"
[ $failures -eq 0 ]

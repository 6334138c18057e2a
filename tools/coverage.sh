#!/usr/bin/env bash
# Which lines of the plug-in, the desktop platform library and the bridge their own test programs execute: a table of the
# areas, and with --files of their files.
# Usage: tools/coverage.sh [--files]
# Compiles the three with counters into build-coverage. The tests themselves are those of the preset release.
# Exit status: 0 all tests pass; 1 some fail; 2 bad arguments.
set -euo pipefail
program=$0
cd "$(dirname "${BASH_SOURCE[0]}")/.."

fail() {
    echo "$program: $1" >&2
    exit 2
}

files=no
if [ "${1:-}" = --files ]; then
    files=yes
    shift
fi
[ $# -eq 0 ] || fail "$1: unexpected argument"

build=build-coverage
jobs=${CMAKE_BUILD_PARALLEL_LEVEL:-$(nproc)}
tools/install-packages.sh run test
cmake --preset release -DTELIX_BUILD_BRIDGE=ON >/dev/null
ninja -C build -j "$jobs" telix_unit_test_objects telix_desktop_test_objects telix_bridge_test_objects
# Counters that threads share are counted as one; assertions stay on, as everywhere.
cmake -S . -B $build -G Ninja -DCMAKE_BUILD_TYPE=Debug -DCMAKE_CXX_FLAGS="--coverage -fprofile-update=atomic" \
    -DTELIX_TEST_OBJECTS="$PWD/build" -DTELIX_BUILD_BRIDGE=ON -DTELIX_BUILD_BROWSER=OFF -DTELIX_BUILD_BENCH=OFF >/dev/null
ninja -C $build -j "$jobs" telix_unit_tests telix_desktop_tests bridge_tests
find $build -name '*.gcda' -delete

status=0
# The tests of the three programs; those of other programs have not been built or need nothing of these sources.
ctest --test-dir $build -j "$jobs" --output-on-failure --no-tests=error >"$build/coverage.log" \
    -E '_NOT_BUILT|^(lint|docs|fuzz|mutation|machines|npapi|platform|browser|desktop\.(tools|media_server))\.' || status=1
grep -E '^[0-9]+% tests passed' "$build/coverage.log"
gcovr --root . $build --json "$build/coverage.json"

# print_row NAME FILTER...: the row of an area, and those of its files.
print_row() {
    local name=$1 options=()
    shift
    for filter in "$@"; do
        options+=(--filter "$filter")
    done
    gcovr --root . --add-tracefile "$build/coverage.json" "${options[@]}" --csv "$build/area.csv"
    awk -F, -v name="$name" -v files=$files '
        NR > 1 { total += $2; covered += $3 }
        NR > 1 && files == "yes" { rows = rows sprintf("| `%s` | %d | %d | %.1f %% |\n", $1, $2, $3, 100 * $3 / ($2 ? $2 : 1)) }
        END { printf "| %s | %d | %d | %.1f %% |\n%s", name, total, covered, 100 * covered / total, rows }' "$build/area.csv"
}
echo '| Area | Lines | Executed | |'
echo '|---|---|---|---|'
print_row 'plug-in: `common`, `src`' common/ src/
print_row '`desktop/platform`' desktop/platform/
print_row '`bridge`' bridge/
exit $status

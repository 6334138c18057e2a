#!/usr/bin/env bash
# Runs all tests: the unit tests with AddressSanitizer and UndefinedBehaviorSanitizer, then all tests of the release build.
# Installs missing packages and builds what has changed.
set -euo pipefail
cd "$(dirname "${BASH_SOURCE[0]}")"

tools/install-packages.sh run test
cores=$(nproc)

cmake --preset release -DTELIX_BUILD_TESTS=ON -DTELIX_BUILD_BENCH=ON -DTELIX_BUILD_DESKTOP=ON \
    -DTELIX_BUILD_BROWSER=ON -DTELIX_BUILD_BRIDGE=ON >/dev/null
cmake --build --preset release -- -k 0
# The sources of the tests are compiled once, for both builds.
cmake --preset asan -DTELIX_TEST_OBJECTS="$PWD/build" >/dev/null
cmake --build --preset asan -- -k 0

# More jobs than cores, because many tests wait for video and audio.
ctest --preset asan -j $((cores + 1)) --output-on-failure
ctest --preset release -j $((2 * cores)) --output-on-failure

#!/usr/bin/env bash
# Runs the tests. Installs missing packages and builds what has changed.
set -euo pipefail

usage='Usage: ./test.sh [--machines | --packages]

Without arguments: the unit tests with AddressSanitizer and UndefinedBehaviorSanitizer, then all tests of the release build.
  --machines   all tests of the plug-in for armhf, arm64, i386 and mipsel, under qemu, and no others
  --packages   build the Debian packages, install them into a fresh root and start the television there; needs root'

cd "$(dirname "${BASH_SOURCE[0]}")"
cores=$(nproc)

# test_machine NAME: builds the plug-in for another machine and runs its tests.
test_machine() {
    echo "== The plug-in on $1"
    tools/make-sysroot.sh "$1" "build-sysroots/$1"
    cmake --preset "$1" >/dev/null
    cmake --build --preset "$1"
    ctest --preset "$1" -j "$cores"
}

# test_this_machine: the build with sanitizers, then the release build.
test_this_machine() {
    cmake --preset release -DTELIX_BUILD_TESTS=ON -DTELIX_BUILD_BENCH=ON -DTELIX_BUILD_DESKTOP=ON \
        -DTELIX_BUILD_BROWSER=ON -DTELIX_BUILD_BRIDGE=ON >/dev/null
    cmake --build --preset release -- -k 0
    # The sources of the tests are compiled once, for both builds.
    cmake --preset asan -DTELIX_TEST_OBJECTS="$PWD/build" >/dev/null
    cmake --build --preset asan -- -k 0

    # More jobs than cores, because many tests wait for video and audio.
    ctest --preset asan -j $((2 * cores)) --output-on-failure
    ctest --preset release -j $((2 * cores)) --output-on-failure
}

case "$*" in
'')
    tools/install-packages.sh run test
    test_this_machine
    ;;
--machines)
    tools/install-packages.sh machines
    for machine in armhf arm64 i386 mipsel; do
        test_machine "$machine"
    done
    ;;
--packages)
    tools/install-packages.sh run test packages
    exec tests/packages/test_packages.py
    ;;
-h | --help) echo "$usage" ;;
*)
    echo "test.sh: $*: unknown argument, expected --machines, --packages or nothing" >&2
    exit 2
    ;;
esac

#!/usr/bin/env bash
# Runs the tests. Installs missing packages and builds what has changed.
set -euo pipefail

usage='Usage: ./test.sh [--machines | --packages]

Without arguments: the unit tests with AddressSanitizer and UndefinedBehaviorSanitizer, then all tests of the release build,
among them a choice of the tests of the plug-in on armhf and i386 and with ThreadSanitizer.
  --machines   all tests of the plug-in on armhf, arm64, i386 and mipsel, and no others
  --packages   build the Debian packages, install them into a fresh root and start the television there; needs root'

cd "$(dirname "${BASH_SOURCE[0]}")"
cores=$(nproc)

# prepare_machine NAME: fetches what it takes to build the plug-in for another machine.
prepare_machine() {
    tools/install-packages.sh "$1" && tools/make-sysroot.sh "$1" "build-sysroots/$1"
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
    ctest --preset asan -j $((3 * cores)) --output-on-failure
    ctest --preset release -j $((3 * cores)) --output-on-failure
}

case "$*" in
'')
    tools/install-packages.sh run test
    # Without a network CTest skips their tests.
    for machine in armhf i386; do
        prepare_machine "$machine" || echo "test.sh: no tests on $machine: it could not be prepared" >&2
    done
    test_this_machine
    ;;
--machines)
    for machine in armhf arm64 i386 mipsel; do
        echo "== The plug-in on $machine"
        prepare_machine "$machine"
        tools/test-machine.sh "$machine" "build-$machine"
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

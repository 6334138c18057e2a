#!/usr/bin/env bash
# Builds the plug-in for another machine and runs its tests there, with the sysroot build-sysroots/MACHINE.
# Usage: tools/test-machine.sh armhf|arm64|i386|mipsel BUILD-FOLDER [CMAKE-OPTION...]
# Exit status: 0 all tests passed; 77 there is no sysroot; another one if a test fails or cannot be built.
set -euo pipefail

if [ $# -lt 2 ]; then
    echo "test-machine.sh: usage: tools/test-machine.sh armhf|arm64|i386|mipsel BUILD-FOLDER [CMAKE-OPTION...]" >&2
    exit 2
fi
machine=$1
build=$(realpath -m "$2")
shift 2
cd "$(dirname "${BASH_SOURCE[0]}")/.."
sysroot=build-sysroots/$machine
if [ ! -e "$sysroot" ]; then
    echo "test-machine.sh: skipped: $sysroot: no such sysroot, make it with tools/make-sysroot.sh $machine $sysroot" >&2
    exit 77
fi

export CTEST_PARALLEL_LEVEL=${CTEST_PARALLEL_LEVEL:-$(nproc)}
cmake --preset "$machine" -B "$build" "$@" >/dev/null
cmake --build "$build" --parallel "$CTEST_PARALLEL_LEVEL"
ctest --test-dir "$build" --output-on-failure

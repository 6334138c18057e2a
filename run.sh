#!/usr/bin/env bash
# Shows a page in the television's browser window with the plug-in: the demonstration application, or URL (an address
# or a file). Installs what is missing and builds what has changed. Options of telix-tv may stand before URL.
# Without a display it writes a screenshot instead.
set -euo pipefail
top=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
build="$top/build"

"$top/tools/install-packages.sh" run
if [ ! -f "$build/CMakeCache.txt" ]; then
    cmake -S "$top" -B "$build" -G Ninja -DTELIX_BUILD_TESTS=OFF -DTELIX_BUILD_BENCH=OFF
fi
cmake --build "$build" --target telix-tv nptelixjs_desktop telix telixctl

if [ $# -eq 0 ]; then
    set -- "$top/apps/demo/index.html"
fi
if [ -n "${DISPLAY:-}" ]; then
    exec "$build/desktop/telix-tv" "$@"
fi
picture="$build/screenshot.png"
echo "There is no display: the page's picture goes to $picture"
exec xvfb-run -a -s "-screen 0 1280x720x24" "$build/desktop/telix-tv" --screenshot "$picture" "$@"

#!/usr/bin/env bash
# Makes docs/television.png, the screenshot of the demonstration in README.md, or FILE.png instead.
# Usage: tools/make-screenshot.sh [FILE.png]
set -euo pipefail
if [ $# -gt 1 ] || [[ ${1:-} == -* ]]; then
    echo "Usage: $0 [FILE.png]" >&2
    exit 2
fi
top=$(cd "$(dirname "${BASH_SOURCE[0]}")/.." && pwd)

# The third service, some seconds after the channel change, with its programmes. In place of the viewer's settings come those
# without stream events, which would lay a notice over the picture.
ready='document.getElementById("banner-name").textContent === "Telix Three" &&
    document.getElementById("banner-next").textContent &&
    Date.now() > (window.readySince = window.readySince || Date.now()) + 2500'
settings=$(mktemp)
trap 'rm "$settings"' EXIT
printf '[test]\nstream-event-seconds=0\n' >"$settings"
env -u DISPLAY TELIX_CHANNELS=test TELIX_CONFIG="$settings" "$top/run.sh" --keys 3 --wait-for "$ready" \
    --screenshot "${1:-$top/docs/television.png}"

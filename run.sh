#!/usr/bin/env bash
# The television's window: what is on it is told by the usage below. Installs what is missing and builds what has changed.
set -euo pipefail

usage='Usage: ./run.sh [OPTION...] [PAGE | TRANSPORT-STREAM...]

Without PAGE, the demonstration on a generated multiplex of three services, with clips for its media page.
  PAGE                the page of that address or file (.html, .htm, .xhtml, .hbbtv)
  TRANSPORT-STREAM    a file, or a folder of *.ts: the demonstration shows their services
  OPTION              of build/desktop/telix-tv, see its --help
Without a display a screenshot is written instead, of the picture when there is one within 20 seconds.'

fail() {
    echo "run.sh: $1" >&2
    exit 2
}

top=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
build="$top/build"
options=()
given=()
while [ $# -gt 0 ]; do
    case "$1" in
    -h | --help)
        echo "$usage"
        exit 0
        ;;
    --fullscreen | --inspect | --version | --wait-for-picture | --*=*) options+=("$1") ;;
    --)
        shift
        given+=("$@")
        break
        ;;
    -*)
        [ $# -gt 1 ] || fail "option $1 has no value"
        options+=("$1" "$2")
        shift
        ;;
    *) given+=("$1") ;;
    esac
    shift
done

"$top/tools/install-packages.sh" run

is_transport_stream() {
    python3 - "$1" <<'END'
import sys
with open(sys.argv[1], 'rb') as file:
    head = file.read(6 * 188)
sys.exit(not any(all(head[at + 188 * n:at + 188 * n + 1] == b'G' for n in range(5)) for at in range(188)))
END
}

# Sets `page`, or adds to `channels`.
page=
channels=()
look_at() {
    case "$1" in
    *://* | data:* | about:*)
        page=$1
        return
        ;;
    esac
    [ -e "$1" ] || fail "there is no such file: $1"
    [ -r "$1" ] || fail "it can't be read: $1"
    case "${1,,}" in
    *.html | *.htm | *.xhtml | *.hbbtv)
        [ -f "$1" ] || fail "it is no file: $1"
        page=$1
        return
        ;;
    esac
    case "$1" in
    *[\;#]*) fail "a transport stream can't have ; or # in its name: $1" ;;
    esac
    if [ -d "$1" ]; then
        compgen -G "$1/*.ts" >/dev/null || fail "no *.ts in this folder: $1"
    else
        [ -f "$1" ] || fail "it is no file: $1"
        is_transport_stream "$1" || fail "neither a page nor a transport stream: $1"
    fi
    channels+=("$(realpath "$1")")
}
for each in "${given[@]}"; do
    look_at "$each"
done
[ -z "$page" ] || [ ${#given[@]} -eq 1 ] || fail "a page stands alone: ${given[*]}"

if [ ! -f "$build/CMakeCache.txt" ]; then
    cmake -S "$top" -B "$build" -G Ninja -DTELIX_BUILD_TESTS=OFF -DTELIX_BUILD_BENCH=OFF
fi
cmake --build "$build" --target telix-tv nptelixjs_desktop telix telixctl
# The library would fall back to its defaults; here the viewer can still mend the file.
"$build/desktop/telixctl" check-config >/dev/null

if [ ${#channels[@]} -gt 0 ]; then
    TELIX_CHANNELS=$(IFS=';' && echo "${channels[*]}")
    export TELIX_CHANNELS
fi
if [ -z "$page" ]; then
    "$top/tools/make-clips.sh" "$build/media"
    # The server ends with this process, which becomes the window or waits for it.
    exec 3< <(exec "$top/tools/media_server.py" --until-parent-ends "=$top/apps" "media=$build/media")
    read -r -t 20 address <&3 || fail "the server for the demonstration did not start"
    exec 3<&-
    page="$address/demo/index.html"
fi

if [ -n "${DISPLAY:-}" ]; then
    exec "$build/desktop/telix-tv" "${options[@]}" "$page"
fi
picture="$build/screenshot.png"
echo "There is no display: the page's picture goes to $picture"
status=0
xvfb-run -a -s "-screen 0 1280x720x24" "$build/desktop/telix-tv" --wait-for-picture --timeout 20 \
    --screenshot "$picture" "${options[@]}" "$page" || status=$?
# A page need not have a picture.
if [ $status -eq 1 ] && [ ${#options[@]} -eq 0 ] && [ ${#given[@]} -eq 1 ] && [ ${#channels[@]} -eq 0 ]; then
    status=0
fi
exit $status

#!/usr/bin/env bash
# Starts the desktop television, see the usage below. Installs missing packages and builds what has changed.
set -euo pipefail

usage='Usage: ./run.sh [OPTION...] [PAGE | TRANSPORT-STREAM...]

Without arguments, shows the demonstration application with a generated multiplex of three services.
  PAGE                show this page instead: a URL, or a file *.html, *.htm, *.xhtml, *.hbbtv or *.aitx (XML AIT)
  TRANSPORT-STREAM    show the services of these transport streams: a file, or a folder with *.ts
  OPTION              an option of build/desktop/telix-tv, see its --help; --signal and --ait show no demonstration
Without a display, writes a screenshot instead, as soon as there is a picture or after 20 seconds.'

fail() {
    echo "run.sh: $1" >&2
    exit 2
}

top=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
build="$top/build"
options=() # of telix-tv
operands=() # pages and transport streams
has_application= # by an option
while [ $# -gt 0 ]; do
    case "$1" in
    --signal | --signal=* | --ait | --ait=*) has_application=yes ;;
    esac
    case "$1" in
    -h | --help)
        echo "$usage"
        exit 0
        ;;
    --fullscreen | --ignore-certificate-errors | --inspect | --strict | --version | --wait-for-picture | --*=*) options+=("$1") ;;
    --)
        shift
        operands+=("$@")
        break
        ;;
    -*)
        [ $# -gt 1 ] || fail "$1: option needs a value"
        options+=("$1" "$2")
        shift
        ;;
    *) operands+=("$1") ;;
    esac
    shift
done

"$top/tools/install-packages.sh" run

# Whether there is a sync byte at the start of five consecutive packets of 188 bytes, at any offset.
is_transport_stream() {
    python3 - "$1" <<'END'
import sys
with open(sys.argv[1], 'rb') as file:
    head = file.read(6 * 188)
sys.exit(not any(all(head[at + 188 * n:at + 188 * n + 1] == b'G' for n in range(5)) for at in range(188)))
END
}

# Checks an operand; sets `page`, or adds to `channels`.
page=
channels=()
read_operand() {
    case "$1" in
    *://* | data:* | about:*)
        page=$1
        return
        ;;
    esac
    [ -e "$1" ] || fail "$1: No such file"
    [ -r "$1" ] || fail "$1: not readable"
    case "${1,,}" in
    *.html | *.htm | *.xhtml | *.hbbtv | *.aitx)
        [ -f "$1" ] || fail "$1: not a file"
        page=$1
        return
        ;;
    esac
    case "$1" in
    *[\;#]*) fail "$1: the name of a transport stream cannot contain ; or #" ;;
    esac
    if [ -d "$1" ]; then
        compgen -G "$1/*.ts" >/dev/null || fail "$1: no *.ts in this folder"
    else
        [ -f "$1" ] || fail "$1: not a file"
        is_transport_stream "$1" || fail "$1: neither a page nor a transport stream"
    fi
    channels+=("$(realpath "$1")")
}
for operand in "${operands[@]}"; do
    read_operand "$operand"
done
[ -z "$page" ] || [ ${#operands[@]} -eq 1 ] || fail "$page: a page must be the only argument"

if [ ! -f "$build/CMakeCache.txt" ]; then
    cmake -S "$top" -B "$build" -G Ninja -DTELIX_BUILD_TESTS=OFF -DTELIX_BUILD_BENCH=OFF
fi
cmake --build "$build" --target telix-tv nptelixjs_desktop telix telixctl
# Reports errors in the configuration file, for which the platform library would use defaults.
"$build/desktop/telixctl" check-config >/dev/null

if [ ${#channels[@]} -gt 0 ]; then
    TELIX_CHANNELS=$(IFS=';' && echo "${channels[*]}")
    export TELIX_CHANNELS
fi
if [ -z "$page$has_application" ]; then
    # shellcheck source=tools/serve-demonstration.sh
    . "$top/tools/serve-demonstration.sh"
    serve_demonstration "$top" "$build/media"
    page=$demonstration_url
fi

if [ -n "${DISPLAY:-}" ]; then
    exec "$build/desktop/telix-tv" "${options[@]}" ${page:+"$page"}
fi
screenshot="$build/screenshot.png"
echo "No display: writing a screenshot to $screenshot"
status=0
xvfb-run -a -s "-screen 0 1280x720x24" "$build/desktop/telix-tv" --wait-for-picture --timeout 20 \
    --screenshot "$screenshot" "${options[@]}" ${page:+"$page"} || status=$?
# A page that shows no video is not an error.
if [ $status -eq 1 ] && [ ${#options[@]} -eq 0 ] && [ ${#operands[@]} -eq 1 ] && [ ${#channels[@]} -eq 0 ]; then
    status=0
fi
exit $status

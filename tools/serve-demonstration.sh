# Sourced by the programs that show the demonstration.

# serve_demonstration TOP MEDIA: serves TOP/apps, with the clips in the folder MEDIA, which are made if they are not there.
# Sets demonstration_url, and lets the test multiplex signal the applications. The server stops when the calling process exits,
# also after that has become another program.
serve_demonstration() {
    "$1/tools/make-clips.sh" "$2" || return
    exec 3< <(exec "$1/tools/media_server.py" --until-parent-ends "=$1/apps" "media=$2")
    if ! read -r -t 60 demonstration_url <&3; then
        echo "${0##*/}: media_server.py: did not start within 60 seconds" >&2
        return 2
    fi
    exec 3<&-
    export TELIX_APPLICATIONS=${TELIX_APPLICATIONS:-$demonstration_url/}
    demonstration_url+=/demo/index.html
}

#!/usr/bin/env bash
# Makes the clips of the demonstration and of the tests that FOLDER does not have yet: tools/make-clips.sh FOLDER
#   clip.mp4       20 s of video with a running clock, and a tone: H.264, AAC
#   second.mp4     8 s, other video
#   languages.mp4  8 s with German and English audio (low and high) and English subtitles, one a second
#   tune.mp3, tune.aac, tune.wav   3 s of audio
#   hls/index.m3u8 6 s in three segments, for HTTP live streaming
#   playlist.asx   clip.mp4 and second.mp4; media_server.py inserts the URL of their folder
set -euo pipefail

if [ $# -ne 1 ] || [ "${1#-}" != "$1" ]; then
    echo "Usage: $0 FOLDER" >&2
    exit 2
fi
folder=$1
if ! command -v ffmpeg >/dev/null; then
    echo "${0##*/}: ffmpeg: command not found" >&2
    exit 2
fi
if ! mkdir -p "$folder"; then
    exit 2
fi
work=$(mktemp -d "$folder/unfinished.XXXXXX")
trap 'rm -rf "$work"' EXIT

# make NAME ARGUMENT...: one clip, which is moved to the folder when it is complete.
make() {
    local name=$1
    shift
    [ ! -e "$folder/$name" ] || return 0
    ffmpeg -hide_banner -loglevel error -nostdin -y "$@" "$work/$name"
    mv "$work/$name" "$folder/$name"
}

# label TEXT: a filter that draws a name on the left and a running clock on the right.
label() {
    local box=fontsize=32:fontcolor=white:box=1:boxcolor=black@0.6:boxborderw=8
    echo "drawtext=text='$1':x=32:y=32:$box,drawtext=text='%{pts\\:hms}':x=w-tw-32:y=32:$box"
}

# Two keyframes a second, so that seeks are fast.
video=(-c:v libx264 -preset veryfast -profile:v main -pix_fmt yuv420p -g 12 -bf 0 -b:v 500k -maxrate 800k -bufsize 400k)
audio=(-c:a aac -b:a 96k -ac 2)
size=640x360

make clip.mp4 -f lavfi -i "testsrc2=size=$size:rate=25,$(label 'Telix clip')" \
    -f lavfi -i sine=frequency=440:sample_rate=48000,volume=0.2 -t 20 "${video[@]}" "${audio[@]}" -movflags +faststart
make second.mp4 -f lavfi -i "smptehdbars=size=$size:rate=25,$(label 'Second clip')" \
    -f lavfi -i sine=frequency=660:sample_rate=48000,volume=0.2 -t 8 "${video[@]}" "${audio[@]}" -movflags +faststart

for second in 0 1 2 3 4 5 6 7; do
    printf '%d\n00:00:0%d,000 --> 00:00:0%d,900\nSubtitle number %d\n\n' $((second + 1)) $second $second $((second + 1))
done >"$work/english.srt"
make languages.mp4 -f lavfi -i "color=c=navy:size=$size:rate=25,$(label 'Two languages')" \
    -f lavfi -i sine=frequency=440:sample_rate=48000,volume=0.2 -f lavfi -i sine=frequency=880:sample_rate=48000,volume=0.2 \
    -i "$work/english.srt" -map 0:v -map 1:a -map 2:a -map 3:s -t 8 "${video[@]}" "${audio[@]}" -c:s mov_text \
    -metadata:s:a:0 language=deu -metadata:s:a:1 language=eng -metadata:s:s:0 language=eng -movflags +faststart

tone=(-f lavfi -i "sine=frequency=523:sample_rate=44100,volume=0.2,tremolo=f=4:d=0.6" -t 3)
make tune.mp3 "${tone[@]}" -c:a libmp3lame -b:a 128k
make tune.aac "${tone[@]}" -c:a aac -b:a 96k -f adts
make tune.wav "${tone[@]}" -c:a pcm_s16le

if [ ! -e "$folder/hls" ]; then
    mkdir "$work/hls"
    ffmpeg -hide_banner -loglevel error -nostdin -f lavfi -i "mandelbrot=size=$size:rate=25,$(label 'Live streaming')" \
        -f lavfi -i sine=frequency=330:sample_rate=48000,volume=0.2 -t 6 "${video[@]}" -g 50 "${audio[@]}" \
        -f hls -hls_time 2 -hls_playlist_type vod -hls_segment_filename "$work/hls/segment%d.ts" "$work/hls/index.m3u8"
    mv "$work/hls" "$folder/hls"
fi

if [ ! -e "$folder/playlist.asx" ]; then
    cat >"$work/playlist.asx" <<'PLAYLIST'
<ASX VERSION="3.0">
  <TITLE>Clips of the demonstration</TITLE>
  <BASE HREF="@FOLDER@"/>
  <ENTRY><TITLE>Clip</TITLE><REF HREF="clip.mp4"/></ENTRY>
  <ENTRY><TITLE>Second clip</TITLE><REF HREF="second.mp4"/></ENTRY>
</ASX>
PLAYLIST
    mv "$work/playlist.asx" "$folder/playlist.asx"
fi

// The media player: clips over HTTP, a playlist, and media with errors.
var media = (function () {
    'use strict';

    var folder = '../media/';
    var seekMilliseconds = 5000;
    var refreshMilliseconds = 250;
    var hideMilliseconds = 6000; // without a key press, until everything but the video is hidden
    var linesShown = 7;
    var speeds = [-4, -2, -1, 0.5, 1, 2, 4];
    var state = { STOPPED: 0, PLAYING: 1, PAUSED: 2, CONNECTING: 3, BUFFERING: 4, FINISHED: 5, ERROR: 6 };
    var stateTexts = ['Stopped', 'Playing', 'Paused', 'Connecting \u2026', 'Buffering \u2026', 'Finished', 'Error',
                      'Next clip \u2026'];
    var errorTexts = ['The set cannot play this format.', 'The connection failed.',
                      'Playback failed for an unknown reason.', 'The set has not enough resources.',
                      'The content is damaged.', 'The content is not available.', 'The content is not available now.'];

    // `type` is that of the element, by which the set chooses the player. The plug-in starts a playlist when it is loaded.
    var clips = [
        { title: 'Running clock', detail: 'MP4', type: 'video/mp4', url: 'clip.mp4' },
        { title: 'Second clip', detail: 'MP4', type: 'video/mp4', url: 'second.mp4' },
        { title: 'Two languages', detail: 'MP4', type: 'video/mp4', url: 'languages.mp4' },
        { title: 'A tune', detail: 'MP3', type: 'audio/mpeg', url: 'tune.mp3', isAudio: true },
        { title: 'Adaptive streaming', detail: 'HLS', type: 'application/vnd.apple.mpegurl', url: 'hls/index.m3u8' },
        { title: 'Playlist of two clips', detail: 'ASX', type: 'video/mp4', url: 'playlist.asx', isPlaylist: true },
        // The transfer of 60 kB/s is slower than playback.
        { title: 'A slow connection', detail: 'MP4', type: 'video/mp4', url: 'clip.mp4?rate=60000' },
        { title: 'A clip that is not there', detail: 'MP4', type: 'video/mp4', url: 'absent.mp4' },
        // Nothing listens on port 49151, which is reserved. Engines refuse some ports below 1024 by themselves.
        { title: 'A server that is switched off', detail: 'MP4', type: 'video/mp4',
          url: 'http://127.0.0.1:49151/clip.mp4' },
        { title: 'A page instead of a clip', detail: 'HTML', type: 'video/mp4', url: '../demo/index.html' }
    ];

    var onClose = null;
    /** @type {telix.AVControl} */
    var video = null;
    var objectsCreated = 0;
    var opened = null; // the clip that the object was created for
    var shown = null; // the clip whose title is shown
    var hasStarted = false; // playback of `opened`
    var speed = 1; // that the set has accepted last
    var speedChanges = 0;
    var notice = '';
    var focused = 0;
    var openTimer = 0;
    var refreshTimer = 0;
    var hideTimer = 0;

    function isServed() {
        return location.protocol !== 'file:';
    }

    // The absolute URL. The plug-in resolves relative ones against the page's folder without handling "..".
    function urlOf(clip) {
        var link = document.createElement('a');
        link.href = clip.url.indexOf('://') > 0 ? clip.url : folder + clip.url;
        return link.href;
    }

    // ---- Display

    // The clip that is played, which may be a queued one.
    function playedClip() {
        var url = video ? video.data : null;
        return clips.filter(function (clip) { return urlOf(clip) === url; })[0] || opened;
    }

    function describeSpeed() {
        return speed === 1 ? '' : speed < 0 ? 'Backward ' + -speed + '\u00d7' : speed + '\u00d7';
    }

    function describeState() {
        var playState = video.playState;
        if (playState === state.ERROR) {
            return errorTexts[video.error] || errorTexts[2];
        }
        var text = stateTexts[playState] || '';
        return playState === state.PLAYING && speed !== 1 ? describeSpeed() : text;
    }

    function describeTrack() {
        return video.nrTracks > 1 ? 'Track ' + video.currentTrackIndex + ' of ' + video.nrTracks : '';
    }

    function showList() {
        var lines = clips.map(function (clip, index) {
            var line = tv.element('li', '', index === focused ? 'focused' : '');
            line.appendChild(tv.element('span', clip.title));
            line.appendChild(tv.element('i', clip.detail));
            return line;
        });
        tv.fill(tv.byId('media-list'), tv.linesAround(lines, focused, linesShown));
    }

    // Hides everything but the video.
    function hideControls() {
        if (video && video.playState === state.PLAYING) {
            tv.byId('media').className = 'controls-hidden';
        }
    }

    function showControls() {
        tv.byId('media').className = '';
        clearTimeout(hideTimer);
        hideTimer = setTimeout(hideControls, hideMilliseconds);
    }

    function update() {
        var isOpen = video !== null;
        var position = isOpen ? video.playPosition : 0;
        var length = isOpen ? video.playTime : 0;
        var playState = isOpen ? video.playState : state.STOPPED;
        var clip = isOpen ? playedClip() : null;
        if (clip !== shown) {
            // Checked at each update, because a queued clip starts without a state change.
            shown = clip;
            notice = '';
            showControls();
        }
        tv.setText('media-title', clip ? clip.title : 'Choose a clip');
        tv.setText('media-state', isOpen ? describeState() : '');
        tv.byId('media-state').className = playState === state.ERROR ? 'error' : '';
        tv.setText('media-track', isOpen ? describeTrack() : '');
        tv.setText('media-time', length > 0 ? tv.duration(position) + ' / ' + tv.duration(length) : '');
        tv.byId('media-played').style.width = (length > 0 ? Math.min(100, position / length * 100) : 0) + '%';
        tv.setText('media-notice', notice);
        hasStarted = hasStarted || playState === state.PLAYING;
        var hasVideo = isOpen && hasStarted && !clip.isAudio &&
                       [state.PLAYING, state.PAUSED, state.BUFFERING].indexOf(playState) >= 0;
        tv.setVisible('background', !hasVideo);
        if (playState !== state.PLAYING) {
            tv.byId('media').className = '';
        }
    }

    function showNotice(text) {
        update();
        notice = text;
        tv.setText('media-notice', notice);
    }

    // ---- Playing

    function removeVideo() {
        if (video) {
            video.stop();
            tv.removeObject(video);
        }
        video = null;
        opened = null;
    }

    function onStateChange() {
        if (video.playState === state.PLAYING) {
            showControls();
            choice.update();
        }
        update();
    }

    function createVideo(clip) {
        var created = tv.createObject(clip.type, 'media-' + ++objectsCreated);
        if (!created.hasPlugin) {
            tv.removeObject(created);
            showNotice('This set has no media player.');
            return;
        }
        video = created;
        opened = clip;
        video.onPlayStateChange = onStateChange;
        video.onPlayPositionChanged = update;
        video.onPlaySpeedChanged = function () { speedChanges++; };
        video.onDRMRightsError = function (error, contentId) {
            showNotice('There are no rights for ' + (contentId || 'this content') + ' (' + error + ').');
        };
        video.data = urlOf(clip);
        if (!clip.isPlaylist) {
            video.play(1);
        }
        update();
    }

    // The new object is created in a later turn of the event loop, after the browser has destroyed the previous one: some
    // sets have a single pipeline, which they stop when any player is destroyed.
    function open() {
        var clip = clips[focused];
        removeVideo();
        hasStarted = false;
        speed = 1;
        notice = '';
        clearTimeout(openTimer);
        openTimer = setTimeout(function () { createVideo(clip); }, 0);
    }

    // The plug-in passes a speed to the set only with the next call. So each speed is set twice; normal speed is set
    // after a nearly equal one, because the plug-in ignores a call that changes nothing.
    function requestSpeed(wanted) {
        speedChanges = 0;
        video.play(wanted);
        video.play(wanted === 1 ? 1.0001 : wanted);
        if (wanted === 1) {
            video.play(1);
        }
    }

    function setSpeed(wanted) {
        requestSpeed(wanted);
        if (speedChanges >= 2) {
            speed = wanted;
            showNotice('');
            return;
        }
        // The set has rejected the speed, which the plug-in keeps until a pause.
        video.play(0);
        video.play(1);
        requestSpeed(1);
        speed = 1;
        showNotice('This speed is not possible here.');
    }

    function changeSpeed(step) {
        if (!video || [state.PLAYING, state.PAUSED].indexOf(video.playState) < 0) {
            return;
        }
        if (video.playState === state.PAUSED) {
            video.play(1);
        }
        var index = speeds.indexOf(speed) + step;
        if (index >= 0 && index < speeds.length) {
            setSpeed(speeds[index]);
        }
    }

    function play() {
        if (!video || [state.STOPPED, state.FINISHED, state.ERROR].indexOf(video.playState) >= 0) {
            open();
        } else if (video.playState === state.PAUSED) {
            video.play(1);
            if (speed !== 1) {
                setSpeed(1);
            }
        } else if (speed !== 1) {
            setSpeed(1);
        }
    }

    function pause() {
        if (video) {
            video.play(0);
        }
    }

    function ok() {
        if (!video || clips[focused] !== opened) {
            open();
        } else if (video.playState === state.PLAYING) {
            pause();
        } else {
            play();
        }
    }

    function stop() {
        if (video) {
            video.stop();
            speed = 1;
            showNotice('');
        }
    }

    function seek(step) {
        if (!video || [state.PLAYING, state.PAUSED].indexOf(video.playState) < 0) {
            return;
        }
        var last = Math.max(0, video.playTime - 1000);
        var target = Math.max(0, Math.min(last, video.playPosition + step));
        showNotice(video.seek(target) ? '' : 'The set cannot seek in this clip.');
    }

    function queue() {
        var clip = clips[focused];
        if (!video) {
            open();
        } else {
            showNotice(video.queue(urlOf(clip)) ? 'Next: ' + clip.title : 'The set cannot queue this clip.');
        }
    }

    function nextTrack() {
        if (video && video.nrTracks > 1) {
            video.next();
        }
    }

    function moveFocus(step) {
        focused = (focused + step + clips.length) % clips.length;
        showList();
    }

    // ---- The page

    function close() {
        clearTimeout(openTimer);
        clearInterval(refreshTimer);
        clearTimeout(hideTimer);
        choice.close();
        keys.close(layer);
        removeVideo();
        tv.setVisible('media', false);
        onClose();
    }

    // The function of a key, which also shows the controls.
    function withControls(action, argument) {
        return function () {
            showControls();
            action(argument);
            update();
        };
    }

    var layer = { modal: true, keys: { back: close } };
    var keysIfServed = {
        up: withControls(moveFocus, -1),
        down: withControls(moveFocus, 1),
        ok: withControls(ok),
        left: withControls(seek, -seekMilliseconds),
        right: withControls(seek, seekMilliseconds),
        play: withControls(play),
        pause: withControls(pause),
        stop: withControls(stop),
        rewind: withControls(changeSpeed, -1),
        forward: withControls(changeSpeed, 1),
        info: withControls(function () {}),
        green: withControls(function () {
            choice.open(function () {
                return video && [state.PLAYING, state.PAUSED].indexOf(video.playState) >= 0 ? video : null;
            });
        }),
        yellow: withControls(queue),
        blue: withControls(nextTrack)
    };

    // Shows the page; `closed` is called when the viewer closes it.
    function show(closed) {
        onClose = closed;
        tv.setVisible('media', true);
        tv.setVisible('media-unserved', !isServed());
        tv.setVisible('media-player', isServed());
        if (isServed()) {
            Object.keys(keysIfServed).forEach(function (name) { layer.keys[name] = keysIfServed[name]; });
            showList();
            update();
            showControls();
            refreshTimer = setInterval(update, refreshMilliseconds);
        }
        keys.open(layer);
    }

    return { show: show };
}());

// The media player: clips that come over HTTP, a playlist, and the ways in which media can fail.
var media = (function () {
    'use strict';

    var folder = '../media/';
    var seekMilliseconds = 5000;
    var refreshMilliseconds = 250;
    var restMilliseconds = 6000; // without a key, until the picture has the screen for itself
    var linesShown = 7;
    var speeds = [-4, -2, -1, 0.5, 1, 2, 4];
    var state = { STOPPED: 0, PLAYING: 1, PAUSED: 2, CONNECTING: 3, BUFFERING: 4, FINISHED: 5, ERROR: 6 };
    var stateTexts = ['Stopped', 'Playing', 'Paused', 'Connecting \u2026', 'Buffering \u2026', 'Finished', 'Error',
                      'Next clip \u2026'];
    var errorTexts = ['The set cannot play this format.', 'The connection failed.',
                      'The set could not play it, and does not say why.', 'The set has not enough resources.',
                      'The content is damaged.', 'The content is not available.', 'The content is not available now.'];

    // A playlist starts by itself when it has been read. The type is that of the element: the set takes it for a
    // promise.
    var clips = [
        { title: 'Running clock', detail: 'MP4', type: 'video/mp4', url: 'clip.mp4' },
        { title: 'Second clip', detail: 'MP4', type: 'video/mp4', url: 'second.mp4' },
        { title: 'Two languages', detail: 'MP4', type: 'video/mp4', url: 'languages.mp4' },
        { title: 'A tune', detail: 'MP3', type: 'audio/mpeg', url: 'tune.mp3', isAudio: true },
        { title: 'Adaptive streaming', detail: 'HLS', type: 'application/vnd.apple.mpegurl', url: 'hls/index.m3u8' },
        { title: 'Playlist of two clips', detail: 'ASX', type: 'video/mp4', url: 'playlist.asx', isPlaylist: true },
        // Slower than it is played: 60 kilobytes a second.
        { title: 'A slow connection', detail: 'MP4', type: 'video/mp4', url: 'clip.mp4?rate=60000' },
        { title: 'A clip that is not there', detail: 'MP4', type: 'video/mp4', url: 'absent.mp4' },
        // Port 9 is for discarding what comes, and nowadays nobody listens on it.
        { title: 'A server that is switched off', detail: 'MP4', type: 'video/mp4',
          url: 'http://127.0.0.1:9/clip.mp4' },
        { title: 'A page, which is no clip', detail: 'HTML', type: 'video/mp4', url: '../demo/index.html' }
    ];

    var leave = null; // called at the way back
    var video = null;
    var objectsMade = 0;
    var playing = null; // the clip that the object was made for
    var shown = null; // the one whose title is shown
    var hasBegun = false; // it has presented something
    var speed = 1; // what the set was told last
    var speedChanges = 0;
    var notice = '';
    var focused = 0;
    var openTimer = 0;
    var refreshTimer = 0;
    var restTimer = 0;

    function isServed() {
        return location.protocol !== 'file:';
    }

    // The whole address. The plug-in would only put the page's folder in front.
    function addressOf(clip) {
        var link = document.createElement('a');
        link.href = clip.url.indexOf('://') > 0 ? clip.url : folder + clip.url;
        return link.href;
    }

    // ---- What is shown

    // The clip that presents: a queued one takes the place of the one before it.
    function presented() {
        var address = video ? video.data : null;
        return clips.filter(function (clip) { return addressOf(clip) === address; })[0] || playing;
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

    // Hides everything but the picture while something plays and no key is pressed.
    function rest() {
        if (video && video.playState === state.PLAYING) {
            tv.byId('media').className = 'resting';
        }
    }

    function wake() {
        tv.byId('media').className = '';
        clearTimeout(restTimer);
        restTimer = setTimeout(rest, restMilliseconds);
    }

    function update() {
        var isPlaying = video !== null;
        var position = isPlaying ? video.playPosition : 0;
        var length = isPlaying ? video.playTime : 0;
        var playState = isPlaying ? video.playState : state.STOPPED;
        var clip = isPlaying ? presented() : null;
        if (clip !== shown) {
            // Also of the queue, whose clips begin without a change of state.
            shown = clip;
            notice = '';
            wake();
        }
        tv.say('media-title', clip ? clip.title : 'Choose a clip');
        tv.say('media-state', isPlaying ? describeState() : '');
        tv.byId('media-state').className = playState === state.ERROR ? 'error' : '';
        tv.say('media-track', isPlaying ? describeTrack() : '');
        tv.say('media-time', length > 0 ? tv.duration(position) + ' / ' + tv.duration(length) : '');
        tv.byId('media-played').style.width = (length > 0 ? Math.min(100, position / length * 100) : 0) + '%';
        tv.say('media-notice', notice);
        hasBegun = hasBegun || playState === state.PLAYING;
        // The picture is beneath: the ground covers it where there is none to be seen.
        var hasPicture = isPlaying && hasBegun && !clip.isAudio &&
                         [state.PLAYING, state.PAUSED, state.BUFFERING].indexOf(playState) >= 0;
        tv.setVisible('ground', !hasPicture);
        if (playState !== state.PLAYING) {
            tv.byId('media').className = '';
        }
    }

    function tell(text) {
        update();
        notice = text;
        tv.say('media-notice', notice);
    }

    // ---- Playing

    function dropVideo() {
        if (video) {
            video.stop();
            tv.removeObject(video);
        }
        video = null;
        playing = null;
    }

    function onStateChange() {
        if (video.playState === state.PLAYING) {
            wake();
            choice.update();
        }
        update();
    }

    function makeVideo(clip) {
        var made = tv.makeObject(clip.type, 'media-' + ++objectsMade);
        if (!made.isThere) {
            tv.removeObject(made);
            tell('This set has no media player.');
            return;
        }
        video = made;
        playing = clip;
        video.onPlayStateChange = onStateChange;
        video.onPlayPositionChanged = update;
        video.onPlaySpeedChanged = function () { speedChanges++; };
        video.onDRMRightsError = function (error, contentId) {
            tell('There are no rights for ' + (contentId || 'this content') + ' (' + error + ').');
        };
        video.data = addressOf(clip);
        if (!clip.isPlaylist) {
            video.play(1);
        }
        update();
    }

    // Some sets stop their one pipeline for any player that ends. The browser ends the former one a turn later; the new
    // one comes after it.
    function open() {
        var clip = clips[focused];
        dropVideo();
        hasBegun = false;
        speed = 1;
        notice = '';
        clearTimeout(openTimer);
        openTimer = setTimeout(function () { makeVideo(clip); }, 0);
    }

    // The plug-in hands a speed to the set when the next one is asked for. So each speed is asked for twice, and the
    // ordinary one, which is asked for only as a change, by way of one that is as good as it.
    function askForSpeed(wanted) {
        speedChanges = 0;
        video.play(wanted);
        video.play(wanted === 1 ? 1.0001 : wanted);
        if (wanted === 1) {
            video.play(1);
        }
    }

    function setSpeed(wanted) {
        askForSpeed(wanted);
        if (speedChanges >= 2) {
            speed = wanted;
            tell('');
            return;
        }
        // Refused; only a pause makes the plug-in forget it.
        video.play(0);
        video.play(1);
        askForSpeed(1);
        speed = 1;
        tell('This speed is not possible here.');
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
        if (!video || clips[focused] !== playing) {
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
            tell('');
        }
    }

    function seek(step) {
        if (!video || [state.PLAYING, state.PAUSED].indexOf(video.playState) < 0) {
            return;
        }
        var last = Math.max(0, video.playTime - 1000);
        var target = Math.max(0, Math.min(last, video.playPosition + step));
        tell(video.seek(target) ? '' : 'Here the set cannot go to another position.');
    }

    function queue() {
        var clip = clips[focused];
        if (!video) {
            open();
        } else {
            tell(video.queue(addressOf(clip)) ? 'Next: ' + clip.title : 'The set does not queue this.');
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
        clearTimeout(restTimer);
        choice.close();
        keys.close(layer);
        dropVideo();
        tv.setVisible('media', false);
        leave();
    }

    // Wakes the page at each key, and then does what the key is for.
    function waking(action, argument) {
        return function () {
            wake();
            action(argument);
            update();
        };
    }

    var layer = { modal: true, keys: { back: close } };
    var whenServed = {
        up: waking(moveFocus, -1),
        down: waking(moveFocus, 1),
        ok: waking(ok),
        left: waking(seek, -seekMilliseconds),
        right: waking(seek, seekMilliseconds),
        play: waking(play),
        pause: waking(pause),
        stop: waking(stop),
        rewind: waking(changeSpeed, -1),
        forward: waking(changeSpeed, 1),
        info: waking(function () {}),
        green: waking(function () {
            choice.open(function () {
                return video && [state.PLAYING, state.PAUSED].indexOf(video.playState) >= 0 ? video : null;
            });
        }),
        yellow: waking(queue),
        blue: waking(nextTrack)
    };

    // Shows the page; `back` is called when the viewer leaves it.
    function show(back) {
        leave = back;
        tv.setVisible('media', true);
        tv.setVisible('media-unserved', !isServed());
        tv.setVisible('media-player', isServed());
        if (isServed()) {
            Object.keys(whenServed).forEach(function (name) { layer.keys[name] = whenServed[name]; });
            showList();
            update();
            wake();
            refreshTimer = setInterval(update, refreshMilliseconds);
        }
        keys.open(layer);
    }

    return { show: show };
}());

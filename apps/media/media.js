// A media player for the remote control. The query string lists the media: ?media=URL&media=URL...
(function () {
    'use strict';

    var linesOfLog = 7;
    var seekMilliseconds = 10000;
    var refreshMilliseconds = 500;
    var speeds = [-8, -4, -2, 1, 2, 4, 8];
    var states = ['stopped', 'playing', 'paused', 'connecting', 'buffering', 'finished', 'error'];
    var errors = ['format not supported', 'no connection', 'unidentified', 'resources', 'corrupt', 'not available'];

    var video = document.getElementById('video');
    var media = location.search.substr(1).split('&').filter(function (part) {
        return part.indexOf('media=') === 0;
    }).map(function (part) { return decodeURIComponent(part.substr('media='.length)); });
    var focused = 0;
    var speed = speeds.indexOf(1);

    function byId(id) {
        return document.getElementById(id);
    }

    function log(text) {
        var list = byId('log');
        list.insertBefore(tv.element('li', text), list.firstChild);
        while (list.childNodes.length > linesOfLog) {
            list.removeChild(list.lastChild);
        }
    }

    function time(milliseconds) {
        var seconds = Math.floor(milliseconds / 1000);
        return Math.floor(seconds / 60) + ':' + (seconds % 60 < 10 ? '0' : '') + seconds % 60;
    }

    function stateText() {
        var error = video.playState === 6 ? ': ' + (errors[video.error] || 'unidentified') : '';
        return (states[video.playState] || String(video.playState)) + error;
    }

    function nameOf(url) {
        return decodeURIComponent(url.split('?')[0].split('/').pop()) || url;
    }

    function show() {
        var position = video.playPosition;
        var length = video.playTime;
        tv.fill(byId('menu'), media.map(function (url, index) {
            var line = tv.element('li', nameOf(url));
            line.className = index === focused ? 'focused' : '';
            return line;
        }));
        tv.fill(byId('panel'), [tv.element('h2', stateText()), tv.element('p', time(position) + ' of ' + time(length)),
                                tv.element('p', 'Speed ' + video.speed)]);
        byId('played').style.width = (length > 0 ? Math.min(100, position / length * 100) : 0) + '%';
    }

    // ---- Actions of keys

    function open() {
        video.data = media[focused];
        play();
    }

    function play() {
        speed = speeds.indexOf(1);
        log('play(1) returns ' + video.play(1));
    }

    function pause() {
        log('play(0) returns ' + video.play(0));
    }

    function stop() {
        video.stop();
        log('stop()');
    }

    function seek(step) {
        var target = Math.max(0, video.playPosition + step);
        log('seek(' + target + ') returns ' + video.seek(target));
    }

    function changeSpeed(step) {
        speed = Math.max(0, Math.min(speeds.length - 1, speed + step));
        log('play(' + speeds[speed] + ') returns ' + video.play(speeds[speed]));
    }

    function moveFocus(step) {
        focused = (focused + step + media.length) % media.length;
    }

    function switchFullScreen() {
        video.setFullScreen(!video.fullScreen);
        byId('screen').className = video.fullScreen ? 'screen full' : 'screen';
        log('full screen: ' + video.fullScreen);
    }

    function thenShow(action, argument) {
        return function () {
            action(argument);
            show();
        };
    }

    if (!video.play) {
        byId('missing').style.display = 'block';
        ['menu', 'panel', 'bar', 'log', 'legend'].forEach(function (id) { byId(id).style.display = 'none'; });
        return;
    }
    if (media.length === 0) {
        log('No media: add ?media=URL to the URL of this page');
        show();
        return;
    }
    video.data = media[focused];
    video.onPlayStateChange = thenShow(function () { log('state: ' + stateText()); });
    video.onPlaySpeedChanged = thenShow(function () { log('speed: ' + video.speed); });
    video.onPlayPositionChanged = thenShow(function () { log('position: ' + time(video.playPosition)); });
    setInterval(show, refreshMilliseconds);

    var actions = {};
    actions[VK_UP] = thenShow(moveFocus, -1);
    actions[VK_DOWN] = thenShow(moveFocus, 1);
    actions[VK_ENTER] = thenShow(open);
    actions[VK_PLAY] = thenShow(play);
    actions[VK_PAUSE] = thenShow(pause);
    actions[VK_STOP] = thenShow(stop);
    actions[VK_LEFT] = thenShow(seek, -seekMilliseconds);
    actions[VK_RIGHT] = thenShow(seek, seekMilliseconds);
    actions[VK_REWIND] = thenShow(changeSpeed, -1);
    actions[VK_FAST_FWD] = thenShow(changeSpeed, 1);
    actions[VK_RED] = thenShow(switchFullScreen);
    tv.onKeys(actions);
    show();
}());

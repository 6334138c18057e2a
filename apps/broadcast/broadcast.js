// Live television with the remote control: the channel list, the programmes, and the events of the object.
(function () {
    'use strict';

    var linesOfLog = 3;
    var linesOfMenu = 7;
    var video = document.getElementById('tv');
    var channels = [];
    var focused = 0;

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

    function nameOf(channel) {
        return channel ? channel.name || 'without a name' : 'none';
    }

    // Start time and name of the object's programmes, the present one first.
    function programmeRows() {
        var programmes = video.programmes;
        var rows = [];
        for (var i = 0; programmes && i < programmes.length; i++) {
            var programme = programmes.item(i);
            rows.push([new Date(programme.startTime * 1000).toTimeString().substr(0, 5), programme.name || '']);
        }
        return rows;
    }

    function show() {
        var first = Math.max(0, focused - linesOfMenu + 1);
        tv.fill(byId('menu'), channels.slice(first, first + linesOfMenu).map(function (channel, index) {
            var line = tv.element('li', nameOf(channel));
            line.className = first + index === focused ? 'focused' : '';
            return line;
        }));
        var table = document.createElement('table');
        programmeRows().forEach(function (row) {
            var line = document.createElement('tr');
            row.forEach(function (text) { line.appendChild(tv.element('td', text)); });
            table.appendChild(line);
        });
        tv.fill(byId('panel'), [tv.element('h2', 'Now: ' + nameOf(video.currentChannel)), table]);
    }

    function thenShow(action) {
        return function () {
            action();
            show();
        };
    }

    var list = video.getChannelConfig ? video.getChannelConfig().channelList : null;
    for (var i = 0; list && i < list.length; i++) {
        channels.push(list.item(i));
    }
    if (channels.length === 0) {
        byId('missing').style.display = 'block';
        return;
    }
    video.onChannelChangeSucceeded = function (channel) {
        log('tuned to ' + nameOf(channel));
        show();
    };
    video.onChannelChangeError = function (channel, error) {
        log('can\'t tune to ' + nameOf(channel) + ': error ' + error);
        show();
    };
    video.onPlayStateChange = function (state) { log('play state ' + state); };
    video.onFullScreenChange = function () { log('full screen: ' + (video.fullScreen ? 'yes' : 'no')); };
    video.onProgrammesChanged = thenShow(function () { log('programmes changed'); });

    var actions = {};
    actions[VK_UP] = thenShow(function () { focused = (focused + channels.length - 1) % channels.length; });
    actions[VK_DOWN] = thenShow(function () { focused = (focused + 1) % channels.length; });
    actions[VK_ENTER] = thenShow(function () { video.setChannel(channels[focused], false); });
    actions[VK_RED] = thenShow(function () { video.prevChannel(); });
    actions[VK_GREEN] = thenShow(function () { video.nextChannel(); });
    actions[VK_YELLOW] = thenShow(function () { video.stop(); });
    actions[VK_BLUE] = thenShow(function () { video.setFullScreen(!video.fullScreen); });
    tv.onKeys(actions);
    show();
}());

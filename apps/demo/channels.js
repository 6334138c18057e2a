// Channel selection by the channel list and by number.
var channels = (function () {
    'use strict';

    var linesShown = 7;
    var entryMilliseconds = 2000;
    var messageMilliseconds = 3000;
    var focused = 0;
    var digits = '';
    var timer = 0;

    // ---- The list

    function showList() {
        var lines = television.state.channels.map(function (channel, index) {
            var line = tv.element('li', '', index === focused ? 'focused' : '');
            line.appendChild(tv.element('b', String(channel.number)));
            line.appendChild(tv.element('span', channel.name));
            if (channel === television.state.channel) {
                line.appendChild(tv.element('i', '\u25b6'));
            }
            return line;
        });
        tv.fill(tv.byId('channel-list'), tv.linesAround(lines, focused, linesShown));
    }

    function moveFocus(step) {
        var count = television.state.channels.length;
        focused = (focused + step + count) % count;
        showList();
    }

    function closeList() {
        keys.close(layer);
        tv.setVisible('channels', false);
    }

    function openList() {
        focused = Math.max(0, television.state.channels.indexOf(television.state.channel));
        showList();
        tv.setVisible('channels', true);
        keys.open(layer);
    }

    var layer = {
        keys: {
            up: function () { moveFocus(-1); },
            down: function () { moveFocus(1); },
            ok: function () {
                closeList();
                television.tune(television.state.channels[focused]);
            },
            left: closeList,
            back: closeList
        }
    };

    // ---- The number

    function endEntry() {
        var channel = television.state.channels[Number(digits) - 1];
        clearTimeout(timer);
        if (channel) {
            tv.setVisible('number', false);
            television.tune(channel);
        } else {
            tv.setText('number', 'No channel ' + digits);
            timer = setTimeout(function () { tv.setVisible('number', false); }, messageMilliseconds);
        }
        digits = '';
    }

    // A number is complete if no channel number has more digits.
    function enterDigit(digit) {
        digits += digit;
        tv.setText('number', digits);
        tv.setVisible('number', true);
        clearTimeout(timer);
        if (Number(digits) * 10 > television.state.channels.length || digits.length === 3) {
            endEntry();
        } else {
            timer = setTimeout(endEntry, entryMilliseconds);
        }
    }

    return { openList: openList, closeList: closeList, enterDigit: enterDigit,
             isEntering: function () { return digits !== ''; }, endEntry: endEntry };
}());

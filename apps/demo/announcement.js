// The red button: a notice when the broadcast announces something, and the page that red then opens.
var announcement = (function () {
    'use strict';

    var noticeMilliseconds = 8000;
    var text = null; // what is announced on this channel
    var receivedAt = null;
    var timer = 0;

    function hideNotice() {
        clearTimeout(timer);
        tv.setVisible('notice', false);
    }

    function close() {
        keys.close(layer);
        tv.setVisible('more', false);
    }

    function update() {
        var now = television.state.programmes[0];
        var next = television.state.programmes[1];
        tv.say('more-title', text);
        tv.say('more-channel', television.state.channel.name);
        tv.say('more-now', now ? now.name : 'No programme information');
        tv.say('more-description', now ? now.description : '');
        tv.say('more-next', next ? banner.describeProgramme(next) : '');
        tv.say('more-received', 'Received at ' + receivedAt.toTimeString().substr(0, 8));
    }

    function open() {
        if (text === null) {
            return;
        }
        hideNotice();
        banner.hide();
        update();
        tv.setVisible('more', true);
        keys.open(layer);
    }

    var layer = { keys: { red: close, back: close } };

    // The broadcast repeats its announcements; the notice comes once.
    function receive(announced) {
        var words = announced || 'More on this programme';
        var isNew = text !== words;
        text = words;
        receivedAt = new Date();
        if (tv.isVisible('more')) {
            update();
        } else if (isNew) {
            tv.say('notice-text', text);
            tv.setVisible('notice', true);
            clearTimeout(timer);
            timer = setTimeout(hideNotice, noticeMilliseconds);
        }
        banner.update();
    }

    // For another channel, of which nothing is known.
    function forget() {
        text = null;
        hideNotice();
        close();
    }

    return { receive: receive, forget: forget, open: open, close: close, hideNotice: hideNotice,
             isOpenable: function () { return text !== null; },
             isNoticed: function () { return tv.isVisible('notice'); } };
}());

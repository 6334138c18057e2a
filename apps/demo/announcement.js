// The red button: a notice when a stream event announces something, and the page that the red key then opens.
var announcement = (function () {
    'use strict';

    var noticeMilliseconds = 8000;
    var text = null; // of the announcement on this channel
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
        tv.setText('more-title', text);
        tv.setText('more-channel', television.state.channel.name);
        tv.setText('more-now', now ? now.name : 'No programme information');
        tv.setText('more-description', now ? now.description : '');
        tv.setText('more-next', next ? banner.describeProgramme(next) : '');
        tv.setText('more-received', 'Received at ' + receivedAt.toTimeString().substr(0, 8));
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

    // The broadcast repeats its stream events; the notice is shown once.
    function receive(eventText) {
        var newText = eventText || 'More on this programme';
        var isNew = text !== newText;
        text = newText;
        receivedAt = new Date();
        if (tv.isVisible('more')) {
            update();
        } else if (isNew) {
            tv.setText('notice-text', text);
            tv.setVisible('notice', true);
            clearTimeout(timer);
            timer = setTimeout(hideNotice, noticeMilliseconds);
        }
        banner.update();
    }

    // Called at a channel change.
    function clear() {
        text = null;
        hideNotice();
        close();
    }

    return { receive: receive, clear: clear, open: open, close: close, hideNotice: hideNotice,
             isAvailable: function () { return text !== null; },
             isNoticeShown: function () { return tv.isVisible('notice'); } };
}());

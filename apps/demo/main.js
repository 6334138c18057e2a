// The television page: its keys, and the navigation to the other pages.
(function () {
    'use strict';

    function showMessage(title, text) {
        tv.setText('message-title', title);
        tv.setText('message-text', text);
        tv.setVisible('message', true);
    }

    // ---- Broadcast events

    television.on.tuning = function () {
        tv.setVisible('message', false);
        announcement.clear();
        choice.update();
        banner.show();
    };
    television.on.tuned = function () {
        banner.show();
        choice.update();
    };
    television.on.failed = function (text) {
        choice.update();
        banner.show();
        showMessage(television.state.channel.name, text);
    };
    television.on.programmes = function () { banner.update(); };
    television.on.announced = function (text) { announcement.receive(text); };

    function watchTelevision() {
        var hasChannels = television.start();
        tv.setVisible('background', !hasChannels);
        tv.setVisible('legend', !hasChannels);
        if (hasChannels) {
            return;
        }
        if (television.hasPlugin()) {
            showMessage('No television here',
                        'The set has no channels: its platform library is missing, or has no tuner.');
        } else {
            showMessage('The plug-in is missing', 'No plug-in of the browser supports the object type video/broadcast.');
        }
    }

    // ---- Navigation

    function clearScreen() {
        banner.hide();
        announcement.hideNotice();
        channels.closeList();
        announcement.close();
        choice.close();
    }

    function openMedia() {
        clearScreen();
        tv.setVisible('message', false);
        tv.setVisible('legend', false);
        television.release();
        media.show(watchTelevision);
    }

    function openDevice() {
        clearScreen();
        tv.setVisible('overlays', false);
        device.show(function () {
            tv.setVisible('overlays', true);
            if (television.state.channels.length > 0) {
                banner.show();
            }
        });
    }

    // ---- Keys

    function withChannels(action) {
        return function (digit) {
            if (television.state.channels.length > 0) {
                action(digit);
            }
        };
    }

    keys.open({
        keys: {
            up: withChannels(function () { television.zap(1); }),
            down: withChannels(function () { television.zap(-1); }),
            digit: withChannels(function (digit) {
                announcement.hideNotice();
                channels.enterDigit(digit);
            }),
            left: withChannels(function () { clearScreen(); channels.openList(); }),
            ok: withChannels(function () {
                if (channels.isEntering()) {
                    channels.endEntry();
                } else if (banner.isShown()) {
                    clearScreen();
                    channels.openList();
                } else {
                    banner.show();
                }
            }),
            info: withChannels(function () { banner.show(); }),
            back: function () {
                if (announcement.isNoticeShown()) {
                    announcement.hideNotice();
                } else {
                    banner.hide();
                }
            },
            red: withChannels(function () { announcement.open(); }),
            green: withChannels(function () {
                clearScreen();
                choice.open(television.presenter);
            }),
            yellow: openMedia,
            blue: openDevice
        }
    });

    banner.start();
    watchTelevision();
}());

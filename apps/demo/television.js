// Broadcast: the object that presents it, the channels and the programmes. Events call the functions of television.on:
// tuning(), tuned(), failed(text), programmes(), announced(text).
var television = (function () {
    'use strict';

    var zapMilliseconds = 250; // from the last of several quick steps to the tune
    var tuneTimeoutMilliseconds = 15000;
    var announcement = { url: 'streamevent.xml', name: 'red-button', id: '1', tag: '1f' };
    var errors = { 0: 'The tuner does not support this channel.', 1: 'No signal.',
                   2: 'The tuner is in use.', 3: 'Parental control blocks this channel.',
                   4: 'The channel is encrypted and there is no key for it.', 5: 'The channel is not known.',
                   6: 'The channel change was interrupted.', 8: 'The address could not be resolved.',
                   9: 'There is not enough bandwidth.', 10: 'The channel cannot be changed now.',
                   11: 'The set has not enough resources.' };

    var on = {};
    /** @type {telix.VideoBroadcast} */
    var object = null;
    var previous = []; // earlier objects, one of which presents until `object` does
    var objectsCreated = 0;
    var timer = 0;
    var state = { channels: [], channel: null, isTuned: false, error: '', programmes: [] };

    // Values are copied, because the channels of an object are invalid after its removal.
    function copyChannel(channel, index) {
        return { number: index + 1, ccid: channel.ccid, name: channel.name || 'Channel ' + (index + 1),
                 isRadio: channel.channelType === channel.TYPE_RADIO };
    }

    function channelList() {
        var configuration = object.getChannelConfig ? object.getChannelConfig() : null;
        return configuration ? configuration.channelList : null;
    }

    function readChannels() {
        var list = channelList();
        var channels = [];
        for (var i = 0; list && i < list.length; i++) {
            channels.push(copyChannel(list.item(i), i));
        }
        return channels;
    }

    function listedChannel(channel) {
        return channel && state.channels.filter(function (each) { return each.ccid === channel.ccid; })[0] || null;
    }

    // ---- The object

    function removePrevious() {
        previous.forEach(tv.removeObject);
        previous = [];
        document.body.offsetWidth; // forces the layout, which destroys their plug-in instances
    }

    // An object caches its component lists, even across channel changes, so every channel has its own object. Its events
    // are handled by listeners: browsers share the handler properties of all objects of a plug-in, and lose a handler
    // when one of these objects is removed. Handlers are used only for the error code, which the events do not have.
    function replaceObject() {
        if (object) {
            object.onChannelChangeError = object.onPlayStateChange = null;
            previous.push(object);
        }
        var created = object = tv.createObject('video/broadcast', 'broadcast-' + ++objectsCreated);
        if (!object.hasPlugin) {
            return;
        }
        function listen(type, action) {
            created.addEventListener(type, function () {
                if (created === object) {
                    action();
                }
            }, false);
        }
        listen('ChannelChangeSucceded', succeed); // the event's own spelling
        listen('ChannelChangeError', function () {
            if (!state.error) {
                end('The channel cannot be shown.');
            }
        });
        listen('ProgrammesChanged', readProgrammes);
        listen('ParentalRatingChange', function () { on.programmes(); });
        object.onChannelChangeError = function (channel, error) { fail(error); };
        object.onPlayStateChange = function (playState, error) {
            // Also called after a tune error, which has been reported already.
            if (state.isTuned && error !== undefined) {
                fail(error);
            }
        };
    }

    // ---- Tuning

    function begin(channel) {
        clearTimeout(timer);
        state.channel = channel;
        state.isTuned = false;
        state.error = '';
        state.programmes = [];
        on.tuning();
    }

    function startTimeout() {
        timer = setTimeout(function () { end('The set does not respond.'); }, tuneTimeoutMilliseconds);
    }

    function end(text) {
        clearTimeout(timer);
        state.isTuned = false;
        state.error = text;
        state.programmes = [];
        on.failed(text);
    }

    function succeed() {
        var presenting = object;
        clearTimeout(timer);
        state.channel = listedChannel(object.currentChannel) || state.channel;
        state.isTuned = true;
        // Deferred, because this is a call from the plug-in whose objects are removed. The listener is added after that,
        // because the removal of an object would remove it.
        setTimeout(function () {
            removePrevious();
            setTimeout(function () {
                if (presenting === object && state.isTuned) {
                    watchForAnnouncements();
                }
            }, 0);
        }, 0);
        on.tuned();
        readProgrammes();
    }

    function fail(error) {
        end(errors[error] || 'The set reports error ' + error + '.');
    }

    function present(channel) {
        replaceObject();
        var list = channelList();
        var wanted = list ? list.getChannel(channel.ccid) : null;
        if (!wanted) {
            end(errors[5]);
            return;
        }
        object.setChannel(wanted, false);
        startTimeout();
    }

    function tune(channel) {
        begin(channel);
        timer = setTimeout(function () { present(channel); }, zapMilliseconds);
    }

    function zap(step) {
        var count = state.channels.length;
        var index = state.channels.indexOf(state.channel);
        tune(state.channels[index < 0 ? 0 : (index + step + count) % count]);
    }

    // Presents the set's current channel, at the start and after media. Returns false if there are no channels.
    function start() {
        replaceObject();
        state.channels = object.hasPlugin ? readChannels() : [];
        if (state.channels.length === 0) {
            return false;
        }
        object.bindToCurrentChannel();
        begin(listedChannel(object.currentChannel) || state.channels[0]);
        startTimeout();
        return true;
    }

    // Releases the tuner and the video plane.
    function release() {
        clearTimeout(timer);
        state.isTuned = false;
        if (object.hasPlugin) {
            object.release();
        }
        previous.push(object);
        object = null;
        removePrevious();
    }

    // ---- Programmes

    function copyRating(ratings) {
        var rating = ratings && ratings.length > 0 ? ratings.item(0) : null;
        return rating && { name: rating.name || String(rating.value), value: rating.value, scheme: rating.scheme };
    }

    function copyProgramme(programme) {
        return { name: programme.name || 'Without a title', description: programme.description || '',
                 start: programme.startTime, seconds: programme.duration,
                 rating: copyRating(programme.parentalRating) };
    }

    // An object also caches its programmes, so a temporary object reads the current ones.
    function readProgrammes() {
        if (!state.isTuned) {
            return;
        }
        /** @type {telix.VideoBroadcast} */
        var reader = tv.createObject('video/broadcast');
        var list = reader.programmes;
        state.programmes = [];
        for (var i = 0; list && i < list.length; i++) {
            state.programmes.push(copyProgramme(list.item(i)));
        }
        tv.removeObject(reader);
        on.programmes();
    }

    // ---- Stream events

    function watchForAnnouncements() {
        var watched = object;
        function onStreamEvent(event) {
            if (watched === object && event.name === announcement.name) {
                on.announced(event.text || '');
            }
        }
        if (location.protocol === 'file:') {
            // Without a description file, because the plug-in cannot fetch it: requests for files have no HTTP status.
            watched.addEventListener('StreamEvent', onStreamEvent, false);
            watched.addStreamEventListener('', announcement.name, announcement.id, announcement.tag);
        } else {
            watched.addStreamEventListener(announcement.url, announcement.name, onStreamEvent);
        }
    }

    return { on: on, state: state, start: start, release: release, tune: tune, zap: zap,
             hasPlugin: function () { return object.hasPlugin; },
             // The object that presents, for the selection of components, or null.
             presenter: function () { return state.isTuned ? object : null; } };
}());

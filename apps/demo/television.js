// Broadcast: the object that presents it, the channels, and what is on. What happens is told to the functions of
// television.on: tuning(), tuned(), failed(text), programmes(), announced(text).
var television = (function () {
    'use strict';

    var zapMilliseconds = 250; // rest after the last of several quick steps
    var answerMilliseconds = 15000;
    var announcement = { url: 'streamevent.xml', name: 'red-button', id: '1', tag: '1f' };
    var errors = { 0: 'The tuner does not support this channel.', 1: 'No signal.',
                   2: 'The tuner is in use.', 3: 'Parental control blocks this channel.',
                   4: 'The channel is encrypted and there is no key for it.', 5: 'The channel is not known.',
                   6: 'The channel change was interrupted.', 8: 'The address could not be resolved.',
                   9: 'There is not enough bandwidth.', 10: 'The channel cannot be changed now.',
                   11: 'The set has not enough resources.' };

    var on = {};
    var object = null;
    var former = []; // the objects before it, which present until it does
    var objectsMade = 0;
    var timer = 0;
    var state = { channels: [], channel: null, isTuned: false, error: '', programmes: [] };

    // The plug-in ends what it has handed out together with the object that it came from, so values are copied.
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

    function known(channel) {
        return channel && state.channels.filter(function (each) { return each.ccid === channel.ccid; })[0] || null;
    }

    // ---- The object

    function dropFormer() {
        former.forEach(tv.removeObject);
        former = [];
        document.body.offsetWidth; // the browser ends them now
    }

    // An object keeps the lists of components that it has once handed out, also on another channel. So every channel
    // gets an object of its own. Its events go to listeners of the page: browsers keep a handler that is set on an object
    // of the plug-in by any such object of the page, and lose it when that one is taken away. Only what an event
    // does not tell, why something failed, is left to handlers.
    function renew() {
        if (object) {
            object.onChannelChangeError = object.onPlayStateChange = null;
            former.push(object);
        }
        var made = object = tv.makeObject('video/broadcast', 'broadcast-' + ++objectsMade);
        if (!object.isThere) {
            return;
        }
        function listen(type, action) {
            made.addEventListener(type, function () {
                if (made === object) {
                    action();
                }
            }, false);
        }
        listen('ChannelChangeSucceded', succeed); // in the plug-in's spelling
        listen('ChannelChangeError', function () {
            if (!state.error) {
                end('The channel cannot be shown.');
            }
        });
        listen('ProgrammesChanged', readProgrammes);
        listen('ParentalRatingChange', function () { on.programmes(); });
        object.onChannelChangeError = function (channel, error) { fail(error); };
        object.onPlayStateChange = function (playState, error) {
            // Also told behind an error of the tuning; then it is a repetition.
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

    function expectAnswer() {
        timer = setTimeout(function () { end('The set does not answer.'); }, answerMilliseconds);
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
        state.channel = known(object.currentChannel) || state.channel;
        state.isTuned = true;
        // Later: this is a call from the plug-in, of which the objects are. And then in this order: a listener that the
        // plug-in is given goes with an object that is taken away.
        setTimeout(function () {
            dropFormer();
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
        renew();
        var list = channelList();
        var wanted = list ? list.getChannel(channel.ccid) : null;
        if (!wanted) {
            end(errors[5]);
            return;
        }
        object.setChannel(wanted, false);
        expectAnswer();
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

    // Shows what the set presents already; also the way back from media. False without channels.
    function start() {
        renew();
        state.channels = object.isThere ? readChannels() : [];
        if (state.channels.length === 0) {
            return false;
        }
        object.bindToCurrentChannel();
        begin(known(object.currentChannel) || state.channels[0]);
        expectAnswer();
        return true;
    }

    // Gives the tuner and the picture up.
    function release() {
        clearTimeout(timer);
        state.isTuned = false;
        if (object.isThere) {
            object.release();
        }
        former.push(object);
        object = null;
        dropFormer();
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

    // The programmes too are kept by an object that has once handed them out. One that is made for the moment has those
    // of now.
    function readProgrammes() {
        if (!state.isTuned) {
            return;
        }
        var reader = tv.makeObject('video/broadcast');
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
        function tell(event) {
            if (watched === object && event.name === announcement.name) {
                on.announced(event.text || '');
            }
        }
        if (location.protocol === 'file:') {
            // The plug-in would fetch the description, but a request for a file has no status that tells of success.
            watched.addEventListener('StreamEvent', tell, false);
            watched.addStreamEventListener('', announcement.name, announcement.id, announcement.tag);
        } else {
            watched.addStreamEventListener(announcement.url, announcement.name, tell);
        }
    }

    return { on: on, state: state, start: start, release: release, tune: tune, zap: zap,
             isThere: function () { return object.isThere; },
             // The object that presents, for the choice of components; null while none does.
             presenter: function () { return state.isTuned ? object : null; } };
}());

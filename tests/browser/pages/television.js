// A page that a test drives while it runs: it fetches expressions from its server, evaluates them and sends their values
// back. For the expressions there are a broadcast object and what it has told.
var tv = null;
var events = []; // [name, argument...] of each, a channel as its name
var objectsMade = 0;
var isThere = false;
var commands = 0;

function simple(value) {
    var isChannel = value !== null && value !== undefined && value.ccid !== undefined;
    return isChannel ? value.name : value === undefined ? null : value;
}

function keep(name) {
    return function () {
        events.push([name].concat([].slice.call(arguments).map(simple)));
    };
}

// A new object in the place of the one before it: an object keeps the lists of components that it has handed out.
function renew() {
    var former = tv;
    objectsMade += 1;
    tv = document.createElement('object');
    tv.id = 'tv' + objectsMade;
    tv.type = 'video/broadcast';
    document.body.appendChild(tv);
    // The browser would make the plug-in some time later; reading a property makes it do so now.
    isThere = tv.offsetWidth > 0 && tv.playState !== undefined;
    if (former) {
        document.body.removeChild(former);
    }
    events = [];
    tv.onChannelChangeSucceeded = keep('succeeded');
    tv.onChannelChangeError = keep('failed');
    tv.onProgrammesChanged = keep('programmes');
    tv.onFullScreenChange = keep('fullScreen');
}

function items(list) {
    var all = [];
    for (var i = 0; list && i < list.length; i++) {
        all.push(list.item(i));
    }
    return all;
}

function channels() {
    return items(tv.getChannelConfig().channelList);
}

function tune(name) {
    events = [];
    tv.setChannel(channels().filter(function (channel) { return channel.name === name; })[0], false);
}

function hasTuned(name) {
    return JSON.stringify(events).indexOf(JSON.stringify(['succeeded', name])) >= 0;
}

function programmes() {
    return items(tv.programmes).map(function (each) {
        return [each.name, each.startTime, each.duration, each.description];
    });
}

// Of a kind: 1 audio, 2 subtitles.
function component(kind, language) {
    return items(tv.getComponents(kind)).filter(function (each) { return each.language === language; })[0];
}

function active(kind) {
    return items(tv.getCurrentActiveComponents(kind)).map(function (each) { return each.language; });
}

function watchStreamEvents() {
    tv.addStreamEventListener('streamevent.xml', 'red-button', function (event) {
        events.push(['streamEvent', event.name, event.text, event.status]);
    });
}

function answer(value) {
    var request = new XMLHttpRequest();
    request.open('POST', 'answer');
    request.onload = next;
    request.send(JSON.stringify(value));
}

function next() {
    var request = new XMLHttpRequest();
    commands += 1;
    request.open('GET', 'command?' + commands);
    request.onload = function () {
        if (request.status !== 200) {
            next();
            return;
        }
        var value = {};
        try {
            value.value = (0, eval)(request.responseText);
        } catch (error) {
            value.error = String(error);
        }
        if (value.value === undefined) {
            value.value = null;
        }
        answer(value);
    };
    request.send();
}

renew();
window.addEventListener('load', next, false);

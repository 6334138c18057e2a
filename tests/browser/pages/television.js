// A page that a test drives: it fetches expressions from its server, evaluates them and sends back their values. The
// expressions use a broadcast object, the record of its events, and the functions below.
var tv = null;
var events = []; // [name, argument...] of each, with a channel's name for a channel
var objectsCreated = 0;
var hasPlugin = false;
var commands = 0;

function toJson(value) {
    var isChannel = value !== null && value !== undefined && value.ccid !== undefined;
    return isChannel ? value.name : value === undefined ? null : value;
}

function recorder(name) {
    return function () {
        events.push([name].concat([].slice.call(arguments).map(toJson)));
    };
}

// Replaces the object by a new one, because an object caches its component lists.
function replaceObject() {
    var previous = tv;
    objectsCreated += 1;
    tv = document.createElement('object');
    tv.id = 'tv' + objectsCreated;
    tv.type = 'video/broadcast';
    document.body.appendChild(tv);
    // Forces the layout, which creates the plug-in instance.
    hasPlugin = tv.offsetWidth > 0 && tv.playState !== undefined;
    if (previous) {
        document.body.removeChild(previous);
    }
    events = [];
    tv.onChannelChangeSucceeded = recorder('succeeded');
    tv.onChannelChangeError = recorder('failed');
    tv.onProgrammesChanged = recorder('programmes');
    tv.onFullScreenChange = recorder('fullScreen');
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

// `type`: 1 audio, 2 subtitles.
function component(type, language) {
    return items(tv.getComponents(type)).filter(function (each) { return each.language === language; })[0];
}

function active(type) {
    return items(tv.getCurrentActiveComponents(type)).map(function (each) { return each.language; });
}

function watchStreamEvents() {
    tv.addStreamEventListener('streamevent.xml', 'red-button', function (event) {
        events.push(['streamEvent', event.name, event.text, event.status]);
    });
}

function sendResult(result) {
    var request = new XMLHttpRequest();
    request.open('POST', 'result');
    request.onload = runNextCommand;
    request.send(JSON.stringify(result));
}

function runNextCommand() {
    var request = new XMLHttpRequest();
    commands += 1;
    request.open('GET', 'command?' + commands);
    request.onload = function () {
        if (request.status !== 200) {
            runNextCommand();
            return;
        }
        var result = {};
        try {
            result.value = (0, eval)(request.responseText);
        } catch (error) {
            result.error = String(error);
        }
        if (result.value === undefined) {
            result.value = null;
        }
        sendResult(result);
    };
    request.send();
}

replaceObject();
window.addEventListener('load', runNextCommand, false);

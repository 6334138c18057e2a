// Shared by the test pages of the broadcast object: access to the platform library of platforms/broadcast.cpp through a
// video/broadcast object. The page has one in `tv`.
var PLATFORM_EVENTS = { programmesChange: 1, ratingChange: 2, ratingError: 3, streamEvent: 4, playStateError: 5,
                        channelListError: 6, currentChannelError: 7 };

// Triggers an event of the platform.
function trigger(object, event, argument) {
    object.setChannelByTriplet(0xFFFE, PLATFORM_EVENTS[event], argument || 0);
}

// callsOf(object, NAME...): the platform calls of these names since the last callsOf(), which clears the record.
function callsOf(object) {
    var names = Array.prototype.slice.call(arguments, 1);
    return object.createChannelObject(0, 0xFFFF, 0, 0).name.split('\n').filter(function (call) {
        return names.indexOf(call.split('(')[0]) >= 0;
    });
}

// How many platform calls of that name the plug-in makes when the property is read. The browser creates a new wrapper
// each time it returns an object of the plug-in, so that === cannot compare them, but the values that an object has
// cached identify it. The browser does not pass numeric names to such an object: entries are read with item(), or by a
// name that only starts with a digit.
function platformCallsForRead(object, property, call) {
    callsOf(tv);
    var value = object[property];
    check(value !== null && value !== undefined);
    return callsOf(tv, call).length;
}

// Whether the page has not read this channel object before; now it has.
function isNewChannel(channel) {
    return platformCallsForRead(channel, 'onid', 'TELIX_JS_CM_GetOnid') > 0;
}

// Sets the handler for one call: next(arguments...) runs in a later turn, because an exception in a handler is lost.
function onceCalled(object, handler, next) {
    object[handler] = function () {
        var values = arguments;
        object[handler] = null;
        setTimeout(function () { next.apply(null, values); }, 0);
    };
}

// Runs `action`, and `next` with the channel when the object has been tuned.
function whenTuned(object, action, next) {
    onceCalled(object, 'onChannelChangeSucceeded', next);
    action();
}

// Adds another object to the page.
function addObject(id) {
    var added = document.createElement('object');
    added.type = 'video/broadcast';
    if (id) {
        added.id = id;
    }
    document.body.appendChild(added);
    return added;
}

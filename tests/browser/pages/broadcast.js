// What the pages for the broadcast objects share: the platform of platforms/broadcast.cpp, asked through a
// video/broadcast object. The page has one in `tv`.
var OCCURRENCES = { programmesChange: 1, ratingChanges: 2, ratingFails: 3, streamEventComes: 4, playStateFails: 5,
                    channelListFails: 6, currentChannelGoes: 7 };

// Makes something happen at the platform.
function provoke(object, occurrence, argument) {
    object.setChannelByTriplet(0xFFFE, OCCURRENCES[occurrence], argument || 0);
}

// callsOf(object, NAME...): the calls of these names that the platform has got since the last question, as it wrote them
// down. All other calls up to now are forgotten.
function callsOf(object) {
    var names = Array.prototype.slice.call(arguments, 1);
    return object.createChannelObject(0, 0xFFFF, 0, 0).name.split('\n').filter(function (call) {
        return names.indexOf(call.split('(')[0]) >= 0;
    });
}

// How often reading that property makes the plug-in ask the platform with the call of that name. The browser makes a
// new wrapper whenever it hands out an object of the plug-in, so === does not tell which one it is; what it has read and
// kept does. Nor does the browser ask such an object for a plain number: entries are read with item(), or by a name
// that only begins with a digit.
function questionsFor(object, property, call) {
    callsOf(tv);
    var value = object[property];
    check(value !== null && value !== undefined);
    return callsOf(tv, call).length;
}

// Whether the page reads this channel object for the first time; it counts as read then.
function isNewChannel(channel) {
    return questionsFor(channel, 'onid', 'TELIX_JS_CM_GetOnid') > 0;
}

// Takes the next call of a handler property: next(arguments...) runs in a turn of its own, where checks count.
function onceCalled(object, handler, next) {
    object[handler] = function () {
        var values = arguments;
        object[handler] = null;
        setTimeout(function () { next.apply(null, values); }, 0);
    };
}

// Runs `action` and then `next` with the channel that the object has been tuned to.
function whenTuned(object, action, next) {
    onceCalled(object, 'onChannelChangeSucceeded', next);
    action();
}

// A further object in the page; it goes with removeChild().
function addObject(id) {
    var made = document.createElement('object');
    made.type = 'video/broadcast';
    if (id) {
        made.id = id;
    }
    document.body.appendChild(made);
    return made;
}

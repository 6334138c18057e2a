// Dispatches a key event with a code that the engine does not produce, at the focused element. Returns false if a
// listener prevented the default action.
(function (type, keyCode) {
    var target = document.activeElement || document.body || document.documentElement;
    var event = document.createEvent('KeyboardEvent');
    event.initKeyboardEvent(type, true, true, window, '', 0, false, false, false, false, false);
    // The engine cannot create a key event with a given code, so own properties of the event hide the inherited ones.
    Object.defineProperty(event, 'keyCode', { value: keyCode });
    Object.defineProperty(event, 'which', { value: keyCode });
    return target.dispatchEvent(event);
})

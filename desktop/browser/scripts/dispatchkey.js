// One key event whose code the engine has no key for, at the element that has the focus.
// Gives false when the page prevented the default action.
(function (type, keyCode) {
    var target = document.activeElement || document.body || document.documentElement;
    var event = document.createEvent('KeyboardEvent');
    event.initKeyboardEvent(type, true, true, window, '', 0, false, false, false, false, false);
    // The engine offers no way to create a key event with a code of one's own choice, so the event's own properties
    // cover those that it would inherit.
    Object.defineProperty(event, 'keyCode', { value: keyCode });
    Object.defineProperty(event, 'which', { value: keyCode });
    return target.dispatchEvent(event);
})

// Dispatches key events with a code that the engine does not produce, at the focused element: keyup, or keydown
// and, unless a listener prevents it, keypress.
(function (type, keyCode, key, code, isRepeat) {
    // The element with the focus is in a frame if it is one.
    function focusedIn(document) {
        var element = document.activeElement || document.body || document.documentElement;
        var inner = null;
        try {
            inner = element.contentDocument;
        } catch (error) {
            // A frame of another origin in an engine that throws.
        }
        return inner && /^i?frame$/i.test(element.localName) ? focusedIn(inner) : element;
    }

    var target = focusedIn(document);
    function dispatch(type) {
        var event = target.ownerDocument.createEvent('KeyboardEvent');
        event.initKeyboardEvent(type, true, true, target.ownerDocument.defaultView, '', 0, false, false, false, false,
            false);
        // The engine cannot create a key event with a given code, so own properties of the event hide the inherited
        // ones.
        Object.defineProperty(event, 'keyCode', { value: keyCode });
        Object.defineProperty(event, 'which', { value: keyCode });
        Object.defineProperty(event, 'key', { value: key });
        Object.defineProperty(event, 'code', { value: code });
        Object.defineProperty(event, 'repeat', { value: isRepeat });
        return target.dispatchEvent(event);
    }

    if (dispatch(type) && type === 'keydown') {
        dispatch('keypress');
    }
})

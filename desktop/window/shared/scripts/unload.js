// Dispatches the unload events of a document.
(function () {
    function dispatch(type) {
        var event = document.createEvent('Event');
        event.initEvent(type, false, false);
        window.dispatchEvent(event);
    }

    // Like the engine, only for a complete document.
    if (document.readyState === 'complete') {
        dispatch('pagehide');
        dispatch('unload');
    }
})

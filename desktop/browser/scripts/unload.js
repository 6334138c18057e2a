// Tells a document that it is unloaded.
(function () {
    function tell(type) {
        var event = document.createEvent('Event');
        event.initEvent(type, false, false);
        window.dispatchEvent(event);
    }

    // As the engine does it, only a document that is complete is told.
    if (document.readyState === 'complete') {
        tell('pagehide');
        tell('unload');
    }
})

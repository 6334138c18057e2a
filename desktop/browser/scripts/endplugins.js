// Ends the plug-ins of a page that is about to be taken apart, as long as it is whole. An element without a box has no
// plug-in once the page is laid out.
(function () {
    function end() {
        var elements = document.querySelectorAll('object, embed, applet');
        for (var i = 0; i < elements.length; i++) {
            elements[i].style.setProperty('display', 'none', 'important');
        }
        return document.documentElement && document.documentElement.offsetWidth; // lays the page out
    }

    // The page's own listeners may still use the objects; this one is the last. Before a document is complete, it is not
    // told that it is unloaded.
    if (document.readyState === 'complete') {
        window.addEventListener('unload', end, false);
    } else {
        end();
    }
})

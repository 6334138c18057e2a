// Tells when a page lets the video plane be seen, because its background is not opaque. Runs in a script world of its own, so
// that nothing the page does to its script objects matters here.
//
// Is called when a document has been parsed. Posts a message to the handler transparentPage once, as soon as the document is
// visible and transparent, and looks no longer then. What is not known to be opaque counts as transparent. `emptyPage`: the URL
// of the window's own page, which nothing is drawn in.
(function (emptyPage) {
    'use strict';

    var checkInterval = 1000; // milliseconds, for changes that nothing reports, such as those of style sheets
    var opaque = /^rgb\(/; // a computed colour without an alpha component

    function isOpaque(node) {
        var style = window.getComputedStyle(node);
        return style.display !== 'none' && style.visibility === 'visible' && opaque.test(style.backgroundColor);
    }

    // The background of the root, or else that of the body, is that of the whole page.
    function isTransparent() {
        var root = document.documentElement;
        return window.getComputedStyle(root).opacity !== '1' ||
            !(isOpaque(root) || (document.body && isOpaque(document.body)));
    }

    // Before its style sheets have come, the background of a document is not known.
    function isStyled() {
        return document.readyState === 'complete' ||
            Array.prototype.every.call(document.querySelectorAll('link[rel~="stylesheet"]'), function (link) {
                return link.sheet;
            });
    }

    function check() {
        if (!document.hidden && document.documentElement && isStyled() && isTransparent()) {
            observer.disconnect();
            window.clearInterval(interval);
            document.removeEventListener('visibilitychange', check);
            window.removeEventListener('load', check);
            window.webkit.messageHandlers.transparentPage.postMessage(null);
        }
    }

    if (document.URL === emptyPage) {
        return;
    }
    var observer = new MutationObserver(check);
    var interval = window.setInterval(check, checkInterval);
    [document.documentElement, document.body].forEach(function (node) {
        if (node) {
            observer.observe(node, { attributes: true });
        }
    });
    document.addEventListener('visibilitychange', check);
    window.addEventListener('load', check);
    check();
})

// Reports the objects of a document that have no id, or a type that no plug-in has, in an engine without the bridge, which
// reports them itself. Called once per window object, before any script of the page and before pagefunctions.js takes the
// host object.
(function () {
    var browser = window.telixTvBrowser;
    var types = null;

    // By name, in lower case.
    function typesOfPlugins() {
        var all = Object.create(null);
        for (var i = 0; i < navigator.mimeTypes.length; i++) {
            all[navigator.mimeTypes[i].type.toLowerCase()] = true;
        }
        return all;
    }

    function check(element) {
        var type = (element.getAttribute('type') || '').split(';')[0].trim().toLowerCase();
        types = types || typesOfPlugins();
        if (type && !types[type]) {
            browser.warn('unknown-type', type);
        } else if (type && !element.getAttribute('id')) {
            browser.warn('no-id', type);
        }
    }

    function checkAll(node) {
        if (node.nodeType !== 1) {
            return;
        }
        if (/^(object|embed)$/i.test(node.localName)) {
            check(node);
        }
        Array.prototype.forEach.call(node.querySelectorAll('object, embed'), check);
    }

    new MutationObserver(function (records) {
        records.forEach(function (record) {
            if (record.type === 'attributes') {
                checkAll(record.target);
            }
            Array.prototype.forEach.call(record.addedNodes, checkAll);
        });
    }).observe(document, { childList: true, subtree: true, attributes: true, attributeFilter: ['type'] });
    // The window object comes with the first script, which elements may precede.
    if (document.documentElement) {
        checkAll(document.documentElement);
    }
})

// Makes the keys of a WebDriver session those of the remote control. The engine sends them to the page without the
// window. Called once per window object, before any script of the page, with the function of dispatchkey.js and the keys
// by the code of their keyboard key: [name, code in pages, group, whether the engine produces the code,
// `key`, `code`].
(function (dispatchKey, keys) {
    var remote = window.telixTvRemote;
    delete window.telixTvRemote;
    // The keys whose press the page has received, by their names.
    var held = {};

    function onKey(event) {
        var key = keys[event.keyCode];
        if (!event.isTrusted || !key || event.ctrlKey || event.altKey || event.metaKey) {
            return;
        }
        var name = key[0], isPress = event.type === 'keydown';
        var isForPage = isPress ? remote.isKeyOfPages(key[2]) : held[name] === true;
        held[name] = isPress && isForPage;
        if (isForPage && key[3] && key[1] === event.keyCode) {
            return;
        }
        event.stopImmediatePropagation();
        event.preventDefault();
        if (isForPage) {
            dispatchKey(event.type, key[1], key[4], key[5], event.repeat);
        } else if (isPress) {
            remote.pressTelevisionKey(name);
        }
    }

    window.addEventListener('keydown', onKey, true);
    window.addEventListener('keyup', onKey, true);
})

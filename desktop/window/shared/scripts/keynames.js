// Adds to key events the properties `key` and `code` of UI Events, in an engine without them. Called once per window
// object, before any script of the page, with [key, code] of the keys of the remote control by their key codes.
(function (names) {
    var keyOfControlCharacter = { 8: 'Backspace', 9: 'Tab', 13: 'Enter', 27: 'Escape', 127: 'Delete' };

    function nameOfCharacter(code) {
        return keyOfControlCharacter[code] || String.fromCharCode(code);
    }

    // The engine has the name, or the character as U+0041 whatever the case is.
    function nameOfIdentifier(event) {
        var identifier = event.keyIdentifier || 'Unidentified';
        if (identifier.slice(0, 2) !== 'U+') {
            return identifier;
        }
        var name = nameOfCharacter(parseInt(identifier.slice(2), 16));
        return name.length > 1 || event.shiftKey ? name : name.toLowerCase();
    }

    function add(name, read) {
        Object.defineProperty(KeyboardEvent.prototype, name, {
            get: function () {
                return read(this);
            },
            enumerable: true,
            configurable: true
        });
    }

    add('key', function (event) {
        if (event.type === 'keypress' && event.charCode > 0) {
            return nameOfCharacter(event.charCode);
        }
        return names[event.keyCode] ? names[event.keyCode][0] : nameOfIdentifier(event);
    });
    add('code', function (event) {
        var isLetter = event.keyCode >= 65 && event.keyCode <= 90 && event.type !== 'keypress';
        return names[event.keyCode] ? names[event.keyCode][1] :
            isLetter ? 'Key' + String.fromCharCode(event.keyCode) : '';
    });
})

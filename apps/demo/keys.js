// The remote control: each key is handled by the topmost layer of the screen that has a function for it.
//
// A layer is an object whose `keys` maps key names to functions: up, down, left, right, ok, back, info, red, green,
// yellow, blue, play, pause, stop, rewind, forward, and digit, which gets the number. Layers below a `modal` one get no
// keys.
var keys = (function () {
    'use strict';

    // The browser's constant, the code if the browser has no constant, the name. Channel keys act like arrow keys.
    var codes = [['VK_UP', 38, 'up'], ['VK_DOWN', 40, 'down'], ['VK_LEFT', 37, 'left'], ['VK_RIGHT', 39, 'right'],
                 ['VK_ENTER', 13, 'ok'], ['VK_BACK', 461, 'back'], ['VK_INFO', 457, 'info'], ['VK_RED', 403, 'red'],
                 ['VK_GREEN', 404, 'green'], ['VK_YELLOW', 405, 'yellow'], ['VK_BLUE', 406, 'blue'],
                 ['VK_PLAY', 415, 'play'], ['VK_PAUSE', 19, 'pause'], ['VK_STOP', 413, 'stop'],
                 ['VK_REWIND', 412, 'rewind'], ['VK_FAST_FWD', 417, 'forward'], ['VK_CHANNEL_UP', 427, 'up'],
                 ['VK_CHANNEL_DOWN', 428, 'down']];
    var names = {};
    var layers = [];

    codes.forEach(function (row) {
        names[window[row[0]] === undefined ? row[1] : window[row[0]]] = row[2];
    });

    function digitOf(keyCode) {
        var first = window.VK_0 === undefined ? 48 : window.VK_0;
        return keyCode >= first && keyCode < first + 10 ? keyCode - first : -1;
    }

    function actionFor(keyCode) {
        var digit = digitOf(keyCode);
        var name = digit >= 0 ? 'digit' : names[keyCode];
        for (var i = layers.length - 1; i >= 0; i--) {
            var action = layers[i].keys[name];
            if (action) {
                return function () { action(digit); };
            }
            if (layers[i].modal) {
                break;
            }
        }
        return null;
    }

    document.addEventListener('keydown', function (event) {
        var action = actionFor(event.keyCode);
        if (action) {
            event.preventDefault();
            action();
        }
    }, false);

    function close(layer) {
        layers = layers.filter(function (each) { return each !== layer; });
    }

    // Puts the layer on top of all others.
    function open(layer) {
        close(layer);
        layers.push(layer);
    }

    // The name of the browser's constant for a key code.
    function nameOf(keyCode) {
        return Object.getOwnPropertyNames(window).filter(function (name) {
            return name.indexOf('VK_') === 0 && window[name] === keyCode;
        })[0] || 'unknown';
    }

    return { open: open, close: close, nameOf: nameOf };
}());

// Adds to the window object the names of OIPF DAE and CEA-2014 that are there without an element: KeyEvent with all key
// codes, oipfObjectFactory and debug(). Called once per window object, before any script of the page. What few pages use
// is made when it is read first.
(function () {
    // As a property of the window that the page can replace, also by a declaration.
    function addLazily(name, make) {
        function set(value) {
            Object.defineProperty(window, name, { value: value, writable: true, enumerable: false, configurable: true });
        }
        Object.defineProperty(window, name, {
            get: function () {
                set(make());
                return window[name];
            },
            set: set,
            enumerable: false,
            configurable: true
        });
    }

    // --- Key codes: those of keyboards, of the remote controls of HAVi from 403 on, and of CEA-2014 itself

    // Codes that follow one another.
    function row(codes, first, names) {
        names.split(' ').forEach(function (name, index) {
            codes['VK_' + name] = first + index;
        });
    }

    // The window has those of the remote control, and further ones that TS 102 796 names.
    row(window, 33, 'PAGE_UP PAGE_DOWN');
    row(window, 402, 'PLAY_PAUSE');
    row(window, 416, 'RECORD');
    row(window, 424, 'TRACK_PREV TRACK_NEXT');
    row(window, 460, 'SUBTITLE');

    addLazily('KeyEvent', function () {
        var codes = {};
        row(codes, 3, 'CANCEL');
        row(codes, 8, 'BACK_SPACE TAB');
        row(codes, 12, 'CLEAR ENTER');
        row(codes, 16, 'SHIFT CONTROL ALT PAUSE CAPS_LOCK');
        row(codes, 27, 'ESCAPE');
        row(codes, 32, 'SPACE PAGE_UP PAGE_DOWN END HOME LEFT UP RIGHT DOWN SELECT PRINT EXECUTE PRINTSCREEN INSERT ' +
            'DELETE HELP 0 1 2 3 4 5 6 7 8 9');
        row(codes, 65, 'A B C D E F G H I J K L M N O P Q R S T U V W X Y Z');
        row(codes, 96, 'NUMPAD0 NUMPAD1 NUMPAD2 NUMPAD3 NUMPAD4 NUMPAD5 NUMPAD6 NUMPAD7 NUMPAD8 NUMPAD9 MULTIPLY ADD ' +
            'SEPARATOR SUBTRACT DECIMAL DIVIDE F1 F2 F3 F4 F5 F6 F7 F8 F9 F10 F11 F12 F13 F14 F15 F16 F17 F18 F19 F20 ' +
            'F21 F22 F23 F24');
        row(codes, 144, 'NUM_LOCK SCROLL_LOCK');
        row(codes, 402, 'PLAY_PAUSE');
        row(codes, 403, 'COLORED_KEY_0 COLORED_KEY_1 COLORED_KEY_2 COLORED_KEY_3 COLORED_KEY_4 COLORED_KEY_5 POWER ' +
            'DIMMER WINK REWIND STOP EJECT_TOGGLE PLAY RECORD FAST_FWD PLAY_SPEED_UP PLAY_SPEED_DOWN PLAY_SPEED_RESET ' +
            'RECORD_SPEED_NEXT GO_TO_START GO_TO_END TRACK_PREV TRACK_NEXT RANDOM_TOGGLE CHANNEL_UP CHANNEL_DOWN ' +
            'STORE_FAVORITE_0 STORE_FAVORITE_1 STORE_FAVORITE_2 STORE_FAVORITE_3 RECALL_FAVORITE_0 RECALL_FAVORITE_1 ' +
            'RECALL_FAVORITE_2 RECALL_FAVORITE_3 CLEAR_FAVORITE_0 CLEAR_FAVORITE_1 CLEAR_FAVORITE_2 CLEAR_FAVORITE_3 ' +
            'SCAN_CHANNELS_TOGGLE PINP_TOGGLE SPLIT_SCREEN_TOGGLE DISPLAY_SWAP SCREEN_MODE_NEXT VIDEO_MODE_NEXT ' +
            'VOLUME_UP VOLUME_DOWN MUTE SURROUND_MODE_NEXT BALANCE_RIGHT BALANCE_LEFT FADER_FRONT FADER_REAR ' +
            'BASS_BOOST_UP BASS_BOOST_DOWN INFO GUIDE TELETEXT SUBTITLE BACK MENU');
        row(codes, 403, 'RED GREEN YELLOW BLUE GREY BROWN');
        return codes;
    });

    // --- Object factory (OIPF DAE 7.1). It has the methods whose types the plug-in has; a call of another one is a
    // TypeError.

    var createElement = document.createElement;

    function newObject(type) {
        var element = createElement.call(document, 'object');
        element.type = type;
        return element;
    }

    // An object that is not seen works without the page putting it into the document.
    function newHiddenObject(type) {
        var element = newObject(type);
        element.style.cssText = 'display: block; position: absolute; visibility: hidden; left: 0; top: 0; width: 0; ' +
            'height: 0';
        document.documentElement.appendChild(element);
        return element;
    }

    var factoryMethods = [
        ['createVideoBroadcastObject', 'video/broadcast', newObject],
        ['createVideoMpegObject', 'video/mpeg', newObject],
        ['createApplicationManagerObject', 'application/oipfApplicationManager', newHiddenObject],
        ['createCapabilitiesObject', 'application/oipfCapabilities', newHiddenObject],
        ['createConfigurationObject', 'application/oipfConfiguration', newHiddenObject],
        ['createDrmAgentObject', 'application/oipfDrmAgent', newHiddenObject],
        ['createParentalControlManagerObject', 'application/oipfParentalControlManager', newHiddenObject]
    ];

    // The name of the plug-in that has a type; undefined if none has.
    function pluginOf(type) {
        var entry = navigator.mimeTypes[String(type).toLowerCase()];
        return entry && entry.enabledPlugin ? entry.enabledPlugin.name : undefined;
    }

    // Of the plug-in of television only: engines list types of their own.
    function isSupported(type) {
        var plugin = pluginOf(type);
        return plugin !== undefined && plugin === pluginOf('video/broadcast');
    }

    addLazily('oipfObjectFactory', function () {
        var factory = { isObjectSupported: isSupported };
        factoryMethods.forEach(function (method) {
            if (isSupported(method[1])) {
                factory[method[0]] = function () {
                    return method[2](method[1]);
                };
            }
        });
        return factory;
    });

    window.debug = console.log.bind(console);
})

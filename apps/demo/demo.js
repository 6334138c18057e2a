// The demonstration: what a page gets from the application manager and the device, shown and tried with the remote
// control.
(function () {
    'use strict';

    var linesOfLog = 3;
    var previewMilliseconds = 3000;
    var applicationHandlers = ['onKeyPress', 'onKeyUp', 'onKeyDown', 'onApplicationShown', 'onApplicationHidden'];
    var managerHandlers = ['onLowMemory', 'onApplicationLoaded', 'onApplicationUnloaded', 'onApplicationLoadError'];
    var applicationMethods = ['createApplication', 'destroyApplication', 'show', 'hide'];

    var manager = document.getElementById('manager');
    var application = null;
    var focused = 0;
    var hidden = false;
    var lastKey = null;
    var created = null;
    var drm = { sent: null, id: null, result: null, code: null };

    function byId(id) {
        return document.getElementById(id);
    }

    function log(text) {
        var list = byId('log');
        list.insertBefore(tv.element('li', text), list.firstChild);
        while (list.childNodes.length > linesOfLog) {
            list.removeChild(list.lastChild);
        }
    }

    function table(rows) {
        var made = document.createElement('table');
        rows.forEach(function (row) {
            var line = document.createElement('tr');
            row.forEach(function (text) { line.appendChild(tv.element('td', text)); });
            made.appendChild(line);
        });
        return made;
    }

    function propertiesOf(object, names) {
        return table(names.map(function (name) { return [name, tv.describe(object[name])]; }));
    }

    // Handlers. One function for all: what counts here is that the object keeps it.

    function handler() {}

    function setHandlers() {
        applicationHandlers.forEach(function (name) { application[name] = handler; });
        managerHandlers.forEach(function (name) { manager[name] = handler; });
        log('all handlers = a function');
    }

    function clearHandlers() {
        applicationHandlers.forEach(function (name) { application[name] = null; });
        managerHandlers.forEach(function (name) { manager[name] = null; });
        log('null clears the manager\'s handlers, not the application\'s');
    }

    function switchHandlers() {
        if (manager[managerHandlers[0]] === null) {
            setHandlers();
        } else {
            clearHandlers();
        }
    }

    // Applications.

    function openSecond() {
        created = application.createApplication('second.html', true);
        log('createApplication("second.html", true) gives ' + tv.describeApplication(created));
    }

    function preview() {
        openSecond();
        if (created) {
            setTimeout(function () {
                // The viewer may have closed it; then this page would close itself.
                if (document.hidden) {
                    created.destroyApplication();
                    log('destroyApplication() brings this page back');
                    show();
                }
            }, previewMilliseconds);
        }
    }

    function hideOrShow() {
        if (hidden) {
            application.show();
        } else {
            application.hide();
        }
        hidden = !hidden;
        log(hidden ? 'hide()' : 'show()');
    }

    // The device. The key mask goes back and forth between what a menu needs and that with the digits.

    function keySet() {
        return application.privateData.keyset;
    }

    function switchKeyMask() {
        var keys = keySet();
        var colours = keys.RED + keys.GREEN + keys.YELLOW + keys.BLUE;
        var menuKeys = colours + keys.NAVIGATION;
        var mask = keys.value === menuKeys ? menuKeys + keys.NUMERIC : menuKeys;
        log('setValue(' + hexadecimal(mask) + ') gives ' + hexadecimal(keys.setValue(mask)));
    }

    function hexadecimal(number) {
        return '0x' + number.toString(16);
    }

    function value(of) {
        return of === null || of === undefined ? 'not known' : String(of);
    }

    function deviceRows() {
        var settings = byId('configuration').configuration;
        var capabilities = byId('capabilities');
        var description = capabilities.xmlCapabilities;
        return [['Country', value(settings.countryId)],
                ['Audio language', value(settings.preferredAudioLanguage)],
                ['Subtitle language', value(settings.preferredSubtitleLanguage)],
                ['Free memory', value(application.privateData.getFreeMem())],
                ['Key mask in force', hexadecimal(keySet().value)],
                ['HD user interface', capabilities.hasCapability('OITF_HD_UIPROF') ? 'yes' : 'no'],
                ['More decoders, SD and HD', capabilities.extraSDVideoDecodes + ' and ' + capabilities.extraHDVideoDecodes],
                ['Capability profiles', description ? String(description.documentElement.childNodes.length) : 'not known']];
    }

    // DRM: a message to the set, and its answer some time later.

    function sendDrmMessage() {
        drm = { sent: 'Hello, set', id: null, result: null, code: null };
        drm.id = byId('agent').sendDRMMessage('text/plain', drm.sent, 'urn:dvb:casystemid:0');
        log('sendDRMMessage() gives ' + value(drm.id));
    }

    function onDrmResult(id, result, code) {
        drm.id = id;
        drm.result = result;
        drm.code = code;
        log('onDRMMessageResult: ' + value(result));
        show();
    }

    // The menu: a title, what the panel shows, and what OK does.

    var menu = [
        {
            title: 'Application',
            panel: function () {
                return [tv.element('h2', 'What getOwnerApplication() gave'),
                        propertiesOf(application, applicationHandlers.concat(applicationMethods))];
            },
            ok: function () {
                application = manager.getOwnerApplication(document);
                log('getOwnerApplication(document) gives another one');
            }
        },
        {
            title: 'Manager',
            panel: function () {
                return [tv.element('h2', 'The embedded application manager'),
                        propertiesOf(manager, managerHandlers.concat('getOwnerApplication'))];
            },
            ok: switchHandlers
        },
        {
            title: 'Second page',
            panel: function () {
                return [tv.element('h2', 'An application on top of this one'),
                        tv.element('p', 'OK or green opens it; it closes itself at BACK.'),
                        tv.element('p', 'Blue opens it for three seconds; then this page closes it.'),
                        table([['Last one opened', tv.describeApplication(created)]])];
            },
            ok: openSecond
        },
        {
            title: 'Plug-in',
            panel: function () {
                var plugin = navigator.mimeTypes[manager.type].enabledPlugin;
                return [tv.element('h2', plugin.name), tv.element('p', plugin.description),
                        table([['Types of objects', String(plugin.length)], ['File', plugin.filename]])];
            },
            ok: function () { log('nothing to do here'); }
        },
        {
            title: 'Device',
            panel: function () {
                return [tv.element('h2', 'The set, as a page sees it'), table(deviceRows())];
            },
            ok: switchKeyMask
        },
        {
            title: 'DRM messages',
            panel: function () {
                return [tv.element('h2', 'OK sends a message to the set'),
                        table([['Message', value(drm.sent)], ['Id', value(drm.id)], ['Result', value(drm.result)],
                               ['Code', value(drm.code)]])];
            },
            ok: sendDrmMessage
        },
        {
            title: 'Remote control',
            panel: function () {
                return [tv.element('h2', 'Press a key'),
                        table([['keyCode', lastKey === null ? 'none yet' : String(lastKey)],
                               ['Name', lastKey === null ? '' : nameOfKey(lastKey)]])];
            },
            ok: function () { log('OK'); }
        }
    ];

    function nameOfKey(keyCode) {
        return Object.getOwnPropertyNames(window).filter(function (name) {
            return name.indexOf('VK_') === 0 && window[name] === keyCode;
        })[0] || 'unknown';
    }

    function show() {
        tv.fill(byId('menu'), menu.map(function (entry, index) {
            var line = tv.element('li', entry.title);
            line.className = index === focused ? 'focused' : '';
            return line;
        }));
        tv.fill(byId('panel'), menu[focused].panel());
    }

    function moveFocus(step) {
        focused = (focused + step + menu.length) % menu.length;
    }

    function showTime() {
        function twoDigits(number) {
            return (number < 10 ? '0' : '') + number;
        }
        var now = new Date();
        byId('clock').textContent = twoDigits(now.getHours()) + ':' + twoDigits(now.getMinutes());
    }

    function thenShow(action) {
        return function () {
            action();
            show();
        };
    }

    showTime();
    setInterval(showTime, 1000);
    application = tv.ownerApplication(manager);
    if (!application) {
        byId('missing').style.display = 'block';
        ['menu', 'panel', 'log', 'legend'].forEach(function (id) { byId(id).style.display = 'none'; });
        return;
    }

    document.addEventListener('keydown', function (event) {
        lastKey = event.keyCode;
        show();
    }, false);
    byId('agent').onDRMMessageResult = onDrmResult;
    var actions = {};
    actions[VK_UP] = thenShow(function () { moveFocus(-1); });
    actions[VK_DOWN] = thenShow(function () { moveFocus(1); });
    actions[VK_ENTER] = thenShow(function () { menu[focused].ok(); });
    actions[VK_BACK] = thenShow(function () { focused = 0; });
    actions[VK_RED] = thenShow(hideOrShow);
    actions[VK_GREEN] = thenShow(openSecond);
    actions[VK_YELLOW] = thenShow(switchHandlers);
    actions[VK_BLUE] = thenShow(preview);
    tv.onKeys(actions);
    log('getOwnerApplication(document) gives ' + tv.describeApplication(application));
    show();
}());

// The device page: configuration, capabilities, parental control, keys, DRM and applications.
var device = (function () {
    'use strict';

    var linesOfLog = 3;
    var applicationHandlers = ['onKeyPress', 'onKeyUp', 'onKeyDown', 'onApplicationShown', 'onApplicationHidden'];
    var managerHandlers = ['onLowMemory', 'onApplicationLoaded', 'onApplicationUnloaded', 'onApplicationLoadError'];
    var applicationMethods = ['createApplication', 'destroyApplication', 'show', 'hide'];
    var keyGroups = ['RED', 'GREEN', 'YELLOW', 'BLUE', 'NAVIGATION', 'VCR', 'SCROLL', 'INFO', 'NUMERIC', 'ALPHA'];
    var profileNames = ['OITF_HD_UIPROF', 'OITF_SD_UIPROF'];
    var drmSystems = ['urn:dvb:casystemid:0', 'urn:dvb:casystemid:4096', 'urn:dvb:casystemid:19219'];
    var drmResults = ['successful', 'unknown error', 'cannot process the request', 'unknown type of message',
                      'consent of the viewer needed', 'unknown DRM system'];
    var linesOfPanel = 9;

    var manager = tv.byId('manager');
    var application = null;
    var onClose = null;
    var focused = 0;
    var scheme = 0;
    var profile = 0; // the first one that is listed
    var drmSystem = 0;
    var hidden = false;
    var lastKey = null;
    var created = null;
    var isPreviewing = false;
    var drm = { sent: null, id: null, result: null, code: null };

    function log(text) {
        var list = tv.byId('log');
        list.insertBefore(tv.element('li', text), list.firstChild);
        while (list.childNodes.length > linesOfLog) {
            list.removeChild(list.lastChild);
        }
    }

    function propertiesOf(object, names) {
        return tv.table(names.map(function (name) { return [name, tv.describe(object[name])]; }));
    }

    function textOf(value) {
        return value === null || value === undefined || value === '' ? 'not known' : String(value);
    }

    function hexadecimal(number) {
        return '0x' + number.toString(16);
    }

    // ---- Handlers. One function for all, because the page only shows whether they are set.

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

    // ---- Applications

    function open(page) {
        created = application.createApplication(page, true);
        log('createApplication("' + page + '", true) returns ' + tv.describeApplication(created));
    }

    function openSecond() {
        open('second.html');
    }

    // The second page ends itself after some seconds.
    function preview() {
        open('second.html#preview');
        isPreviewing = created !== null;
    }

    function afterPreview() {
        if (isPreviewing && !document.hidden) {
            isPreviewing = false;
            log('destroyApplication() brings this page back');
            update();
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

    // ---- The set

    function settingsRows() {
        var settings = tv.byId('configuration').configuration;
        return [['Country', textOf(settings.countryId)],
                ['Audio language', textOf(settings.preferredAudioLanguage)],
                ['Subtitle language', textOf(settings.preferredSubtitleLanguage)],
                ['Free memory', textOf(application.privateData.getFreeMem() || null)]];
    }

    // The elements of the UI, video and audio profiles in the capabilities document.
    function describedProfiles() {
        var description = tv.byId('capabilities').xmlCapabilities;
        return description && description.documentElement ? description.documentElement.children : [];
    }

    function capabilityRows() {
        var capabilities = tv.byId('capabilities');
        var profiles = describedProfiles();
        var rows = profileNames.map(function (name) {
            return [name, capabilities.hasCapability(name) ? 'yes' : 'no'];
        });
        rows.push(['More decoders, SD and HD', capabilities.extraSDVideoDecodes + ' and ' +
                                               capabilities.extraHDVideoDecodes]);
        rows.push(['Profiles described', profiles.length > 0 ? String(profiles.length) : 'not known']);
        Array.prototype.slice.call(profiles, profile, profile + linesOfPanel - rows.length).forEach(function (each) {
            rows.push([each.getAttribute('name') || each.nodeName, each.getAttribute('type') || '']);
        });
        return rows;
    }

    // The index before or after `number`, cyclic.
    function stepped(number, step, count) {
        return count > 0 ? (number + step + count) % count : 0;
    }

    // ---- Parental control

    function schemes() {
        return tv.byId('parental').parentalRatingSchemes;
    }

    function parentalPanel() {
        var all = schemes();
        if (!all || all.length === 0) {
            return [tv.element('h2', 'Parental control'), tv.element('p', 'The set knows no schemes of ratings.')];
        }
        var shown = all.item(scheme);
        var threshold = shown.threshold;
        var rows = [['Scheme', scheme + 1 + ' of ' + all.length],
                    ['Threshold', threshold ? threshold.name : 'not known']];
        for (var i = 0; i < shown.length && rows.length < linesOfPanel; i++) {
            rows.push(['Rating ' + (i + 1), textOf(shown.item(i))]);
        }
        return [tv.element('h2', shown.name || 'A scheme without a name'), tv.table(rows)];
    }

    // ---- Keys. The mask alternates between the keys of a menu and these with the digits.

    function keySet() {
        return application.privateData.keyset;
    }

    function switchKeyMask() {
        var set = keySet();
        var menuKeys = set.RED + set.GREEN + set.YELLOW + set.BLUE + set.NAVIGATION;
        var mask = set.value === menuKeys ? menuKeys + set.NUMERIC : menuKeys;
        log('setValue(' + hexadecimal(mask) + ') returns ' + hexadecimal(set.setValue(mask)));
    }

    function keyRows() {
        var set = keySet();
        var mask = set.value;
        var groups = keyGroups.filter(function (name) { return (mask & set[name]) !== 0; });
        var rows = [['Key mask in force', hexadecimal(mask)]];
        for (var i = 0; i < groups.length; i += 5) {
            rows.push([i === 0 ? 'Groups' : '', groups.slice(i, i + 5).join(' ').toLowerCase()]);
        }
        return rows;
    }

    // ---- DRM: a message to the set and its asynchronous result.

    function sendDrmMessage() {
        drm = { sent: 'Hello, set', id: null, result: null, code: null };
        drm.id = tv.byId('agent').sendDRMMessage('text/plain', drm.sent, drmSystems[drmSystem]);
        log('sendDRMMessage() returns ' + textOf(drm.id));
    }

    function onDrmResult(id, result, code) {
        drm.id = id;
        drm.result = result;
        drm.code = code;
        log('onDRMMessageResult: ' + textOf(result));
        update();
    }

    function drmRows() {
        return [['DRM system', drmSystems[drmSystem]], ['Message', textOf(drm.sent)], ['Id', textOf(drm.id)],
                ['Result', textOf(drm.result)],
                ['Code', textOf(drm.code) + (drmResults[drm.code] ? ', ' + drmResults[drm.code] : '')]];
    }

    // ---- The menu: title, contents of the panel, function of OK, optional function of left and right.

    var menu = [
        {
            title: 'Settings',
            panel: function () { return [tv.element('h2', 'The settings of the viewer'), tv.table(settingsRows())]; },
            ok: function () { log('they are changed in the set itself'); }
        },
        {
            title: 'Capabilities',
            panel: function () { return [tv.element('h2', 'The capabilities of the set'), tv.table(capabilityRows())]; },
            ok: function () { log('left and right show other profiles'); },
            turn: function (step) { profile = stepped(profile, step, describedProfiles().length); }
        },
        {
            title: 'Parental control',
            panel: parentalPanel,
            ok: function () { log('left and right show other schemes'); },
            turn: function (step) {
                var all = schemes();
                scheme = stepped(scheme, step, all ? all.length : 0);
            }
        },
        {
            title: 'Keys',
            panel: function () {
                return [tv.element('h2', 'The keys that this page gets'), tv.table(keyRows()),
                        tv.element('p', 'OK adds or removes the digits.')];
            },
            ok: switchKeyMask
        },
        {
            title: 'DRM messages',
            panel: function () {
                return [tv.element('h2', 'OK sends a message to the set'),
                        tv.table(drmRows()), tv.element('p', 'Left and right choose the system.')];
            },
            ok: sendDrmMessage,
            turn: function (step) { drmSystem = stepped(drmSystem, step, drmSystems.length); }
        },
        {
            title: 'Second page',
            panel: function () {
                return [tv.element('h2', 'An application on top of this one'),
                        tv.element('p', 'OK or green opens it; it closes itself at BACK.'),
                        tv.element('p', 'Blue opens it for three seconds; then this page closes it.'),
                        tv.table([['Last one opened', tv.describeApplication(created)]])];
            },
            ok: openSecond
        },
        {
            title: 'Application',
            panel: function () {
                return [tv.element('h2', 'The owner application'),
                        propertiesOf(application, applicationHandlers.concat(applicationMethods))];
            },
            ok: function () {
                application = manager.getOwnerApplication(document);
                log('getOwnerApplication(document) returns another one');
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
            title: 'Plug-in',
            panel: function () {
                var plugin = navigator.mimeTypes[manager.type].enabledPlugin;
                return [tv.element('h2', plugin.name), tv.element('p', plugin.description),
                        tv.table([['Types of objects', String(plugin.length)], ['File', plugin.filename]])];
            },
            ok: function () { log('nothing to do here'); }
        },
        {
            title: 'Remote control',
            panel: function () {
                return [tv.element('h2', 'Press a key'),
                        tv.table([['keyCode', lastKey === null ? 'none yet' : String(lastKey)],
                                  ['Name', lastKey === null ? '' : keys.nameOf(lastKey)]])];
            },
            ok: function () { log('OK'); }
        }
    ];

    function update() {
        tv.fill(tv.byId('menu'), menu.map(function (entry, index) {
            return tv.element('li', entry.title, index === focused ? 'focused' : '');
        }));
        tv.fill(tv.byId('panel'), menu[focused].panel());
    }

    function moveFocus(step) {
        focused = stepped(focused, step, menu.length);
    }

    function turn(step) {
        if (menu[focused].turn) {
            menu[focused].turn(step);
        }
    }

    // ---- The page

    function rememberKey(event) {
        lastKey = event.keyCode;
        update();
    }

    function close() {
        document.removeEventListener('keydown', rememberKey, false);
        keys.close(layer);
        tv.setVisible('device', false);
        onClose();
    }

    function thenUpdate(action, argument) {
        return function () {
            action(argument);
            update();
        };
    }

    var layer = { modal: true, keys: { back: close } };
    var keysWithPlugin = {
        up: thenUpdate(moveFocus, -1),
        down: thenUpdate(moveFocus, 1),
        left: thenUpdate(turn, -1),
        right: thenUpdate(turn, 1),
        ok: thenUpdate(function () { menu[focused].ok(); }),
        red: thenUpdate(hideOrShow),
        green: thenUpdate(openSecond),
        yellow: thenUpdate(switchHandlers),
        blue: thenUpdate(preview)
    };

    // Shows the page; `closed` is called when the viewer closes it.
    function show(closed) {
        onClose = closed;
        tv.setVisible('device', true);
        keys.open(layer);
        application = application || tv.ownerApplication(manager);
        tv.setVisible('device-missing', !application);
        tv.setVisible('device-content', !!application);
        if (!application) {
            return;
        }
        Object.keys(keysWithPlugin).forEach(function (name) { layer.keys[name] = keysWithPlugin[name]; });
        document.addEventListener('keydown', rememberKey, false);
        document.addEventListener('visibilitychange', afterPreview, false);
        tv.byId('agent').onDRMMessageResult = onDrmResult;
        update();
    }

    return { show: show };
}());

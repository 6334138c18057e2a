// The selection of audio and subtitle components, for broadcast and media.
var choice = (function () {
    'use strict';

    var audioType = 1;
    var subtitleType = 2;
    var sections = [{ type: audioType, id: 'choice-audio', off: null },
                    { type: subtitleType, id: 'choice-subtitles', off: 'Off' }];
    var presenter = null; // returns the object that presents, or null
    var entries = [];
    var focused = 0;

    function describe(component) {
        var text = tv.languageName(component.language);
        if (component.audioDescription) {
            text += ', audio description';
        }
        if (component.hearingImpaired) {
            text += ', hard of hearing';
        }
        if (component.audioChannels > 2) {
            text += ', surround';
        }
        return text;
    }

    // Identifies a component by its values, because the browser creates a new wrapper each time that it returns one.
    function identity(component) {
        return [component.encoding, component.language, component.audioDescription, component.hearingImpaired,
                component.audioChannels].join();
    }

    function toArray(list) {
        var components = [];
        for (var i = 0; list && i < list.length; i++) {
            components.push(list.item(i));
        }
        return components;
    }

    function readSection(section, object) {
        var active = toArray(object.getCurrentActiveComponents(section.type));
        var activeIdentities = active.map(identity);
        var sectionEntries = toArray(object.getComponents(section.type)).map(function (component) {
            return { section: section, text: describe(component),
                     isActive: activeIdentities.indexOf(identity(component)) >= 0,
                     choose: function () { object.selectComponent(component); } };
        });
        if (section.off && sectionEntries.length > 0) {
            sectionEntries.unshift({ section: section, text: section.off, isActive: active.length === 0,
                                     choose: function () {
                                         toArray(object.getCurrentActiveComponents(section.type)).forEach(
                                             function (component) { object.unselectComponent(component); });
                                     } });
        }
        return sectionEntries;
    }

    function show() {
        sections.forEach(function (section) {
            var lines = entries.map(function (entry, index) {
                var line = tv.element('li', '', index === focused ? 'focused' : '');
                line.appendChild(tv.element('b', entry.isActive ? '\u2713' : ''));
                line.appendChild(tv.element('span', entry.text));
                return entry.section === section ? line : null;
            }).filter(function (line) { return line !== null; });
            tv.fill(tv.byId(section.id), lines.length > 0 ? lines : [tv.element('li', 'None', 'none')]);
        });
    }

    // Reads all components again.
    function refresh() {
        var object = presenter();
        entries = [];
        if (object) {
            sections.forEach(function (section) { entries = entries.concat(readSection(section, object)); });
        }
        focused = Math.min(focused, Math.max(0, entries.length - 1));
        show();
    }

    function moveFocus(step) {
        if (entries.length > 0) {
            focused = (focused + step + entries.length) % entries.length;
            show();
        }
    }

    function close() {
        keys.close(layer);
        tv.setVisible('choice', false);
    }

    function open(presenterOf) {
        presenter = presenterOf;
        focused = 0;
        refresh();
        tv.setVisible('choice', true);
        keys.open(layer);
    }

    var layer = {
        keys: {
            up: function () { moveFocus(-1); },
            down: function () { moveFocus(1); },
            ok: function () {
                if (entries.length > 0) {
                    entries[focused].choose();
                    refresh();
                }
            },
            left: close,
            green: close,
            back: close
        }
    };

    return { open: open, close: close,
             // Called when the presenter presents something else.
             update: function () {
                 if (tv.isVisible('choice')) {
                     refresh();
                 }
             } };
}());

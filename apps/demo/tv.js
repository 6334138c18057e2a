// What the pages of the demonstration share: elements, texts and the application of a page.
var tv = (function () {
    'use strict';

    var languages = { deu: 'German', ger: 'German', eng: 'English', fra: 'French', fre: 'French', ita: 'Italian',
                      spa: 'Spanish', nld: 'Dutch', dut: 'Dutch', pol: 'Polish', tur: 'Turkish', por: 'Portuguese',
                      ces: 'Czech', dan: 'Danish', swe: 'Swedish', fin: 'Finnish', nor: 'Norwegian', mul: 'Several' };

    function byId(id) {
        return document.getElementById(id);
    }

    function element(name, text, className) {
        var made = document.createElement(name);
        made.appendChild(document.createTextNode(text));
        if (className) {
            made.className = className;
        }
        return made;
    }

    function fill(parent, children) {
        while (parent.firstChild) {
            parent.removeChild(parent.firstChild);
        }
        children.forEach(function (child) { parent.appendChild(child); });
    }

    // Shows a text in the element of that id.
    function say(id, text) {
        if (byId(id).textContent !== text) {
            byId(id).textContent = text;
        }
    }

    function setVisible(id, visible) {
        byId(id).style.display = visible ? 'block' : 'none';
    }

    function isVisible(id) {
        return byId(id).style.display === 'block';
    }

    // A table of two columns, one row for each pair of texts. With an empty second one the first has both columns.
    function table(rows) {
        var made = document.createElement('table');
        rows.forEach(function (row) {
            var line = document.createElement('tr');
            line.appendChild(element('td', row[0]));
            if (row[1] === '') {
                line.firstChild.colSpan = 2;
            } else {
                line.appendChild(element('td', row[1]));
            }
            made.appendChild(line);
        });
        return made;
    }

    // The lines of a list, of which at most `most` are shown; the one at `focused` is among them.
    function linesAround(lines, focused, most) {
        var first = Math.max(0, Math.min(focused - Math.floor(most / 2), lines.length - most));
        return lines.slice(first, first + most);
    }

    function twoDigits(number) {
        return (number < 10 ? '0' : '') + number;
    }

    function timeOfDay(date) {
        return twoDigits(date.getHours()) + ':' + twoDigits(date.getMinutes());
    }

    // A position in media, from milliseconds.
    function duration(milliseconds) {
        var seconds = Math.floor(milliseconds / 1000);
        return Math.floor(seconds / 60) + ':' + twoDigits(seconds % 60);
    }

    function languageName(code) {
        return languages[code] || code || 'Unknown language';
    }

    // The value of a property as a viewer reads it.
    function describe(value) {
        if (value === undefined) {
            return 'not there';
        }
        return value === null ? 'null' : typeof value;
    }

    // What a method that hands out applications gave. Browsers differ in what they call the type of such an object.
    function describeApplication(value) {
        return value ? 'an application' : describe(value);
    }

    // The application that the page is, or null when there is no plug-in.
    function ownerApplication(manager) {
        return manager.getOwnerApplication ? manager.getOwnerApplication(document) : null;
    }

    // Calls actions[keyCode]() at the press of a key that has one; the browser then does nothing of its own with it.
    function onKeys(actions) {
        document.addEventListener('keydown', function (event) {
            if (actions[event.keyCode]) {
                event.preventDefault();
                actions[event.keyCode]();
            }
        }, false);
    }

    // A new object of the plug-in, which fills the screen, or is out of sight without an `id`. Without one it gets no
    // events either. The browser would make it some time later; reading a property makes it do so now.
    function makeObject(type, id) {
        var made = document.createElement('object');
        made.type = type;
        if (id) {
            made.id = id;
            made.className = 'picture';
        }
        byId('pictures').appendChild(made);
        made.isThere = made.offsetWidth > 0 && made.playState !== undefined;
        return made;
    }

    function removeObject(object) {
        if (object.parentNode) {
            object.parentNode.removeChild(object);
        }
    }

    return { byId: byId, element: element, fill: fill, say: say, setVisible: setVisible, isVisible: isVisible,
             table: table, linesAround: linesAround, timeOfDay: timeOfDay, duration: duration,
             languageName: languageName, describe: describe, describeApplication: describeApplication,
             ownerApplication: ownerApplication, onKeys: onKeys, makeObject: makeObject, removeObject: removeObject };
}());

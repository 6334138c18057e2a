// Shared by all pages: DOM helpers, formatting, plug-in objects.
var tv = (function () {
    'use strict';

    var languages = { deu: 'German', ger: 'German', eng: 'English', fra: 'French', fre: 'French', ita: 'Italian',
                      spa: 'Spanish', nld: 'Dutch', dut: 'Dutch', pol: 'Polish', tur: 'Turkish', por: 'Portuguese',
                      ces: 'Czech', dan: 'Danish', swe: 'Swedish', fin: 'Finnish', nor: 'Norwegian', mul: 'Several' };

    function byId(id) {
        return document.getElementById(id);
    }

    function element(name, text, className) {
        var created = document.createElement(name);
        created.appendChild(document.createTextNode(text));
        if (className) {
            created.className = className;
        }
        return created;
    }

    function fill(parent, children) {
        while (parent.firstChild) {
            parent.removeChild(parent.firstChild);
        }
        children.forEach(function (child) { parent.appendChild(child); });
    }

    // Sets the text of the element with that id.
    function setText(id, text) {
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

    // A table with one row per pair of strings. If the second one is empty, the first spans both columns.
    function table(rows) {
        var created = document.createElement('table');
        rows.forEach(function (row) {
            var line = document.createElement('tr');
            var first = element('td', row[0]);
            line.appendChild(first);
            if (row[1] === '') {
                first.setAttribute('colspan', '2');
            } else {
                line.appendChild(element('td', row[1]));
            }
            created.appendChild(line);
        });
        return created;
    }

    // At most `count` of the lines, around the focused one.
    function linesAround(lines, focused, count) {
        var first = Math.max(0, Math.min(focused - Math.floor(count / 2), lines.length - count));
        return lines.slice(first, first + count);
    }

    function twoDigits(number) {
        return (number < 10 ? '0' : '') + number;
    }

    function timeOfDay(date) {
        return twoDigits(date.getHours()) + ':' + twoDigits(date.getMinutes());
    }

    // Formats a media position in milliseconds.
    function duration(milliseconds) {
        var seconds = Math.floor(milliseconds / 1000);
        return Math.floor(seconds / 60) + ':' + twoDigits(seconds % 60);
    }

    function languageName(code) {
        return languages[code] || code || 'Unknown language';
    }

    // Describes the type of a property's value.
    function describe(value) {
        if (value === undefined) {
            return 'not there';
        }
        return value === null ? 'null' : typeof value;
    }

    // Describes a returned application. Not by its type, because browsers differ in `typeof` for such an object.
    function describeApplication(value) {
        return value ? 'an application' : describe(value);
    }

    // The owner application of the page, or null if there is no plug-in.
    function ownerApplication(manager) {
        return manager.getOwnerApplication ? manager.getOwnerApplication(document) : null;
    }

    // Calls actions[keyCode]() on a key press and prevents the browser's default action.
    function onKeys(actions) {
        document.addEventListener('keydown', function (event) {
            if (actions[event.keyCode]) {
                event.preventDefault();
                actions[event.keyCode]();
            }
        }, false);
    }

    // Creates a plug-in object that fills the screen. Without an `id` it is invisible and gets no events. `hasPlugin` of
    // the element says whether a plug-in handles it; the read forces the layout, which creates the instance.
    /** @returns {any} the object that belongs to the type */
    function createObject(type, id) {
        var created = /** @type {any} */ (document.createElement('object'));
        created.type = type;
        if (id) {
            created.id = id;
            created.className = 'video';
        }
        byId('videos').appendChild(created);
        created.hasPlugin = created.offsetWidth > 0 && created.playState !== undefined;
        return created;
    }

    function removeObject(object) {
        if (object.parentNode) {
            object.parentNode.removeChild(object);
        }
    }

    return { byId: /** @type {Document['getElementById']} */ (byId), element: element, fill: fill, setText: setText,
             setVisible: setVisible, isVisible: isVisible, table: table, linesAround: linesAround, timeOfDay: timeOfDay,
             duration: duration, languageName: languageName, describe: describe,
             describeApplication: describeApplication, ownerApplication: ownerApplication, onKeys: onKeys,
             createObject: createObject, removeObject: removeObject };
}());

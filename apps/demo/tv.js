// What the pages of the demonstration share: elements, texts and the application of a page.
var tv = (function () {
    'use strict';

    function element(name, text) {
        var made = document.createElement(name);
        made.appendChild(document.createTextNode(text));
        return made;
    }

    function fill(parent, children) {
        while (parent.firstChild) {
            parent.removeChild(parent.firstChild);
        }
        children.forEach(function (child) { parent.appendChild(child); });
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

    return { element: element, fill: fill, describe: describe, describeApplication: describeApplication,
             ownerApplication: ownerApplication, onKeys: onKeys };
}());

// Makes a function for an engine that does not ask plug-ins for numeric names. The function takes a list of the plug-in
// and returns a script object whose elements are also there as list[index].
(function () {
    'use strict';

    // The methods of all kinds of lists. Their other names the object inherits from the list itself, but the engine takes
    // methods with a plug-in's object as `this` only.
    var methods = ['item', 'getChannel', 'getChannelByTriplet', 'getParentalRatingScheme'];
    var prototypes = {}; // by the length of lists: with an accessor for each index

    function addIndex(prototype, index) {
        Object.defineProperty(prototype, index, {
            get: function () {
                return this.item(index);
            },
            configurable: true
        });
    }

    function prototypeFor(length) {
        if (!prototypes[length]) {
            var prototype = Object.create(Object.prototype);
            for (var index = 0; index < length; index++) {
                addIndex(prototype, index);
            }
            prototypes[length] = prototype;
        }
        return prototypes[length];
    }

    function addMethod(view, list, name) {
        if (name in list) {
            Object.defineProperty(view, name, {
                value: function () {
                    return list[name].apply(list, arguments);
                }
            });
        }
    }

    return function (list) {
        var view = Object.create(list);
        Object.setPrototypeOf(list, prototypeFor(list.length));
        methods.forEach(function (name) { addMethod(view, list, name); });
        return Object.preventExtensions(view);
    };
})

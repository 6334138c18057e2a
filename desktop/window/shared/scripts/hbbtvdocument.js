// Makes documents of the content types of televisions those of XHTML, in an engine that takes them as any other XML: their
// elements have the namespace of XHTML. Called once per window object, before any script of the page, with the types.
(function () {
    var televisionTypes = Array.prototype.slice.call(arguments);
    var indexOf = Array.prototype.indexOf;
    var xhtmlType = 'application/xhtml+xml';
    var xhtml = 'http://www.w3.org/1999/xhtml';
    var prototype = Document.prototype;
    var apply = Reflect.apply;
    var contentType = Object.getOwnPropertyDescriptor(prototype, 'contentType');
    var createElement = prototype.createElement;
    var createElementNS = prototype.createElementNS;
    var toLowerCase = String.prototype.toLowerCase;

    function typeOf(document) {
        var type = apply(contentType.get, document, []);
        return apply(indexOf, televisionTypes, [apply(toLowerCase, type, [])]) >= 0 ? xhtmlType : type;
    }

    prototype.createElement = function (name) {
        // Throws for anything else than a document and for a bad name.
        var element = apply(createElement, this, arguments);
        return element.namespaceURI === null && typeOf(this) === xhtmlType ?
            apply(createElementNS, this, [xhtml, name]) : element;
    };
    Object.defineProperty(prototype, 'contentType', {
        get: function () {
            return typeOf(this);
        },
        enumerable: contentType.enumerable,
        configurable: contentType.configurable
    });
})

// The half of the bridge that lives in the page: finds the elements of the plug-in, gives them their objects, watches their
// place, and makes the requests of the plug-in. The other half is the host object (HostObject.cpp).
//
// The function runs once per window object, before any script of the page's own, with the host object, the plug-in's name,
// description and file name, the prefix of the ids for elements without one (empty: they get none), and three strings for
// each of its types: type, suffixes, description. What it uses of the
// engine it takes now, because the page may replace everything later; so it never asks an element by its own
// properties, and iterates with indexes only.
//
// How an element gets its object. A mutation observer finds the elements that the parser makes before a script can use them.
// Elements that script puts into the document get a guard first: a proxy before the element's class that makes the
// instance at the first access. From then on the element's own prototype is the plug-in's script object, with the guard
// behind it, so that the plug-in's names come first when they are read, without a proxy in between. Writes pass by
// prototypes that are not proxies, so the guard hands them to the plug-in. A guard belongs to one element, because the
// engine gives up its fast arrays in a page with a proxy that is a prototype of a prototype.
(function (host, pluginName, pluginDescription, pluginFile, idPrefix) {
    'use strict';

    const { apply, defineProperty, deleteProperty, get, getOwnPropertyDescriptor, getPrototypeOf, has,
        ownKeys, set, setPrototypeOf } = Reflect;
    const { create, assign } = Object;
    const typeFields = 3;
    const firstType = 5;

    // f as a function whose first argument is `this`.
    function uncurry(f) {
        return function (self, first, second, third) {
            return apply(f, self, [first, second, third]);
        };
    }
    function getter(prototype, name) {
        const read = getOwnPropertyDescriptor(prototype, name).get;
        return function (self) {
            return apply(read, self, []);
        };
    }
    function hostCall(name) {
        const call = host[name];
        return function () {
            return apply(call, host, arguments);
        };
    }

    const hostCreate = hostCall('create');
    const hostObject = hostCall('object');
    const hostWrite = hostCall('write');
    const hostPlace = hostCall('place');
    const hostOpen = hostCall('open');
    const hostDestroy = hostCall('destroy');
    const hostEnd = hostCall('end');
    const hostRun = hostCall('run');
    const hostResponse = hostCall('response');
    const hostData = hostCall('data');
    const hostDone = hostCall('done');

    const theWindow = window;
    const theDocument = document;

    // Another extension of the process may follow the instances: it leaves a function in the window object, which the page
    // never sees.
    const instanceObserver = theWindow.telixBridgeObserver;
    deleteProperty(theWindow, 'telixBridgeObserver');

    // Calls it with the element, 'creating', 'created' or 'destroyed', and the number of the instance in this window. The
    // first two come for each attempt, with the number 0 if there is no instance.
    function report(element, event, number) {
        if (instanceObserver) {
            apply(instanceObserver, undefined, [element, event, number]);
        }
    }

    // Another function of that kind, for what the page is not told. Calls it with what it is and with what it is about:
    //   'no-id'          an object without an id, its type
    //   'unknown-type'   an element of a type that the plug-in does not have, the type
    //   'refused-call'   a method that has refused its arguments without an exception, the call with their types
    //   'failed-script'  a script of the plug-in that has thrown, its source
    const reporter = theWindow.telixBridgeReporter;
    deleteProperty(theWindow, 'telixBridgeReporter');
    function warn(what, subject) {
        if (reporter) {
            apply(reporter, undefined, [what, subject]);
        }
    }

    const isConnected = getter(Node.prototype, 'isConnected');
    const ownerDocument = getter(Node.prototype, 'ownerDocument');
    const parentNode = getter(Node.prototype, 'parentNode');
    const nextSibling = getter(Node.prototype, 'nextSibling');
    const firstChild = getter(Node.prototype, 'firstChild');
    const nodeType = getter(Node.prototype, 'nodeType');
    const baseURI = getter(Node.prototype, 'baseURI');
    const localName = getter(Element.prototype, 'localName');
    const namespaceURI = getter(Element.prototype, 'namespaceURI');
    const attributes = getter(Element.prototype, 'attributes');
    const clientLeft = getter(Element.prototype, 'clientLeft');
    const clientTop = getter(Element.prototype, 'clientTop');
    const getAttribute = uncurry(Element.prototype.getAttribute);
    const setAttribute = uncurry(Element.prototype.setAttribute);
    const querySelectorAll = uncurry(Element.prototype.querySelectorAll);
    const querySelectorAllOfFragment = uncurry(DocumentFragment.prototype.querySelectorAll);
    const boundingRect = uncurry(Element.prototype.getBoundingClientRect);
    const clientRects = uncurry(Element.prototype.getClientRects);
    const rectsLength = getter(DOMRectList.prototype, 'length');
    const rectLeft = getter(DOMRectReadOnly.prototype, 'left');
    const rectTop = getter(DOMRectReadOnly.prototype, 'top');
    const rectRight = getter(DOMRectReadOnly.prototype, 'right');
    const rectBottom = getter(DOMRectReadOnly.prototype, 'bottom');
    const attributeCount = getter(NamedNodeMap.prototype, 'length');
    const attributeAt = uncurry(NamedNodeMap.prototype.item);
    const attributeName = getter(Attr.prototype, 'name');
    const attributeValue = getter(Attr.prototype, 'value');
    const nodeCount = getter(NodeList.prototype, 'length');
    const nodeAt = uncurry(NodeList.prototype.item);
    const readyState = getter(Document.prototype, 'readyState');
    const documentElement = getter(Document.prototype, 'documentElement');
    const frameElement = getter(theWindow, 'frameElement');
    const parentWindow = getter(theWindow, 'parent');
    const innerWidth = getter(theWindow, 'innerWidth');
    const innerHeight = getter(theWindow, 'innerHeight');
    const addEventListener = uncurry(EventTarget.prototype.addEventListener);
    const removeEventListener = uncurry(EventTarget.prototype.removeEventListener);
    const isPersisted = getter(PageTransitionEvent.prototype, 'persisted');
    const setTimer = setTimeout.bind(theWindow);
    const clearTimer = clearTimeout.bind(theWindow);
    const requestFrame = requestAnimationFrame.bind(theWindow);
    const openWindow = theWindow.open.bind(theWindow);
    const takeRecords = uncurry(MutationObserver.prototype.takeRecords);
    const observe = uncurry(MutationObserver.prototype.observe);
    const recordTarget = getter(MutationRecord.prototype, 'target');
    const recordType = getter(MutationRecord.prototype, 'type');
    const recordAdded = getter(MutationRecord.prototype, 'addedNodes');
    const toLowerCase = uncurry(String.prototype.toLowerCase);
    const trim = uncurry(String.prototype.trim);
    const indexOf = uncurry(String.prototype.indexOf);
    const slice = uncurry(String.prototype.slice);
    const charCodeAt = uncurry(String.prototype.charCodeAt);
    const fromCharCode = String.fromCharCode;
    const mapGet = uncurry(WeakMap.prototype.get);
    const mapSet = uncurry(WeakMap.prototype.set);
    const mapDelete = uncurry(WeakMap.prototype.delete);
    const { round, max, min } = Math;
    const objectPrototype = HTMLObjectElement.prototype;
    const embedPrototype = HTMLEmbedElement.prototype;
    const toStringTag = Symbol.toStringTag;

    const elementNode = 1;
    const fragmentNode = 11;
    const xhtml = 'http://www.w3.org/1999/xhtml';

    // The types of the plug-in by name, without a prototype that the page could fill.
    const types = create(null);
    const typeList = [];
    for (let i = firstType; i + typeFields <= arguments.length; i += typeFields) {
        const type = { type: toLowerCase(arguments[i]), suffixes: arguments[i + 1], description: arguments[i + 2] };
        types[type.type] = type;
        typeList[typeList.length] = type;
    }

    // --- Elements

    // Of each element that has an instance, or whose type the plug-in has refused to make (number 0), its record:
    // { element, number, object, base, place }. `object` is the plug-in's, `base` the prototype that the element had.
    const recordOf = new WeakMap();
    // The records with an instance, for as long as their elements are in the document.
    let records = [];
    // Elements of the plug-in's types that have got no instance yet.
    let pending = [];
    // The elements that have a guard; true if script, not the parser, puts them into the document.
    const guarded = new WeakMap();
    let lastId = 0; // of those given to elements
    let isAway = false; // the document is going, or kept by the engine for the way back

    function isEmbedding(node) {
        if (nodeType(node) !== elementNode || namespaceURI(node) !== xhtml) {
            return false;
        }
        const name = localName(node);
        return name === 'object' || name === 'embed';
    }

    // The type attribute without its parameters.
    function typeOf(element) {
        const type = getAttribute(element, 'type');
        if (type === null) {
            return '';
        }
        const end = indexOf(type, ';');
        return toLowerCase(trim(end < 0 ? type : slice(type, 0, end)));
    }

    function isHere(element) {
        return isConnected(element) && ownerDocument(element) === theDocument;
    }

    function isEligible(element) {
        return !isAway && isHere(element) && typeOf(element) in types;
    }

    // Whether the parser may still be adding to the element: nothing follows it in a document that is being parsed.
    function isOpen(element) {
        if (readyState(theDocument) !== 'loading' || mapGet(guarded, element)) {
            return false;
        }
        for (let node = element; node; node = parentNode(node)) {
            if (nextSibling(node)) {
                return false;
            }
        }
        return true;
    }

    // What NPP_New gets: the attributes in their order, then the param children. No more than a function can be called with.
    const mostParameters = 10000;
    function parametersOf(element) {
        const list = [];
        const all = attributes(element);
        for (let i = 0; i < attributeCount(all) && list.length < 2 * mostParameters; i++) {
            const attribute = attributeAt(all, i);
            list[list.length] = attributeName(attribute);
            list[list.length] = attributeValue(attribute);
        }
        for (let child = firstChild(element); child && list.length < 2 * mostParameters; child = nextSibling(child)) {
            if (nodeType(child) === elementNode && localName(child) === 'param' && getAttribute(child, 'name') !== null) {
                list[list.length] = getAttribute(child, 'name');
                list[list.length] = getAttribute(child, 'value') || '';
            }
        }
        return list;
    }

    // Makes the instance of an element that may have one and has none. True when it has been made now.
    function attach(element) {
        if (mapGet(recordOf, element) || !isEligible(element)) {
            return false;
        }
        const record = { __proto__: null, element, number: 0, object: null, base: null, place: '' };
        // Before all else, so that what the plug-in and the page do meanwhile does not come here again.
        mapSet(recordOf, element, record);
        if (!getAttribute(element, 'id')) {
            if (idPrefix === '') {
                warn('no-id', typeOf(element));
            } else {
                setAttribute(element, 'id', idPrefix + ++lastId);
            }
        }
        const values = [element, typeOf(element)];
        const parameters = parametersOf(element);
        for (let i = 0; i < parameters.length; i++) {
            values[values.length] = parameters[i];
        }
        applyStyle();
        report(element, 'creating', 0);
        record.number = apply(hostCreate, undefined, values);
        report(element, 'created', record.number);
        if (record.number === 0) {
            return false;
        }
        records[records.length] = record;
        record.object = hostObject(record.number);
        if (record.object) {
            connect(record);
        }
        place(record);
        watchPlaces();
        openOwnStream(record);
        return record.object !== null;
    }

    // Puts the plug-in's object before the element's guard.
    function connect(record) {
        const { element, object } = record;
        guard(element, false);
        record.base = getPrototypeOf(element);
        setPrototypeOf(object, record.base);
        defineProperty(object, toStringTag, { __proto__: null, value: get(element, toStringTag), configurable: true });
        // Names that the page has given to the element before would hide the plug-in's.
        const own = ownKeys(element);
        for (let i = 0; i < own.length; i++) {
            if (typeof own[i] === 'string' && getOwnPropertyDescriptor(object, own[i])) {
                deleteProperty(element, own[i]);
            }
        }
        setPrototypeOf(element, object);
    }

    function openOwnStream(record) {
        const name = localName(record.element) === 'object' ? 'data' : 'src';
        const url = getAttribute(record.element, name);
        if (url) {
            hostOpen(record.number, absolute(url));
        }
    }

    function detach(record) {
        const { element, object } = record;
        mapDelete(recordOf, element);
        // Nearly always the element itself: another document may have put an object of its own before this one.
        let holder = object && element;
        while (holder && getPrototypeOf(holder) !== object) {
            holder = getPrototypeOf(holder);
        }
        if (holder) {
            setPrototypeOf(holder, record.base);
        }
        hostDestroy(record.number);
        report(element, 'destroyed', record.number);
    }

    function detachIf(condition) {
        const kept = [];
        const leaving = [];
        for (let i = 0; i < records.length; i++) {
            const list = condition(records[i]) ? leaving : kept;
            list[list.length] = records[i];
        }
        records = kept;
        for (let i = 0; i < leaving.length; i++) {
            detach(leaving[i]);
        }
    }

    // An element that is moved is out of the document for a part of a task only.
    let isSweeping = false;
    function sweepLater() {
        if (!isSweeping) {
            isSweeping = true;
            setTimer(function () {
                isSweeping = false;
                detachIf(function (record) { return !isHere(record.element); });
            }, 0);
        }
    }

    function addPending(element) {
        const record = mapGet(recordOf, element);
        if (record && record.number === 0) { // refused where it was before
            mapDelete(recordOf, element);
        }
        if (!mapGet(recordOf, element)) {
            pending[pending.length] = element;
        }
    }

    // Calls the function with the elements in a tree that may be the plug-in's.
    function forEachEmbedding(root, action) {
        if (isEmbedding(root)) {
            action(root);
        }
        if (firstChild(root)) {
            const query = nodeType(root) === fragmentNode ? querySelectorAllOfFragment : querySelectorAll;
            const found = query(root, 'object, embed');
            for (let i = 0; i < nodeCount(found); i++) {
                if (isEmbedding(nodeAt(found, i))) {
                    action(nodeAt(found, i));
                }
            }
        }
    }

    // Makes the instances of the elements that are complete.
    function settle() {
        const elements = pending;
        pending = [];
        for (let i = 0; i < elements.length; i++) {
            if (isHere(elements[i]) && isOpen(elements[i])) {
                pending[pending.length] = elements[i];
                guard(elements[i], false);
            } else {
                warnOfType(elements[i]);
                attach(elements[i]);
            }
        }
    }

    function warnOfType(element) {
        const type = typeOf(element);
        if (type !== '' && !(type in types) && isHere(element)) {
            warn('unknown-type', type);
        }
    }

    // The element's type or URL has changed: another instance.
    function restart(element) {
        const record = mapGet(recordOf, element);
        if (record && record.number !== 0) {
            detachIf(function (each) { return each === record; });
        }
        addPending(element);
    }

    function onMutations(list) {
        for (let i = 0; i < list.length; i++) {
            const target = recordTarget(list[i]);
            if (recordType(list[i]) === 'childList') {
                const added = recordAdded(list[i]);
                for (let j = 0; j < nodeCount(added); j++) {
                    if (nodeType(nodeAt(added, j)) === elementNode) {
                        forEachEmbedding(nodeAt(added, j), addPending);
                    }
                }
            } else if (isEmbedding(target)) {
                restart(target);
            }
        }
        for (let i = 0; i < records.length; i++) {
            if (!isHere(records[i].element)) {
                sweepLater();
            }
        }
        listen(); // document.open() removes all listeners, and shows as a mutation
        settle();
    }

    const observer = new MutationObserver(onMutations);
    const observed = { __proto__: null, childList: true, subtree: true, attributes: true, attributeFilter: ['type', 'data', 'src'] };
    observe(observer, theDocument, observed);

    // --- The first access by script

    // Writes a name of the plug-in's. False when the element has no such name of it.
    function write(element, name, value) {
        const record = mapGet(recordOf, element);
        return record !== undefined && record.object !== null && hostWrite(record.object, name, value);
    }

    // `isOfScript`: script puts the element into the document.
    function guard(element, isOfScript) {
        const base = getPrototypeOf(element);
        // Only before a class as it is: the engine finds no cycle of prototypes behind a proxy.
        if (mapGet(guarded, element) !== undefined || (base !== objectPrototype && base !== embedPrototype)) {
            return;
        }
        const isAccess = function (name, receiver) {
            return receiver === element && typeof name === 'string';
        };
        const proxy = new Proxy(create(base), {
            __proto__: null,
            get: function (target, name, receiver) {
                return isAccess(name, receiver) && attach(element) ? get(element, name) : get(base, name, receiver);
            },
            set: function (target, name, value, receiver) {
                if (isAccess(name, receiver)) {
                    attach(element);
                    if (write(element, name, value)) {
                        return true;
                    }
                }
                return set(base, name, value, receiver);
            },
            has: function (target, name) {
                return attach(element) ? has(element, name) : has(base, name);
            }
        });
        if (setPrototypeOf(element, proxy)) {
            mapSet(guarded, element, isOfScript);
        }
    }

    // Replaces a function of the engine, or of an accessor, by what `wrap` makes of it. It looks the same to the page. The
    // result undoes that, unless the page has put something else there; null when the engine has no such function.
    function replace(prototype, name, wrap) {
        const property = getOwnPropertyDescriptor(prototype, name);
        if (!property) {
            return null;
        }
        const key = property.set ? 'set' : property.get ? 'get' : 'value';
        const wrapped = new Proxy(property[key], { __proto__: null, apply: wrap });
        defineProperty(prototype, name, assign({ __proto__: null }, property, { [key]: wrapped }));
        return function () {
            const current = getOwnPropertyDescriptor(prototype, name);
            if (current && current[key] === wrapped) {
                defineProperty(prototype, name, property);
            }
        };
    }

    function replaceAll(prototypes, names, wrap) {
        const undoing = [];
        for (let i = 0; i < prototypes.length; i++) {
            for (let j = 0; j < names.length; j++) {
                const undo = replace(prototypes[i], names[j], wrap);
                if (undo) {
                    undoing[undoing.length] = undo;
                }
            }
        }
        return undoing;
    }

    function guardOfScript(element) {
        guard(element, true);
    }

    // A call with nodes that are to go into a document.
    function callInserting(target, self, values) {
        for (let i = 0; i < values.length; i++) {
            try {
                forEachEmbedding(values[i], guardOfScript);
            } catch (error) {
                // no node
            }
        }
        return apply(target, self, values);
    }

    // A call after which there may be elements that a parser has made.
    function callParsing(target, self, values) {
        const result = apply(target, self, values);
        const list = takeRecords(observer);
        if (list.length > 0) {
            onMutations(list);
        }
        return result;
    }

    // A script in what is written runs before the observer.
    function callWriting(target, self, values) {
        watchLookups();
        return callParsing(target, self, values);
    }

    function callAttachingShadow(target, self, values) {
        const root = apply(target, self, values);
        try {
            observe(observer, root, observed);
        } catch (error) {
            // Array iterators, as in adoptStyleSheet(): instances here come with the first access, and go.
        }
        return root;
    }

    const containers = [Document.prototype, DocumentFragment.prototype, Element.prototype];
    const siblings = [Element.prototype, CharacterData.prototype];
    replaceAll([Node.prototype], ['appendChild', 'insertBefore', 'replaceChild'], callInserting);
    replaceAll(containers, ['append', 'prepend', 'replaceChildren'], callInserting);
    replaceAll(siblings, ['before', 'after', 'replaceWith'], callInserting);
    replace(Element.prototype, 'insertAdjacentElement', callInserting);
    replace(Range.prototype, 'insertNode', callInserting);
    replaceAll([Element.prototype, ShadowRoot.prototype], ['innerHTML', 'outerHTML', 'insertAdjacentHTML', 'setHTMLUnsafe'],
        callParsing);
    replaceAll([Document.prototype], ['write', 'writeln'], callWriting);
    replace(Element.prototype, 'attachShadow', callAttachingShadow);

    // While the observer may come later than a script that follows an element: the ways from the document to an element
    // look for it first. The XML parser runs scripts without the observer before.
    let lookups = null;
    function watchLookups() {
        if (!lookups && readyState(theDocument) === 'loading') {
            lookups = [
                replaceAll([Node.prototype], ['firstChild', 'lastChild', 'nextSibling', 'previousSibling', 'childNodes'],
                    callParsing),
                replaceAll(siblings, ['nextElementSibling', 'previousElementSibling'], callParsing),
                replaceAll(containers, ['querySelector', 'querySelectorAll', 'getElementById', 'getElementsByTagName',
                    'getElementsByTagNameNS', 'getElementsByClassName', 'getElementsByName', 'children', 'firstElementChild',
                    'lastElementChild', 'body', 'documentElement', 'embeds', 'evaluate'], callParsing)
            ];
        }
    }

    function endLookups() {
        if (lookups && readyState(theDocument) !== 'loading') {
            for (let i = 0; i < lookups.length; i++) {
                for (let j = 0; j < lookups[i].length; j++) {
                    lookups[i][j]();
                }
            }
            lookups = null;
        }
    }

    if (theDocument instanceof XMLDocument) {
        watchLookups();
    }

    // --- Place in the window

    // Fallback content is not shown, and an element without a size has the default one of plug-ins. Everything that the
    // page says of its elements comes before a layer.
    function styleText() {
        let selectors = '';
        for (let i = 0; i < typeList.length; i++) {
            selectors += (i > 0 ? ',' : '') + 'object[type="' + typeList[i].type + '" i],embed[type="' +
                typeList[i].type + '" i]';
        }
        const rule = function (filter, properties) {
            return ':where(' + selectors + ')' + filter + '{' + properties + '}';
        };
        return '@layer telix-webkit-bridge{' +
            rule('', 'display:inline-block;content-visibility:hidden') +
            rule(':where(:not([width]))', 'width:300px') +
            rule(':where(:not([height]))', 'height:150px') +
            '@supports not (content-visibility:hidden){' +
            rule('', 'overflow:hidden;color:transparent!important') +
            rule('>:where(*)', 'display:none!important') + '}}';
    }

    // Gives the document a style sheet of script's own. False when the engine has none.
    const styleSheets = getOwnPropertyDescriptor(Document.prototype, 'adoptedStyleSheets');
    const StyleSheet = theWindow.CSSStyleSheet;
    const replaceSync = StyleSheet.prototype.replaceSync;
    let styleSheet = null;
    function adoptStyleSheet() {
        if (!styleSheets || !replaceSync) {
            return false;
        }
        const sheets = apply(styleSheets.get, theDocument, []);
        const list = [];
        for (let i = 0; i < sheets.length; i++) {
            if (sheets[i] === styleSheet) {
                return true;
            }
            list[list.length] = sheets[i];
        }
        if (!styleSheet) {
            styleSheet = new StyleSheet();
            apply(replaceSync, styleSheet, [styleText()]);
        }
        list[list.length] = styleSheet;
        try {
            apply(styleSheets.set, theDocument, [list]);
        } catch (error) {
            // The engine reads the list with what the page has made of array iterators; elements go without the style.
        }
        return true;
    }

    const createElement = uncurry(Document.prototype.createElementNS);
    const appendChild = uncurry(Node.prototype.appendChild);
    const setTextContent = getOwnPropertyDescriptor(Node.prototype, 'textContent').set;
    let styleElement = null;
    function addStyleElement() {
        const parent = documentElement(theDocument);
        if (!parent || (styleElement && isHere(styleElement))) {
            return;
        }
        if (!styleElement) {
            styleElement = createElement(theDocument, xhtml, 'style');
            apply(setTextContent, styleElement, [styleText()]);
        }
        appendChild(parent, styleElement);
    }

    function applyStyle() {
        if (!adoptStyleSheet()) {
            addStyleElement();
        }
    }

    // Where the document lies in the window: of documents in frames as far as their origin lets this one see.
    function frameOffset() {
        const offset = { x: 0, y: 0 };
        try {
            let each = theWindow;
            let element = frameElement(each);
            while (element) {
                const rect = boundingRect(element);
                offset.x += rectLeft(rect) + clientLeft(element);
                offset.y += rectTop(rect) + clientTop(element);
                each = parentWindow(each);
                element = frameElement(each);
            }
        } catch (error) {
            // a frame of another origin
        }
        return offset;
    }

    function placeOf(element) {
        if (rectsLength(clientRects(element)) === 0) {
            return [0, 0, 0, 0, 0, 0, 0, 0];
        }
        const offset = frameOffset();
        const rect = boundingRect(element);
        const left = round(rectLeft(rect) + offset.x);
        const top = round(rectTop(rect) + offset.y);
        const right = round(rectRight(rect) + offset.x);
        const bottom = round(rectBottom(rect) + offset.y);
        const viewLeft = round(offset.x);
        const viewTop = round(offset.y);
        return [left, top, right - left, bottom - top, max(left, viewLeft), max(top, viewTop),
            min(right, viewLeft + innerWidth(theWindow)), min(bottom, viewTop + innerHeight(theWindow))];
    }

    // Tells the plug-in where its element is, and returns true, if that is not where it was. An element that has never
    // been laid out is nowhere.
    function place(record) {
        const values = placeOf(record.element);
        let text = '';
        let isEmpty = true;
        for (let i = 0; i < values.length; i++) {
            text += values[i] + ' ';
            isEmpty = isEmpty && values[i] === 0;
        }
        if (text === record.place || (isEmpty && record.place === '')) {
            return false;
        }
        record.place = text;
        hostPlace(record.number, values[0], values[1], values[2], values[3], values[4], values[5], values[6], values[7]);
        return true;
    }

    // Nothing tells of a change of position. While there are instances their places are read once for each picture of
    // the page, which is when they can change. But a page that asks for pictures keeps three processes busy: when nothing
    // has moved for a while, a timer reads the places until something moves.
    const picturesUntilRest = 30;
    const restInterval = 100; // milliseconds
    let isWatchingPlaces = false;
    let picturesAtRest = 0;
    let restTimer = 0;

    function readPlaces() {
        isWatchingPlaces = false;
        restTimer = 0;
        applyStyle();
        const current = records;
        picturesAtRest++;
        for (let i = 0; i < current.length; i++) {
            if (!isHere(current[i].element)) {
                sweepLater();
            } else if (place(current[i])) {
                picturesAtRest = 0;
            }
        }
        watchPlaces();
    }

    function watchPlaces() {
        if (isWatchingPlaces || records.length === 0) {
            return;
        }
        isWatchingPlaces = true;
        if (picturesAtRest < picturesUntilRest) {
            requestFrame(readPlaces);
        } else {
            restTimer = setTimer(readPlaces, restInterval);
        }
    }

    // What moves elements most often need not wait for the timer: places are read in the next two pictures.
    function onStyleMutations() {
        picturesAtRest = min(picturesAtRest, picturesUntilRest - 2);
        if (restTimer) {
            clearTimer(restTimer);
            restTimer = 0;
            requestFrame(readPlaces);
        }
    }

    observe(new MutationObserver(onStyleMutations), theDocument,
        { __proto__: null, childList: true, subtree: true, attributes: true, attributeFilter: ['style', 'class'] });

    // --- The document's end

    function leave() {
        isAway = true;
        detachIf(function () { return true; });
    }

    // The page's own listeners of this event find the plug-in: this one is the last, because it is added when the end has
    // begun.
    function onUnload() {
        leave();
        hostEnd();
    }

    function listenToUnload() {
        removeEventListener(theWindow, 'unload', onUnload);
        addEventListener(theWindow, 'unload', onUnload);
    }

    function onPageHide(event) {
        if (isPersisted(event)) {
            leave();
        } else {
            listenToUnload();
        }
    }

    function onPageShow(event) {
        if (isPersisted(event)) {
            isAway = false;
            forEachEmbedding(documentElement(theDocument), addPending);
            settle();
        }
    }

    function onReadyStateChange() {
        settle();
        endLookups();
    }

    function listen() {
        addEventListener(theWindow, 'pagehide', onPageHide, true);
        addEventListener(theWindow, 'pageshow', onPageShow, true);
        // WPE WebKit 2.38 hides a frame that is removed without pagehide if file URLs may read everything.
        addEventListener(theDocument, 'visibilitychange', listenToUnload, true);
        addEventListener(theDocument, 'readystatechange', onReadyStateChange, true);
    }
    listen();

    // --- navigator.plugins and navigator.mimeTypes

    const { MimeType: MimeTypeClass, MimeTypeArray: MimeTypeArrayClass, Plugin: PluginClass,
        PluginArray: PluginArrayClass } = theWindow;

    function define(object, name, value, enumerable) {
        defineProperty(object, name, { __proto__: null, value, enumerable, configurable: true });
    }

    // An array-like object of that class with the items by index and, hidden, by name.
    function listOf(itsClass, items, nameOf) {
        const list = create(itsClass.prototype);
        for (let i = 0; i < items.length; i++) {
            define(list, i, items[i], true);
            define(list, nameOf(items[i]), items[i], false);
        }
        define(list, 'length', items.length, false);
        define(list, 'item', function (index) { return items[index >>> 0] || null; }, false);
        define(list, 'namedItem', function (name) {
            for (let i = 0; i < items.length; i++) {
                if (nameOf(items[i]) === '' + name) {
                    return items[i];
                }
            }
            return null;
        }, false);
        define(list, 'refresh', function () {}, false);
        return list;
    }

    function describePlugin() {
        const mimeTypes = [];
        for (let i = 0; i < typeList.length; i++) {
            const mimeType = create(MimeTypeClass.prototype);
            define(mimeType, 'type', typeList[i].type, true);
            define(mimeType, 'suffixes', typeList[i].suffixes, true);
            define(mimeType, 'description', typeList[i].description, true);
            define(mimeTypes, i, mimeType, true);
        }
        const typeName = function (mimeType) { return mimeType.type; };
        const plugin = listOf(PluginClass, mimeTypes, typeName);
        define(plugin, 'name', pluginName, true);
        define(plugin, 'description', pluginDescription, true);
        define(plugin, 'filename', pluginFile, true);
        for (let i = 0; i < mimeTypes.length; i++) {
            define(mimeTypes[i], 'enabledPlugin', plugin, true);
        }
        return {
            __proto__: null,
            plugins: listOf(PluginArrayClass, [plugin], function () { return pluginName; }),
            mimeTypes: listOf(MimeTypeArrayClass, mimeTypes, typeName)
        };
    }

    // Few pages ask.
    let description = null;
    function describeBy(name) {
        defineProperty(Navigator.prototype, name, {
            __proto__: null,
            get: function () {
                description = description || describePlugin();
                return description[name];
            },
            enumerable: true,
            configurable: true
        });
    }
    describeBy('plugins');
    describeBy('mimeTypes');

    // --- Requests of the plug-in

    const reasonDone = 0;
    const reasonNetworkError = 1;
    const firstErrorStatus = 400;
    const conversionStep = 8192; // bytes that become characters at a time

    const fetchUrl = theWindow.fetch.bind(theWindow);
    const then = uncurry(Promise.prototype.then);
    const Url = URL;
    const urlHref = getter(URL.prototype, 'href');
    const urlOrigin = getter(URL.prototype, 'origin');
    const urlProtocol = getter(URL.prototype, 'protocol');
    const Controller = AbortController;
    const abort = uncurry(AbortController.prototype.abort);
    const abortSignal = getter(AbortController.prototype, 'signal');
    const responseUrl = getter(Response.prototype, 'url');
    const responseType = getter(Response.prototype, 'type');
    const responseStatus = getter(Response.prototype, 'status');
    const responseStatusText = getter(Response.prototype, 'statusText');
    const responseHeaders = getter(Response.prototype, 'headers');
    const responseBody = getter(Response.prototype, 'body');
    const headerOf = uncurry(Headers.prototype.get);
    const forEachHeader = uncurry(Headers.prototype.forEach);
    const getReader = uncurry(ReadableStream.prototype.getReader);
    // WPE WebKit 2.38 shows the class by its objects only.
    const Reader = theWindow.ReadableStreamDefaultReader || getReader(new ReadableStream()).constructor;
    const readPiece = uncurry(Reader.prototype.read);
    const Bytes = Uint8Array;
    const byteLength = getter(getPrototypeOf(Uint8Array.prototype), 'length');
    const subarray = uncurry(Uint8Array.prototype.subarray);
    const parseDate = Date.parse;
    const toNumber = Number;
    const pageOrigin = theWindow.origin;
    const decode = decodeURIComponent;
    const encode = encodeURIComponent;
    const bytesAsText = unescape; // a character for each byte of an encoded text
    const Request = XMLHttpRequest;
    const openRequest = XMLHttpRequest.prototype.open;
    const sendRequest = XMLHttpRequest.prototype.send;
    const requestResult = getter(XMLHttpRequest.prototype, 'response');
    const setRequestType = getOwnPropertyDescriptor(XMLHttpRequest.prototype, 'responseType').set;

    // The requests that have not ended by number: { url, controller, reader, text }. What has arrived comes from the
    // reader or is the text, a character for each byte.
    const requests = create(null);

    function absolute(url) {
        try {
            return urlHref(new Url(url, baseURI(theDocument)));
        } catch (error) {
            return url;
        }
    }

    function textOf(bytes) {
        let text = '';
        for (let i = 0; i < byteLength(bytes); i += conversionStep) {
            text += apply(fromCharCode, undefined, subarray(bytes, i, i + conversionStep));
        }
        return text;
    }

    function bytesOf(text) {
        const bytes = new Bytes(text.length);
        for (let i = 0; i < text.length; i++) {
            bytes[i] = charCodeAt(text, i);
        }
        return bytes;
    }

    function finish(number, reason) {
        delete requests[number];
        hostDone(number, reason);
    }

    // The next piece of a response; the host asks for it when the plug-in has taken the one before.
    function next(number) {
        const request = requests[number];
        if (!request) {
            return;
        }
        if (request.text) {
            const text = request.text;
            request.text = '';
            hostData(number, text);
            return;
        }
        if (!request.reader) {
            finish(number, reasonDone);
            return;
        }
        then(readPiece(request.reader), function (piece) {
            if (piece.done) {
                finish(number, reasonDone);
            } else {
                hostData(number, textOf(piece.value));
            }
        }, function () { finish(number, reasonNetworkError); });
    }

    function cancel(number) {
        const request = requests[number];
        delete requests[number];
        if (request && request.controller) {
            abort(request.controller);
        }
    }

    function onResponse(number, response) {
        const request = requests[number];
        if (!request) {
            return;
        }
        if (responseType(response) === 'opaque') {
            // Another origin that does not let pages read: all that is known is that something is there.
            abort(request.controller);
            hostResponse(number, request.url, '', '', 0, 0);
            return;
        }
        if (responseStatus(response) >= firstErrorStatus) {
            abort(request.controller);
            finish(number, reasonNetworkError);
            return;
        }
        const fields = responseHeaders(response);
        let lines = 'HTTP/1.1 ' + responseStatus(response) + ' ' + responseStatusText(response) + '\n';
        forEachHeader(fields, function (value, name) { lines += name + ': ' + value + '\n'; });
        const type = headerOf(fields, 'content-type') || '';
        const typeEnd = indexOf(type, ';');
        const modified = parseDate(headerOf(fields, 'last-modified') || '');
        const body = responseBody(response);
        request.reader = body ? getReader(body) : null;
        // The length of what arrives is not that of a body which the engine decompresses.
        const length = headerOf(fields, 'content-encoding') ? 0 : toNumber(headerOf(fields, 'content-length')) || 0;
        hostResponse(number, responseUrl(response) || request.url, trim(typeEnd < 0 ? type : slice(type, 0, typeEnd)),
            lines, length, modified > 0 ? modified / 1000 : 0);
    }

    // A response that other origins keep from pages is asked for with ever less: first with the session's cookies, then
    // without, then only whether it is there. The page's own origin may redirect to another one.
    function modesFor(url, method) {
        const modes = urlOrigin(url) === pageOrigin ? [{ __proto__: null, credentials: 'same-origin' }] :
            [{ __proto__: null, credentials: 'include' }, { __proto__: null, credentials: 'omit' }];
        if (method === 'GET') {
            modes[modes.length] = { __proto__: null, mode: 'no-cors', credentials: 'include' };
        }
        return modes;
    }

    function fetchWith(number, modes, index, options) {
        const request = requests[number];
        if (!request) {
            return;
        }
        if (index === modes.length) {
            finish(number, reasonNetworkError);
            return;
        }
        request.controller = new Controller();
        const all = assign({ __proto__: null, signal: abortSignal(request.controller) }, options, modes[index]);
        then(fetchUrl(request.url, all), function (response) {
            onResponse(number, response);
        }, function () {
            fetchWith(number, modes, index + 1, options);
        });
    }

    // Files: the engine's fetch() does not read them.
    function loadFile(number, url) {
        const request = new Request();
        addEventListener(request, 'load', function () {
            if (requests[number]) {
                const bytes = new Bytes(requestResult(request));
                requests[number].text = textOf(bytes);
                hostResponse(number, url, '', '', byteLength(bytes), 0);
            }
        });
        addEventListener(request, 'error', function () { finish(number, reasonNetworkError); });
        apply(openRequest, request, ['GET', url]);
        apply(setRequestType, request, ['arraybuffer']);
        apply(sendRequest, request, []);
    }

    // javascript: URLs: the value is the response, if it is a string.
    function runScript(number, source) {
        let program = '';
        try {
            program = decode(source);
        } catch (error) {
            // a malformed escape sequence
        }
        const value = hostRun(program);
        const text = typeof value === 'string' ? bytesAsText(encode(value)) : null;
        if (text !== null && requests[number]) {
            requests[number].text = text;
            hostResponse(number, requests[number].url, 'text/plain', '', text.length, 0);
        } else {
            finish(number, reasonDone);
        }
    }

    function navigate(number, url, target, method) {
        if (method !== 'GET') {
            finish(number, reasonNetworkError);
            return;
        }
        openWindow(url, target);
        finish(number, reasonDone);
    }

    function headersFrom(lines) {
        const fields = create(null);
        let rest = lines;
        while (rest) {
            const end = indexOf(rest, '\n');
            const line = end < 0 ? rest : slice(rest, 0, end);
            const colon = indexOf(line, ':');
            if (colon > 0) {
                fields[trim(slice(line, 0, colon))] = trim(slice(line, colon + 1));
            }
            rest = end < 0 ? '' : slice(rest, end + 1);
        }
        return fields;
    }

    function start(number, target, method, headers, body) {
        const request = requests[number];
        if (!request) {
            return;
        }
        if (target) {
            navigate(number, request.url, target, method);
            return;
        }
        let url = null;
        try {
            url = new Url(request.url);
        } catch (error) {
            finish(number, reasonNetworkError);
            return;
        }
        const protocol = urlProtocol(url);
        if (protocol === 'javascript:') {
            runScript(number, slice(request.url, protocol.length));
        } else if (protocol === 'file:') {
            loadFile(number, request.url);
        } else {
            const options = { __proto__: null, method: method };
            if (method === 'POST') {
                options.headers = headersFrom(headers);
                options.body = bytesOf(body);
            }
            fetchWith(number, modesFor(url, method), 0, options);
        }
    }

    host.attach({
        request: function (number, url, target, method, headers, body) {
            requests[number] = { __proto__: null, url: absolute(url), controller: null, reader: null, text: '' };
            // Not within the plug-in's call.
            setTimer(start, 0, number, target, method, headers, body);
        },
        next: next,
        cancel: cancel,
        warn: warn
    });
})

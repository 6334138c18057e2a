// Random steps of a page, whatever a page can do with the elements of a plug-in. The same seed gives the same steps. Exceptions
// are no failure: that the process lives to the last step is what is tested. window.stepsResult is then
// { steps: number, thrown: number }.
//
// The page's URL has ?seed=NUMBER&steps=NUMBER. The page fills the tables, adds its own functions to `actions`, and calls
// runSteps(). Written for the oldest engine.
'use strict';

var query = {};
location.search.substring(1).split('&').forEach(function (part) {
    query[part.split('=')[0]] = decodeURIComponent(part.split('=')[1]);
});
var random = Number(query.seed) >>> 0;
var types = []; // values of the attribute type
var texts = []; // names of properties, and texts for arguments
var methods = [];
var styles = [];
var markup = []; // HTML with elements of the plug-in
var frameScripts = []; // for a frame whose first element is in markup[0]
var pool = []; // whatever has come up, to be used again
var deepest = 8; // steps within steps
var depth = 0;
var done = 0;
var thrown = 0;

function below(limit) {
    random = (Math.imul(random, 1664525) + 1013904223) >>> 0;
    return Math.floor(random / 4294967296 * limit);
}
function one(list) {
    return list[below(list.length)];
}
function keep(value) {
    pool[pool.length < 60 ? pool.length : below(pool.length)] = value;
    return value;
}
function place() {
    var places = document.querySelectorAll('body, div');
    return one(places) || document.documentElement;
}
function element() {
    var elements = document.querySelectorAll('object, embed');
    return elements.length > 0 && below(4) > 0 ? one(elements) : one(pool);
}
function callback() {
    step();
    return value();
}
var objects = [{}, [1, 2], new Error('e'), document, window, Object.prototype];
if (typeof Symbol === 'function') {
    objects.push(Symbol('s'));
}
if (typeof BigInt === 'function') {
    objects.push(BigInt(7));
}
function value() {
    switch (below(12)) {
    case 0: return undefined;
    case 1: return null;
    case 2: return below(2) === 0;
    case 3: return below(20) - 10;
    case 4: return one([NaN, Infinity, -0, 1e300, 4294967295, 0.5]);
    case 5: return one(texts);
    case 6: return callback;
    case 7: return one(objects);
    case 8: return { toString: callback, valueOf: callback, get mine() { return callback(); } };
    case 9: return element();
    default: return one(pool);
    }
}
function values(most) {
    var list = [];
    for (var i = below(most + 1); i > 0; i--) {
        list.push(value());
    }
    return list;
}
function frameWindow() {
    return one(document.querySelectorAll('iframe')).contentWindow; // throws when there is none
}

var actions = [
    function makeByScript() {
        var made = document.createElement(one(['object', 'embed']));
        if (below(4) > 0) {
            made.setAttribute('type', one(types));
        }
        if (below(4) === 0) {
            made.setAttribute(one(['data', 'src', 'width', 'height', 'id', 'style']), one(texts));
        }
        if (below(3) > 0) {
            place().appendChild(made);
        }
        keep(made);
    },
    function makeByParser() { place().insertAdjacentHTML(one(['beforeend', 'afterbegin']), one(markup)); },
    function remove() {
        var target = element();
        target.parentNode.removeChild(target);
    },
    function move() { place().appendChild(element()); },
    function changeAttribute() { element().setAttribute(one(['type', 'data', 'src', 'width', 'style']), one(texts.concat(types))); },
    function changeStyle() { element().style.cssText = one(styles); },
    function scroll() { window.scrollTo(below(100), below(5000)); },
    function clear() {
        if (below(5) === 0) {
            document.body.innerHTML = '';
        }
    },
    function read() { keep(element()[one(texts)]); },
    function readBehind() { keep(one(pool)[one(texts.concat(methods))]); },
    function write() { element()[one(texts)] = value(); },
    function writeBehind() { one(pool)[one(texts)] = value(); },
    function call() { keep(element()[one(methods)](value(), value(), value())); },
    function callAgain() { keep(element()[one(methods)](callback, value(), value())); },
    function callBehind() { keep(one(pool)[one(methods)](value(), value())); },
    function borrow() { keep(element()[one(methods)].call(value(), value())); },
    function callFunction() { keep(one(pool)(value(), value())); },
    function constructFunction() { keep(new (one(pool))(value())); },
    function ask() { keep(one(texts) in element()); },
    function enumerate() {
        for (var name in one(pool)) {
            keep(name);
        }
    },
    function describe() { keep(Object.getOwnPropertyDescriptor(one(pool), one(texts))); },
    function define() {
        Object.defineProperty(one(pool), one(texts), below(2) ? { value: value(), configurable: true }
                                                              : { get: callback, configurable: true });
    },
    function erase() { delete one(pool)[one(texts)]; },
    function freeze() {
        one([Object.freeze, Object.preventExtensions, Object.keys, Object.getOwnPropertyNames, JSON.stringify, String])(
            typeof one(pool) === 'object' && one(pool) !== window ? Object.create(one(pool)) : {});
    },
    function inherit() { keep(Object.create(one(pool))); },
    function frame() {
        var made = document.createElement('iframe');
        made.srcdoc = markup[0] + '<script>' + one(frameScripts) + '</' + 'script>';
        place().appendChild(made);
    },
    function frameObject() { keep(frameWindow().document.querySelector('object')); },
    function endFrame() {
        var frame = document.querySelector('iframe');
        frame.parentNode.removeChild(frame);
    },
    function reloadFrame() { frameWindow().location.reload(); },
    function rewriteFrame() {
        var inner = frameWindow().document;
        inner.open();
        inner.write(one(['text', markup[0], '</object>']));
        inner.close();
    },
    function moveIntoFrame() { frameWindow().document.body.appendChild(element()); },
    function moveOutOfFrame() { place().appendChild(document.adoptNode(frameWindow().document.querySelector('object'))); },
    function goElsewhere() { frameWindow().location.href = one(['about:blank', 'first.html', 'javascript:parent.step()']); },
    function cloneAndReplace() {
        var target = element();
        target.parentNode.replaceChild(target.cloneNode(true), target);
    },
    function makeGarbage() { keep(new Array(10000).join('x').split('')); },
    function forget() { pool.length = below(pool.length + 1); }
];

function step() {
    if (++depth < deepest) {
        try {
            one(actions)();
        } catch (error) {
            thrown++;
        }
    }
    depth--;
}

// So that the page stays one that a turn of the main loop can deal with.
function limit() {
    var all = document.querySelectorAll('object, embed, iframe');
    for (var i = 0; i < all.length - 30; i++) {
        all[i].parentNode.removeChild(all[i]);
    }
    if (!document.body) {
        document.documentElement.appendChild(document.createElement('body'));
    }
}

function runSteps() {
    for (var i = 0; i < 50 && done < Number(query.steps); i++, done++) {
        depth = 0;
        step();
    }
    limit();
    if (done < Number(query.steps)) {
        setTimeout(runSteps, 0);
    } else {
        window.stepsResult = { steps: done, thrown: thrown };
    }
}
window.onerror = function () { return true; };

// The part of the GObject script engine that is script: proxies for the plug-in's objects, which the GObject API cannot
// make, and the plug-in's operations on script objects with their exceptions caught where they can be reported.
//
// The file is run in the registry, a context without a page, and in each page. What it uses of the engine it takes then,
// because the page may replace everything later.
({
    // What all pages of a process share: the numbers of the proxies. A number is that of the engine's ScriptWrapper;
    // `collected` is called with it when its proxy is garbage.
    makeRegistry: function (collected) {
        'use strict';

        const { apply } = Reflect;
        const { exec } = RegExp.prototype;
        const { charCodeAt } = String.prototype;
        const { fromCharCode } = String;
        const mapGet = WeakMap.prototype.get;
        const mapSet = WeakMap.prototype.set;
        const numbers = new WeakMap();
        const garbage = new FinalizationRegistry(collected);
        const { register } = FinalizationRegistry.prototype;
        const loneSurrogate = /[\uD800-\uDFFF]/u; // by characters, of which a pair is one
        const replacement = '\uFFFD';

        function isHigh(unit) {
            return unit >= 0xD800 && unit < 0xDC00;
        }
        function isLow(unit) {
            return unit >= 0xDC00 && unit < 0xE000;
        }

        return {
            // The number of a proxy, undefined for everything else.
            numberOf: function (value) {
                return apply(mapGet, numbers, [value]);
            },
            setNumber: function (proxy, number) {
                apply(mapSet, numbers, [proxy, number]);
                apply(register, garbage, [proxy, number]);
            },
            // The text with lone surrogates replaced: the API cuts texts off there.
            wellFormed: function (text) {
                if (apply(exec, loneSurrogate, [text]) === null) {
                    return text;
                }
                let repaired = '';
                for (let i = 0; i < text.length; i++) {
                    const unit = apply(charCodeAt, text, [i]);
                    if (isHigh(unit) && i + 1 < text.length && isLow(apply(charCodeAt, text, [i + 1]))) {
                        repaired += fromCharCode(unit, apply(charCodeAt, text, [++i]));
                    } else {
                        repaired += isHigh(unit) || isLow(unit) ? replacement : text[i];
                    }
                }
                return repaired;
            }
        };
    },

    // The functions of a page for its engine. `registry` is what makeRegistry() has returned; `plugin` holds the engine's
    // natives, each of which takes the number of a proxy first; `evaluateWith` is the function below.
    makePage: function (registry, plugin, evaluateWith) {
        'use strict';

        const { apply, construct, defineProperty, deleteProperty, get, getOwnPropertyDescriptor, getPrototypeOf, has,
            ownKeys, set, setPrototypeOf } = Reflect;
        const { create } = Object;
        const { bind } = Function.prototype;
        const { toStringTag } = Symbol;
        const { numberOf, setNumber, wellFormed } = registry;
        const { missing, read, write, hasName, remove, names, call, callDefault, callConstructor } = plugin;
        const reportError = typeof globalThis.reportError === 'function' ? globalThis.reportError : function () {};
        const theConsole = typeof console === 'object' ? console : null;
        const logError = theConsole ? theConsole.error : function () {};
        const failed = { __proto__: null };
        const longestPrototypeChain = 32;

        // A list that begins with those values.
        function listOf(first, second, rest) {
            const list = second === undefined ? [first] : [first, second];
            for (let i = 0; i < rest.length; i++) {
                list[list.length] = rest[i];
            }
            return list;
        }

        // A property's description without what the page may have added to Object.prototype: `get` would be taken from there.
        function bare(description) {
            if (description !== undefined) {
                setPrototypeOf(description, null);
            }
            return description;
        }
        function ownDescriptor(object, name) {
            return bare(getOwnPropertyDescriptor(object, name));
        }

        // Only what is not the plug-in's reaches the target, which holds the names of the page.
        const traps = {
            __proto__: null,
            get: function (target, name, receiver) {
                if (typeof name === 'string') {
                    const value = read(this.number, wellFormed(name));
                    if (value !== missing) {
                        return value;
                    }
                }
                const own = get(target, name, receiver);
                return name === toStringTag && own === undefined ? 'NPObject' : own;
            },
            set: function (target, name, value, receiver) {
                return typeof name === 'string' && write(this.number, wellFormed(name), value) ||
                    set(target, name, value, receiver);
            },
            has: function (target, name) {
                return typeof name === 'string' && hasName(this.number, wellFormed(name)) || has(target, name);
            },
            deleteProperty: function (target, name) {
                return typeof name === 'string' && remove(this.number, wellFormed(name)) ||
                    deleteProperty(target, name);
            },
            getOwnPropertyDescriptor: function (target, name) {
                if (typeof name === 'string') {
                    const value = read(this.number, wellFormed(name));
                    if (value !== missing) {
                        return { __proto__: null, value, writable: true, enumerable: true, configurable: true };
                    }
                }
                return ownDescriptor(target, name);
            },
            defineProperty: function (target, name, property) {
                const value = typeof name === 'string' ? ownDescriptor(property, 'value') : undefined;
                return value !== undefined && write(this.number, wellFormed(name), value.value) ||
                    defineProperty(target, name, bare(property));
            },
            ownKeys: function (target) {
                const known = create(null);
                const list = names(this.number);
                for (let i = 0; i < list.length; i++) {
                    known[list[i]] = true;
                }
                const own = ownKeys(target);
                for (let i = 0; i < own.length; i++) {
                    if (!(own[i] in known)) {
                        list[list.length] = own[i];
                    }
                }
                return list;
            },
            // The plug-in may gain names at any time.
            preventExtensions: function () {
                return false;
            },
            apply: function (target, self, values) {
                return apply(callDefault, undefined, listOf(this.number, undefined, values));
            },
            construct: function (target, values) {
                return apply(callConstructor, undefined, listOf(this.number, undefined, values));
            }
        };

        // The number of the proxy that is, or stands behind, an object; 0 when there is none.
        function numberBehind(object) {
            for (let i = 0; i < longestPrototypeChain; i++) {
                if (object === null || (typeof object !== 'object' && typeof object !== 'function')) {
                    return 0;
                }
                const number = numberOf(object);
                if (number !== undefined) {
                    return number;
                }
                object = getPrototypeOf(object);
            }
            return 0;
        }

        // A function that may be called and constructed, without names of its own.
        function makeFunction() {
            const made = apply(bind, function () {}, [undefined]);
            delete made.name;
            delete made.length;
            return made;
        }

        return {
            failed,

            makeObject: function (number, isFunction) {
                const handler = { __proto__: traps, number };
                const proxy = new Proxy(isFunction ? makeFunction() : {}, handler);
                setNumber(proxy, number);
                return proxy;
            },
            // The function of a method: one for all objects, so that script may borrow it from one for another.
            makeMethod: function (name) {
                return {
                    [name](...values) {
                        return apply(call, undefined, listOf(numberBehind(this), name, values));
                    }
                }[name];
            },

            // The plug-in's operations on script objects; `failed` when they fail.
            invoke: function (object, name, ...values) {
                try {
                    const method = object[name];
                    return typeof method === 'function' ? apply(method, object, values) : failed;
                } catch (error) {
                    reportError(error);
                    return failed;
                }
            },
            invokeDefault: function (method, ...values) {
                try {
                    return typeof method === 'function' ? apply(method, undefined, values) : failed;
                } catch (error) {
                    reportError(error);
                    return failed;
                }
            },
            construct: function (constructor, ...values) {
                try {
                    return construct(constructor, values);
                } catch (error) {
                    reportError(error);
                    return failed;
                }
            },
            get: function (object, name) {
                try {
                    return object[name];
                } catch (error) {
                    reportError(error);
                    return failed;
                }
            },
            // Without an exception when the property is read-only.
            set: function (object, name, value) {
                try {
                    set(object, name, value);
                    return true;
                } catch (error) {
                    reportError(error);
                    return false;
                }
            },
            has: function (object, name) {
                return has(object, name);
            },
            hasMethod: function (object, name) {
                return typeof object[name] === 'function';
            },
            remove: function (object, name) {
                return has(object, name) && deleteProperty(object, name);
            },
            enumerate: function (object) {
                const list = [];
                for (const name in object) {
                    list[list.length] = wellFormed(name);
                }
                return list;
            },
            // With another `this` than the window. What a program of the plug-in's throws is no event of the page's.
            evaluate: function (scope, source) {
                try {
                    return apply(evaluateWith, scope, [source]);
                } catch (error) {
                    apply(logError, theConsole, [error]);
                    return failed;
                }
            },
            log: function (text) {
                apply(logError, theConsole, [text]);
            }
        };
    },

    // Runs a program with another `this` than the window. Not strict, as programs are not by themselves.
    evaluateWith: function () {
        return eval(arguments[0]);
    }
})

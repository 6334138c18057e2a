// Shows the video of one object where the page puts it: on the video plane under the page if nothing of the page lies
// between, or painted by the page as the object's background. Runs in a script world of its own, so that nothing the page
// does to its script objects matters here.
//
// The style sheet of the window gives each object the background var(--telix-video), which is empty unless an animation
// that the page does not see in the element's attributes sets it to the named canvas.
//
// Returns the functions for the host: start(), stop(), image(), paint() and planeShown(). `host` has
//   paint()          asks for the newest frame now: image() and paint() run before it returns
//   watch(on)        whether each frame is to be painted
//   setInPage(on)    whether the window leaves the video to the page; planeShown() is called when the plane shows it again
(function (element, canvasName, host) {
    'use strict';

    var window = element.ownerDocument.defaultView;
    var document = element.ownerDocument;
    var checkInterval = 1000; // milliseconds, for changes that nothing reports, such as those of style sheets
    var returnDelay = 250; // milliseconds without checks after a change of a page that paints
    var animationInterval = 100; // milliseconds between checks while something moves
    var share = 0.1; // of the time that checks may take
    var burst = 100; // milliseconds of checks that follow one another without a pause
    // After that many animation frames the window shows what the page has drawn: the first comes before it is drawn, and the
    // engine begins a picture when the window has the last but one.
    var turnsUntilShown = 4;
    var margin = 0.5; // pixels that rectangles may differ by
    var nothing = /^transparent$|^rgba\(.*, 0\)$/;
    var replaced = /^(img|canvas|video|audio|iframe|frame|svg|math|input|textarea|select|button|progress|meter|marquee)$/;

    // --- What lies between the video plane and the element

    function overlaps(a, b) {
        return a.left < b.right - margin && b.left < a.right - margin && a.top < b.bottom - margin &&
            b.top < a.bottom - margin;
    }

    function contains(outer, inner) {
        return outer.left <= inner.left + margin && outer.top <= inner.top + margin &&
            outer.right >= inner.right - margin && outer.bottom >= inner.bottom - margin;
    }

    // Whether the element is drawn as it is: the plane knows rectangles only.
    function isPlain(style) {
        return style.opacity === '1' && style.transform === 'none' && style.translate === 'none' &&
            style.rotate === 'none' && style.scale === 'none' && style.filter === 'none' && style.clipPath === 'none' &&
            style.clip === 'auto' && style.mixBlendMode === 'normal' && style.maskImage === 'none' &&
            style.visibility === 'visible';
    }

    function hasBox(style) {
        return !nothing.test(style.backgroundColor) || style.backgroundImage !== 'none' || style.boxShadow !== 'none' ||
            style.borderTopWidth !== '0px' || style.borderLeftWidth !== '0px' || style.borderBottomWidth !== '0px' ||
            style.borderRightWidth !== '0px' || (style.outlineStyle !== 'none' && style.outlineWidth !== '0px');
    }

    function hasText(node) {
        for (var child = node.firstChild; child; child = child.nextSibling) {
            if (child.nodeType === 3 && /\S/.test(child.data)) {
                return true;
            }
        }
        return false;
    }

    function hasPseudoElement(node) {
        return ['::before', '::after'].some(function (name) {
            var content = window.getComputedStyle(node, name).content;
            return content !== 'none' && content !== 'normal';
        });
    }

    // Whether the element itself, without its children, puts anything on the screen.
    function paints(node, style) {
        if (style.visibility !== 'visible' || style.opacity === '0') {
            return false;
        }
        if (hasBox(style) || replaced.test(node.localName)) {
            return true;
        }
        // What an object without a plug-in shows is its content or its children.
        var isContentHidden = style.contentVisibility === 'hidden';
        return !isContentHidden && (/^(object|embed)$/.test(node.localName) || hasText(node) || hasPseudoElement(node));
    }

    function isRounded(style) {
        return style.borderTopLeftRadius !== '0px' || style.borderTopRightRadius !== '0px' ||
            style.borderBottomLeftRadius !== '0px' || style.borderBottomRightRadius !== '0px';
    }

    // Whether a clip of an ancestor may take something of the rectangle.
    function clips(ancestor, style, rect) {
        return (style.overflowX !== 'visible' || style.overflowY !== 'visible' || style.contain !== 'none') &&
            (isRounded(style) || !contains(ancestor.getBoundingClientRect(), rect));
    }

    // The order of the elements at some points, from the topmost one; each point is asked for once.
    function makeOrder(inDocument, target) {
        var samples = [];
        function sampleIn(rect) {
            var found = samples.filter(function (sample) {
                return sample.x > rect.left && sample.x < rect.right && sample.y > rect.top && sample.y < rect.bottom;
            });
            var x = (rect.left + rect.right) / 2;
            var y = (rect.top + rect.bottom) / 2;
            if (found.length === 0) {
                samples.push({ x: x, y: y, list: inDocument.elementsFromPoint(x, y) });
                found = samples.slice(-1);
            }
            return found;
        }
        // Whether the element lies above the target. False if that is not known.
        return function isAbove(node, rect) {
            return sampleIn(rect).some(function (sample) {
                var index = sample.list.indexOf(node);
                return index >= 0 && index < sample.list.indexOf(target);
            });
        };
    }

    // Whether something in the target's document may lie under it.
    function hasUnderlay(target, rect) {
        var inDocument = target.ownerDocument;
        var view = inDocument.defaultView;
        var root = inDocument.documentElement;
        // Their backgrounds are those of the whole document.
        if ([root, inDocument.body].some(function (node) { return node && hasBox(view.getComputedStyle(node)); })) {
            return true;
        }
        var isAbove = makeOrder(inDocument, target);
        var all = root.getElementsByTagName('*');
        for (var i = 0; i < all.length; i++) {
            var node = all[i];
            var box = node === target || node.ownerSVGElement ? null : node.getBoundingClientRect();
            if (!box || !overlaps(box, rect)) {
                continue;
            }
            var style = view.getComputedStyle(node);
            if (style.mixBlendMode !== 'normal' || (style.backdropFilter || 'none') !== 'none') {
                return true; // mixes with the video even from above
            }
            if (!paints(node, style)) {
                continue;
            }
            var common = {
                left: Math.max(box.left, rect.left), top: Math.max(box.top, rect.top),
                right: Math.min(box.right, rect.right), bottom: Math.min(box.bottom, rect.bottom)
            };
            if (!isAbove(node, common)) {
                return true;
            }
        }
        return false;
    }

    function hasClipOrEffect(target, rect) {
        var view = target.ownerDocument.defaultView;
        var root = target.ownerDocument.documentElement;
        var position = 'static';
        for (var node = target; node; node = node.parentElement) {
            var style = view.getComputedStyle(node);
            // An element is clipped by what it is positioned in; the clip of the root or the body is the viewport's.
            var isContainer = node !== target && node !== root && position !== 'fixed' &&
                (position !== 'absolute' || style.position !== 'static') &&
                (node !== target.ownerDocument.body || view.getComputedStyle(root).overflowX !== 'visible');
            if (!isPlain(style) || (isContainer && clips(node, style, rect))) {
                return true;
            }
            position = node === target || isContainer ? style.position : position;
        }
        return false;
    }

    function isMoving(target) {
        return target.ownerDocument.getAnimations().some(function (each) {
            return each !== picture && each.playState === 'running' && each.effect && each.effect.target &&
                each.effect.target.contains(target);
        });
    }

    function isOnPlane(target, rect) {
        var view = target.ownerDocument.defaultView;
        var visible = {
            left: Math.max(rect.left, 0), top: Math.max(rect.top, 0),
            right: Math.min(rect.right, view.innerWidth), bottom: Math.min(rect.bottom, view.innerHeight)
        };
        if (isRounded(view.getComputedStyle(target)) || hasClipOrEffect(target, rect) || isMoving(target) ||
            hasUnderlay(target, visible)) {
            return false;
        }
        if (view === view.parent) {
            return true;
        }
        var frame = view.frameElement; // null for a frame of another origin
        var offset = frame && frame.getBoundingClientRect();
        // The plug-in places the plane by the element's place in its own document.
        return frame !== null && offset.left + frame.clientLeft === 0 && offset.top + frame.clientTop === 0 &&
            contains(visible, rect) && !hasBox(frame.ownerDocument.defaultView.getComputedStyle(frame)) &&
            isOnPlane(frame, rect);
    }

    // A hidden page paints nothing, and the video is seen.
    function needsPage() {
        return !document.hidden && !(element.isConnected && isOnPlane(element, element.getBoundingClientRect()));
    }

    // --- The picture in the page

    var picture = null; // the animation that gives the element its background; null: none
    var isInPage; // what needsPage() has said last; undefined before
    var context = null;
    var target = null; // the image for the next frame
    var turns = 0; // animation frames until the window has the page with the picture

    function addPicture() {
        if (!picture) {
            var background = '-webkit-canvas(' + canvasName + ') center / contain no-repeat, linear-gradient(#000, #000)';
            picture = element.animate([{ '--telix-video': background }, { '--telix-video': background }],
                { duration: 1, fill: 'both' });
            picture.pause();
            host.watch(true);
        }
    }

    function removePicture() {
        if (picture) {
            picture.cancel();
            picture = null;
            host.watch(false);
        }
    }

    function waitForPage() {
        if (isInPage && turns > 0) {
            turns--;
            window.requestAnimationFrame(waitForPage);
        } else if (isInPage) {
            host.setInPage(true);
        }
    }

    function show(inPage) {
        if (inPage === isInPage) {
            return;
        }
        isInPage = inPage;
        if (inPage) {
            addPicture();
            host.paint();
            turns = turnsUntilShown;
            waitForPage();
        } else {
            host.setInPage(false);
        }
    }

    // --- When to look

    var isStopped = false;
    var isRequested = false;
    var isAfterFrame = false; // the callbacks for this picture of the page have run, and it has not been drawn
    var timer = 0;
    var budget = burst; // milliseconds that checks may take now
    var budgetTime = window.performance.now();

    function checkAfter(delay) {
        if (!timer && !isStopped) {
            timer = window.setTimeout(function () {
                timer = 0;
                check();
            }, delay);
        }
    }

    function check() {
        if (isStopped) {
            return;
        }
        var begin = window.performance.now();
        budget = Math.min(burst, budget + share * (begin - budgetTime));
        budgetTime = begin;
        if (budget <= 0) {
            checkAfter(1 - budget / share);
            return;
        }
        var needed = needsPage();
        budget -= window.performance.now() - begin;
        show(needed);
        if (document.getAnimations().some(function (each) { return each.playState === 'running'; })) {
            checkAfter(animationInterval);
        }
    }

    // Something may have changed. The page waits for the next picture, so that the change and what follows from it are drawn
    // together.
    function onChange() {
        if (isInPage) {
            checkAfter(returnDelay);
        } else if (isAfterFrame || document.hidden) {
            check();
        } else if (!isRequested && !isStopped) {
            isRequested = true;
            window.requestAnimationFrame(function () {
                isRequested = false;
                isAfterFrame = true;
                window.setTimeout(function () { isAfterFrame = false; }, 0);
                check();
            });
        }
    }

    var events = ['scroll', 'resize', 'load', 'transitionrun', 'animationstart', 'animationend', 'transitionend', 'focusin',
        'focusout'];
    var observer = new MutationObserver(onChange);
    var watched = [];

    function watchDocuments() {
        for (var view = window; view; view = view === view.parent || !view.frameElement ? null : view.parent) {
            watched.push(view);
            observer.observe(view.document, { childList: true, attributes: true, subtree: true });
            events.forEach(function (name) { view.addEventListener(name, onChange, true); });
        }
        document.addEventListener('visibilitychange', check, true);
    }

    function unwatchDocuments() {
        observer.disconnect();
        watched.forEach(function (view) {
            events.forEach(function (name) { view.removeEventListener(name, onChange, true); });
        });
        document.removeEventListener('visibilitychange', check, true);
    }

    var interval = 0;

    return {
        // The object presents.
        start: function () {
            watchDocuments();
            interval = window.setInterval(check, checkInterval);
            check();
        },
        // The object no longer presents.
        stop: function () {
            isStopped = true;
            isInPage = false;
            removePicture();
            unwatchDocuments();
            window.clearInterval(interval);
            window.clearTimeout(timer);
        },
        // The image for a frame of that aspect ratio, as large as the element's box allows; null if it has none.
        image: function (aspect) {
            var width = Math.round(Math.min(element.offsetWidth, element.offsetHeight * aspect));
            var height = Math.round(Math.min(element.offsetHeight, element.offsetWidth / aspect));
            if (width <= 0 || height <= 0) {
                return null;
            }
            if (!target || target.width !== width || target.height !== height) {
                context = document.getCSSCanvasContext('2d', canvasName, width, height);
                target = context.createImageData(width, height);
            }
            return target;
        },
        // The image has the pixels of a frame.
        paint: function () {
            context.putImageData(target, 0, 0);
        },
        planeShown: function () {
            if (!isInPage) {
                removePicture();
            }
        }
    };
})

// Tests in a page. The page calls testPage() once with its tests by name. A test is a function; it passes if it makes at
// least one check and none fails:
//
//     testPage({
//         'a call gives an object': function () { same(typeof manager.call(), 'object'); },
//         'an event comes': function (done) { element.addEventListener('x', function () { check(true); done(); }); }
//     });
//
// An asynchronous test takes `done` and calls it within `testTimeout` milliseconds, which only bounds a hang. Tests run
// one after the other when the page is loaded. Then window.testResult is {passed: number, failed: [message, ...]}.
var testTimeout = 60000;
var checksMade = 0;
// Whether the page runs in the engine that loads NPAPI plug-ins by itself: where that is at fault, a test expects what
// the current engines do only of those.
var isOldEngine = typeof WeakRef === 'undefined';
// Whether the window has no way to the outcome but its console, and adds nothing to pages as the television's does.
var isBareWindow = location.hash === '#outcome-on-console';

if (isBareWindow) {
    window.createHbbTVApplication = function (uri) {
        var request = new XMLHttpRequest();
        try {
            request.open('GET', uri, false);
            request.send();
        } catch (error) {
            return false;
        }
        return request.responseText !== '';
    };
    window.destroyHbbTVApplication = window.showHbbTVApplication = window.hideHbbTVApplication = function () {};
    document.write('<style>object, embed { opacity: 0 !important; }</style>');
}

// Fails the test unless `condition` is true.
function check(condition, message) {
    checksMade++;
    if (condition !== true) {
        throw new Error(message || 'a condition is ' + condition);
    }
}

// Fails the test unless both values are strictly equal; arrays are compared by element.
function same(actual, expected) {
    var bothArrays = Array.isArray(actual) && Array.isArray(expected);
    check(bothArrays ? JSON.stringify(actual) === JSON.stringify(expected) : actual === expected,
          'is ' + JSON.stringify(actual) + ' (' + typeof actual + '), should be ' + JSON.stringify(expected));
}

// Fails the test unless the function throws.
function throws(action) {
    var thrown = false;
    try {
        action();
    } catch (error) {
        thrown = true;
    }
    check(thrown, 'nothing is thrown');
}

// Polls until condition() is true, then calls `next`.
function whenTrue(condition, next) {
    if (condition()) {
        next();
    } else {
        setTimeout(function () { whenTrue(condition, next); }, 20);
    }
}

function testPage(tests) {
    var names = Object.keys(tests);
    var passed = 0;
    var failed = [];

    function runFrom(index) {
        if (index === names.length) {
            window.testResult = { passed: passed, failed: failed };
            if (isBareWindow) {
                console.log('testResult ' + JSON.stringify(window.testResult));
            }
            return;
        }
        var name = names[index];
        var test = tests[name];
        var ended = false;
        var timer = 0;

        function end(failure) {
            if (ended) {
                return;
            }
            ended = true;
            clearTimeout(timer);
            window.onerror = null;
            if (!failure && checksMade === 0) {
                failure = 'nothing was checked';
            }
            if (failure) {
                failed.push(name + ': ' + failure);
            } else {
                passed++;
            }
            setTimeout(function () { runFrom(index + 1); }, 0);
        }

        checksMade = 0;
        // Catches exceptions of checks that run in callbacks.
        window.onerror = function (message) { end(String(message)); };
        timer = setTimeout(function () { end('not done within ' + testTimeout + ' ms'); }, testTimeout);
        try {
            test(function () { end(); });
        } catch (error) {
            end(String(error));
        }
        if (test.length === 0) {
            end();
        }
    }

    window.addEventListener('load', function () { runFrom(0); }, false);
}

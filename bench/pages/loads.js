// The time of loading a page in a frame.
var loads = 20;

// Calls done() with the microseconds of one load; `objects` is the number of object elements that the page has.
function timeLoads(page, objects, done) {
    var left = loads;
    var begin = performance.now();
    (function load() {
        var frame = document.createElement('iframe');
        frame.onload = function () {
            if (frame.contentDocument.getElementsByTagName('object').length !== objects) {
                throw new Error('an object is missing');
            }
            setTimeout(function () { // the old engine does not survive it within the handler
                document.body.removeChild(frame);
                if (--left === 0) {
                    done(1000 * (performance.now() - begin) / loads);
                } else {
                    load();
                }
            }, 0);
        };
        frame.src = page;
        document.body.appendChild(frame);
    }());
}

// Rounds of a measurement. Of several the fastest counts: what else the machine does only ever adds.
var rounds = 5;

// The smallest result of measure().
function best(measure) {
    var times = [];
    for (var i = 0; i < rounds; i++) {
        times.push(measure());
    }
    return Math.min.apply(null, times);
}

// Calls measure(done) one time after the other, and then next() with the smallest result.
function bestOf(measure, next) {
    var times = [];
    (function again() {
        measure(function (time) {
            times.push(time);
            if (times.length < rounds) {
                again();
            } else {
                next(Math.min.apply(null, times));
            }
        });
    }());
}

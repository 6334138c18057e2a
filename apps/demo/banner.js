// The channel banner: the channel, and its present and following programme. Shown for some seconds at a channel change.
var banner = (function () {
    'use strict';

    var shownMilliseconds = 6000;
    var timer = 0;
    var threshold = null;

    // The parental rating threshold, or null.
    function ratingThreshold() {
        var schemes = tv.byId('parental').parentalRatingSchemes;
        var scheme = schemes ? schemes.getParentalRatingScheme('dvb-si') : null;
        var limit = scheme ? scheme.threshold : null;
        return limit ? limit.value : null;
    }

    function describeRating(rating) {
        if (!rating) {
            return '';
        }
        var text = /^[0-9]+$/.test(rating.name) ? rating.name + '+' : rating.name;
        var isAbove = threshold !== null && rating.scheme === 'dvb-si' && rating.value > threshold;
        return isAbove ? text + ' above your limit' : text;
    }

    function timeAt(seconds) {
        return tv.timeOfDay(new Date(seconds * 1000));
    }

    function describeProgramme(programme) {
        return timeAt(programme.start) + '\u2013' + timeAt(programme.start + programme.seconds) + '  ' + programme.name;
    }

    function describeState() {
        return television.state.error || (television.state.isTuned ? 'No programme information' : 'Tuning \u2026');
    }

    function update() {
        var channel = television.state.channel;
        var now = television.state.programmes[0];
        var next = television.state.programmes[1];
        var seconds = Date.now() / 1000;
        tv.setText('clock', tv.timeOfDay(new Date()));
        tv.setText('banner-number', channel ? String(channel.number) : '');
        tv.setText('banner-name', channel ? channel.name : '');
        tv.setText('banner-now', now ? describeProgramme(now) : describeState());
        tv.setText('banner-next', next ? describeProgramme(next) : '');
        tv.setText('banner-rating', now ? describeRating(now.rating) : '');
        tv.setVisible('banner-rating', !!now && !!now.rating);
        var played = now && now.seconds > 0 ? (seconds - now.start) / now.seconds * 100 : 0;
        tv.byId('banner-played').style.width = Math.max(0, Math.min(100, played)) + '%';
        tv.byId('banner-more').style.display = announcement.isAvailable() ? 'inline' : 'none';
    }

    function hide() {
        clearTimeout(timer);
        tv.setVisible('banner', false);
    }

    // Shows the banner while the set tunes, and for some seconds afterwards.
    function show() {
        update();
        tv.setVisible('banner', true);
        clearTimeout(timer);
        if (television.state.isTuned) {
            timer = setTimeout(hide, shownMilliseconds);
        }
    }

    function start() {
        threshold = ratingThreshold();
        setInterval(update, 1000);
    }

    return { start: start, show: show, hide: hide, update: update, describeProgramme: describeProgramme,
             isShown: function () { return tv.isVisible('banner'); } };
}());

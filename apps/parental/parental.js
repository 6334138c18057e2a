// The parental rating schemes of the set, with their ratings and thresholds.
(function () {
    'use strict';

    var schemes = document.getElementById('manager').parentalRatingSchemes;
    var focused = 0;

    function row(name, value) {
        var line = document.createElement('tr');
        line.appendChild(tv.element('td', name));
        line.appendChild(tv.element('td', value));
        return line;
    }

    function show() {
        var lines = [];
        for (var i = 0; i < schemes.length; i++) {
            var line = tv.element('li', schemes.item(i).name || 'without a name');
            line.className = i === focused ? 'focused' : '';
            lines.push(line);
        }
        tv.fill(document.getElementById('menu'), lines);

        var scheme = schemes.item(focused);
        var threshold = scheme.threshold;
        var table = document.createElement('table');
        table.appendChild(row('Threshold', threshold ? threshold.name : 'not known'));
        for (var rating = 0; rating < scheme.length; rating++) {
            table.appendChild(row('Rating ' + (rating + 1), scheme.item(rating)));
        }
        tv.fill(document.getElementById('panel'), [tv.element('h2', scheme.name || 'without a name'), table]);
    }

    if (!schemes) {
        document.getElementById('missing').style.display = 'block';
        return;
    }
    var actions = {};
    actions[VK_UP] = function () { focused = (focused + schemes.length - 1) % schemes.length; show(); };
    actions[VK_DOWN] = function () { focused = (focused + 1) % schemes.length; show(); };
    tv.onKeys(actions);
    show();
}());

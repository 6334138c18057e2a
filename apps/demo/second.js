// The second application of the demonstration: it says who it is and ends itself.
(function () {
    'use strict';

    var application = tv.ownerApplication(document.getElementById('manager'));
    var state = document.getElementById('state');
    state.textContent = 'getOwnerApplication(document) gave ' + tv.describeApplication(application) + '.';

    function leave() {
        if (application) {
            application.destroyApplication();
        }
    }

    var actions = {};
    actions[VK_BACK] = leave;
    actions[VK_ENTER] = leave;
    tv.onKeys(actions);
}());

// The second application of the demonstration: shows its owner application and destroys itself.
(function () {
    'use strict';

    var application = tv.ownerApplication(document.getElementById('manager'));
    var state = document.getElementById('state');
    state.textContent = 'getOwnerApplication(document) returned ' + tv.describeApplication(application) + '.';

    function close() {
        if (application) {
            application.destroyApplication();
        }
    }

    var actions = {};
    actions[VK_BACK] = close;
    actions[VK_ENTER] = close;
    tv.onKeys(actions);
}());

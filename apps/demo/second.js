// The second application of the demonstration: shows its owner application and destroys itself.
(function () {
    'use strict';

    var previewMilliseconds = 3000;
    var application = tv.ownerApplication(document.getElementById('manager'));
    var state = document.getElementById('state');
    state.textContent = 'getOwnerApplication(document) returned ' + tv.describeApplication(application) + '.';

    function close() {
        if (application) {
            application.destroyApplication();
        }
    }

    if (location.hash === '#preview') {
        setTimeout(close, previewMilliseconds);
    }
    var actions = {};
    actions[VK_BACK] = close;
    actions[VK_ENTER] = close;
    tv.onKeys(actions);
}());

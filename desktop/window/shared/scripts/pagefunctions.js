// Adds to the window object what pages of a TV browser expect: the functions that create, destroy, show and hide
// applications, and the key codes of the remote control. Called once per window object, before any script of the page,
// with the key codes by name.
(function (keyCodes) {
    var browser = window.telixTvBrowser;
    delete window.telixTvBrowser;

    window.createHbbTVApplication = function (uri) {
        return arguments.length > 0 && browser.createApplication(String(uri));
    };
    window.destroyHbbTVApplication = function () {
        browser.destroyApplication();
    };
    window.showHbbTVApplication = function () {
        browser.showApplication();
    };
    window.hideHbbTVApplication = function () {
        browser.hideApplication();
    };

    for (var name in keyCodes) {
        window[name] = keyCodes[name];
    }
})

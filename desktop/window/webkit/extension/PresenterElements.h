// The elements of pages by the objects of the platform library that present for them.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_PRESENTERELEMENTS_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_PRESENTERELEMENTS_H

#include <webkit2/webkit-web-extension.h>

#include <cstdint>
#include <functional>
#include <map>
#include <vector>

#include "desktop/platform/telix_picture.h"
#include "desktop/window/shared/PlatformLibrary.h"

namespace desktop {

// The library numbers its objects in the order in which they are created, and the bridge reports the elements
// before and after their instances are made, so the number that is new in between is the element's. Nothing
// is inferred from places in the page. Main thread of the web process.
class PresenterElements {
public:
    // `onGone` is called with the number of an element that is no longer there. The object lives as long as
    // the process.
    explicit PresenterElements(std::function<void(uint64_t presenter)> onGone);
    PresenterElements(const PresenterElements&) = delete;
    PresenterElements& operator=(const PresenterElements&) = delete;

    // The element of a number of telix_picture.h as a value of a script world of the television's own, owned
    // by this object; null if no page has it.
    JSCValue* find(uint64_t presenter) const;

private:
    class Window;

    static void onWindowObjectCleared(WebKitScriptWorld* defaultWorld, WebKitWebPage*, WebKitFrame* frame,
                                      gpointer self);
    uint64_t newestPresenter();
    void onCreating();
    uint64_t onCreated(WebKitFrame* frame, JSCValue* element);
    void remove(uint64_t presenter);
    void removeLater(uint64_t presenter);

    std::function<void(uint64_t presenter)> m_onGone;
    WebKitScriptWorld* m_world;
    PlatformLibrary m_library;
    telix_desktop_newest_presenter_function m_newest = nullptr;
    std::vector<uint64_t> m_before;           // of the instances that are being made, the innermost last
    std::map<uint64_t, JSCValue*> m_elements; // owns references
};

} // namespace desktop

#endif

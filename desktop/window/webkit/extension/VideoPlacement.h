// Shows the video where the page puts its element: on the window's video plane or painted by the page.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_VIDEOPLACEMENT_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_EXTENSION_VIDEOPLACEMENT_H

#include <webkit2/webkit-web-extension.h>

#include <atomic>
#include <cstdint>

#include "desktop/window/frames/FramePublisher.h"
#include "desktop/window/shared/FrameSource.h"
#include "desktop/window/webkit/extension/PresenterElements.h"

namespace desktop {

// scripts/videoplacement.js decides, for the element of the object that presents, and paints; this class
// gives it the frames. For a moment at each change both ways show the video: the plane is there until the
// window has the page with the picture, and the picture until the window shows the plane. Main thread of the
// web process, unless a function says otherwise.
class VideoPlacement {
public:
    // Both must outlive the object, which lives as long as the process.
    VideoPlacement(WebKitWebExtension* extension, FramePublisher& publisher);
    VideoPlacement(const VideoPlacement&) = delete;
    VideoPlacement& operator=(const VideoPlacement&) = delete;

    // What the publisher reports. Any thread.
    void onChange();

    // Follows the newest frame at once: to where it belongs, and into the page if that paints it.
    void update();

private:
    struct Request;

    void start(uint64_t presenter, bool isFullScreen);
    void stop();
    void paint();
    void watch(bool isWatched);
    void setInPage(bool isInPage);
    void onWindowReply(unsigned request, bool isInPage);
    JSCValue* newHost(JSCContext* context);

    WebKitWebExtension* m_extension;
    FramePublisher& m_publisher;
    FrameSource m_source;
    PresenterElements m_elements;
    std::atomic<bool> m_isPosted{false};
    uint64_t m_presenter = 0; // 0: nothing is presented
    bool m_isFullScreen = false;
    JSCValue* m_script = nullptr; // what the script has returned; null: no element, or full screen
    bool m_isWatched = false;     // the page paints the frames
    unsigned m_lastRequest = 0;   // to the window
};

} // namespace desktop

#endif

// The fixture of the A/V control tests: a page with one media element or several, the platform's callbacks, a
// page that encodes URLs as a browser does, and the clock of the monitors.
#ifndef TELIX_TESTS_UNIT_AVCONTROL_AVCONTROLTEST_H
#define TELIX_TESTS_UNIT_AVCONTROL_AVCONTROLTEST_H

#include <string>
#include <vector>

#include "tests/support/BorderTest.h"
#include "tests/unit/avcontrol/MonitorClock.h"
#include "tests/unit/support/Heap.h"

namespace avcontrol {

enum {
    Stopped = 0,
    Playing = 1,
    Paused = 2,
    Connecting = 3,
    Buffering = 4,
    Finished = 5,
    Error = 6,
    NextClip = 7
};

inline const char kClip[] = "http://media.example/clip.mp4";

// What TELIX_JS_AV_Play is asked for an ordinary video.
std::string playOf(const std::string& url, int player = 7, int playCount = 1, int source = 6,
                   int container = 512, int codec = 0);

class AVControlTest : public BorderTest {
protected:
    AVControlTest();
    void TearDown() override;

    // An element with the id "video" that plays `url` from its `data`, which the plug-in doesn't fetch.
    EmbeddedObject video(const std::string& url = kClip, const Attributes& more = {});
    EmbeddedObject element(const std::string& mimeType, const Attributes& attributes);
    // The same in state 1: played, and begun by the platform.
    EmbeddedObject playingVideo(const std::string& url = kClip, const Attributes& more = {});
    // A playlist that the browser has streamed to an element, which plays its first clip.
    EmbeddedObject playlist(const std::string& text, const Attributes& more = {});

    // The platform calls back; the page is brought to rest after it.
    void send(TELIX_AV_CB_MSG message);
    void post(TELIX_AV_CB_MSG message); // without the rest
    // There is memory for copies of the first `copies` strings, and none for the next.
    void sendRightsError(int state, const std::string& contentId, const std::string& system,
                         const std::string& url, unsigned copies = 3);
    // How many blocks the platform's callbacks leave on the heap on purpose: records that nobody gets, and
    // what belongs to them. The test fails if it isn't exactly that.
    void blocksLeftBehind(size_t blocks) { m_blocksLeftBehind = blocks; }
    bool hasCallbacks() const { return m_stateCallback != nullptr; }

    int32_t state(const EmbeddedObject& object) const { return object.get("playState").value.integer(); }
    // The calls of the platform's players so far: "TELIX_JS_AV_Stop(7)".
    BorderLog::Entries playerCalls() const { return log.startingWith("TELIX_JS_AV_"); }
    // The DOM events so far: "PlayStateChange".
    std::vector<std::string> events() const { return browser.eventTypes(); }

    // What the platform reports of a player from now on.
    void report(const TELIX_JS_AV_PLAY_INFO& info);
    static TELIX_JS_AV_PLAY_INFO info(uint32_t buffered, uint32_t position = 5000, uint32_t duration = 600000,
                                      uint32_t bufferedEnd = 10, uint32_t state = 2);

    // Ends the page in the middle of a test, as far as the plug-in is concerned.
    void destroy(const EmbeddedObject& object);

    MonitorClock& clock = MonitorClock::instance();
    uint32_t nextPlayer = 7;

private:
    TELIX_JS_AV_PLAYSTATE_CB m_stateCallback = nullptr;
    TELIX_JS_AV_DRM_RIGHTS_CB m_rightsCallback = nullptr;
    HeapWatch m_callbackHeap;
    size_t m_blocksLeftBehind = 0;
};

// A playlist document of these clips; what a clip is given beside its URL follows a blank.
std::string asx(const std::vector<std::string>& entries);
std::string entry(const std::string& url, const std::string& more = "");

} // namespace avcontrol

#endif

// The applications that the current service signals, for the window that runs them: what the receiver reads
// from the broadcast, and what is injected. The functions that are exported to the window are in
// telix_applications.h.
#ifndef TELIX_DESKTOP_PLATFORM_APPLICATIONSIGNALLING_H
#define TELIX_DESKTOP_PLATFORM_APPLICATIONSIGNALLING_H

#include <cstdint>
#include <functional>
#include <map>
#include <mutex>
#include <string>
#include <vector>

#include "desktop/platform/ApplicationInformation.h"
#include "desktop/platform/telix_applications.h"
#include "telix/telix_platform.h"

namespace desktop {

// Has locks of its own; no function needs the platform's mutex.
class ApplicationSignalling {
public:
    enum class State {
        NoService, // nothing is received
        Awaited,   // the service is received, its signalling is not known yet
        Known,
    };

    struct Snapshot {
        State state = State::NoService;
        TELIX_JS_CM_HANDLE channel = 0; // received, or received last; 0: none yet
        uint64_t serviceSerial = 0;     // increases when another service is selected
        uint64_t serial = 0;            // increases with each change of anything here
        ApplicationList list;
    };

    // ---- Reports of the reception. Platform thread.

    // Nothing happens if the channel is received already.
    void onServiceSelected(TELIX_JS_CM_HANDLE channel);
    void onApplications(TELIX_JS_CM_HANDLE channel, const ApplicationList& list);

    // Nothing is received until the next service is selected, which may be the same one: a gap in reception
    // ends no application.
    void onServiceLost();

    // ---- Any thread.

    Snapshot snapshot() const;

    // Signals a document as an application of a channel, beside what the broadcast signals, until the next
    // call for the channel. An empty URL ends that. False if the URL is not absolute.
    bool signal(TELIX_JS_CM_HANDLE channel, const std::string& url, uint8_t controlCode, bool isServiceBound);

    // See telix_desktop_set_applications_wakeup.
    void setWakeup(telix_desktop_applications_wakeup wakeup, void* data);

private:
    ApplicationId idOfLocked(const std::string& url);
    void wakeUp();

    mutable std::mutex m_mutex; // guards what follows; not held in callbacks
    Snapshot m_received;
    std::map<TELIX_JS_CM_HANDLE, SignalledApplication> m_injected;
    std::vector<std::string> m_injectedUrls; // the index is the application id, less 1

    std::mutex m_wakeupMutex; // guards what follows; held while the wake-up runs
    telix_desktop_applications_wakeup m_wakeup = nullptr;
    void* m_wakeupData = nullptr;
};

} // namespace desktop

#endif

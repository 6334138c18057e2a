// The stream events that pages have subscribed to.
#ifndef TELIX_DESKTOP_PLATFORM_STREAMEVENTS_H
#define TELIX_DESKTOP_PLATFORM_STREAMEVENTS_H

#include <cstdint>
#include <functional>
#include <list>
#include <mutex>
#include <string>
#include <vector>

#include "desktop/platform/TsTables.h"
#include "telix/telix_platform.h"

namespace desktop {

// A mutex of its own guards the subscriptions. It is held while callbacks run, so that none runs after its
// subscription has ended, and it is recursive, so that a callback may subscribe and unsubscribe. It is never
// taken while Platform::mutex() is held.
class StreamEvents {
public:
    // What is known of a subscription.
    struct Subscription {
        TELIX_JS_VB_HANDLE object;
        uint16_t eventId;
        uint8_t componentTag;
        std::string name; // the page's, handed to the callback
    };

    // Any thread. Event ids are written in decimal, or hexadecimal with 0x before; component tags in
    // hexadecimal.
    void subscribe(TELIX_JS_VB_HANDLE object, TELIX_JS_VB_STREAM_EVENT_CB callback,
                   const std::string& eventId, const std::string& componentTag, const std::string& name);

    // Ends one of the subscriptions that are equal but for the name; false if there is none. When this
    // returns, its callback is not running on another thread and is not called again. Any thread.
    bool unsubscribe(TELIX_JS_VB_HANDLE object, TELIX_JS_VB_STREAM_EVENT_CB callback,
                     const std::string& eventId, const std::string& componentTag);

    // Calls the subscribers of an event that `object` receives, once for each version: sections are repeated.
    // Platform thread.
    void dispatch(TELIX_JS_VB_HANDLE object, uint8_t componentTag, const StreamEvent& event);

    // Calls the subscribers of all objects that `isMeant` chooses, and returns their number. `status` is what
    // pages know: "trigger" or "error". Platform thread.
    size_t dispatchTo(const std::function<bool(const Subscription& subscription)>& isMeant, const Bytes& data,
                      const std::string& status);

    std::vector<Subscription> subscriptions() const;

private:
    struct Entry : Subscription {
        TELIX_JS_VB_STREAM_EVENT_CB callback;
        int lastVersion; // -1: no event yet
    };

    static void call(const std::vector<Entry>& due, const Bytes& data, std::string status);

    mutable std::recursive_mutex m_mutex;
    std::list<Entry> m_entries;
};

} // namespace desktop

#endif

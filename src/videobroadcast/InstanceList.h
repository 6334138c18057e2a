// The live video/broadcast objects and the platform handle of each. The browser thread owns the list;
// platform threads look handles up in an immutable copy that is published at every change, so that no side
// ever waits.
#ifndef TELIX_SRC_VIDEOBROADCAST_INSTANCELIST_H
#define TELIX_SRC_VIDEOBROADCAST_INSTANCELIST_H

#include <atomic>
#include <map>
#include <memory>
#include <vector>

#include "common/LiveRef.h"

class VideoBroadcast;

class InstanceList {
public:
    struct Entry {
        LiveRef<VideoBroadcast> instance;
        unsigned int handle;
    };
    // Ordered by the object's address.
    using Entries = std::map<VideoBroadcast*, Entry>;

    // A replaced copy is freed on the main loop once it is `graceMilliseconds` old and no look-up is under
    // way.
    explicit InstanceList(unsigned int graceMilliseconds = 5000) : m_grace(graceMilliseconds) {}
    InstanceList(const InstanceList&) = delete;
    InstanceList& operator=(const InstanceList&) = delete;
    ~InstanceList();

    // Any thread: the first object in order with the handle, or none. The object may be gone by the time the
    // caller looks at it: only the browser thread can tell.
    LiveRef<VideoBroadcast> find(unsigned int handle) const;

    // Browser thread only.
    void set(LiveRef<VideoBroadcast> instance, unsigned int handle);
    bool erase(VideoBroadcast* instance); // whether there was an entry
    bool contains(VideoBroadcast* instance) const { return m_entries.count(instance) != 0; }
    unsigned int handleOf(VideoBroadcast* instance) const; // 0 without an entry
    const Entries& entries() const { return m_entries; }
    size_t copiesHeldBack() const { return m_replaced.size() + m_aged.size(); }

private:
    using Copies = std::vector<std::unique_ptr<const Entries>>;

    void publish();
    bool sweep(); // whether copies are left for another turn

    Entries m_entries;
    std::atomic<const Entries*> m_published{nullptr};
    mutable std::atomic<unsigned int> m_readers{0};
    Copies m_replaced; // since the last sweep
    Copies m_aged;     // before it
    unsigned int m_grace;
    unsigned int m_sweepSource = 0;
};

#endif

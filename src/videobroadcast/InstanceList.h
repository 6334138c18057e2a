// The live video/broadcast objects and the platform handle of each. The browser thread owns the list;
// platform threads look handles up in an immutable copy that is published at every change, so that no side
// ever waits.
#ifndef TELIX_SRC_VIDEOBROADCAST_INSTANCELIST_H
#define TELIX_SRC_VIDEOBROADCAST_INSTANCELIST_H

#include <atomic>
#include <map>
#include <memory>
#include <vector>

class VideoBroadcast;

class InstanceList {
public:
    // Ordered by the object's address, which is its identity.
    using Handles = std::map<VideoBroadcast*, unsigned int>;

    // A replaced copy is freed on the main loop once it is `graceMilliseconds` old and no look-up is under
    // way.
    explicit InstanceList(unsigned int graceMilliseconds = 5000) : m_grace(graceMilliseconds) {}
    InstanceList(const InstanceList&) = delete;
    InstanceList& operator=(const InstanceList&) = delete;
    ~InstanceList();

    // Any thread: the first object in order with the handle, or null. The object may be gone by the time the
    // caller looks at it: only the browser thread can tell.
    VideoBroadcast* find(unsigned int handle) const;

    // Browser thread only.
    void set(VideoBroadcast* instance, unsigned int handle);
    bool erase(VideoBroadcast* instance); // whether there was an entry
    bool contains(VideoBroadcast* instance) const { return m_handles.count(instance) != 0; }
    unsigned int handleOf(VideoBroadcast* instance) const; // 0 without an entry
    const Handles& handles() const { return m_handles; }
    size_t copiesHeldBack() const { return m_replaced.size() + m_aged.size(); }

private:
    using Copies = std::vector<std::unique_ptr<const Handles>>;

    void publish();
    bool sweep(); // whether copies are left for another turn

    Handles m_handles;
    std::atomic<const Handles*> m_published{nullptr};
    mutable std::atomic<unsigned int> m_readers{0};
    Copies m_replaced; // since the last sweep
    Copies m_aged;     // before it
    unsigned int m_grace;
    unsigned int m_sweepSource = 0;
};

#endif

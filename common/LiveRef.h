// Steps for the browser thread, and the objects that they are for. A step is taken later than it is posted,
// and its object may be gone by then; the next object can even stand at the same address. So a posted step
// names its object by a generation as well, a number that no two objects of the process share.
#ifndef TELIX_COMMON_LIVEREF_H
#define TELIX_COMMON_LIVEREF_H

#include <cstdint>

#include "npapi/npapi.h"

// The generations of the objects that live. Browser thread only.
class LiveGenerations {
public:
    // A new generation, alive until it is ended. Never 0, and never the same twice.
    static uint64_t begin();
    static void end(uint64_t generation);
    static bool contains(uint64_t generation);
};

// Names one object for good; keeps nothing alive. Copied on any thread.
template <class Object>
class LiveRef {
public:
    LiveRef() = default; // of no object
    LiveRef(Object* address, uint64_t generation) : m_address(address), m_generation(generation) {}

    // The object if exactly this one still lives, else null. Browser thread only.
    Object* get() const { return LiveGenerations::contains(m_generation) ? m_address : nullptr; }

    // Where the object is, or was: to compare and to log, not to follow. Null for no object. Any thread.
    Object* address() const { return m_address; }
    uint64_t generation() const { return m_generation; }

private:
    Object* m_address = nullptr;
    uint64_t m_generation = 0;
};

// A member of each object that steps are posted for: lives as long as the object. Made and ended on the
// browser thread; ref() on any thread while the object lives.
template <class Object>
class LiveRegistration {
public:
    explicit LiveRegistration(Object& object) : m_ref(&object, LiveGenerations::begin()) {}
    LiveRegistration(const LiveRegistration&) = delete;
    LiveRegistration& operator=(const LiveRegistration&) = delete;
    ~LiveRegistration() { end(); }

    LiveRef<Object> ref() const { return m_ref; }
    // From here on the object counts as gone; it may go on for the call that is in it.
    void end() const { LiveGenerations::end(m_ref.generation()); }

private:
    const LiveRef<Object> m_ref;
};

// The two ways to the browser thread, each on any thread: the main loop's idle step and the browser's own
// asynchronous call. Steps of one way run in the order in which they were posted, so each step keeps to its
// way.
//
// A step with a record owns the record. It either serves whichever object it finds when it runs, or the
// record holds a LiveRef, which it asks: what a step for a dead object still has to do is its own business.
void postIdle(int (*step)(void* record), void* record);
void postAsyncCall(NPP npp, void (*step)(void* record), void* record);

namespace live_ref_detail {

void postIdleIfAlive(void* object, uint64_t generation, int (*step)(void*));
void postAsyncCallIfAlive(NPP npp, void* object, uint64_t generation, void (*step)(void*));

} // namespace live_ref_detail

// Post if still alive: the step gets the object itself, and is left out if exactly this one no longer lives.
template <class Object>
void postIdleIfAlive(const LiveRef<Object>& object, int (*step)(void* object)) {
    live_ref_detail::postIdleIfAlive(object.address(), object.generation(), step);
}

template <class Object>
void postAsyncCallIfAlive(NPP npp, const LiveRef<Object>& object, void (*step)(void* object)) {
    live_ref_detail::postAsyncCallIfAlive(npp, object.address(), object.generation(), step);
}

#endif

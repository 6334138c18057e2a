// Which objects live, and the two ways to the browser thread.
#include "common/LiveRef.h"

#include <glib.h>

#include <algorithm>
#include <vector>

#include "common/BrowserGates.h"

namespace {

// Ascending, since generations only grow.
std::vector<uint64_t> s_alive;

// A step on its way to an object.
template <class Result>
struct PostedStep {
    LiveRef<void> object;
    Result (*step)(void* object);
};

int runIdle(void* record) {
    const auto* posted = static_cast<PostedStep<int>*>(record);
    if (void* object = posted->object.get()) {
        posted->step(object);
    }
    delete posted;
    return G_SOURCE_REMOVE;
}

void runAsyncCall(void* record) {
    const auto* posted = static_cast<PostedStep<void>*>(record);
    if (void* object = posted->object.get()) {
        posted->step(object);
    }
    delete posted;
}

} // namespace

uint64_t LiveGenerations::begin() {
    static uint64_t last = 0; // 64 bits don't run out
    s_alive.push_back(++last);
    return last;
}

void LiveGenerations::end(uint64_t generation) {
    const auto place = std::lower_bound(s_alive.begin(), s_alive.end(), generation);
    if (place != s_alive.end() && *place == generation) {
        s_alive.erase(place);
    }
}

bool LiveGenerations::contains(uint64_t generation) {
    return std::binary_search(s_alive.begin(), s_alive.end(), generation);
}

void postIdle(int (*step)(void* record), void* record) {
    g_idle_add(step, record);
}

void postAsyncCall(NPP npp, void (*step)(void* record), void* record) {
    NPN_PluginThreadAsyncCall(npp, step, record);
}

void live_ref_detail::postIdleIfAlive(void* object, uint64_t generation, int (*step)(void*)) {
    postIdle(runIdle, new PostedStep<int>{{object, generation}, step});
}

void live_ref_detail::postAsyncCallIfAlive(NPP npp, void* object, uint64_t generation, void (*step)(void*)) {
    postAsyncCall(npp, runAsyncCall, new PostedStep<void>{{object, generation}, step});
}

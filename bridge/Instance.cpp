// One embedded object of the plug-in.
#include "bridge/Instance.h"

#include <algorithm>
#include <cstdlib>
#include <unordered_map>
#include <utility>

#include <glib.h>

#include "bridge/CallDepth.h"
#include "bridge/Objects.h"
#include "bridge/Page.h"

namespace bridge {

namespace {

std::unordered_map<NPP, Instance*>& instances() {
    static auto* all = new std::unordered_map<NPP, Instance*>;
    return *all;
}

// Milliseconds between two runs of a timer, at least; as with timers of script, the page is to get on beside
// it.
constexpr uint32_t kShortestInterval = 4;

uint16_t edge(int coordinate) {
    return static_cast<uint16_t>(std::clamp(coordinate, 0, static_cast<int>(UINT16_MAX)));
}

} // namespace

struct Instance::Timer {
    std::weak_ptr<Instance> instance;
    void (*function)(NPP, uint32_t);
    uint32_t id = 0;
    bool repeats;
};

std::shared_ptr<Instance> Instance::find(NPP npp) {
    const auto found = instances().find(npp);
    return found == instances().end() ? nullptr : found->second->shared_from_this();
}

Instance::Instance(Page& page, const NPPluginFuncs& calls, NPObject* element)
    : m_calls(calls), m_page(&page), m_element(retainObject(element)) {
    m_npp.ndata = this;
    instances().emplace(&m_npp, this);
}

Instance::~Instance() {
    instances().erase(&m_npp);
}

ScriptEngine* Instance::engine() const {
    return m_page ? &m_page->engine() : nullptr;
}

bool Instance::start(const std::string& mimeType, const std::vector<Parameter>& parameters) {
    std::vector<char*> names;
    std::vector<char*> values;
    for (const auto& [name, value] : parameters) {
        names.push_back(const_cast<char*>(name.c_str()));
        values.push_back(const_cast<char*>(value.c_str()));
    }
    std::string type = mimeType; // not const for the plug-in
    const CallDepth depth;
    const NPError error = m_calls.newp(type.data(), &m_npp, NP_EMBED, static_cast<int16_t>(parameters.size()),
                                       names.data(), values.data(), nullptr);
    if (m_state != State::New) { // the page has ended meanwhile
        return false;
    }
    m_state = error == NPERR_NO_ERROR ? State::Running : State::Refused;
    if (m_state == State::Refused) {
        disconnect();
    }
    return m_state == State::Running;
}

NPObject* Instance::scriptableObject() {
    NPObject* object = nullptr;
    const CallDepth depth;
    if (m_state != State::Running || !m_calls.getvalue ||
        m_calls.getvalue(&m_npp, NPPVpluginScriptableNPObject, &object) != NPERR_NO_ERROR) {
        return nullptr;
    }
    return object;
}

void Instance::setWindow(const Place& place) {
    if (m_state != State::Running || !m_page || !m_calls.setwindow) {
        return;
    }
    m_window.x = place.x;
    m_window.y = place.y;
    m_window.width = static_cast<uint32_t>(std::max(place.width, 0));
    m_window.height = static_cast<uint32_t>(std::max(place.height, 0));
    m_window.clipRect = {edge(place.clipTop), edge(place.clipLeft), edge(place.clipBottom),
                         edge(place.clipRight)};
    m_window.type = NPWindowTypeDrawable;
    const CallDepth depth;
    m_calls.setwindow(&m_npp, &m_window);
}

void Instance::disconnect() {
    const auto self = shared_from_this();
    if (Page* const page = std::exchange(m_page, nullptr)) {
        page->streams().endAll(*this);
    }
    for (const uint32_t timer : std::exchange(m_timers, {})) {
        g_source_remove(timer);
    }
    while (!m_objects.empty()) {
        (*m_objects.begin())->end();
    }
}

void Instance::end() {
    const auto self = shared_from_this();
    const State before = std::exchange(m_state, State::Ended);
    if (before == State::Ended) {
        return;
    }
    disconnect();
    if (before == State::Running) {
        const CallDepth depth;
        NPSavedData* saved = nullptr;
        m_calls.destroy(&m_npp, &saved);
        if (saved) { // for a next instance of the same page element, which never comes
            std::free(saved->buf);
            std::free(saved);
        }
    }
    dropResults();
    releaseObject(std::exchange(m_element, nullptr));
}

void Instance::dropResults() {
    while (!m_results.empty()) {
        ScriptObject& result = **m_results.begin();
        if (result.referenceCount == 1) {
            result.cutOff();
        } else {
            result.setEvaluatedFor(nullptr);
        }
    }
}

NPError Instance::setValue(NPPVariable variable) {
    switch (variable) {
    case NPPVpluginWindowBool:
    case NPPVpluginTransparentBool:
    case NPPVpluginKeepLibraryInMemory:
    case NPPVpluginUsesDOMForCursorBool:
        return NPERR_NO_ERROR;
    default:
        return NPERR_GENERIC_ERROR;
    }
}

uint32_t Instance::scheduleTimer(uint32_t milliseconds, bool repeats, void (*function)(NPP, uint32_t)) {
    if (!m_page || !function) {
        return 0;
    }
    auto* const timer = new Timer{weak_from_this(), function, 0, repeats};
    const uint32_t interval = repeats ? std::max(milliseconds, kShortestInterval) : milliseconds;
    timer->id = g_timeout_add_full(G_PRIORITY_DEFAULT, interval, onTimer, timer,
                                   [](gpointer data) { delete static_cast<Timer*>(data); });
    m_timers.insert(timer->id);
    return timer->id;
}

void Instance::unscheduleTimer(uint32_t timer) {
    if (m_timers.erase(timer) > 0) {
        g_source_remove(timer);
    }
}

int Instance::onTimer(void* data) {
    const Timer timer = *static_cast<Timer*>(data); // the call may delete the record
    const auto instance = timer.instance.lock();
    if (!instance) {
        return G_SOURCE_REMOVE;
    }
    if (!timer.repeats) {
        instance->m_timers.erase(timer.id);
    }
    const CallDepth depth;
    timer.function(instance->npp(), timer.id);
    return timer.repeats ? G_SOURCE_CONTINUE : G_SOURCE_REMOVE; // GLib runs no source that has been removed
}

} // namespace bridge

// Subscriptions and dispatch of stream events.
#include "desktop/platform/StreamEvents.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <iterator>

namespace desktop {

namespace {

uint8_t readComponentTag(const std::string& componentTag) {
    return static_cast<uint8_t>(std::strtoul(componentTag.c_str(), nullptr, 16));
}

uint16_t readEventId(const std::string& eventId) {
    const bool isHexadecimal = eventId.compare(0, 2, "0x") == 0 || eventId.compare(0, 2, "0X") == 0;
    return static_cast<uint16_t>(std::strtoul(eventId.c_str(), nullptr, isHexadecimal ? 16 : 10));
}

std::string hexadecimal(const Bytes& data) {
    std::string digits;
    for (const uint8_t byte : data) {
        char pair[3];
        std::snprintf(pair, sizeof(pair), "%02x", byte);
        digits += pair;
    }
    return digits;
}

} // namespace

void StreamEvents::subscribe(TELIX_JS_VB_HANDLE object, TELIX_JS_VB_STREAM_EVENT_CB callback,
                             const std::string& eventId, const std::string& componentTag,
                             const std::string& name) {
    std::lock_guard<std::recursive_mutex> lock(m_mutex);
    m_entries.push_back({{object, readEventId(eventId), readComponentTag(componentTag), name}, callback, -1});
}

bool StreamEvents::unsubscribe(TELIX_JS_VB_HANDLE object, TELIX_JS_VB_STREAM_EVENT_CB callback,
                               const std::string& eventId, const std::string& componentTag) {
    std::lock_guard<std::recursive_mutex> lock(m_mutex);
    const auto found = std::find_if(m_entries.begin(), m_entries.end(), [&](const Entry& each) {
        return each.object == object && each.callback == callback && each.eventId == readEventId(eventId) &&
               each.componentTag == readComponentTag(componentTag);
    });
    if (found == m_entries.end()) {
        return false;
    }
    m_entries.erase(found); // of two equal ones the other stays
    return true;
}

void StreamEvents::dispatch(TELIX_JS_VB_HANDLE object, uint8_t componentTag, const StreamEvent& event) {
    std::lock_guard<std::recursive_mutex> lock(m_mutex);
    std::vector<Entry> due;
    for (Entry& each : m_entries) {
        const bool isMeant =
            each.object == object && each.componentTag == componentTag && each.eventId == event.id;
        if (isMeant && each.lastVersion != event.version) {
            each.lastVersion = event.version;
            due.push_back(each);
        }
    }
    call(due, event.data, "trigger");
}

size_t StreamEvents::dispatchTo(const std::function<bool(const Subscription& subscription)>& isMeant,
                                const Bytes& data, const std::string& status) {
    std::lock_guard<std::recursive_mutex> lock(m_mutex);
    std::vector<Entry> due;
    std::copy_if(m_entries.begin(), m_entries.end(), std::back_inserter(due), isMeant);
    call(due, data, status);
    return due.size();
}

// With the mutex held.
void StreamEvents::call(const std::vector<Entry>& due, const Bytes& data, std::string status) {
    std::string digits = hexadecimal(data);
    for (const Entry& each : due) {
        std::string name = each.name;
        each.callback(each.object, nullptr, nullptr, reinterpret_cast<___UINT8*>(name.data()),
                      reinterpret_cast<___UINT8*>(digits.data()), static_cast<___UINT32>(digits.size()),
                      reinterpret_cast<___UINT8*>(status.data()));
    }
}

std::vector<StreamEvents::Subscription> StreamEvents::subscriptions() const {
    std::lock_guard<std::recursive_mutex> lock(m_mutex);
    return {m_entries.begin(), m_entries.end()};
}

} // namespace desktop

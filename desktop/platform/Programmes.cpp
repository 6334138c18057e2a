// The store of programmes and ratings.
#include "desktop/platform/Programmes.h"

#include <algorithm>

namespace desktop {

namespace {

constexpr size_t kMaxProgrammes = 256;

} // namespace

TELIX_JS_SI_HANDLE Programmes::add(TELIX_JS_CM_HANDLE channel, const EitEvent& event) {
    Programme programme;
    for (const EitRating& rating : event.ratings) {
        programme.ratings.push_back(addRating(rating.country, rating.value));
    }
    std::lock_guard<std::mutex> lock(m_mutex);
    const auto start = static_cast<uint32_t>(event.start);
    const auto known = std::find_if(m_programmes.begin(), m_programmes.end(), [&](const Programme& each) {
        return each.channel == channel && each.eventId == event.id && each.start == start;
    });
    if (known != m_programmes.end()) {
        return known->handle;
    }
    programme.handle = ++m_lastHandle;
    programme.channel = channel;
    programme.eventId = event.id;
    programme.name = event.name;
    programme.description = event.text;
    programme.start = start;
    programme.duration = event.duration;
    programme.channelId = std::to_string(channel);
    m_programmes.push_back(std::move(programme));
    if (m_programmes.size() > kMaxProgrammes) {
        m_programmes.pop_front();
    }
    return m_lastHandle;
}

Programme* Programmes::findLocked(TELIX_JS_SI_HANDLE handle) {
    const auto found = std::find_if(m_programmes.begin(), m_programmes.end(),
                                    [handle](const Programme& each) { return each.handle == handle; });
    return found == m_programmes.end() ? nullptr : &*found;
}

std::optional<Programme> Programmes::find(TELIX_JS_SI_HANDLE handle) const {
    std::lock_guard<std::mutex> lock(m_mutex);
    const Programme* programme = const_cast<Programmes*>(this)->findLocked(handle); // read only
    return programme ? std::optional(*programme) : std::nullopt;
}

TELIX_JS_SI_PARENTALRATING_HANDLE Programmes::addRating(const std::string& region, uint8_t rating) {
    std::lock_guard<std::mutex> lock(m_mutex);
    for (size_t index = 0; index < m_ratings.size(); ++index) {
        if (m_ratings[index].region == region && m_ratings[index].rating == rating) {
            return static_cast<TELIX_JS_SI_PARENTALRATING_HANDLE>(index + 1);
        }
    }
    m_ratings.push_back({region, rating});
    return static_cast<TELIX_JS_SI_PARENTALRATING_HANDLE>(m_ratings.size());
}

std::optional<ParentalRating> Programmes::findRating(TELIX_JS_SI_PARENTALRATING_HANDLE handle) const {
    std::lock_guard<std::mutex> lock(m_mutex);
    if (handle == 0 || handle > m_ratings.size()) {
        return std::nullopt;
    }
    return m_ratings[handle - 1];
}

} // namespace desktop

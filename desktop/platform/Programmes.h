// Programmes and parental ratings under the handles that pages hold.
#ifndef TELIX_DESKTOP_PLATFORM_PROGRAMMES_H
#define TELIX_DESKTOP_PLATFORM_PROGRAMMES_H

#include <deque>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include "desktop/platform/TsTables.h"
#include "telix/telix_platform.h"

namespace desktop {

struct Programme {
    TELIX_JS_SI_HANDLE handle = 0;
    TELIX_JS_CM_HANDLE channel = 0;
    uint16_t eventId = 0;
    std::string name;
    std::string description;
    uint32_t start = 0;    // seconds since 1970, UTC
    uint32_t duration = 0; // seconds
    std::string channelId; // the channel's handle in decimal, or what a page has set
    std::vector<TELIX_JS_SI_PARENTALRATING_HANDLE> ratings;
};

struct ParentalRating {
    std::string region; // country, three letters
    uint8_t rating = 0; // as broadcast: see kParentalRatingFirstAge

    bool isAge() const { return rating >= kParentalRatingFirstAge && rating <= kParentalRatingLastAge; }

    // The age in years, or the broadcaster's own value.
    int32_t value() const { return isAge() ? rating + kParentalRatingAgeOffset : rating; }
};

// Any thread.
class Programmes {
public:
    // The handle of a broadcast programme. The same programme has the same handle as long as it is stored.
    TELIX_JS_SI_HANDLE add(TELIX_JS_CM_HANDLE channel, const EitEvent& event);

    std::optional<Programme> find(TELIX_JS_SI_HANDLE handle) const;

    // Changes a property; false if the programme is not stored any more.
    template <typename Value>
    bool set(TELIX_JS_SI_HANDLE handle, Value Programme::*property, const Value& value) {
        std::lock_guard<std::mutex> lock(m_mutex);
        Programme* programme = findLocked(handle);
        if (programme) {
            programme->*property = value;
        }
        return programme != nullptr;
    }

    // The handle of a rating. Equal ratings have the same one.
    TELIX_JS_SI_PARENTALRATING_HANDLE addRating(const std::string& region, uint8_t rating);
    std::optional<ParentalRating> findRating(TELIX_JS_SI_PARENTALRATING_HANDLE handle) const;

private:
    Programme* findLocked(TELIX_JS_SI_HANDLE handle);

    mutable std::mutex m_mutex;         // guards everything
    std::deque<Programme> m_programmes; // the newest last; the oldest ones are dropped
    TELIX_JS_SI_HANDLE m_lastHandle = 0;
    std::vector<ParentalRating> m_ratings; // by handle - 1
};

} // namespace desktop

#endif

// Programmes and parental ratings under the handles that pages hold.
#ifndef TELIX_DESKTOP_PROGRAMMES_H
#define TELIX_DESKTOP_PROGRAMMES_H

#include "desktop/platform/TsTables.h"
#include "telix/telix_platform.h"

#include <deque>
#include <map>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

namespace desktop {

struct Programme {
    TELIX_JS_SI_HANDLE handle = 0;
    TELIX_JS_CM_HANDLE channel = 0;
    uint16_t eventId = 0;
    std::string name;
    std::string description;
    uint32_t start = 0; // seconds since 1970
    uint32_t duration = 0;
    std::string channelId; // the channel's handle in decimal, unless a page wrote another text
    std::vector<TELIX_JS_SI_PARENTALRATING_HANDLE> ratings;
};

struct ParentalRating {
    std::string region;    // country, three letters
    uint8_t broadcast = 0; // as in EitRating

    bool isAge() const { return broadcast >= 1 && broadcast <= 15; }
    int32_t value() const {
        return isAge() ? broadcast + 3 : broadcast;
    } // the age, or the broadcaster's number
};

// Any thread.
class Programmes {
public:
    // The handle of a broadcast programme; the same one as long as it is remembered.
    TELIX_JS_SI_HANDLE add(TELIX_JS_CM_HANDLE channel, const EitEvent& event);

    std::optional<Programme> find(TELIX_JS_SI_HANDLE handle) const;

    // Writes one property that a page has set; false if the programme has gone.
    template <typename Value>
    bool set(TELIX_JS_SI_HANDLE handle, Value Programme::*property, const Value& value) {
        std::lock_guard<std::mutex> lock(m_mutex);
        Programme* programme = findLocked(handle);
        if (programme) {
            programme->*property = value;
        }
        return programme != nullptr;
    }

    // The handle of a rating, the same one for equal ratings.
    TELIX_JS_SI_PARENTALRATING_HANDLE addRating(const std::string& region, uint8_t broadcast);
    std::optional<ParentalRating> findRating(TELIX_JS_SI_PARENTALRATING_HANDLE handle) const;

private:
    Programme* findLocked(TELIX_JS_SI_HANDLE handle);

    mutable std::mutex m_mutex;
    std::deque<Programme> m_programmes; // the newest ones
    TELIX_JS_SI_HANDLE m_lastHandle = 0;
    std::vector<ParentalRating> m_ratings; // the handle is the index and 1
};

} // namespace desktop

#endif

// Watches the parental rating of the present programme, and reports its changes.
#ifndef TELIX_DESKTOP_PLATFORM_RATINGMONITOR_H
#define TELIX_DESKTOP_PLATFORM_RATINGMONITOR_H

#include <optional>

#include "desktop/platform/BroadcastCallbacks.h"
#include "desktop/platform/Programmes.h"

namespace desktop {

// Platform thread.
class RatingMonitor {
public:
    // Both must outlive the monitor.
    RatingMonitor(const Programmes& programmes, const BroadcastCallbacks& callbacks);

    // The present programme has this rating; 0: none. Reports to `owner` if it differs from the one before;
    // the first one of a service if there is a rating.
    void update(TELIX_JS_VB_HANDLE owner, TELIX_JS_SI_PARENTALRATING_HANDLE rating);

    // Reports the rating also if it is the same as before.
    void force(TELIX_JS_VB_HANDLE owner, TELIX_JS_SI_PARENTALRATING_HANDLE rating);

    // The service is not presented any more.
    void reset() { m_lastRating.reset(); }

private:
    void report(TELIX_JS_VB_HANDLE owner, TELIX_JS_SI_PARENTALRATING_HANDLE rating) const;

    const Programmes& m_programmes;
    const BroadcastCallbacks& m_callbacks;
    std::optional<TELIX_JS_SI_PARENTALRATING_HANDLE> m_lastRating; // nothing: no programme yet
};

} // namespace desktop

#endif

// The present and the following programme of the service that is presented, from its EIT present/following.
#ifndef TELIX_DESKTOP_PLATFORM_PRESENTFOLLOWING_H
#define TELIX_DESKTOP_PLATFORM_PRESENTFOLLOWING_H

#include <vector>

#include "desktop/platform/BroadcastCallbacks.h"
#include "desktop/platform/Platform.h"
#include "desktop/platform/Programmes.h"
#include "desktop/platform/RatingMonitor.h"
#include "desktop/platform/TunerArbiter.h"

namespace desktop {

// Platform::mutex() guards all data. Functions whose name ends in Locked need it held; all others take it
// themselves.
class PresentFollowing {
public:
    // All must outlive this object. `ratings` is updated with the present programme.
    PresentFollowing(Programmes& programmes, const TunerArbiter& arbiter, RatingMonitor& ratings,
                     const BroadcastCallbacks& callbacks);

    // Platform thread.
    void onEit(TELIX_JS_CM_HANDLE channel, const Eit& eit);

    // Another object presents the service: what is known is reported to it. Platform thread.
    void repeat() const;

    // The service is not presented any more.
    void clearLocked();

    // The present one first; one of them or both may be missing. Any thread.
    std::vector<TELIX_JS_SI_HANDLE> handles() const;

    TELIX_JS_SI_HANDLE presentLocked() const { return m_present; }     // 0: none
    TELIX_JS_SI_HANDLE followingLocked() const { return m_following; } // 0: none

private:
    void updateRating(TELIX_JS_VB_HANDLE owner, TELIX_JS_SI_HANDLE present) const;

    Platform& m_platform;
    Programmes& m_programmes;
    const TunerArbiter& m_arbiter;
    RatingMonitor& m_ratings;
    const BroadcastCallbacks& m_callbacks;

    // Guarded by Platform::mutex().
    TELIX_JS_SI_HANDLE m_present = 0;
    TELIX_JS_SI_HANDLE m_following = 0;
};

} // namespace desktop

#endif

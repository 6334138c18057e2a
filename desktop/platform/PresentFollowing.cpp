// Changes of the present and the following programme.
#include "desktop/platform/PresentFollowing.h"

#include <mutex>

namespace desktop {

PresentFollowing::PresentFollowing(Programmes& programmes, const TunerArbiter& arbiter,
                                   RatingMonitor& ratings, const BroadcastCallbacks& callbacks)
    : m_platform(Platform::instance()), m_programmes(programmes), m_arbiter(arbiter), m_ratings(ratings),
      m_callbacks(callbacks) {}

void PresentFollowing::onEit(TELIX_JS_CM_HANDLE channel, const Eit& eit) {
    if (eit.sectionNumber > kEitSectionFollowing) {
        return;
    }
    const bool isPresent = eit.sectionNumber == kEitSectionPresent;
    const TELIX_JS_VB_HANDLE owner = m_arbiter.owner();
    const TELIX_JS_SI_HANDLE programme =
        eit.events.empty() ? 0 : m_programmes.add(channel, eit.events.front());
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        TELIX_JS_SI_HANDLE& slot = isPresent ? m_present : m_following;
        if (slot == programme) {
            return;
        }
        slot = programme;
    }
    if (owner == 0) {
        return; // presented by the set itself: there is nobody to report to
    }
    m_callbacks.onProgrammes.call(owner);
    if (isPresent) {
        updateRating(owner, programme);
    }
}

void PresentFollowing::repeat() const {
    const TELIX_JS_VB_HANDLE owner = m_arbiter.owner();
    TELIX_JS_SI_HANDLE present = 0;
    TELIX_JS_SI_HANDLE following = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        present = m_present;
        following = m_following;
    }
    if (owner == 0 || (present == 0 && following == 0)) {
        return;
    }
    m_callbacks.onProgrammes.call(owner);
    updateRating(owner, present);
}

void PresentFollowing::updateRating(TELIX_JS_VB_HANDLE owner, TELIX_JS_SI_HANDLE present) const {
    const auto found = m_programmes.find(present);
    m_ratings.update(owner, found && !found->ratings.empty() ? found->ratings.front() : 0);
}

void PresentFollowing::clearLocked() {
    m_present = 0;
    m_following = 0;
}

std::vector<TELIX_JS_SI_HANDLE> PresentFollowing::handles() const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    std::vector<TELIX_JS_SI_HANDLE> handles;
    for (const TELIX_JS_SI_HANDLE handle : {m_present, m_following}) {
        if (handle != 0) {
            handles.push_back(handle);
        }
    }
    return handles;
}

} // namespace desktop

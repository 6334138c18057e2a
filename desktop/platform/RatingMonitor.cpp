// Changes of the parental rating.
#include "desktop/platform/RatingMonitor.h"

namespace desktop {

RatingMonitor::RatingMonitor(const Programmes& programmes, const BroadcastCallbacks& callbacks)
    : m_programmes(programmes), m_callbacks(callbacks) {}

void RatingMonitor::update(TELIX_JS_VB_HANDLE owner, TELIX_JS_SI_PARENTALRATING_HANDLE rating) {
    const bool hasChanged = rating != m_lastRating.value_or(0);
    m_lastRating = rating;
    if (hasChanged) {
        report(owner, rating);
    }
}

void RatingMonitor::force(TELIX_JS_VB_HANDLE owner, TELIX_JS_SI_PARENTALRATING_HANDLE rating) {
    m_lastRating = rating;
    report(owner, rating);
}

// A receiver cannot interpret a rating of the broadcaster's own: that is an error.
void RatingMonitor::report(TELIX_JS_VB_HANDLE owner, TELIX_JS_SI_PARENTALRATING_HANDLE rating) const {
    const auto found = m_programmes.findRating(rating);
    const bool isError = found && !found->isAge();
    (isError ? m_callbacks.onRatingError : m_callbacks.onRatingChange)
        .call(owner, static_cast<___UINT8*>(nullptr), rating, static_cast<___UINT8*>(nullptr));
}

} // namespace desktop

// Injected errors and events.
#include "desktop/platform/FaultInjection.h"

#include <mutex>

#include "desktop/platform/Broadcast.h"

namespace desktop {

FaultInjection::FaultInjection(Broadcast& broadcast)
    : m_broadcast(broadcast), m_platform(Platform::instance()) {}

bool FaultInjection::channelError(TELIX_ERR_STATE_ENUM_T error) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const TELIX_JS_VB_HANDLE owner = m_broadcast.arbiter().ownerLocked();
    if (owner == 0) {
        return false;
    }
    m_platform.post([this, owner, channel = m_broadcast.arbiter().currentChannelLocked(), error] {
        m_broadcast.callbacks().onChannelError.call(owner, channel, error);
    });
    return true;
}

bool FaultInjection::rating(const std::string& region, uint8_t rating) {
    const TELIX_JS_SI_PARENTALRATING_HANDLE handle =
        rating == 0 ? 0 : m_broadcast.programmes().addRating(region, rating);
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    if (m_broadcast.arbiter().ownerLocked() == 0) {
        return false;
    }
    m_platform.post([this, handle] { m_broadcast.ratings().force(m_broadcast.arbiter().owner(), handle); });
    return true;
}

bool FaultInjection::ratingError(std::string contentId, std::string drmSystemId) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const TELIX_JS_VB_HANDLE owner = m_broadcast.arbiter().ownerLocked();
    if (owner == 0) {
        return false;
    }
    m_platform.post([this, owner, contentId, drmSystemId]() mutable {
        m_broadcast.callbacks().onRatingError.call(owner, reinterpret_cast<___UINT8*>(contentId.data()),
                                                   TELIX_JS_SI_PARENTALRATING_HANDLE{0},
                                                   reinterpret_cast<___UINT8*>(drmSystemId.data()));
    });
    return true;
}

size_t FaultInjection::streamEvent(const Event& event) {
    const auto isMeant = [&](const StreamEvents::Subscription& each) {
        return event.id.value_or(each.eventId) == each.eventId &&
               event.componentTag.value_or(each.componentTag) == each.componentTag &&
               event.name.value_or(each.name) == each.name;
    };
    return m_broadcast.streamEvents().dispatchTo(isMeant, event.data, event.status);
}

bool FaultInjection::fullScreen(bool isFullScreen) {
    const TELIX_JS_VB_HANDLE owner = m_broadcast.arbiter().owner();
    const auto change = [=](Picture::View& view) { view.fullScreen = isFullScreen; };
    if (owner == 0 || !m_broadcast.changeView(owner, change)) {
        return false;
    }
    m_platform.post([this, owner] { m_broadcast.callbacks().onFullScreen.call(owner); });
    return true;
}

} // namespace desktop

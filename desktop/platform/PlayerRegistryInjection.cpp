// What the control tool injects in the place of the pipeline.
#include "desktop/platform/PlayerRegistry.h"

namespace desktop {

TELIX_JS_AV_HANDLE PlayerRegistry::injectionTargetLocked() const {
    const TELIX_JS_AV_HANDLE player = m_owner != 0 ? m_owner : m_lastOwner;
    return findLocked(player) ? player : 0;
}

bool PlayerRegistry::injectMessage(TELIX_AV_CB_MSG message) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const TELIX_JS_AV_HANDLE player = injectionTargetLocked();
    if (player == 0) {
        return false;
    }
    // Without a separator: the plug-in is to see exactly what is injected.
    m_platform.post([this, player, message] {
        m_lastMessage = message;
        if (const auto callbacks = callbacksOf(player)) {
            callbacks->message.call(player, message);
        }
    });
    return true;
}

bool PlayerRegistry::injectRightsError(TELIX_AV_DRM_ERR_STATE_ENUM_T state, const std::string& contentId,
                                       const std::string& drmSystemId, const std::string& rightsIssuerUrl) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const TELIX_JS_AV_HANDLE player = injectionTargetLocked();
    if (player == 0) {
        return false;
    }
    m_platform.post(
        [this, player, state, content = contentId, system = drmSystemId, url = rightsIssuerUrl]() mutable {
            if (const auto callbacks = callbacksOf(player)) {
                callbacks->rights.call(player, state, reinterpret_cast<___UINT8*>(content.data()),
                                       reinterpret_cast<___UINT8*>(system.data()),
                                       reinterpret_cast<___UINT8*>(url.data()));
            }
        });
    return true;
}

bool PlayerRegistry::injectBuffered(std::optional<uint32_t> raw) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    m_injectedBuffered = raw;
    return true;
}

} // namespace desktop

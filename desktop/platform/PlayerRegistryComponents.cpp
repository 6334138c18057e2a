// The components of the media that plays, and the selection of pages.
#include "desktop/platform/PlayerRegistry.h"

#include <array>

namespace desktop {

void PlayerRegistry::setComponentsLocked(Entry& entry, const std::vector<MediaPipeline::Stream>& streams) {
    entry.components.clear();
    for (const MediaPipeline::Stream& stream : streams) {
        const TELIX_JS_AVCOMPHANDLE handle = m_components.intern({stream, m_owner, entry.url});
        entry.components.add(handle, m_components.share(handle));
    }
    entry.components.selectDefaults(m_platform.configuration().audioLanguage);
}

std::optional<std::vector<TELIX_JS_AVCOMPHANDLE>>
PlayerRegistry::components(TELIX_JS_AV_HANDLE player, TELIX_JS_AVCOMPTYPE type, bool activeOnly) const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const Entry* entry = findLocked(player);
    if (!entry || !hasPrerolled(*entry)) {
        return std::nullopt;
    }
    return entry->components.list(type, activeOnly);
}

std::optional<ComponentTraits> PlayerRegistry::findComponent(TELIX_JS_AVCOMPHANDLE component,
                                                             TELIX_JS_AVCOMPTYPE type) const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const Component* found = m_components.find(component, type);
    return found ? std::optional<ComponentTraits>(*found) : std::nullopt;
}

bool PlayerRegistry::selectComponent(TELIX_JS_AV_HANDLE player, TELIX_JS_AVCOMPHANDLE component,
                                     TELIX_JS_AVCOMPTYPE type, bool isActive) {
    return apply(
        player, [=](Entry& entry) { return entry.components.select(component, type, isActive); },
        [this](MediaPipeline&) { applySelection(); });
}

// Platform thread. Video that is not selected is hidden, not stopped: it can be shown again without a gap.
void PlayerRegistry::applySelection() {
    std::array<std::optional<int>, ComponentSelection::kTypeCount> streams;
    bool hasVideo = false;
    Picture::Token token = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        const Entry* entry = findLocked(m_owner);
        if (!m_pipeline || m_pipelineSession != m_session || !entry) {
            return;
        }
        for (TELIX_JS_AVCOMPTYPE type = 0; type < streams.size(); ++type) {
            if (const TELIX_JS_AVCOMPHANDLE handle = entry->components.active(type)) {
                streams[type] = m_components.at(handle).number;
            }
        }
        hasVideo = !entry->components.list(TELIX_JS_AVCOMPTYPE_VIDEO, false).empty();
        token = m_token;
    }
    m_pipeline->selectAudio(streams[TELIX_JS_AVCOMPTYPE_AUDIO]);
    m_pipeline->selectSubtitle(streams[TELIX_JS_AVCOMPTYPE_SUBTITLE]);
    m_platform.picture().setHidden(token, hasVideo && !streams[TELIX_JS_AVCOMPTYPE_VIDEO]);
}

} // namespace desktop

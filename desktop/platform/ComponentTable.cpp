// The active component of each type: defaults and selection.
#include "desktop/platform/ComponentTable.h"

#include <utility>

namespace desktop {

void ComponentSelection::clear() {
    m_available.clear();
    m_active = {};
}

void ComponentSelection::add(TELIX_JS_AVCOMPHANDLE handle, std::shared_ptr<const ComponentTraits> traits) {
    m_available.push_back({handle, std::move(traits)});
}

void ComponentSelection::selectDefaults(const std::string& audioLanguage) {
    m_active = {};
    for (const TELIX_JS_AVCOMPTYPE type : {TELIX_JS_AVCOMPTYPE_VIDEO, TELIX_JS_AVCOMPTYPE_AUDIO}) {
        const auto handles = list(type, false);
        m_active[type] = handles.empty() ? 0 : handles.front();
    }
    for (const Available& each : m_available) {
        const bool isForEverybody = !each.traits->isAudioDescription && !each.traits->isForHearingImpaired;
        if (each.traits->type == TELIX_JS_AVCOMPTYPE_AUDIO && isForEverybody &&
            each.traits->language == audioLanguage) {
            m_active[TELIX_JS_AVCOMPTYPE_AUDIO] = each.handle;
            break;
        }
    }
}

std::vector<TELIX_JS_AVCOMPHANDLE> ComponentSelection::list(TELIX_JS_AVCOMPTYPE type, bool activeOnly) const {
    std::vector<TELIX_JS_AVCOMPHANDLE> handles;
    for (const Available& each : m_available) {
        if (each.traits->type == type && (!activeOnly || m_active[type] == each.handle)) {
            handles.push_back(each.handle);
        }
    }
    return handles;
}

bool ComponentSelection::select(TELIX_JS_AVCOMPHANDLE handle, TELIX_JS_AVCOMPTYPE type, bool isActive) {
    const bool isAvailable = std::any_of(m_available.begin(), m_available.end(), [&](const Available& each) {
        return each.handle == handle && each.traits->type == type;
    });
    if (!isAvailable) {
        return false;
    }
    if (isActive) {
        m_active[type] = handle;
    } else if (m_active[type] == handle) {
        m_active[type] = 0;
    }
    return true;
}

} // namespace desktop

// Components (video, audio and subtitle streams) that the plug-in knows by handle. Broadcast and the players
// have one table each, and one selection for each piece of media that they present.
//
// No class here has a lock of its own: the calls of the plug-in read both at any time, so they belong to what
// the platform's mutex guards. The caller of every function holds it.
#ifndef TELIX_DESKTOP_PLATFORM_COMPONENTTABLE_H
#define TELIX_DESKTOP_PLATFORM_COMPONENTTABLE_H

#include <algorithm>
#include <array>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "desktop/platform/ComponentTraits.h"

namespace desktop {

// Components by handle. A handle outlives the presentation of its component, because the plug-in keeps
// handles of media that is not presented any more; equal components have the same handle, because pages
// compare them. `Component` is derived from ComponentTraits; its operator== says what a page takes for equal.
// What a broadcast or a page makes is without end, so of the components in no selection only the last
// kMaxComponents are kept. A handle is not given to another component.
template <typename Component>
class ComponentTable {
public:
    static constexpr size_t kMaxComponents = 1024;

    // The handle of `component`, which is added if the table has no equal one. Never 0.
    TELIX_JS_AVCOMPHANDLE intern(const Component& component) {
        const auto found = std::find_if(m_components.begin(), m_components.end(),
                                        [&](const auto& each) { return *each.second == component; });
        if (found != m_components.end()) {
            return found->first;
        }
        forgetTheOldest();
        m_components.emplace_hint(m_components.end(), ++m_lastHandle, std::make_shared<Component>(component));
        return m_lastHandle;
    }

    // For a handle from the plug-in: null if no component of this type has it. Valid until the next intern().
    const Component* find(TELIX_JS_AVCOMPHANDLE handle, TELIX_JS_AVCOMPTYPE type) const {
        const auto found = m_components.find(handle);
        return found != m_components.end() && found->second->type == type ? found->second.get() : nullptr;
    }

    // For a handle from the last intern(), or in a selection: what a selection takes, and so keeps in the
    // table.
    std::shared_ptr<const Component> share(TELIX_JS_AVCOMPHANDLE handle) const {
        return m_components.at(handle);
    }

    // For such a handle. The reference stays valid while a selection has the component.
    const Component& at(TELIX_JS_AVCOMPHANDLE handle) const { return *m_components.at(handle); }
    Component& at(TELIX_JS_AVCOMPHANDLE handle) { return *m_components.at(handle); }

private:
    // Makes room for one, unless selections have all of them.
    void forgetTheOldest() {
        if (m_components.size() < kMaxComponents) {
            return;
        }
        const auto oldest = std::find_if(m_components.begin(), m_components.end(),
                                         [](const auto& each) { return each.second.use_count() == 1; });
        if (oldest != m_components.end()) {
            m_components.erase(oldest);
        }
    }

    std::map<TELIX_JS_AVCOMPHANDLE, std::shared_ptr<Component>> m_components; // the oldest first
    TELIX_JS_AVCOMPHANDLE m_lastHandle = 0;
};

// The components of one piece of media: which are available, and of each type the active one.
class ComponentSelection {
public:
    static constexpr size_t kTypeCount = 3; // TELIX_JS_AVCOMPTYPE counts from 0

    struct Available {
        TELIX_JS_AVCOMPHANDLE handle;
        std::shared_ptr<const ComponentTraits> traits; // shared with the table
    };

    void clear();

    // `traits` are what the table shares. The component is not active yet.
    void add(TELIX_JS_AVCOMPHANDLE handle, std::shared_ptr<const ComponentTraits> traits);

    // Activates the first video, and the first audio in the language (ISO 639-2) that is made for everybody,
    // or else the first audio. Subtitles are off until a page selects them.
    void selectDefaults(const std::string& audioLanguage);

    // In the order in which they were added; a type that does not exist has none.
    std::vector<TELIX_JS_AVCOMPHANDLE> list(TELIX_JS_AVCOMPTYPE type, bool activeOnly) const;

    // Activates a component instead of the active one of its type, or deactivates it. False if it is not
    // available as one of this type.
    bool select(TELIX_JS_AVCOMPHANDLE handle, TELIX_JS_AVCOMPTYPE type, bool isActive);

    // 0 if none is active. `type` is one that exists.
    TELIX_JS_AVCOMPHANDLE active(TELIX_JS_AVCOMPTYPE type) const { return m_active[type]; }

    const std::vector<Available>& available() const { return m_available; }

private:
    std::vector<Available> m_available;
    std::array<TELIX_JS_AVCOMPHANDLE, kTypeCount> m_active{};
};

} // namespace desktop

#endif

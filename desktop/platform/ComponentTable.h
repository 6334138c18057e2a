// Components (video, audio and subtitle streams) that the plug-in knows by handle. Broadcast and the players
// have one table each, and one selection for each piece of media that they present.
//
// No class here has a lock of its own: the calls of the plug-in read both at any time, so they belong to what
// the platform's mutex guards. The caller of every function holds it.
#ifndef TELIX_DESKTOP_PLATFORM_COMPONENTTABLE_H
#define TELIX_DESKTOP_PLATFORM_COMPONENTTABLE_H

#include <algorithm>
#include <array>
#include <deque>
#include <string>
#include <vector>

#include "desktop/platform/ComponentTraits.h"

namespace desktop {

// Every component there ever was. A handle is valid for the life of the process, because the plug-in keeps
// handles of media that is not presented any more; equal components have the same handle, because pages
// compare them. `Component` is derived from ComponentTraits; its operator== says what a page takes for equal.
template <typename Component>
class ComponentTable {
public:
    // The handle of `component`, which is added if the table has no equal one. Never 0.
    TELIX_JS_AVCOMPHANDLE intern(const Component& component) {
        const auto found = std::find(m_components.begin(), m_components.end(), component);
        const auto index = found - m_components.begin();
        if (found == m_components.end()) {
            m_components.push_back(component);
        }
        return static_cast<TELIX_JS_AVCOMPHANDLE>(index + 1);
    }

    // For a handle from the plug-in: null if no component of this type has it.
    const Component* find(TELIX_JS_AVCOMPHANDLE handle, TELIX_JS_AVCOMPTYPE type) const {
        const bool isValid = handle != 0 && handle <= m_components.size() && at(handle).type == type;
        return isValid ? &at(handle) : nullptr;
    }

    // For a handle from intern(). The reference stays valid.
    const Component& at(TELIX_JS_AVCOMPHANDLE handle) const { return m_components[handle - 1]; }
    Component& at(TELIX_JS_AVCOMPHANDLE handle) { return m_components[handle - 1]; }

private:
    std::deque<Component> m_components; // by handle - 1; a deque, because it never moves its elements
};

// The components of one piece of media: which are available, and of each type the active one.
class ComponentSelection {
public:
    static constexpr size_t kTypeCount = 3; // TELIX_JS_AVCOMPTYPE counts from 0

    struct Available {
        TELIX_JS_AVCOMPHANDLE handle;
        const ComponentTraits* traits; // in the table
    };

    void clear();

    // `traits` belong to the table, which keeps them. The component is not active yet.
    void add(TELIX_JS_AVCOMPHANDLE handle, const ComponentTraits& traits);

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

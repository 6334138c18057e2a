// An ordered collection of script objects of one wrapper class, for the models behind the list classes.
// Browser thread only.
#ifndef TELIX_COMMON_SCRIPTOBJECTLIST_H
#define TELIX_COMMON_SCRIPTOBJECTLIST_H

#include <algorithm>
#include <cstdint>
#include <vector>

#include "common/ScriptReferences.h"

template <class Wrapper>
class ScriptObjectList {
public:
    ScriptObjectList() = default;
    ScriptObjectList(const ScriptObjectList&) = delete;
    ScriptObjectList& operator=(const ScriptObjectList&) = delete;

    // Gives the list's own references back, the last entry first.
    ~ScriptObjectList() {
        for (size_t i = reach(); i > 0; --i) {
            releaseHeld(m_objects[i - 1]);
        }
    }

    // How many entries count.
    uint32_t length() const { return m_length; }
    void setLength(uint32_t length) { m_length = length; }

    // Appends a new object, without a change of the length. A browser that refuses is asked until it yields:
    // an entry must not be skipped, or the indexes would no longer be those of the platform.
    Wrapper& add(NPP npp) {
        NPObject* object = nullptr;
        while (!object) {
            object = createScriptObject<Wrapper>(npp);
        }
        // Two references from the outset. The list gives one back at its end and never the one of the
        // creation, so an entry outlives its list.
        m_objects.push_back(handOut(object));
        return *wrapperOf<Wrapper>(object);
    }

    // Adds objects until the list counts `count` of them; `fill(wrapper, index)` completes each.
    template <class Fill>
    void fillUpTo(uint32_t count, NPP npp, Fill fill) {
        while (m_length < count) {
            fill(add(npp), m_length);
            ++m_length;
        }
    }

    // The entry with one reference added for the caller; null beyond the end.
    NPObject* item(uint32_t index) const { return index < reach() ? handOut(m_objects[index]) : nullptr; }

    // The wrapper of an entry, which stays the list's; `index` is below the length.
    Wrapper& wrapperAt(uint32_t index) const { return *wrapperOf<Wrapper>(m_objects[index]); }

    // The first entry whose model passes `test`, with one reference added for the caller; null if none does.
    template <class Test>
    NPObject* find(Test test) const {
        const auto end = m_objects.begin() + static_cast<std::ptrdiff_t>(reach());
        const auto found = std::find_if(m_objects.begin(), end, [&test](NPObject* object) {
            return test(*wrapperOf<Wrapper>(object)->impl());
        });
        return found == end ? nullptr : handOut(*found);
    }

private:
    // The entries that count and are there: while a list fills, its length may run ahead.
    size_t reach() const { return std::min<size_t>(m_length, m_objects.size()); }

    std::vector<NPObject*> m_objects;
    uint32_t m_length = 0;
};

#endif

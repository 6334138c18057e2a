// The list of live video/broadcast objects: publishing it to platform threads and clearing up behind.
#include "src/videobroadcast/InstanceList.h"

#include <glib.h>

#include <thread>

InstanceList::~InstanceList() {
    if (m_sweepSource) {
        g_source_remove(m_sweepSource);
    }
    m_replaced.emplace_back(m_published.exchange(nullptr));
    // Whoever looks something up from here on finds an empty list; the last look-up before is over in no
    // time.
    while (m_readers.load() != 0) {
        std::this_thread::yield();
    }
}

VideoBroadcast* InstanceList::find(unsigned int handle) const {
    // Counted in before the copy is taken up: a sweep that counts nobody knows that whoever comes later finds
    // a newer copy than those that it frees.
    m_readers.fetch_add(1);
    VideoBroadcast* found = nullptr;
    if (const Handles* published = m_published.load()) {
        for (const auto& [instance, held] : *published) {
            if (held == handle) {
                found = instance;
                break;
            }
        }
    }
    m_readers.fetch_sub(1);
    return found;
}

void InstanceList::set(VideoBroadcast* instance, unsigned int handle) {
    m_handles[instance] = handle;
    publish();
}

bool InstanceList::erase(VideoBroadcast* instance) {
    if (m_handles.erase(instance) == 0) {
        return false;
    }
    publish();
    return true;
}

unsigned int InstanceList::handleOf(VideoBroadcast* instance) const {
    const auto entry = m_handles.find(instance);
    return entry == m_handles.end() ? 0 : entry->second;
}

void InstanceList::publish() {
    const Handles* replaced = m_published.exchange(new Handles(m_handles));
    if (!replaced) {
        return;
    }
    m_replaced.emplace_back(replaced);
    if (!m_sweepSource) {
        m_sweepSource = g_timeout_add(
            m_grace, [](gpointer list) -> gboolean { return static_cast<InstanceList*>(list)->sweep(); },
            this);
    }
}

bool InstanceList::sweep() {
    if (m_readers.load() == 0) {
        // What is freed has seen a whole turn go by.
        m_aged.clear();
        m_aged.swap(m_replaced);
    }
    if (copiesHeldBack() != 0) {
        return true;
    }
    m_sweepSource = 0;
    return false;
}

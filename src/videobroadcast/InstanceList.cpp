// The list of live video/broadcast objects: publishing it to platform threads, and freeing what is replaced.
#include "src/videobroadcast/InstanceList.h"

#include <glib.h>

#include <thread>

InstanceList::~InstanceList() {
    if (m_sweepSource) {
        g_source_remove(m_sweepSource);
    }
    m_replaced.emplace_back(m_published.exchange(nullptr));
    // Whoever looks something up from here on finds an empty list; the last look-up before that ends at once.
    while (m_readers.load() != 0) {
        std::this_thread::yield();
    }
}

LiveRef<VideoBroadcast> InstanceList::find(unsigned int handle) const {
    // Counted in before the copy is taken up: a sweep that counts no reader knows that a later reader finds a
    // newer copy than those that it frees.
    m_readers.fetch_add(1);
    LiveRef<VideoBroadcast> found;
    if (const Entries* published = m_published.load()) {
        for (const auto& [address, entry] : *published) {
            if (entry.handle == handle) {
                found = entry.instance;
                break;
            }
        }
    }
    m_readers.fetch_sub(1);
    return found;
}

void InstanceList::set(LiveRef<VideoBroadcast> instance, unsigned int handle) {
    m_entries[instance.address()] = {instance, handle};
    publish();
}

bool InstanceList::erase(VideoBroadcast* instance) {
    if (m_entries.erase(instance) == 0) {
        return false;
    }
    publish();
    return true;
}

unsigned int InstanceList::handleOf(VideoBroadcast* instance) const {
    const auto entry = m_entries.find(instance);
    return entry == m_entries.end() ? 0 : entry->second.handle;
}

void InstanceList::publish() {
    const Entries* replaced = m_published.exchange(new Entries(m_entries));
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

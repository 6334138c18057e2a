// The volume of the set.
#include "desktop/platform/OutputVolume.h"

namespace desktop {

OutputVolume& OutputVolume::instance() {
    static auto* volume = new OutputVolume; // kept until the process ends, as the pipelines are
    return *volume;
}

void OutputVolume::set(uint32_t volume) {
    std::lock_guard<std::mutex> lock(m_mutex);
    m_volume = static_cast<double>(volume) / kMaxVolume;
    for (const auto& [element, ownVolume] : m_elements) {
        g_object_set(element, "volume", ownVolume * m_volume, nullptr);
    }
}

void OutputVolume::apply(GstElement* element, double ownVolume) {
    std::lock_guard<std::mutex> lock(m_mutex);
    m_elements[element] = ownVolume;
    g_object_set(element, "volume", ownVolume * m_volume, nullptr);
}

void OutputVolume::remove(GstElement* element) {
    std::lock_guard<std::mutex> lock(m_mutex);
    m_elements.erase(element);
}

} // namespace desktop

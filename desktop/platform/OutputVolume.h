// The volume of the set, by which that of each sound is multiplied.
#ifndef TELIX_DESKTOP_PLATFORM_OUTPUTVOLUME_H
#define TELIX_DESKTOP_PLATFORM_OUTPUTVOLUME_H

#include <gst/gst.h>

#include <cstdint>
#include <map>
#include <mutex>

namespace desktop {

constexpr uint32_t kMaxVolume = 100;

// Any thread.
class OutputVolume {
public:
    static OutputVolume& instance();

    // 0 to kMaxVolume, which it is at first.
    void set(uint32_t volume);

    // Gives an element with the property "volume" its own volume (1 is full) times that of the set, also when
    // that changes, until remove(), which must come before the element is unreferenced.
    void apply(GstElement* element, double ownVolume);
    void remove(GstElement* element);

private:
    std::mutex m_mutex; // guards what follows; held while properties are set
    double m_volume = 1;
    std::map<GstElement*, double> m_elements;
};

} // namespace desktop

#endif

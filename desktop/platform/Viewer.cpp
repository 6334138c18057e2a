// What the viewer's remote control needs of the library.
#include <algorithm>
#include <cstdio>

#include "desktop/platform/Broadcast.h"
#include "desktop/platform/Device.h"
#include "desktop/platform/OutputVolume.h"
#include "desktop/platform/Utf8.h"
#include "desktop/platform/telix_viewer.h"

using desktop::Broadcast;

uint32_t telix_desktop_key_set() {
    return desktop::Device::instance().keySet();
}

uint32_t telix_desktop_channel() {
    const auto& list = Broadcast::instance().channels().list();
    const auto found = std::find(list.begin(), list.end(), Broadcast::instance().arbiter().currentChannel());
    return found == list.end() ? 0 : static_cast<uint32_t>(found - list.begin() + 1);
}

uint32_t telix_desktop_channel_count() {
    return static_cast<uint32_t>(Broadcast::instance().channels().list().size());
}

uint8_t telix_desktop_tune(uint32_t number) {
    const auto& list = Broadcast::instance().channels().list();
    return number > 0 && number <= list.size() && Broadcast::instance().arbiter().zap(list[number - 1]) ? 1
                                                                                                        : 0;
}

size_t telix_desktop_channel_name(uint32_t number, char* name, size_t size) {
    const auto& channels = Broadcast::instance().channels();
    const auto& list = channels.list();
    const auto channel = number > 0 && number <= list.size() ? channels.find(list[number - 1]) : std::nullopt;
    const std::string text = channel ? channel->name : std::string();
    if (size > 0) {
        std::snprintf(name, size, "%s", desktop::truncateUtf8(text, size - 1).c_str());
    }
    return text.size();
}

void telix_desktop_present_channel() {
    Broadcast::instance().presentInBackground();
}

void telix_desktop_set_volume(uint32_t volume) {
    desktop::OutputVolume::instance().set(std::min(volume, desktop::kMaxVolume));
}

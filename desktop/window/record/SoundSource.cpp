// The sound of the platform library that the plug-in has loaded.
#include "desktop/window/record/SoundSource.h"

#include <utility>

namespace desktop {

SoundSource::SoundSource(Listener listener)
    : m_listener(std::move(listener)), m_search([this] { return find(); }) {}

SoundSource::~SoundSource() {
    if (m_setListener) {
        m_setListener(nullptr, nullptr);
    }
}

bool SoundSource::find() {
    if (!m_library.find()) {
        return false;
    }
    if (m_library.bind("telix_desktop_set_sound_listener", m_setListener)) {
        m_setListener([](const telix_desktop_sound* sound,
                         void* source) { static_cast<SoundSource*>(source)->m_listener(*sound); },
                      this);
    }
    return true;
}

} // namespace desktop

// The way of the remote control's keys: to the page, if it has asked for them, or to the television.
#include "desktop/window/webkit/KeyRouter.h"

#include <utility>

#include "desktop/window/webkit/Application.h"

namespace desktop {

KeyRouter::KeyRouter(Window window) : m_window(std::move(window)) {}

void KeyRouter::route(const RemoteKey& key, Stroke stroke, std::function<void()> done) {
    m_entries.push_back({&key, stroke, std::move(done)});
    if (m_entries.size() == 1) {
        routeFirst();
    }
}

void KeyRouter::routeFirst() {
    Application* top = m_window.topApplication();
    if (!top) {
        deliver(nullptr, false);
        return;
    }
    top->readKeySet([this](Application* application, uint32_t keySet) {
        deliver(application, (keySet & m_entries.front().key->group) != 0);
    });
}

void KeyRouter::deliver(Application* application, bool isAskedFor) {
    const Entry entry = m_entries.front();
    const bool isRelease = entry.stroke == Stroke::Release;
    const bool isForPage = application && (isRelease ? m_hasPagePress : isAskedFor);
    m_hasPagePress = isForPage && !isRelease;
    if (isForPage && isRelease) {
        application->sendRelease(*entry.key);
    } else if (isForPage) {
        application->sendPress(*entry.key, entry.stroke == Stroke::Repeat);
    } else if (!isRelease) {
        m_window.onTelevisionKey(*entry.key, application);
    }
    if (entry.done && application) {
        application->waitForKeys(entry.done);
    } else if (entry.done) {
        entry.done();
    }
    m_entries.pop_front();
    if (!m_entries.empty()) {
        routeFirst();
    }
}

} // namespace desktop

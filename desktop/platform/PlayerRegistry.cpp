// The table of players, their callbacks and their phases.
#include "desktop/platform/PlayerRegistry.h"

#include <cassert>
#include <utility>

#include "desktop/platform/HttpSource.h"

namespace desktop {

PlayerRegistry& PlayerRegistry::instance() {
    static auto* registry = new PlayerRegistry; // lives until the process ends
    return *registry;
}

PlayerRegistry::PlayerRegistry() : m_platform(Platform::instance()) {
    registerHttpSource();
}

// ---- The table

const PlayerRegistry::Entry* PlayerRegistry::findLocked(TELIX_JS_AV_HANDLE player) const {
    const auto found = m_entries.find(player);
    return found == m_entries.end() ? nullptr : &found->second;
}

PlayerRegistry::Entry* PlayerRegistry::findLocked(TELIX_JS_AV_HANDLE player) {
    const auto found = m_entries.find(player);
    return found == m_entries.end() ? nullptr : &found->second;
}

TELIX_JS_AV_HANDLE PlayerRegistry::create() {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    Entry& entry = m_entries[++m_lastHandle];
    entry.view.presenter = m_platform.picture().newPresenter();
    entry.record = &m_records.emplace_back();
    entry.callbacks = std::make_shared<Callbacks>();
    return m_lastHandle;
}

bool PlayerRegistry::destroy(TELIX_JS_AV_HANDLE player) {
    std::shared_ptr<Callbacks> callbacks;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Entry* entry = findLocked(player);
        if (!entry) {
            return false;
        }
        releaseLocked(player, Phase::Stopped);
        callbacks = entry->callbacks;
        m_entries.erase(player);
    }
    callbacks->message.set(nullptr);
    callbacks->rights.set(nullptr);
    return true;
}

// ---- Phases

void PlayerRegistry::changePhase(Entry& entry, Phase phase) {
    const bool isOwner = entry.phase == Phase::Connecting || hasPrerolled(entry);
    switch (phase) {
    case Phase::Stopped: // from any phase: a request of the page
    case Phase::Connecting:
        break;
    case Phase::Prerolled:
        assert(entry.phase == Phase::Connecting);
        break;
    case Phase::Presenting:
        assert(entry.phase == Phase::Prerolled);
        break;
    case Phase::Finished:
    case Phase::Error:
        assert(isOwner);
        break;
    }
    entry.phase = phase;
}

bool PlayerRegistry::hasPrerolled(const Entry& entry) {
    return entry.phase == Phase::Prerolled || entry.phase == Phase::Presenting;
}

// ---- Callbacks

bool PlayerRegistry::setCallback(TELIX_JS_AV_HANDLE player, TELIX_JS_AV_PLAYSTATE_CB callback) {
    const auto callbacks = callbacksOf(player);
    if (callbacks) {
        callbacks->message.set(callback);
    }
    return callbacks != nullptr;
}

bool PlayerRegistry::setCallback(TELIX_JS_AV_HANDLE player, TELIX_JS_AV_DRM_RIGHTS_CB callback) {
    const auto callbacks = callbacksOf(player);
    if (callbacks) {
        callbacks->rights.set(callback);
    }
    return callbacks != nullptr;
}

std::shared_ptr<PlayerRegistry::Callbacks> PlayerRegistry::callbacksOf(TELIX_JS_AV_HANDLE player) const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const Entry* entry = findLocked(player);
    return entry ? entry->callbacks : nullptr;
}

// Platform thread.
void PlayerRegistry::notify(TELIX_JS_AV_HANDLE player, TELIX_AV_CB_MSG message) {
    const auto callbacks = callbacksOf(player);
    if (!callbacks) {
        return;
    }
    const TELIX_AV_CB_MSG previous = std::exchange(m_lastMessage, message);
    if (previous == message && message != TELIX_AV_CB_MSG_PLAYSTART) {
        callbacks->message.call(player, kSeparatorMessage); // the plug-in drops a repeated message
    }
    callbacks->message.call(player, message);
}

} // namespace desktop

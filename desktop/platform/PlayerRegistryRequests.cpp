// Requests of the page: the table changes at once, the pipeline follows on the platform thread.
#include "desktop/platform/PlayerRegistry.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <utility>

#include "desktop/platform/OutputVolume.h"

namespace desktop {

namespace {

constexpr double kMinSpeed = 0.1;
constexpr double kMaxSpeed = 32;

} // namespace

// ---- Who owns the pipeline

void PlayerRegistry::clearMedia(Entry& entry) {
    entry.isPaused = false;
    entry.isBuffering = false;
    entry.seekSupport = {};
    entry.pendingSeeks = 0; // those that are still posted belong to the previous session
    entry.progress = {};
    entry.components.clear();
}

// Makes `player` the owner of the pipeline, which plays `item` at once.
void PlayerRegistry::requestLocked(TELIX_JS_AV_HANDLE player, Entry& entry, const Item& item) {
    if (m_owner != player) {
        releaseLocked(m_owner, Phase::Stopped);
    }
    clearMedia(entry);
    entry.url = item.url;
    changePhase(entry, Phase::Connecting);
    m_owner = player;
    m_lastOwner = player;
    m_platform.post([this, session = ++m_session, item] { startPipeline(session, item); });
}

// Takes the pipeline away from `player` if it is the owner.
void PlayerRegistry::releaseLocked(TELIX_JS_AV_HANDLE player, Phase phase) {
    if (player == 0 || m_owner != player) {
        return;
    }
    if (Entry* entry = findLocked(player)) {
        clearMedia(*entry);
        changePhase(*entry, phase);
        entry->speed = 1;
    }
    m_owner = 0;
    m_platform.post([this, session = ++m_session] {
        if (m_pipelineSession < session) { // a later session keeps its pipeline
            stopPipeline();
        }
    });
}

// ---- Play, queue and stop

bool PlayerRegistry::play(TELIX_JS_AV_HANDLE player, const std::string& url, uint32_t playCount) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    Entry* entry = findLocked(player);
    if (!entry || url.empty()) {
        return false;
    }
    if (!entry->startPosition) {
        entry->queue.clear();
    }
    requestLocked(player, *entry, {url, std::max(playCount, 1U)});
    return true;
}

bool PlayerRegistry::queue(TELIX_JS_AV_HANDLE player, const std::string& url, uint32_t playCount) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    Entry* entry = findLocked(player);
    if (!entry || url.empty()) {
        return false;
    }
    const Item item{url, std::max(playCount, 1U)};
    if (m_owner == player) {
        entry->queue.push_back(item);
    } else {
        requestLocked(player, *entry, item);
    }
    return true;
}

bool PlayerRegistry::clearQueue(TELIX_JS_AV_HANDLE player) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    Entry* entry = findLocked(player);
    if (entry) {
        entry->queue.clear();
    }
    return entry != nullptr;
}

bool PlayerRegistry::stop(TELIX_JS_AV_HANDLE player) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    Entry* entry = findLocked(player);
    if (!entry) {
        return false;
    }
    releaseLocked(player, Phase::Stopped);
    changePhase(*entry, Phase::Stopped); // also of a player that has finished or failed
    entry->progress = {};
    entry->startPosition.reset();
    m_platform.post([this] { m_lastMessage = kSeparatorMessage; }); // the plug-in resets its own as well
    return true;
}

// ---- Changes of the pipeline that plays

// Changes the entry of the pipeline's owner, and then the pipeline. False if `player` is not the owner, or if
// `change` returns false. `follow` runs on the platform thread, unless another session has begun.
bool PlayerRegistry::apply(TELIX_JS_AV_HANDLE player, const std::function<bool(Entry& entry)>& change,
                           std::function<void(MediaPipeline& pipeline)> follow) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    Entry* entry = findLocked(player);
    if (!entry || m_owner != player || !change(*entry)) {
        return false;
    }
    m_platform.post([this, session = m_session, follow = std::move(follow)] {
        if (m_pipelineSession == session && m_pipeline) {
            follow(*m_pipeline);
        }
    });
    return true;
}

bool PlayerRegistry::pause(TELIX_JS_AV_HANDLE player) {
    const auto change = [](Entry& entry) {
        entry.isPaused = true;
        return true;
    };
    return apply(player, change, [](MediaPipeline& pipeline) { pipeline.setPaused(true); });
}

bool PlayerRegistry::resume(TELIX_JS_AV_HANDLE player) {
    const auto change = [](Entry& entry) {
        entry.isPaused = false;
        return true;
    };
    return apply(player, change, [](MediaPipeline& pipeline) { pipeline.setPaused(false); });
}

// Before preroll everything is possible: the pipeline decides when it knows the media.
bool PlayerRegistry::canSeekTo(const Entry& entry, uint32_t milliseconds) {
    if (!hasPrerolled(entry)) {
        return true;
    }
    const MediaPipeline::Progress& progress = entry.progress;
    const bool isBeyondEnd = progress.duration > 0 && milliseconds > progress.duration;
    const bool isBuffered = milliseconds / 1000 <= progress.bufferedEnd;
    return entry.seekSupport.canSeek && !isBeyondEnd && (entry.seekSupport.canSeekBeyondBuffer || isBuffered);
}

bool PlayerRegistry::seek(TELIX_JS_AV_HANDLE player, uint32_t milliseconds) {
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Entry* entry = findLocked(player);
        if (entry && m_owner != player) {
            entry->startPosition = milliseconds;
            return true;
        }
    }
    const auto change = [milliseconds](Entry& entry) {
        if (!canSeekTo(entry, milliseconds)) {
            return false;
        }
        entry.progress.position = milliseconds; // pages see the seek target at once
        ++entry.pendingSeeks;
        return true;
    };
    return apply(player, change, [this, player, milliseconds](MediaPipeline& pipeline) {
        if (!pipeline.seek(milliseconds)) {
            std::fprintf(stderr, "libtelix: media: seek to %u ms: refused by the pipeline\n", milliseconds);
        }
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Entry* entry = findLocked(player);
        if (entry && m_pipelineSession == m_session) { // a new session has reset the count
            --entry->pendingSeeks;
        }
    });
}

bool PlayerRegistry::canPlayAt(const Entry& entry, double speed) {
    if (!hasPrerolled(entry)) {
        return true;
    }
    return (speed == 1 || entry.seekSupport.canSeek) && (speed > 0 || entry.seekSupport.canPlayBackward);
}

bool PlayerRegistry::setSpeed(TELIX_JS_AV_HANDLE player, double speed) {
    if (speed == 0) {
        pause(player);
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        return findLocked(player) != nullptr;
    }
    if (std::abs(speed) < kMinSpeed || std::abs(speed) > kMaxSpeed) {
        return false;
    }
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Entry* entry = findLocked(player);
        if (entry && m_owner != player) { // for what plays next, which starts at its beginning
            entry->speed = speed > 0 ? speed : entry->speed;
            return speed > 0;
        }
    }
    const auto change = [speed](Entry& entry) {
        if (!canPlayAt(entry, speed)) {
            return false;
        }
        entry.speed = speed;
        return true;
    };
    return apply(player, change, [this, player, speed](MediaPipeline& pipeline) {
        if (pipeline.setSpeed(speed)) {
            return;
        }
        std::fprintf(stderr, "libtelix: media: speed %.1f: refused by the pipeline\n", speed);
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Entry* entry = findLocked(player);
        if (entry && m_pipelineSession == m_session) {
            entry->speed = pipeline.speed();
        }
    });
}

bool PlayerRegistry::setVolume(TELIX_JS_AV_HANDLE player, uint32_t volume) {
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Entry* entry = findLocked(player);
        if (!entry || volume > kMaxVolume) {
            return false;
        }
        entry->volume = volume;
    }
    const auto change = [](Entry&) { return true; };
    apply(player, change, [volume](MediaPipeline& pipeline) { pipeline.setVolume(volume); });
    return true;
}

bool PlayerRegistry::changeView(TELIX_JS_AV_HANDLE player,
                                const std::function<void(Picture::View& view)>& change) {
    Picture::View view;
    Picture::Token token = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Entry* entry = findLocked(player);
        if (!entry) {
            return false;
        }
        change(entry->view);
        view = entry->view;
        token = m_owner == player ? m_token : 0;
    }
    m_platform.picture().setView(token, view);
    return true;
}

} // namespace desktop

// How far playback has come, for the plug-in and for the control tool.
#include "desktop/platform/PlayerRegistry.h"

namespace desktop {

namespace {

constexpr unsigned int kProgressInterval = 100; // milliseconds

// The field `state` of the play info.
constexpr uint32_t kPlayInfoNothing = 0;
constexpr uint32_t kPlayInfoUnknown = 1; // the page keeps the values of the last play info
constexpr uint32_t kPlayInfoValid = 2;

} // namespace

uint32_t PlayerRegistry::bufferedOf(const Entry& entry) const {
    return m_injectedBuffered.value_or(entry.progress.buffered);
}

TELIX_JS_AV_PLAY_INFO* PlayerRegistry::playInfo(TELIX_JS_AV_HANDLE player) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const Entry* entry = findLocked(player);
    if (!entry) {
        return nullptr;
    }
    TELIX_JS_AV_PLAY_INFO& record = *entry->record;
    if (hasPrerolled(*entry)) {
        record = {kPlayInfoValid,
                  entry->progress.position,
                  entry->progress.duration,
                  0,
                  entry->progress.bufferedEnd,
                  bufferedOf(*entry)};
    } else {
        const bool isStarting = entry->phase == Phase::Connecting || entry->startPosition;
        record = {isStarting ? kPlayInfoUnknown : kPlayInfoNothing, 0, 0, 0, 0, 0};
    }
    return &record;
}

// Platform thread. Reads until the pipeline is gone.
void PlayerRegistry::startReadingProgress() {
    if (m_isReadingProgress) {
        return;
    }
    m_isReadingProgress = true;
    m_platform.postDelayed(kProgressInterval, [this] {
        readProgress();
        m_isReadingProgress = m_pipeline != nullptr;
        return m_isReadingProgress;
    });
}

// Platform thread.
void PlayerRegistry::readProgress() {
    if (!m_pipeline) {
        return;
    }
    const MediaPipeline::Progress progress = m_pipeline->progress();
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    Entry* entry = findLocked(m_owner);
    if (m_pipelineSession != m_session || !entry) {
        return;
    }
    const uint32_t seekTarget = entry->progress.position;
    entry->progress = progress;
    if (entry->pendingSeeks > 0) {
        entry->progress.position = seekTarget;
    }
}

std::vector<PlayerRegistry::State> PlayerRegistry::states() const {
    const auto nameOf = [](const Entry& entry) -> const char* {
        switch (entry.phase) {
        case Phase::Stopped:
            return "stopped";
        case Phase::Connecting:
        case Phase::Prerolled:
            return entry.isPaused ? "paused" : entry.isBuffering ? "buffering" : "connecting";
        case Phase::Presenting:
            return entry.isPaused ? "paused" : entry.isBuffering ? "buffering" : "playing";
        case Phase::Finished:
            return "finished";
        case Phase::Error:
            return "error";
        }
        return "";
    };
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    std::vector<State> states;
    for (const auto& [handle, entry] : m_entries) {
        states.push_back({handle, entry.url, nameOf(entry), entry.progress.position, entry.progress.duration,
                          entry.progress.bufferedEnd, bufferedOf(entry), entry.speed, entry.volume});
    }
    return states;
}

std::optional<MediaPipeline::Output> PlayerRegistry::output() const {
    return m_pipeline ? std::optional(m_pipeline->output()) : std::nullopt;
}

} // namespace desktop

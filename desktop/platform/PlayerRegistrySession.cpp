// The pipeline of the current session, and what it reports. Everything here runs on the platform thread.
#include "desktop/platform/PlayerRegistry.h"

#include <algorithm>
#include <cstdio>
#include <utility>

namespace desktop {

// ---- Start and stop

void PlayerRegistry::startPipeline(uint64_t session, const Item& item) {
    m_pipeline.reset();
    m_pipelineSession = 0;
    MediaPipeline::Setup setup;
    Picture::View view;
    Picture::Token token = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Entry* entry = findLocked(m_owner);
        if (session != m_session || !entry) {
            return; // a later request follows
        }
        setup.url = item.url;
        setup.speed = entry->speed;
        setup.volume = entry->volume;
        setup.isPaused = entry->isPaused;
        setup.position = std::exchange(entry->startPosition, std::nullopt);
        view = entry->view;
        token = m_token;
    }
    m_pipelineSession = session;
    m_item = item;
    token = acquirePicture(token, view);

    m_pipeline = std::make_unique<MediaPipeline>(listenerFor(session));
    std::string error;
    if (m_pipeline->start(m_platform.picture(), token, setup, error)) {
        startReadingProgress();
    } else {
        onError(session, TELIX_AV_CB_MSG_ERR_PLAYING, error);
    }
}

// Preempts broadcast, or keeps the presentation `token`, which the former session has left.
Picture::Token PlayerRegistry::acquirePicture(Picture::Token token, const Picture::View& view) {
    if (token != 0) {
        m_platform.picture().setHidden(token, false);
        m_platform.picture().setView(token, view);
        return token;
    }
    token = m_platform.picture().acquire(view, [this] { onPipelinePreempted(); });
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    m_token = token;
    return token;
}

// The last two are posted, because they may delete the pipeline, which must not happen in its listener.
MediaPipeline::Listener PlayerRegistry::listenerFor(uint64_t session) {
    MediaPipeline::Listener listener;
    listener.onPrerolled = [this, session](const MediaPipeline::Media& media) {
        onPrerolled(session, media);
    };
    listener.onStarted = [this, session] { onStarted(session); };
    listener.onBuffering = [this, session](bool isBuffering) { onBuffering(session, isBuffering); };
    listener.onEos = [this, session] { m_platform.post([this, session] { onEos(session); }); };
    listener.onError = [this, session](TELIX_AV_CB_MSG message, const std::string& reason) {
        m_platform.post([this, session, message, reason] { onError(session, message, reason); });
    };
    return listener;
}

void PlayerRegistry::stopPipeline() {
    m_pipeline.reset();
    m_pipelineSession = 0;
    Picture::Token token = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        token = std::exchange(m_token, Picture::Token{0});
    }
    m_platform.picture().leave(token);
}

// By broadcast.
void PlayerRegistry::onPipelinePreempted() {
    TELIX_JS_AV_HANDLE player = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        m_token = 0;
        if (m_pipelineSession == m_session) {
            player = m_owner;
            releaseLocked(player, Phase::Error);
        }
    }
    m_pipeline.reset();
    m_pipelineSession = 0;
    notify(player, TELIX_AV_CB_MSG_ERR_PLAYING);
}

// ---- Reports of the pipeline

void PlayerRegistry::onPrerolled(uint64_t session, const MediaPipeline::Media& media) {
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Entry* entry = findLocked(m_owner);
        if (!isCurrentLocked(session) || !entry) {
            return;
        }
        if (entry->phase == Phase::Connecting) { // not if it repeats media that cannot seek
            changePhase(*entry, Phase::Prerolled);
        }
        entry->seekSupport = {media.canSeek, media.canSeekBeyondBuffer, media.canPlayBackward};
        setComponentsLocked(*entry, media.streams);
    }
    readProgress();
    applySelection();
}

void PlayerRegistry::onStarted(uint64_t session) {
    TELIX_JS_AV_HANDLE player = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Entry* entry = findLocked(m_owner);
        if (!isCurrentLocked(session) || !entry) {
            return;
        }
        if (entry->phase == Phase::Prerolled) { // a repetition is not reported
            changePhase(*entry, Phase::Presenting);
            player = m_owner;
        }
    }
    readProgress();
    notify(player, TELIX_AV_CB_MSG_PLAYSTART);
}

void PlayerRegistry::onBuffering(uint64_t session, bool isBuffering) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    Entry* entry = findLocked(m_owner);
    if (isCurrentLocked(session) && entry) {
        entry->isBuffering = isBuffering;
    }
}

void PlayerRegistry::onEos(uint64_t session) {
    TELIX_JS_AV_HANDLE player = 0;
    bool repeats = false;
    bool hasNext = false;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Entry* entry = findLocked(m_owner);
        if (!isCurrentLocked(session) || !entry) {
            return;
        }
        player = m_owner;
        repeats = m_item.playCount > 1 && entry->speed > 0; // backward, the end is the start
        hasNext = !repeats && !entry->queue.empty();
        if (hasNext) {
            const Item next = entry->queue.front();
            entry->queue.pop_front();
            entry->speed = std::max(entry->speed, 1.0);
            requestLocked(player, *entry, next);
        } else if (!repeats) {
            releaseLocked(player, Phase::Finished);
        }
    }
    if (repeats) {
        --m_item.playCount;
        if (!m_pipeline->repeat()) {
            startPipeline(session, Item(m_item));
        }
    } else if (!hasNext) {
        stopPipeline();
        notify(player, TELIX_AV_CB_MSG_PLAYEND);
    }
}

void PlayerRegistry::onError(uint64_t session, TELIX_AV_CB_MSG message, const std::string& reason) {
    TELIX_JS_AV_HANDLE player = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        if (!isCurrentLocked(session)) {
            return;
        }
        player = m_owner;
        releaseLocked(player, Phase::Error);
    }
    std::fprintf(stderr, "libtelix: media: %s: %s\n", m_item.url.c_str(), reason.c_str());
    stopPipeline();
    notify(player, message);
}

} // namespace desktop

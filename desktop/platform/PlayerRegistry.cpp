// Turns of the pipeline, queues and repetitions, and what is told of them.
#include "desktop/platform/PlayerRegistry.h"

#include "desktop/platform/ElementRank.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <utility>

namespace desktop {

namespace {

constexpr unsigned int readingInterval = 100; // milliseconds

constexpr double slowest = 0.1;
constexpr double fastest = 32;

// Means nothing to the plug-in, except that it is another message than the one before.
constexpr TELIX_AV_CB_MSG nothingNew = 0;

// Of play-info.
constexpr uint32_t stateNothing = 0;
constexpr uint32_t stateUnknown = 1;
constexpr uint32_t statePresenting = 2;

} // namespace

PlayerRegistry& PlayerRegistry::instance() {
    static auto* const players = new PlayerRegistry; // kept until the process ends
    return *players;
}

PlayerRegistry::PlayerRegistry() : m_platform(Platform::instance()) {
    // A web engine in the process brings an element of its own for web addresses, which works for the engine
    // alone.
    setRank("souphttpsrc", GST_RANK_PRIMARY + 1000);
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
        releaseLocked(player, Phase::stopped);
        callbacks = entry->callbacks;
        m_entries.erase(player);
    }
    callbacks->message.set(nullptr);
    callbacks->rights.set(nullptr);
    return true;
}

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

// ---- Requests

void PlayerRegistry::forgetMedia(Entry& entry) {
    entry.isPaused = false;
    entry.isHeld = false;
    entry.isKnown = false;
    entry.canSeek = false;
    entry.canSeekAhead = false;
    entry.canReverse = false;
    entry.progress = {};
    entry.components.clear();
}

// Makes `player` the one that plays: `item` now, whatever played before.
void PlayerRegistry::requestLocked(TELIX_JS_AV_HANDLE player, Entry& entry, const Item& item) {
    if (m_owner != player) {
        releaseLocked(m_owner, Phase::stopped);
    }
    forgetMedia(entry);
    entry.url = item.url;
    entry.phase = Phase::connecting;
    m_owner = player;
    m_lastPlayed = player;
    m_platform.post([this, session = ++m_session, item] { begin(session, item); });
}

// Takes the pipeline from `player` if it has it.
void PlayerRegistry::releaseLocked(TELIX_JS_AV_HANDLE player, Phase phase) {
    if (player == 0 || m_owner != player) {
        return;
    }
    if (Entry* entry = findLocked(player)) {
        forgetMedia(*entry);
        entry->phase = phase;
        entry->speed = 1;
    }
    m_owner = 0;
    m_platform.post([this, session = ++m_session] {
        if (m_working < session) { // what began meanwhile stays
            end();
        }
    });
}

bool PlayerRegistry::play(TELIX_JS_AV_HANDLE player, const std::string& url, uint32_t playCount) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    Entry* entry = findLocked(player);
    if (!entry || url.empty()) {
        return false;
    }
    if (!entry->nextPosition) {
        entry->waiting.clear();
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
        entry->waiting.push_back(item);
    } else {
        requestLocked(player, *entry, item);
    }
    return true;
}

bool PlayerRegistry::withdraw(TELIX_JS_AV_HANDLE player) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    Entry* entry = findLocked(player);
    if (entry) {
        entry->waiting.clear();
    }
    return entry != nullptr;
}

bool PlayerRegistry::stop(TELIX_JS_AV_HANDLE player) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    Entry* entry = findLocked(player);
    if (!entry) {
        return false;
    }
    releaseLocked(player, Phase::stopped);
    entry->phase = Phase::stopped;
    entry->progress = {};
    entry->nextPosition.reset();
    m_platform.post([this] { m_lastMessage = nothingNew; }); // the plug-in forgets it as well
    return true;
}

// Changes a player that has the pipeline, and the pipeline after it. False if it has it not, or if `change`
// says so.
bool PlayerRegistry::apply(TELIX_JS_AV_HANDLE player, const std::function<bool(Entry& entry)>& change,
                           std::function<void(MediaPipeline& pipeline)> follow) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    Entry* entry = findLocked(player);
    if (!entry || m_owner != player || !change(*entry)) {
        return false;
    }
    m_platform.post([this, session = m_session, follow = std::move(follow)] {
        if (m_working == session && m_pipeline) {
            follow(*m_pipeline);
        }
    });
    return true;
}

bool PlayerRegistry::pause(TELIX_JS_AV_HANDLE player) {
    return apply(
        player, [](Entry& entry) { return entry.isPaused = true; },
        [](MediaPipeline& pipeline) { pipeline.setPaused(true); });
}

bool PlayerRegistry::resume(TELIX_JS_AV_HANDLE player) {
    const auto change = [](Entry& entry) {
        entry.isPaused = false;
        return true;
    };
    return apply(player, change, [](MediaPipeline& pipeline) { pipeline.setPaused(false); });
}

bool PlayerRegistry::seek(TELIX_JS_AV_HANDLE player, uint32_t milliseconds) {
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Entry* entry = findLocked(player);
        if (entry && m_owner != player) {
            entry->nextPosition = milliseconds;
            return true;
        }
    }
    const auto change = [milliseconds](Entry& entry) {
        const MediaPipeline::Progress& progress = entry.progress;
        const bool isBeyond = progress.duration > 0 && milliseconds > progress.duration;
        const bool isHeld = entry.canSeekAhead || milliseconds / 1000 <= progress.bufferedEnd;
        if (entry.isKnown && (!entry.canSeek || isBeyond || !isHeld)) {
            return false;
        }
        entry.progress.position = milliseconds; // pages see the goal at once
        ++entry.seeksOnTheWay;
        return true;
    };
    return apply(player, change, [this, player, milliseconds](MediaPipeline& pipeline) {
        if (!pipeline.seek(milliseconds)) {
            std::fprintf(stderr, "libtelix: media: the seek to %u ms is refused\n", milliseconds);
        }
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        if (Entry* entry = findLocked(player)) {
            --entry->seeksOnTheWay;
        }
    });
}

bool PlayerRegistry::setSpeed(TELIX_JS_AV_HANDLE player, double speed) {
    if (speed == 0) {
        pause(player);
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        return findLocked(player) != nullptr;
    }
    if (std::abs(speed) < slowest || std::abs(speed) > fastest) {
        return false;
    }
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Entry* entry = findLocked(player);
        if (entry && m_owner != player) { // of what is played next, which begins at its start
            entry->speed = speed > 0 ? speed : entry->speed;
            return speed > 0;
        }
    }
    const auto change = [speed](Entry& entry) {
        if (entry.isKnown && ((speed != 1 && !entry.canSeek) || (speed < 0 && !entry.canReverse))) {
            return false;
        }
        entry.speed = speed;
        return true;
    };
    return apply(player, change, [this, player, speed](MediaPipeline& pipeline) {
        if (pipeline.setSpeed(speed)) {
            return;
        }
        std::fprintf(stderr, "libtelix: media: the speed %.1f is refused\n", speed);
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        if (Entry* entry = findLocked(player)) {
            entry->speed = pipeline.speed();
        }
    });
}

bool PlayerRegistry::setVolume(TELIX_JS_AV_HANDLE player, uint32_t volume) {
    constexpr uint32_t loudest = 100;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Entry* entry = findLocked(player);
        if (!entry || volume > loudest) {
            return false;
        }
        entry->volume = volume;
    }
    apply(
        player, [](Entry&) { return true; },
        [volume](MediaPipeline& pipeline) { pipeline.setVolume(volume); });
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
    m_platform.picture().place(token, view);
    return true;
}

// ---- Progress

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
    if (entry->isKnown) {
        record = {statePresenting,
                  entry->progress.position,
                  entry->progress.duration,
                  0,
                  entry->progress.bufferedEnd,
                  bufferedOf(*entry)};
    } else {
        // On its way, the page goes on reading what it knew before.
        const bool isOnItsWay = entry->phase == Phase::connecting || entry->nextPosition;
        record = {isOnItsWay ? stateUnknown : stateNothing, 0, 0, 0, 0, 0};
    }
    return &record;
}

void PlayerRegistry::readProgress() {
    if (!m_pipeline) {
        return;
    }
    const MediaPipeline::Progress progress = m_pipeline->progress();
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    Entry* entry = findLocked(m_owner);
    if (m_working != m_session || !entry) {
        return;
    }
    const uint32_t goal = entry->progress.position;
    entry->progress = progress;
    if (entry->seeksOnTheWay > 0) {
        entry->progress.position = goal;
    }
}

std::vector<PlayerRegistry::State> PlayerRegistry::states() const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    std::vector<State> states;
    for (const auto& [handle, entry] : m_entries) {
        const char* name = "stopped";
        const bool isAtWork = entry.phase == Phase::connecting || entry.phase == Phase::presenting;
        if (isAtWork && entry.isPaused) {
            name = "paused";
        } else if (isAtWork && entry.isHeld) {
            name = "buffering";
        } else if (entry.phase == Phase::connecting) {
            name = "connecting";
        } else if (entry.phase == Phase::presenting) {
            name = "playing";
        } else if (entry.phase == Phase::finished) {
            name = "finished";
        } else if (entry.phase == Phase::error) {
            name = "error";
        }
        states.push_back({handle, entry.url, name, entry.progress.position, entry.progress.duration,
                          entry.progress.bufferedEnd, bufferedOf(entry), entry.speed, entry.volume});
    }
    return states;
}

// ---- The pipeline, on the platform thread

void PlayerRegistry::begin(uint64_t session, const Item& item) {
    m_pipeline.reset();
    m_working = 0;
    MediaPipeline::Setup setup;
    Picture::View view;
    Picture::Token token = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Entry* entry = findLocked(m_owner);
        if (session != m_session || !entry) {
            return; // what has come after it follows
        }
        setup.url = item.url;
        setup.speed = entry->speed;
        setup.volume = entry->volume;
        setup.isPaused = entry->isPaused;
        setup.position = std::exchange(entry->nextPosition, std::nullopt);
        view = entry->view;
        token = m_token;
    }
    m_working = session;
    m_item = item;
    if (token == 0) {
        token = m_platform.picture().take(view, [this] { lose(); });
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        m_token = token;
    } else {
        m_platform.picture().hide(token, false);
        m_platform.picture().place(token, view);
    }

    MediaPipeline::Listener listener;
    listener.known = [this, session](const MediaPipeline::Media& media) { takeMedia(session, media); };
    listener.began = [this, session] { tellBegin(session); };
    listener.buffering = [this, session](bool isHeld) {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Entry* entry = findLocked(m_owner);
        if (isCurrentLocked(session) && entry) {
            entry->isHeld = isHeld;
        }
    };
    listener.ended = [this, session] { m_platform.post([this, session] { takeEnd(session); }); };
    listener.failed = [this, session](TELIX_AV_CB_MSG message, const std::string& reason) {
        m_platform.post([this, session, message, reason] { fail(session, message, reason); });
    };
    m_pipeline = std::make_unique<MediaPipeline>(std::move(listener));
    std::string error;
    if (!m_pipeline->start(m_platform.picture(), token, setup, error)) {
        fail(session, TELIX_AV_CB_MSG_ERR_PLAYING, error);
        return;
    }
    if (!std::exchange(m_isReading, true)) {
        m_platform.postDelayed(readingInterval, [this] {
            readProgress();
            return m_isReading = m_pipeline != nullptr;
        });
    }
}

void PlayerRegistry::end() {
    m_pipeline.reset();
    m_working = 0;
    Picture::Token token = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        token = std::exchange(m_token, Picture::Token{0});
    }
    m_platform.picture().release(token);
}

// Broadcast has taken the picture.
void PlayerRegistry::lose() {
    TELIX_JS_AV_HANDLE player = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        m_token = 0;
        if (m_working == m_session) {
            player = m_owner;
            releaseLocked(player, Phase::error);
        }
    }
    m_pipeline.reset();
    m_working = 0;
    tell(player, TELIX_AV_CB_MSG_ERR_PLAYING);
}

void PlayerRegistry::tellBegin(uint64_t session) {
    TELIX_JS_AV_HANDLE player = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Entry* entry = findLocked(m_owner);
        if (!isCurrentLocked(session) || !entry) {
            return;
        }
        if (std::exchange(entry->phase, Phase::presenting) == Phase::connecting) {
            player = m_owner;
        }
    }
    readProgress();
    tell(player, TELIX_AV_CB_MSG_PLAYSTART);
}

void PlayerRegistry::takeEnd(uint64_t session) {
    TELIX_JS_AV_HANDLE player = 0;
    bool repeats = false;
    std::optional<Item> next;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Entry* entry = findLocked(m_owner);
        if (!isCurrentLocked(session) || !entry) {
            return;
        }
        player = m_owner;
        // Backward, the end is the start: there is nothing to go on to before it.
        if (m_item.playCount > 1 && entry->speed > 0) {
            repeats = true;
        } else if (!entry->waiting.empty()) {
            next = entry->waiting.front();
            entry->waiting.pop_front();
            entry->speed = std::max(entry->speed, 1.0);
            requestLocked(player, *entry, *next);
        } else {
            releaseLocked(player, Phase::finished);
        }
    }
    if (repeats) {
        --m_item.playCount;
        if (!m_pipeline->repeat()) {
            begin(session, Item(m_item));
        }
    } else if (!next) {
        end();
        tell(player, TELIX_AV_CB_MSG_PLAYEND);
    }
}

void PlayerRegistry::fail(uint64_t session, TELIX_AV_CB_MSG message, const std::string& reason) {
    TELIX_JS_AV_HANDLE player = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        if (!isCurrentLocked(session)) {
            return;
        }
        player = m_owner;
        releaseLocked(player, Phase::error);
    }
    std::fprintf(stderr, "libtelix: media: %s: %s\n", m_item.url.c_str(), reason.c_str());
    end();
    tell(player, message);
}

void PlayerRegistry::tell(TELIX_JS_AV_HANDLE player, TELIX_AV_CB_MSG message) {
    const auto callbacks = callbacksOf(player);
    if (!callbacks) {
        return;
    }
    const TELIX_AV_CB_MSG former = std::exchange(m_lastMessage, message);
    if (former == message && message != TELIX_AV_CB_MSG_PLAYSTART) {
        callbacks->message.call(player, nothingNew); // or the plug-in would take it for the former one
    }
    callbacks->message.call(player, message);
}

// ---- Components

void PlayerRegistry::takeMedia(uint64_t session, const MediaPipeline::Media& media) {
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Entry* entry = findLocked(m_owner);
        if (!isCurrentLocked(session) || !entry) {
            return;
        }
        entry->isKnown = true;
        entry->canSeek = media.canSeek;
        entry->canSeekAhead = media.canSeekAhead;
        entry->canReverse = media.canReverse;
        entry->components.clear();
        for (const MediaPipeline::Stream& stream : media.streams) {
            const TELIX_JS_AVCOMPHANDLE handle = m_components.intern({stream, m_owner, entry->url});
            entry->components.add(handle, m_components.at(handle));
        }
        entry->components.selectDefaults(m_platform.configuration().audioLanguage);
    }
    readProgress();
    applySelection();
}

std::optional<std::vector<TELIX_JS_AVCOMPHANDLE>>
PlayerRegistry::components(TELIX_JS_AV_HANDLE player, TELIX_JS_AVCOMPTYPE type, bool activeOnly) const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const Entry* entry = findLocked(player);
    if (!entry || !entry->isKnown) {
        return std::nullopt;
    }
    return entry->components.list(type, activeOnly);
}

std::optional<ComponentTraits> PlayerRegistry::findComponent(TELIX_JS_AVCOMPHANDLE component,
                                                             TELIX_JS_AVCOMPTYPE type) const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const Component* found = m_components.find(component, type);
    return found ? std::optional<ComponentTraits>(*found) : std::nullopt;
}

bool PlayerRegistry::selectComponent(TELIX_JS_AV_HANDLE player, TELIX_JS_AVCOMPHANDLE component,
                                     TELIX_JS_AVCOMPTYPE type, bool isActive) {
    return apply(
        player, [=](Entry& entry) { return entry.components.select(component, type, isActive); },
        [this](MediaPipeline&) { applySelection(); });
}

void PlayerRegistry::applySelection() {
    std::array<std::optional<int>, ComponentSelection::kTypeCount> streams;
    bool hasVideo = false;
    Picture::Token token = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        const Entry* entry = findLocked(m_owner);
        if (!m_pipeline || m_working != m_session || !entry) {
            return;
        }
        for (TELIX_JS_AVCOMPTYPE type = 0; type < streams.size(); ++type) {
            if (const TELIX_JS_AVCOMPHANDLE handle = entry->components.active(type)) {
                streams[type] = m_components.at(handle).number;
            }
        }
        hasVideo = !entry->components.list(TELIX_JS_AVCOMPTYPE_VIDEO, false).empty();
        token = m_token;
    }
    m_pipeline->selectAudio(streams[TELIX_JS_AVCOMPTYPE_AUDIO]);
    m_pipeline->selectSubtitle(streams[TELIX_JS_AVCOMPTYPE_SUBTITLE]);
    m_platform.picture().hide(token, hasVideo && !streams[TELIX_JS_AVCOMPTYPE_VIDEO]);
}

std::optional<MediaPipeline::Sound> PlayerRegistry::sound() const {
    return m_pipeline ? std::optional(m_pipeline->sound()) : std::nullopt;
}

// ---- Provoked from outside

TELIX_JS_AV_HANDLE PlayerRegistry::addresseeLocked() const {
    const TELIX_JS_AV_HANDLE player = m_owner != 0 ? m_owner : m_lastPlayed;
    return findLocked(player) ? player : 0;
}

bool PlayerRegistry::injectMessage(TELIX_AV_CB_MSG message) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const TELIX_JS_AV_HANDLE player = addresseeLocked();
    if (player == 0) {
        return false;
    }
    // As it is: whoever injects wants to see what the plug-in makes of it.
    m_platform.post([this, player, message] {
        m_lastMessage = message;
        if (const auto callbacks = callbacksOf(player)) {
            callbacks->message.call(player, message);
        }
    });
    return true;
}

bool PlayerRegistry::injectRightsError(TELIX_AV_DRM_ERR_STATE_ENUM_T state, const std::string& contentId,
                                       const std::string& drmSystemId, const std::string& rightsIssuerUrl) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const TELIX_JS_AV_HANDLE player = addresseeLocked();
    if (player == 0) {
        return false;
    }
    m_platform.post(
        [this, player, state, content = contentId, system = drmSystemId, url = rightsIssuerUrl]() mutable {
            if (const auto callbacks = callbacksOf(player)) {
                callbacks->rights.call(player, state, reinterpret_cast<___UINT8*>(content.data()),
                                       reinterpret_cast<___UINT8*>(system.data()),
                                       reinterpret_cast<___UINT8*>(url.data()));
            }
        });
    return true;
}

bool PlayerRegistry::injectBuffered(std::optional<uint32_t> raw) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    m_injectedBuffered = raw;
    return true;
}

} // namespace desktop

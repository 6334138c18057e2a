// Turns of the tuner, the steps of a tune, and what follows from received tables.
#include "desktop/platform/Broadcast.h"

#include "desktop/platform/Multiplex.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>

namespace desktop {

namespace {

constexpr unsigned int longestTune = 6000; // milliseconds

struct Encoding {
    uint8_t streamType;
    TELIX_JS_AVCOMPTYPE type;
    const char* name;
};
const Encoding encodings[] = {
    {0x01, TELIX_JS_AVCOMPTYPE_VIDEO, "MPEG1"},    {0x02, TELIX_JS_AVCOMPTYPE_VIDEO, "MPEG2"},
    {0x1B, TELIX_JS_AVCOMPTYPE_VIDEO, "AVC"},      {0x24, TELIX_JS_AVCOMPTYPE_VIDEO, "HEVC"},
    {0x03, TELIX_JS_AVCOMPTYPE_AUDIO, "MPEG1_L2"}, {0x04, TELIX_JS_AVCOMPTYPE_AUDIO, "MPEG1_L2"},
    {0x0F, TELIX_JS_AVCOMPTYPE_AUDIO, "HEAAC"},    {0x11, TELIX_JS_AVCOMPTYPE_AUDIO, "HEAAC"},
    {0x81, TELIX_JS_AVCOMPTYPE_AUDIO, "AC3"},      {0x87, TELIX_JS_AVCOMPTYPE_AUDIO, "E_AC3"},
};

// The component that a stream of a service is to a page; nothing for streams that are no component.
std::optional<Component> componentOf(TELIX_JS_CM_HANDLE channel, const Pmt& map,
                                     const ElementaryStream& stream) {
    Component component;
    bool isComponent = false;
    for (const Encoding& encoding : encodings) {
        if (encoding.streamType == stream.type) {
            component.type = encoding.type;
            component.encoding = encoding.name;
            isComponent = true;
        }
    }
    forEachDescriptor(map.descriptors, [&](uint8_t tag, const uint8_t* body, size_t length) {
        (void)body;
        (void)length;
        component.isEncrypted = component.isEncrypted || tag == 0x09;
    });
    forEachDescriptor(stream.descriptors, [&](uint8_t tag, const uint8_t* body, size_t length) {
        if (tag == 0x0A && length >= 4) {
            component.language.assign(reinterpret_cast<const char*>(body), 3);
            component.isForHearingImpaired = body[3] == audioTypeHearingImpaired;
            component.isAudioDescription = body[3] == audioTypeDescription;
        } else if (tag == 0x59 && length >= 8) {
            component.type = TELIX_JS_AVCOMPTYPE_SUBTITLE;
            component.encoding = "DVB_SUB";
            component.language.assign(reinterpret_cast<const char*>(body), 3);
            component.isForHearingImpaired = body[3] >= 0x20 && body[3] <= 0x25;
            isComponent = true;
        } else if (stream.type == streamTypePrivate && (tag == 0x6A || tag == 0x7A)) {
            component.type = TELIX_JS_AVCOMPTYPE_AUDIO;
            component.encoding = tag == 0x6A ? "AC3" : "E_AC3";
            isComponent = true;
        } else if (tag == 0x09) {
            component.isEncrypted = true;
        }
    });
    component.channel = channel;
    component.pid = stream.pid;
    return isComponent ? std::optional(component) : std::nullopt;
}

// The tag of a stream event's component: hexadecimal.
uint8_t readTag(const std::string& tag) {
    return static_cast<uint8_t>(std::strtoul(tag.c_str(), nullptr, 16));
}

// The id of a stream event: decimal, or hexadecimal with its prefix.
uint16_t readEventId(const std::string& id) {
    const bool isHexadecimal = id.compare(0, 2, "0x") == 0 || id.compare(0, 2, "0X") == 0;
    return static_cast<uint16_t>(std::strtoul(id.c_str(), nullptr, isHexadecimal ? 16 : 10));
}

} // namespace

Broadcast& Broadcast::instance() {
    static auto* const broadcast = new Broadcast; // kept until the process ends
    return *broadcast;
}

Broadcast::Broadcast()
    : m_platform(Platform::instance()), m_channels(m_platform.configuration().sources),
      m_headEnd([this](const uint8_t* packets, size_t size) { m_receiver.push(packets, size); }) {
    if (!m_channels.list().empty()) {
        m_current = m_channels.list().front();
    }
    if (m_channels.usesTestMultiplex()) {
        m_isMakingTest = true;
        std::thread(&Broadcast::makeTestFile, this).detach(); // ends by itself; the object outlives it
    }
}

void Broadcast::makeTestFile() {
    std::string error;
    const std::string file = makeTestMultiplex(error);
    if (file.empty()) {
        std::fprintf(stderr, "libtelix: no test multiplex: %s\n", error.c_str());
    }
    m_platform.post([this, file, error] {
        m_isMakingTest = false;
        m_testFile = file;
        m_testError = error;
        if (m_working.number != 0) {
            present(m_working);
        }
    });
}

// ---- Objects

const Broadcast::Object* Broadcast::findLocked(TELIX_JS_VB_HANDLE object) const {
    const auto found = m_objects.find(object);
    return found == m_objects.end() ? nullptr : &found->second;
}

Broadcast::Object* Broadcast::findLocked(TELIX_JS_VB_HANDLE object) {
    const auto found = m_objects.find(object);
    return found == m_objects.end() ? nullptr : &found->second;
}

TELIX_JS_VB_HANDLE Broadcast::newObject() {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    m_objects[++m_lastObject];
    return m_lastObject;
}

bool Broadcast::exists(TELIX_JS_VB_HANDLE object) const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    return findLocked(object) != nullptr;
}

bool Broadcast::release(TELIX_JS_VB_HANDLE object) {
    return end(object, TELIX_PLAYSTATE_UNREALIZED);
}
bool Broadcast::stop(TELIX_JS_VB_HANDLE object) {
    return end(object, TELIX_PLAYSTATE_STOPPED);
}

// A released object may tune again, so nothing of it is forgotten but its channel.
bool Broadcast::end(TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T state) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    Object* found = findLocked(object);
    if (!found) {
        return false;
    }
    const bool holds = m_holder == object;
    const bool changes = found->state != state && (holds || found->state != TELIX_PLAYSTATE_UNREALIZED);
    if (state == TELIX_PLAYSTATE_UNREALIZED) {
        found->channel = 0;
    }
    if (changes) {
        found->state = state;
    }
    if (holds) {
        m_holder = 0;
        m_request = {m_request.number + 1, 0, 0};
        m_platform.post([this] {
            interrupt();
            stopTuner();
        });
    }
    if (changes) {
        m_platform.post([this, object, state] { onPlayState.call(object, 0U, state, TELIX_ERR_STATE_NONE); });
    }
    return true;
}

void Broadcast::requestLocked(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel) {
    const TELIX_JS_VB_HANDLE former = m_holder;
    if (former != 0 && former != object) {
        m_platform.post([this, former] {
            {
                std::lock_guard<std::mutex> lock(m_platform.mutex());
                m_objects[former].channel = 0;
            }
            changeState(former, TELIX_PLAYSTATE_UNREALIZED, TELIX_ERR_STATE_NONE);
        });
    }
    m_holder = object;
    m_current = channel;
    m_objects[object].channel = channel;
    m_objects[object].state = TELIX_PLAYSTATE_CONNECTING;
    m_request = {m_request.number + 1, object, channel};
    m_platform.post([this, request = m_request] { begin(request); });
}

bool Broadcast::tune(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel) {
    if (channel == 0) {
        if (!release(object)) {
            return false;
        }
        m_platform.post([this, object] { onChannelChange.call(object, TELIX_JS_CM_HANDLE{0}); });
        return true;
    }
    const bool isKnown = m_channels.find(channel).has_value();
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    if (!isKnown || !findLocked(object)) {
        return false;
    }
    requestLocked(object, channel);
    return true;
}

TELIX_JS_CM_HANDLE Broadcast::step(TELIX_JS_VB_HANDLE object, int distance) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const TELIX_JS_CM_HANDLE selected = m_current;
    const TELIX_JS_CM_HANDLE next = m_channels.neighbour(selected, distance);
    if (!findLocked(object) || next == 0) {
        return 0;
    }
    requestLocked(object, next);
    return selected;
}

bool Broadcast::bind(TELIX_JS_VB_HANDLE object) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const Object* found = findLocked(object);
    if (!found || m_current == 0) {
        return false;
    }
    if (m_holder == object && found->state == TELIX_PLAYSTATE_PRESENTING) {
        return true;
    }
    requestLocked(object, m_current);
    return true;
}

TELIX_JS_CM_HANDLE Broadcast::channelOf(TELIX_JS_VB_HANDLE object) const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const Object* found = findLocked(object);
    return found ? found->channel : 0;
}

TELIX_JS_CM_HANDLE Broadcast::currentChannel() const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    return m_current;
}

std::optional<Picture::View> Broadcast::viewOf(TELIX_JS_VB_HANDLE object) const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const Object* found = findLocked(object);
    return found ? std::optional(found->view) : std::nullopt;
}

bool Broadcast::changeView(TELIX_JS_VB_HANDLE object,
                           const std::function<void(Picture::View& view)>& change) {
    Picture::View view;
    Picture::Token token = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Object* found = findLocked(object);
        if (!found) {
            return false;
        }
        change(found->view);
        view = found->view;
        token = m_holder == object ? m_token : 0;
    }
    m_platform.picture().setView(token, view);
    return true;
}

std::optional<TELIX_PLAYSTATE_ENUM_T> Broadcast::playState(TELIX_JS_VB_HANDLE object) const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const Object* found = findLocked(object);
    return found ? std::optional(found->state) : std::nullopt;
}

bool Broadcast::setPlayState(TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T state) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    Object* found = findLocked(object);
    if (found) {
        found->state = state;
    }
    return found != nullptr;
}

// ---- The steps of a tune

void Broadcast::begin(const Request& request) {
    interrupt();
    stopTuner();
    m_working = request;
    onPlayState.call(request.object, 0U, TELIX_PLAYSTATE_CONNECTING, TELIX_ERR_STATE_NONE);
    present(request);
}

// Ends what is at work without an outcome.
void Broadcast::interrupt() {
    if (m_working.number == 0) {
        return;
    }
    const Request working = m_working;
    m_working = {};
    onChannelError.call(working.object, working.channel, errorInterrupted);
}

void Broadcast::present(const Request& request) {
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        if (m_request.number != request.number) {
            return; // the next one interrupts
        }
    }
    const uint64_t number = request.number;
    const Channel channel = m_channels.find(request.channel).value_or(Channel());
    if (channel.origin == Channel::Origin::nowhere) {
        fail(number, errorUnknownChannel, "unknown channel");
        return;
    }
    const bool isTest = channel.origin == Channel::Origin::testMultiplex;
    if (isTest && m_isMakingTest) {
        return; // goes on when it is made
    }
    const std::string file = isTest ? m_testFile : channel.file;
    if (file.empty()) {
        fail(number, errorNoSignal, m_testError);
        return;
    }
    if (file != m_sentFile) {
        m_headEnd.stop();
        m_receiver.reset();
        m_sentFile.clear();
        const Configuration& configuration = m_platform.configuration();
        std::string error;
        if (!m_headEnd.play(
                file,
                isTest ? makeTestCarousel(configuration.programmeSeconds, configuration.streamEventSeconds)
                       : nullptr,
                error)) {
            fail(number, errorNoSignal, error);
            return;
        }
        m_sentFile = file;
    }

    const auto sid = static_cast<uint16_t>(channel.sid);
    const auto post = [this](auto function) { m_platform.post(function); };
    Tuner::Listener listener;
    listener.failed = [this, number, post](const std::string& reason) {
        post([this, number, reason] { fail(number, errorNoSignal, reason); });
    };
    listener.heard = [this, number, post] {
        post([this, number] {
            std::unique_lock<std::mutex> lock(m_platform.mutex());
            const bool isRadio = ofKindLocked(TELIX_JS_AVCOMPTYPE_VIDEO, false).empty();
            lock.unlock();
            if (isRadio) {
                succeed(number);
            }
        });
    };
    listener.audioFormat = [this, handle = request.channel, post](uint16_t pid, uint32_t channelCount) {
        post([this, handle, pid, channelCount] {
            std::lock_guard<std::mutex> lock(m_platform.mutex());
            for (Component& component : m_components) {
                if (component.channel == handle && component.pid == pid) {
                    component.audioChannels = channelCount;
                }
            }
        });
    };
    m_tuner = std::make_unique<Tuner>(sid, listener);
    m_presented = number;
    Picture::View view;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        view = m_objects[request.object].view;
    }
    const Picture::Token token = m_platform.picture().acquire(
        view, [this, object = request.object] { loseTuner(object); },
        [this, number, post] { post([this, number] { succeed(number); }); });
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        m_token = token;
    }
    std::string error;
    if (!m_tuner->start(m_platform.picture(), token, error)) {
        fail(number, errorNoSignal, error);
        return;
    }
    Receiver::Service service;
    service.serviceId = sid;
    service.feed = m_tuner->feed();
    service.mapped = [this, number, post](const Pmt& map) {
        post([this, number, map] { takeMap(number, map); });
    };
    service.missing = [this, number, post] {
        post([this, number] { fail(number, errorUnknownChannel, "the multiplex has no such service"); });
    };
    service.programmes = [this, number, post](const Eit& eit) {
        post([this, number, eit] { takeProgrammes(number, eit); });
    };
    service.event = [this, number, post](uint8_t tag, const StreamEvent& event) {
        post([this, number, tag, event] {
            if (m_presented == number) {
                deliverEvent(tag, event);
            }
        });
    };
    m_receiver.select(service);
    m_platform.postDelayed(longestTune, [this, number] {
        if (m_working.number == number) {
            fail(number, errorNoSignal, "nothing to be seen or heard");
        }
        return false;
    });
}

void Broadcast::succeed(uint64_t number) {
    if (m_working.number != number) {
        return;
    }
    const Request done = m_working;
    m_working = {};
    readShape();
    changeState(done.object, TELIX_PLAYSTATE_PRESENTING, TELIX_ERR_STATE_NONE);
    onChannelChange.call(done.object, done.channel);
}

void Broadcast::fail(uint64_t number, TELIX_ERR_STATE_ENUM_T error, const std::string& reason) {
    const bool breaksLater = number == m_presented && m_working.number == 0; // while it presents
    if (number != m_working.number && !breaksLater) {
        return;
    }
    std::fprintf(stderr, "libtelix: channel: %s\n", reason.c_str());
    TELIX_JS_VB_HANDLE object = 0;
    TELIX_JS_CM_HANDLE channel = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        object = m_working.number != 0 ? m_working.object : m_holder;
        channel = m_working.number != 0 ? m_working.channel : m_current;
    }
    const bool wasTuning = m_working.number != 0;
    m_working = {};
    stopTuner();
    if (wasTuning) {
        onChannelError.call(object, channel, error);
    }
    changeState(object, TELIX_PLAYSTATE_UNREALIZED, error);
}

// A media player has taken the pipeline.
void Broadcast::loseTuner(TELIX_JS_VB_HANDLE object) {
    interrupt();
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        m_token = 0;
        if (m_holder == object) {
            m_holder = 0;
        }
    }
    stopTuner();
    changeState(object, TELIX_PLAYSTATE_STOPPED, TELIX_ERR_STATE_NONE);
}

void Broadcast::stopTuner() {
    m_receiver.deselect();
    m_tuner.reset();
    m_presented = 0;
    m_hasRating = false;
    Picture::Token token = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        token = std::exchange(m_token, Picture::Token{0});
        m_available.clear();
        std::fill(std::begin(m_active), std::end(m_active), 0);
        m_present = 0;
        m_following = 0;
    }
    m_platform.picture().release(token);
}

void Broadcast::changeState(TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T state,
                            TELIX_ERR_STATE_ENUM_T error) {
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        Object* found = findLocked(object);
        if (!found) {
            return;
        }
        found->state = state;
    }
    onPlayState.call(object, 0U, state, error);
}

// ---- Programmes

std::vector<TELIX_JS_SI_HANDLE> Broadcast::currentProgrammes() const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    std::vector<TELIX_JS_SI_HANDLE> handles;
    for (const TELIX_JS_SI_HANDLE handle : {m_present, m_following}) {
        if (handle != 0) {
            handles.push_back(handle);
        }
    }
    return handles;
}

void Broadcast::takeProgrammes(uint64_t number, const Eit& eit) {
    if (m_presented != number || eit.number > 1) {
        return;
    }
    TELIX_JS_VB_HANDLE object = 0;
    TELIX_JS_CM_HANDLE channel = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        object = m_holder;
        channel = m_current;
    }
    const TELIX_JS_SI_HANDLE programme =
        eit.events.empty() ? 0 : m_programmes.add(channel, eit.events.front());
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        TELIX_JS_SI_HANDLE& slot = eit.number == 0 ? m_present : m_following;
        if (slot == programme) {
            return;
        }
        slot = programme;
    }
    onProgrammes.call(object);
    if (eit.number == 0) {
        const auto found = m_programmes.find(programme);
        tellRating(found && !found->ratings.empty() ? found->ratings.front() : 0);
    }
}

void Broadcast::tellRating(TELIX_JS_SI_PARENTALRATING_HANDLE rating) {
    const bool isFirst = !std::exchange(m_hasRating, true);
    const TELIX_JS_SI_PARENTALRATING_HANDLE former = std::exchange(m_rating, rating);
    if (isFirst ? rating == 0 : rating == former) {
        return;
    }
    TELIX_JS_VB_HANDLE object = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        object = m_holder;
    }
    const auto found = m_programmes.findRating(rating);
    // A number of the broadcaster's own means nothing to a set.
    (found && !found->isAge() ? onRatingError : onRatingChange)
        .call(object, static_cast<___UINT8*>(nullptr), rating, static_cast<___UINT8*>(nullptr));
}

// ---- Components

TELIX_JS_AVCOMPHANDLE Broadcast::internLocked(const Component& component) {
    for (size_t index = 0; index < m_components.size(); ++index) {
        const Component& each = m_components[index];
        if (each.type == component.type && each.channel == component.channel && each.pid == component.pid &&
            each.encoding == component.encoding && each.language == component.language &&
            each.isEncrypted == component.isEncrypted &&
            each.isAudioDescription == component.isAudioDescription &&
            each.isForHearingImpaired == component.isForHearingImpaired) {
            return static_cast<TELIX_JS_AVCOMPHANDLE>(index + 1);
        }
    }
    m_components.push_back(component);
    return static_cast<TELIX_JS_AVCOMPHANDLE>(m_components.size());
}

void Broadcast::takeMap(uint64_t number, const Pmt& map) {
    if (m_presented != number) {
        return;
    }
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        m_available.clear();
        for (const ElementaryStream& stream : map.streams) {
            if (const auto component = componentOf(m_current, map, stream)) {
                m_available.push_back(internLocked(*component));
            }
        }
        const auto videos = ofKindLocked(TELIX_JS_AVCOMPTYPE_VIDEO, false);
        m_active[TELIX_JS_AVCOMPTYPE_VIDEO] = videos.empty() ? 0 : videos.front();
        m_active[TELIX_JS_AVCOMPTYPE_SUBTITLE] = 0; // until someone wants them
        TELIX_JS_AVCOMPHANDLE& audio = m_active[TELIX_JS_AVCOMPTYPE_AUDIO];
        audio = 0;
        for (const TELIX_JS_AVCOMPHANDLE handle : ofKindLocked(TELIX_JS_AVCOMPTYPE_AUDIO, false)) {
            const Component& component = m_components[handle - 1];
            const bool isWanted = component.language == m_platform.configuration().audioLanguage &&
                                  !component.isAudioDescription && !component.isForHearingImpaired;
            const bool isBetter =
                isWanted && audio != 0 &&
                m_components[audio - 1].language != m_platform.configuration().audioLanguage;
            audio = audio == 0 || isBetter ? handle : audio;
        }
    }
    applySelection();
}

// The shape of the picture is known from its first frame.
void Broadcast::readShape() {
    telix_desktop_frame frame{};
    telix_desktop_acquire_frame(&frame);
    if (frame.pixels && frame.aspectHeight != 0) {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        for (const TELIX_JS_AVCOMPHANDLE handle : ofKindLocked(TELIX_JS_AVCOMPTYPE_VIDEO, true)) {
            m_components[handle - 1].aspectRatio =
                static_cast<float>(frame.aspectWidth) / static_cast<float>(frame.aspectHeight);
        }
    }
    telix_desktop_release_frame(&frame);
}

std::vector<TELIX_JS_AVCOMPHANDLE> Broadcast::ofKindLocked(TELIX_JS_AVCOMPTYPE type, bool activeOnly) const {
    std::vector<TELIX_JS_AVCOMPHANDLE> handles;
    for (const TELIX_JS_AVCOMPHANDLE handle : m_available) {
        const bool isKind = m_components[handle - 1].type == type;
        if (isKind && (!activeOnly || m_active[type] == handle)) {
            handles.push_back(handle);
        }
    }
    return handles;
}

std::optional<std::vector<TELIX_JS_AVCOMPHANDLE>>
Broadcast::components(TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPTYPE type, bool activeOnly) const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    if (!findLocked(object)) {
        return std::nullopt;
    }
    return m_holder == object ? ofKindLocked(type, activeOnly) : std::vector<TELIX_JS_AVCOMPHANDLE>();
}

std::optional<ComponentTraits> Broadcast::findComponent(TELIX_JS_AVCOMPHANDLE component,
                                                        TELIX_JS_AVCOMPTYPE type) const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const bool isKnown =
        component != 0 && component <= m_components.size() && m_components[component - 1].type == type;
    return isKnown ? std::optional<ComponentTraits>(m_components[component - 1]) : std::nullopt;
}

bool Broadcast::select(TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type,
                       bool on) {
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        const auto choice = ofKindLocked(type, false);
        if (object == 0 || m_holder != object ||
            std::find(choice.begin(), choice.end(), component) == choice.end()) {
            return false;
        }
        if (on) {
            m_active[type] = component;
        } else if (m_active[type] == component) {
            m_active[type] = 0;
        }
    }
    m_platform.post([this] { applySelection(); });
    return true;
}

void Broadcast::applySelection() {
    if (!m_tuner) {
        return;
    }
    std::optional<uint16_t> pids[3];
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        for (size_t type = 0; type < 3; ++type) {
            if (m_active[type] != 0) {
                pids[type] = m_components[m_active[type] - 1].pid;
            }
        }
    }
    m_tuner->selectVideo(pids[TELIX_JS_AVCOMPTYPE_VIDEO].has_value());
    m_tuner->selectAudio(pids[TELIX_JS_AVCOMPTYPE_AUDIO]);
    m_tuner->selectSubtitle(pids[TELIX_JS_AVCOMPTYPE_SUBTITLE]);
    if (!pids[TELIX_JS_AVCOMPTYPE_VIDEO] && m_working.number == 0) {
        m_platform.picture().blank(m_token); // written on this thread alone
    }
}

std::optional<uint16_t> Broadcast::heardAudio() const {
    return m_tuner ? m_tuner->heardAudio() : std::nullopt;
}

// ---- Stream events

bool Broadcast::watch(TELIX_JS_VB_HANDLE object, TELIX_JS_VB_STREAM_EVENT_CB callback,
                      const std::string& eventId, const std::string& tag, const std::string& name) {
    if (!exists(object) || !callback) {
        return false;
    }
    std::lock_guard<std::recursive_mutex> lock(m_subscriptionsMutex);
    m_subscriptions.push_back({object, callback, readEventId(eventId), readTag(tag), name, -1});
    return true;
}

bool Broadcast::unwatch(TELIX_JS_VB_HANDLE object, TELIX_JS_VB_STREAM_EVENT_CB callback,
                        const std::string& eventId, const std::string& tag) {
    std::lock_guard<std::recursive_mutex> lock(m_subscriptionsMutex);
    const auto found =
        std::find_if(m_subscriptions.begin(), m_subscriptions.end(), [&](const Subscription& each) {
            return each.object == object && each.callback == callback &&
                   each.eventId == readEventId(eventId) && each.tag == readTag(tag);
        });
    if (found == m_subscriptions.end()) {
        return false;
    }
    m_subscriptions.erase(found); // one of two equal ones goes on
    return true;
}

void Broadcast::deliverEvent(uint8_t tag, const StreamEvent& event) {
    TELIX_JS_VB_HANDLE holder = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        holder = m_holder;
    }
    std::lock_guard<std::recursive_mutex> lock(m_subscriptionsMutex);
    std::vector<Subscription> due;
    for (Subscription& each : m_subscriptions) {
        const bool isMeant = each.object == holder && each.tag == tag && each.eventId == event.id;
        if (isMeant && each.lastVersion != event.version) { // an event is sent several times over
            each.lastVersion = event.version;
            due.push_back(each);
        }
    }
    deliver(due, event.data, "trigger");
}

// Under the mutex of the subscriptions.
void Broadcast::deliver(const std::vector<Subscription>& due, const Bytes& data, std::string status) {
    // The data travels in hexadecimal digits.
    std::string text;
    for (const uint8_t byte : data) {
        char digits[3];
        std::snprintf(digits, sizeof(digits), "%02x", byte);
        text += digits;
    }
    for (const Subscription& each : due) {
        std::string name = each.name;
        each.callback(each.object, nullptr, nullptr, reinterpret_cast<___UINT8*>(name.data()),
                      reinterpret_cast<___UINT8*>(text.data()), static_cast<___UINT32>(text.size()),
                      reinterpret_cast<___UINT8*>(status.data()));
    }
}

// ---- Provoked from outside

bool Broadcast::injectChannelError(TELIX_ERR_STATE_ENUM_T error) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    if (m_holder == 0) {
        return false;
    }
    m_platform.post([this, object = m_holder, channel = m_current, error] {
        onChannelError.call(object, channel, error);
    });
    return true;
}

bool Broadcast::zap(TELIX_JS_CM_HANDLE channel) {
    const bool isKnown = m_channels.find(channel).has_value();
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    if (!isKnown) {
        return false;
    }
    if (m_holder != 0) {
        requestLocked(m_holder, channel);
    } else {
        m_current = channel;
    }
    return true;
}

// It comes also if the rating was the same before.
bool Broadcast::injectRating(const std::string& region, uint8_t broadcast) {
    const TELIX_JS_SI_PARENTALRATING_HANDLE rating =
        broadcast == 0 ? 0 : m_programmes.addRating(region, broadcast);
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    if (m_holder == 0) {
        return false;
    }
    m_platform.post([this, rating] {
        m_hasRating = true;
        m_rating = ~rating; // never the one that comes
        tellRating(rating);
    });
    return true;
}

bool Broadcast::injectRatingError(std::string contentId, std::string drmSystemId) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    if (m_holder == 0) {
        return false;
    }
    m_platform.post([this, object = m_holder, contentId, drmSystemId]() mutable {
        onRatingError.call(object, reinterpret_cast<___UINT8*>(contentId.data()),
                           TELIX_JS_SI_PARENTALRATING_HANDLE{0},
                           reinterpret_cast<___UINT8*>(drmSystemId.data()));
    });
    return true;
}

size_t Broadcast::injectStreamEvent(const InjectedEvent& event) {
    std::lock_guard<std::recursive_mutex> lock(m_subscriptionsMutex);
    std::vector<Subscription> due;
    std::copy_if(m_subscriptions.begin(), m_subscriptions.end(), std::back_inserter(due),
                 [&](const Subscription& each) {
                     return event.id.value_or(each.eventId) == each.eventId &&
                            event.tag.value_or(each.tag) == each.tag &&
                            event.name.value_or(each.name) == each.name;
                 });
    deliver(due, event.data, event.status);
    return due.size();
}

bool Broadcast::injectFullScreen(bool on) {
    TELIX_JS_VB_HANDLE object = 0;
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        object = m_holder;
    }
    if (object == 0 || !changeView(object, [on](Picture::View& view) { view.fullScreen = on; })) {
        return false;
    }
    m_platform.post([this, object] { onFullScreen.call(object); });
    return true;
}

// ---- What there is now

Broadcast::State Broadcast::state() const {
    State state{};
    {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        state.channel = m_current;
        for (const auto& [handle, object] : m_objects) {
            state.objects.push_back({handle, object.state, object.channel, object.view, handle == m_holder});
        }
        for (const TELIX_JS_AVCOMPHANDLE handle : m_available) {
            const Component& component = m_components[handle - 1];
            state.components.push_back({handle, component, m_active[component.type] == handle});
        }
        state.present = m_present;
        state.following = m_following;
    }
    std::lock_guard<std::recursive_mutex> lock(m_subscriptionsMutex);
    for (const Subscription& each : m_subscriptions) {
        state.watches.push_back({each.object, each.eventId, each.tag, each.name});
    }
    return state;
}

} // namespace desktop

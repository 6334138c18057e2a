// Components from the streams of a PMT.
#include "desktop/platform/BroadcastComponents.h"

#include <mutex>

#include "desktop/platform/Sections.h"

namespace desktop {

namespace {

// What kind of component a stream_type, or the descriptor of a private stream, stands for, and the encoding
// as pages know it (OIPF DAE, AVComponent.encoding).
struct Encoding {
    uint8_t code;
    TELIX_JS_AVCOMPTYPE type;
    const char* name;
};

const Encoding kStreamTypes[] = {
    {kStreamTypeMpeg1Video, TELIX_JS_AVCOMPTYPE_VIDEO, "MPEG1"},
    {kStreamTypeMpeg2Video, TELIX_JS_AVCOMPTYPE_VIDEO, "MPEG2"},
    {kStreamTypeAvcVideo, TELIX_JS_AVCOMPTYPE_VIDEO, "AVC"},
    {kStreamTypeHevcVideo, TELIX_JS_AVCOMPTYPE_VIDEO, "HEVC"},
    {kStreamTypeMpeg1Audio, TELIX_JS_AVCOMPTYPE_AUDIO, "MPEG1_L2"},
    {kStreamTypeMpeg2Audio, TELIX_JS_AVCOMPTYPE_AUDIO, "MPEG1_L2"},
    {kStreamTypeAacAdts, TELIX_JS_AVCOMPTYPE_AUDIO, "HEAAC"},
    {kStreamTypeAacLatm, TELIX_JS_AVCOMPTYPE_AUDIO, "HEAAC"},
    {kStreamTypeAc3, TELIX_JS_AVCOMPTYPE_AUDIO, "AC3"},
    {kStreamTypeEnhancedAc3, TELIX_JS_AVCOMPTYPE_AUDIO, "E_AC3"},
};

const Encoding kPrivateStreamDescriptors[] = {
    {kTagAc3, TELIX_JS_AVCOMPTYPE_AUDIO, "AC3"},
    {kTagEnhancedAc3, TELIX_JS_AVCOMPTYPE_AUDIO, "E_AC3"},
};

template <size_t Count>
const Encoding* findEncoding(const Encoding (&encodings)[Count], uint8_t code) {
    for (const Encoding& encoding : encodings) {
        if (encoding.code == code) {
            return &encoding;
        }
    }
    return nullptr;
}

bool hasCaDescriptor(const Bytes& descriptors) {
    bool isFound = false;
    forEachDescriptor(descriptors,
                      [&](uint8_t tag, const uint8_t*, size_t) { isFound = isFound || tag == kTagCa; });
    return isFound;
}

std::string codeOf(const uint8_t* body) {
    return {reinterpret_cast<const char*>(body), kCodeSize};
}

// Reads one descriptor of a stream into its component. True if it shows that the stream is a component.
bool readDescriptor(uint8_t streamType, uint8_t tag, const uint8_t* body, size_t length,
                    BroadcastComponent& component) {
    if (tag == kTagIso639Language && length >= kIso639LanguageBodySize) {
        const uint8_t audioType = body[kCodeSize];
        component.language = codeOf(body);
        component.isForHearingImpaired = audioType == kAudioTypeHearingImpaired;
        component.isAudioDescription = audioType == kAudioTypeVisualImpairedCommentary;
        return false;
    }
    if (tag == kTagSubtitling && length >= kSubtitlingBodySize) {
        const uint8_t subtitlingType = body[kCodeSize];
        component.type = TELIX_JS_AVCOMPTYPE_SUBTITLE;
        component.encoding = "DVB_SUB";
        component.language = codeOf(body);
        component.isForHearingImpaired = subtitlingType >= kSubtitlingTypeHardOfHearing &&
                                         subtitlingType <= kSubtitlingTypeHardOfHearingLast;
        return true;
    }
    const Encoding* encoding =
        streamType == kStreamTypePrivatePes ? findEncoding(kPrivateStreamDescriptors, tag) : nullptr;
    if (encoding) {
        component.type = encoding->type;
        component.encoding = encoding->name;
    }
    return encoding != nullptr;
}

// Nothing for a stream that a page cannot select, such as one of stream events.
std::optional<BroadcastComponent> componentOf(TELIX_JS_CM_HANDLE channel, const Pmt& pmt,
                                              const ElementaryStream& stream) {
    BroadcastComponent component;
    component.channel = channel;
    component.pid = stream.pid;
    component.isEncrypted = hasCaDescriptor(pmt.descriptors) || hasCaDescriptor(stream.descriptors);
    const Encoding* encoding = findEncoding(kStreamTypes, stream.type);
    if (encoding) {
        component.type = encoding->type;
        component.encoding = encoding->name;
    }
    bool isComponent = encoding != nullptr;
    forEachDescriptor(stream.descriptors, [&](uint8_t tag, const uint8_t* body, size_t length) {
        isComponent = readDescriptor(stream.type, tag, body, length, component) || isComponent;
    });
    return isComponent ? std::optional(component) : std::nullopt;
}

} // namespace

BroadcastComponents::BroadcastComponents() : m_platform(Platform::instance()) {}

void BroadcastComponents::onPmt(TELIX_JS_CM_HANDLE channel, const Pmt& pmt) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    m_selection.clear();
    for (const ElementaryStream& stream : pmt.streams) {
        if (const auto component = componentOf(channel, pmt, stream)) {
            const TELIX_JS_AVCOMPHANDLE handle = m_table.intern(*component);
            m_selection.add(handle, m_table.share(handle));
        }
    }
    m_selection.selectDefaults(m_platform.configuration().audioLanguage);
}

void BroadcastComponents::selectDefaults() {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    m_selection.selectDefaults(m_platform.configuration().audioLanguage);
}

void BroadcastComponents::onAudioFormat(TELIX_JS_CM_HANDLE channel, uint16_t pid, uint32_t audioChannels) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    for (const ComponentSelection::Available& each : m_selection.available()) {
        BroadcastComponent& component = m_table.at(each.handle);
        if (component.channel == channel && component.pid == pid) {
            component.audioChannels = audioChannels;
        }
    }
}

void BroadcastComponents::updateAspectRatio() {
    telix_desktop_frame frame{};
    telix_desktop_acquire_frame(&frame);
    if (frame.pixels && frame.aspectHeight != 0) {
        std::lock_guard<std::mutex> lock(m_platform.mutex());
        if (const TELIX_JS_AVCOMPHANDLE video = m_selection.active(TELIX_JS_AVCOMPTYPE_VIDEO)) {
            m_table.at(video).aspectRatio =
                static_cast<float>(frame.aspectWidth) / static_cast<float>(frame.aspectHeight);
        }
    }
    telix_desktop_release_frame(&frame);
}

void BroadcastComponents::clearLocked() {
    m_selection.clear();
}

std::optional<ComponentTraits> BroadcastComponents::find(TELIX_JS_AVCOMPHANDLE component,
                                                         TELIX_JS_AVCOMPTYPE type) const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    const BroadcastComponent* found = m_table.find(component, type);
    return found ? std::optional<ComponentTraits>(*found) : std::nullopt;
}

bool BroadcastComponents::hasVideo() const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    return !m_selection.list(TELIX_JS_AVCOMPTYPE_VIDEO, false).empty();
}

BroadcastComponents::ActivePids BroadcastComponents::activePids() const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    return {activePidLocked(TELIX_JS_AVCOMPTYPE_VIDEO), activePidLocked(TELIX_JS_AVCOMPTYPE_AUDIO),
            activePidLocked(TELIX_JS_AVCOMPTYPE_SUBTITLE)};
}

std::optional<uint16_t> BroadcastComponents::activePidLocked(TELIX_JS_AVCOMPTYPE type) const {
    const TELIX_JS_AVCOMPHANDLE active = m_selection.active(type);
    return active != 0 ? std::optional(m_table.at(active).pid) : std::nullopt;
}

std::vector<TELIX_JS_AVCOMPHANDLE> BroadcastComponents::listLocked(TELIX_JS_AVCOMPTYPE type,
                                                                   bool activeOnly) const {
    return m_selection.list(type, activeOnly);
}

bool BroadcastComponents::selectLocked(TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type,
                                       bool isActive) {
    return m_selection.select(component, type, isActive);
}

std::vector<BroadcastComponents::Available> BroadcastComponents::availableLocked() const {
    std::vector<Available> available;
    for (const ComponentSelection::Available& each : m_selection.available()) {
        const BroadcastComponent& component = m_table.at(each.handle);
        available.push_back({each.handle, component, m_selection.active(component.type) == each.handle});
    }
    return available;
}

} // namespace desktop

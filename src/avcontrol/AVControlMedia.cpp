// The choice of media: what the platform is given for a MIME type, and what a new `data` causes.
#include <strings.h>

#include "common/BrowserGates.h"
#include "common/Log.h"
#include "common/PluginUtils.h"
#include "src/avcontrol/AVControl.h"

namespace {

struct PluginMimeType {
    const char* mimeType;
    const char* extension;
    int flag; // nothing reads it
    int32_t mediaType;
    int32_t containerCode;
    int32_t audioCodecCode;
};

constexpr int32_t kMediaUnknown = -1;
constexpr int32_t kMediaVideo = 100;
constexpr int32_t kMediaAudio = 200;
constexpr int32_t kUnknownContainer = 1280;
constexpr int32_t kMp3Codec = 1;

const PluginMimeType pluginMimeType[] = {
    {"audio/mpeg", "mp3", 0, kMediaAudio, AVControl::kContainerMp3, kMp3Codec},
    {"audio/mp4", "mp4", 0, kMediaAudio, 512, 4},
    {"video/mp4", "mp4", 0, kMediaVideo, 512, 0},
    {"video/mpeg", "mpg", 0, kMediaVideo, 512, 0},
    {"video/mpeg4", "mp4", 0, kMediaVideo, 512, 0},
    {"video/x-ms-ism", "ism", 0, kMediaVideo, 512, 0},
    {"application/vnd.ms-sstr+xml", "ism", 0, kMediaVideo, 512, 0},
    {"application/vnd.apple.mpegurl", "m3u8", 0, kMediaVideo, 512, 0},
    {"audio/mpegurl", "m3u8", 0, kMediaAudio, 512, 0},
    {nullptr, nullptr, 1, kMediaVideo, kUnknownContainer, 0},
};

bool equal(const std::string& text, const char* other) {
    return strcasecmp(text.c_str(), other) == 0;
}

} // namespace

void AVControl::detectMediaType(const std::string& type) {
    if (type.empty()) {
        if (m_mediaType == kMediaUnknown && m_mimeType.find("audio/mpeg") != std::string::npos) {
            m_mediaType = kMediaAudio;
            m_containerCode = kContainerMp3;
            m_audioCodecCode = kMp3Codec;
        }
        return;
    }
    const auto take = [this](const PluginMimeType& row) {
        m_mediaType = row.mediaType;
        m_containerCode = row.containerCode;
        m_audioCodecCode = row.audioCodecCode;
    };
    m_containerCode = kUnknownContainer;
    m_audioCodecCode = 0;
    for (const PluginMimeType* row = pluginMimeType; row->mimeType; ++row) {
        if (!equal(type, row->mimeType)) {
            continue;
        }
        take(*row);
        if (equal(type, "video/x-ms-ism") || equal(type, "application/vnd.ms-sstr+xml")) {
            PLUGIN_LOG(AVCONTROL, "video/x-ms-ism mimetype or application/vnd.ms-sstr+xml mimetype ");
            m_sourceCode = SourceCode::SmoothStreaming;
        } else if (equal(type, "application/vnd.apple.mpegurl") || equal(type, "audio/mpegurl")) {
            PLUGIN_LOG(AVCONTROL, "HLS mimetype ");
            m_sourceCode = SourceCode::Hls;
        }
    }
    const std::string url = getURL();
    const size_t dot = url.rfind('.');
    if (m_mediaType == kMediaUnknown && dot != std::string::npos) {
        // The tail keeps its dot and the table's extensions have none, so an unknown type stays unknown
        // whatever its URL ends in.
        const std::string tail = url.substr(dot);
        for (const PluginMimeType* row = pluginMimeType; row->extension && *row->extension; ++row) {
            if (equal(tail, row->extension)) {
                take(*row);
            }
        }
    }
}

void AVControl::setData(const std::string& url) {
    const size_t dot = url.rfind('.');
    if (dot != std::string::npos) {
        // quirk 64: neither mark is taken back by a later URL.
        const std::string tail = url.substr(dot);
        if (equal(tail, ".aac") || equal(tail, ".wav")) {
            PLUGIN_LOG(AVCONTROL, "Memory audio with file extension .aac or .wav ");
            m_memoryAudio = true;
        } else if (equal(tail.substr(0, 4), ".ism")) {
            PLUGIN_LOG(AVCONTROL, "Smooth streaming URL ");
            m_sourceCode = SourceCode::SmoothStreaming;
        }
    }
    stop();
    m_data = !url.empty() && url.find("://") == std::string::npos ? getBaseURL(url) : url;
    encodeURL();
    // quirk 63: script reads back the encoded form; if the page could not encode, the URL before.
    m_data = getURL();
    m_mediaType = kMediaUnknown;
    detectMediaType(m_mimeType);
    setAutoStart(false);
    if (m_fetchStream) {
        getURLValue(getURL());
    } else {
        m_streamState = StreamState::Ready;
    }
}

void AVControl::encodeURL() {
    invokeJScript(getEncodedURL(m_data));
    NPVariant encoded{};
    if (!NPN_Invoke(m_npp, getNPWindowObj(), NPN_GetStringIdentifier("getEncodedURL"), nullptr, 0,
                    &encoded)) {
        return;
    }
    if (encoded.type == NPVariantType_String) {
        setURL(stringValue(encoded.value.stringValue));
    }
    NPN_ReleaseVariantValue(&encoded);
}

void AVControl::getURLValue(const std::string& url) {
    if (url.empty()) {
        return;
    }
    NPN_GetURLNotify(m_npp, url.c_str(), nullptr, nullptr);
    m_streamState = StreamState::Requested;
    m_streamFlag = false;
}

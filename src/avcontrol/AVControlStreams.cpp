// What the browser streams: the media itself plays from its URL, so a stream serves only to learn the
// media's type from its headers and to gather a playlist.
#include <string_view>
#include <utility>

#include "common/BrowserGates.h"
#include "common/PluginUtils.h"
#include "src/avcontrol/AVControl.h"
#include "src/avcontrol/Asx.h"

namespace {

constexpr int32_t kChunkSize = 1024;

} // namespace

NPError AVControl::newStream(NPMIMEType, NPStream* stream, NPBool, uint16_t*) {
    m_streamState = StreamState::Ready;
    // One stream in an object's life; the content of another URL is not looked at.
    // quirk 69: an object takes one stream in its life.
    if (m_streamSeen) {
        NPN_DestroyStream(m_npp, stream, NPRES_DONE);
        return NPERR_NO_ERROR;
    }
    m_streamSeen = true;
    if (toLower(getURL()) == toLower(stream->url)) {
        setURL(stream->url);
        detectMediaType(m_mimeType);
    }
    stream->pdata = this;
    return NPERR_NO_ERROR;
}

int32_t AVControl::writeReady(NPStream* stream) {
    if (getPluginMode() == NP_FULL) {
        NPN_DestroyStream(m_npp, stream, NPRES_DONE);
        return 0;
    }
    return stream->pdata == m_npp->pdata ? kChunkSize : 0;
}

int32_t AVControl::write(NPStream* stream, int32_t offset, int32_t length, void* buffer) {
    const std::string headers = stream->headers ? stream->headers : "";
    if (offset == 0 && toLower(headers).find("content-type") != std::string::npos) {
        m_mimeType = headers;
        detectMediaType("");
    }
    // The browser's length is signed.
    const std::string_view chunk = buffer && length > 0
                                       ? std::string_view(static_cast<const char*>(buffer), length)
                                       : std::string_view();
    if (offset == 0) {
        beginBody(chunk);
        if (!m_isPlayList && !m_memoryAudio) {
            NPN_DestroyStream(m_npp, stream, NPRES_DONE);
        }
    } else {
        m_body.append(chunk);
    }
    return length;
}

// The first chunk says whether the stream is a playlist. A playlist is read to its first zero byte.
void AVControl::beginBody(std::string_view chunk) {
    const std::string playlist =
        asxIsAsxfile(std::string(chunk).c_str(), static_cast<unsigned>(chunk.size()));
    if (!playlist.empty()) {
        m_body.take();
        m_body.append(playlist);
        m_bodyIsPlaylist = true;
        m_isPlayList = true;
    } else if (!m_bodyIsPlaylist) {
        m_body.append(chunk);
    }
}

// quirk 67: a playlist plays as soon as it has been read.
// quirk 68: the reason isn't looked at, so what has come of a broken playlist plays.
NPError AVControl::destroyStream(NPStream*, NPReason) {
    if (!m_isPlayList) {
        return NPERR_NO_ERROR;
    }
    const bool hasText = std::exchange(m_bodyIsPlaylist, false);
    if (asxParseAsx(hasText ? m_body.take() : AsxText(), getURL()) == 0) {
        asxPrintAsxData();
        play(m_playSpeed);
    } else {
        processError(AVCONTROL_ERROR_PLAYLIST);
    }
    return NPERR_NO_ERROR;
}

void AVControl::urlNotify(const char*, NPReason reason, void*) {
    if (reason == NPRES_NETWORK_ERR) {
        processError(AVCONTROL_ERROR_CONNECTION);
    }
}

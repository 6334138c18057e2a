// What the browser streams: the media itself plays from its URL, so a stream serves only to learn the
// media's type from its headers and to gather a playlist.
#include <cstdlib>
#include <cstring>

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
    if (buffer) {
        // Without memory the bytes before are given up as well, and the stream goes on.
        m_bodyData = static_cast<char*>(std::realloc(m_bodyData, m_bodySize + length)); // NOLINT
        if (m_bodyData) {
            std::memcpy(m_bodyData + m_bodySize, buffer, length);
            m_bodySize += length;
        }
    }
    const std::string chunk = buffer ? std::string(static_cast<const char*>(buffer), length) : std::string();
    if (offset == 0) {
        // A terminated copy: a playlist is read to its first zero byte.
        const std::string playlist = asxIsAsxfile(chunk.c_str(), length);
        if (!playlist.empty()) {
            m_asxText = playlist;
            m_isPlayList = true;
        }
        if (!m_isPlayList && !m_memoryAudio) {
            NPN_DestroyStream(m_npp, stream, NPRES_DONE);
        }
    } else if (!m_asxText.empty()) {
        m_asxText += chunk;
    }
    return length;
}

// quirk 67: a playlist plays as soon as it has been read.
// quirk 68: the reason isn't looked at, so what has come of a broken playlist plays.
NPError AVControl::destroyStream(NPStream*, NPReason) {
    if (!m_isPlayList) {
        return NPERR_NO_ERROR;
    }
    if (asxParseAsx(m_asxText.c_str(), getURL()) == 0) {
        asxPrintAsxData();
        play(m_playSpeed);
    } else {
        processError(AVCONTROL_ERROR_PLAYLIST);
    }
    m_asxText.clear();
    return NPERR_NO_ERROR;
}

void AVControl::urlNotify(const char*, NPReason reason, void*) {
    if (reason == NPRES_NETWORK_ERR) {
        processError(AVCONTROL_ERROR_CONNECTION);
    }
}

// The streams of a page's instances.
#include "bridge/Streams.h"

#include <algorithm>
#include <utility>
#include <vector>

#include <glib.h>
#include <glib/gstdio.h>

#include "bridge/CallDepth.h"
#include "bridge/HostObject.h"
#include "bridge/Instance.h"
#include "bridge/Page.h"
#include "bridge/Variants.h"

namespace bridge {

namespace {

// After how many milliseconds a plug-in that accepts no data is asked again.
constexpr unsigned kRetryInterval = 10;

} // namespace

struct Streams::Stream {
    // Requested: nothing has come. Offered: NPP_NewStream is running. Open: the plug-in has accepted the
    // stream, and is told of its end. Ended: nothing follows.
    enum class State { Requested, Offered, Open, Ended };

    uint32_t number;
    std::shared_ptr<Instance> instance;
    StreamRequest request;
    StreamResponse response;
    State state = State::Requested;
    NPStream np = {};
    uint16_t mode = NP_NORMAL;
    std::string queue; // data that the plug-in has not taken
    size_t delivered = 0;
    bool isComplete = false; // nothing follows the queue
    NPReason endReason = NPRES_DONE;
    std::string file; // of the modes with a file: all data
    guint retry = 0;

    const NPPluginFuncs& calls() const { return instance->calls(); }
    bool wantsData() const { return mode != NP_ASFILEONLY; }
    bool wantsFile() const { return mode == NP_ASFILE || mode == NP_ASFILEONLY; }
};

Streams::~Streams() {
    for (const auto& [number, stream] : m_streams) {
        if (stream->retry) {
            g_source_remove(stream->retry);
        }
    }
}

Streams::StreamPointer Streams::find(uint32_t number) const {
    const auto found = m_streams.find(number);
    return found == m_streams.end() ? nullptr : found->second;
}

NPError Streams::open(Instance& instance, const StreamRequest& request) {
    if (request.url.empty()) {
        return NPERR_INVALID_URL;
    }
    const auto stream = std::make_shared<Stream>();
    stream->number = ++m_lastNumber;
    stream->instance = instance.shared_from_this();
    stream->request = request;
    m_streams.emplace(stream->number, stream);
    Arguments arguments(6);
    arguments[0] = doubleVariant(stream->number);
    arguments[1] = stringVariant(request.url);
    arguments[2] = stringVariant(request.target);
    arguments[3] = stringVariant(request.isPost ? "POST" : "GET");
    arguments[4] = stringVariant(request.headers);
    arguments[5] = stringVariant(textFromBytes(request.body));
    if (!m_page.callScript("request", arguments)) {
        m_streams.erase(stream->number);
        return NPERR_GENERIC_ERROR;
    }
    return NPERR_NO_ERROR;
}

NPError Streams::destroy(const Instance& instance, const NPStream* stream, NPReason reason) {
    for (const auto& [number, candidate] : m_streams) {
        if (&candidate->np == stream && candidate->instance.get() == &instance) {
            finish(StreamPointer(candidate), reason);
            return NPERR_NO_ERROR;
        }
    }
    return NPERR_INVALID_INSTANCE_ERROR;
}

void Streams::endAll(const Instance& instance) {
    std::vector<StreamPointer> ending;
    for (const auto& [number, stream] : m_streams) {
        if (stream->instance.get() == &instance) {
            ending.push_back(stream);
        }
    }
    for (const auto& stream : ending) {
        finish(stream, NPRES_USER_BREAK);
    }
}

void Streams::onResponse(uint32_t number, const StreamResponse& response) {
    const StreamPointer stream = find(number);
    if (!stream || stream->state != Stream::State::Requested || !stream->calls().newstream) {
        return;
    }
    stream->response = response;
    stream->np.url = stream->response.url.c_str();
    stream->np.end = response.length;
    stream->np.lastmodified = response.modified;
    stream->np.notifyData = stream->request.notifyData;
    stream->np.headers = stream->response.headers.c_str();
    stream->state = Stream::State::Offered;
    NPError error = NPERR_NO_ERROR;
    {
        const CallDepth depth;
        std::string mimeType = response.mimeType;
        error = stream->calls().newstream(stream->instance->npp(), mimeType.data(), &stream->np, false,
                                          &stream->mode);
    }
    if (stream->state != Stream::State::Offered) { // the plug-in has ended it
        return;
    }
    if (error != NPERR_NO_ERROR) {
        finish(stream, NPRES_USER_BREAK);
        return;
    }
    stream->state = Stream::State::Open;
    if (stream->mode == NP_SEEK) {
        finish(stream, NPRES_NETWORK_ERR); // no range of a response can be read at will here
    } else {
        deliver(stream);
    }
}

void Streams::onData(uint32_t number, std::string_view bytes) {
    if (const StreamPointer stream = find(number)) {
        if (stream->wantsFile()) {
            stream->file += bytes;
        }
        if (stream->wantsData()) {
            stream->queue += bytes;
        }
        deliver(stream);
    }
}

void Streams::onEnd(uint32_t number, NPReason reason) {
    if (const StreamPointer stream = find(number)) {
        stream->isComplete = true;
        stream->endReason = reason;
        deliver(stream);
    }
}

// Hands the queue to the plug-in as fast as that takes it, and then asks for more or ends the stream.
void Streams::deliver(const StreamPointer& stream) {
    while (!stream->queue.empty() && stream->state == Stream::State::Open) {
        if (!deliverPiece(stream)) {
            return;
        }
    }
    if (stream->state == Stream::State::Ended) {
        return;
    }
    if (stream->isComplete) {
        finish(stream, stream->endReason);
    } else if (stream->state == Stream::State::Open) {
        Arguments arguments(1);
        arguments[0] = doubleVariant(stream->number);
        m_page.callScript("next", arguments);
    }
}

// False when the plug-in takes nothing now.
bool Streams::deliverPiece(const StreamPointer& stream) {
    if (stream->retry) {
        return false;
    }
    NPP const npp = stream->instance->npp();
    const CallDepth depth;
    const int32_t accepted = stream->calls().writeready(npp, &stream->np);
    if (stream->state != Stream::State::Open) {
        return true;
    }
    if (accepted <= 0) {
        retryLater(stream);
        return false;
    }
    // A copy with a zero after it: the plug-in may read on to the end of a string.
    std::string piece = stream->queue.substr(0, static_cast<size_t>(accepted));
    const auto length = static_cast<int32_t>(piece.size());
    // The offset is a number of 32 bits; of what follows only the order is told.
    const auto offset = static_cast<int32_t>(std::min<size_t>(stream->delivered, INT32_MAX));
    const int32_t taken = stream->calls().write(npp, &stream->np, offset, length, piece.data());
    if (stream->state != Stream::State::Open) {
        return true;
    }
    if (taken < 0) {
        finish(stream, NPRES_NETWORK_ERR);
        return true;
    }
    const auto count = static_cast<size_t>(std::min(taken, length));
    stream->queue.erase(0, count);
    stream->delivered += count;
    if (count == 0) {
        retryLater(stream);
    }
    return count > 0;
}

void Streams::retryLater(const StreamPointer& stream) {
    struct Retry {
        Streams& streams;
        uint32_t number;
    };
    stream->retry = g_timeout_add_full(
        G_PRIORITY_DEFAULT, kRetryInterval,
        [](gpointer data) -> gboolean {
            const Retry retry = *static_cast<Retry*>(data);
            if (const StreamPointer waiting = retry.streams.find(retry.number)) {
                waiting->retry = 0;
                retry.streams.deliver(waiting);
            }
            return G_SOURCE_REMOVE;
        },
        new Retry{*this, stream->number}, [](gpointer data) { delete static_cast<Retry*>(data); });
}

void Streams::finish(const StreamPointer& stream, NPReason reason) {
    const Stream::State before = std::exchange(stream->state, Stream::State::Ended);
    if (before == Stream::State::Ended) {
        return;
    }
    m_streams.erase(stream->number);
    if (stream->retry) {
        g_source_remove(std::exchange(stream->retry, 0));
    }
    if (!stream->isComplete) {
        Arguments arguments(1);
        arguments[0] = doubleVariant(stream->number);
        m_page.callScript("cancel", arguments);
    }
    NPP const npp = stream->instance->npp();
    const CallDepth depth;
    if (before == Stream::State::Open) {
        if (reason == NPRES_DONE && stream->wantsFile()) {
            saveAsFile(*stream);
        }
        stream->calls().destroystream(npp, &stream->np, reason);
    }
    if (stream->request.notifies && stream->calls().urlnotify) {
        stream->calls().urlnotify(npp, stream->request.url.c_str(), reason, stream->request.notifyData);
    }
}

// The file is the plug-in's for the length of the call.
void Streams::saveAsFile(Stream& stream) {
    gchar* name = nullptr;
    const gint file = g_file_open_tmp("telix-stream-XXXXXX", &name, nullptr);
    if (file < 0) {
        return;
    }
    g_close(file, nullptr);
    const bool isWritten =
        g_file_set_contents(name, stream.file.data(), static_cast<gssize>(stream.file.size()), nullptr);
    if (isWritten && stream.calls().asfile) {
        stream.calls().asfile(stream.instance->npp(), &stream.np, name);
    }
    g_unlink(name);
    g_free(name);
}

} // namespace bridge

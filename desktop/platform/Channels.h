// The channel list, and unlisted channels that pages make.
#ifndef TELIX_DESKTOP_PLATFORM_CHANNELS_H
#define TELIX_DESKTOP_PLATFORM_CHANNELS_H

#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include "desktop/platform/Configuration.h"
#include "desktop/platform/TsTables.h"
#include "telix/telix_platform.h"

namespace desktop {

// The transport_stream_id of a page that gives none: it stands for any.
constexpr uint32_t kAnyTransportStream = 8191;

struct Channel {
    enum class Origin {
        TestMultiplex,
        File,
        None, // a page made it: tuning to it is an error
    };

    // What pages know as Channel.channelType (OIPF DAE).
    enum Type : int32_t { Television = 0, Radio = 1, Other = 2 };

    TELIX_JS_CM_HANDLE handle = 0;
    Origin origin = Origin::None;
    std::string file; // of Origin::File
    int32_t type = Television;
    uint32_t onid = 0; // original_network_id
    uint32_t tsid = 0; // transport_stream_id
    uint32_t sid = 0;  // service_id
    std::string name;
    Bytes deliveryDescriptor;
};

// Any thread.
class Channels {
public:
    // Reads the services of the sources. A file that cannot be read gets a channel with the file's name.
    explicit Channels(const std::vector<Configuration::Source>& sources);

    // Does not change.
    const std::vector<TELIX_JS_CM_HANDLE>& list() const { return m_list; }

    std::optional<Channel> find(TELIX_JS_CM_HANDLE handle) const;

    // The listed channel with these ids; 0 if there is none.
    TELIX_JS_CM_HANDLE findByTriplet(uint32_t onid, uint32_t tsid, uint32_t sid) const;

    // The listed channel with these ids, or else an unlisted one, which is made if necessary. 0 if there are
    // too many unlisted channels.
    TELIX_JS_CM_HANDLE makeByTriplet(uint32_t onid, uint32_t tsid, uint32_t sid);
    TELIX_JS_CM_HANDLE makeByDescriptor(const Bytes& descriptor, uint32_t sid);

    // The channel `offset` places after a listed one (before it, if negative); the list has no ends. The
    // first channel for any other handle; 0 if the list is empty.
    TELIX_JS_CM_HANDLE neighbour(TELIX_JS_CM_HANDLE handle, int offset) const;

    bool usesTestMultiplex() const;

private:
    void add(Channel channel);
    void addFile(const std::string& file, std::optional<uint16_t> service);
    TELIX_JS_CM_HANDLE addUnlisted(Channel channel);

    mutable std::mutex m_mutex;             // guards m_channels
    std::vector<Channel> m_channels;        // by handle - 1; the listed ones come first
    std::vector<TELIX_JS_CM_HANDLE> m_list; // not changed after construction
};

} // namespace desktop

#endif

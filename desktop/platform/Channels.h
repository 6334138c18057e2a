// The channel line-up, and channels that pages make beside it.
#ifndef TELIX_DESKTOP_CHANNELS_H
#define TELIX_DESKTOP_CHANNELS_H

#include "desktop/platform/Configuration.h"
#include "desktop/platform/TsTables.h"
#include "telix/telix_platform.h"

#include <mutex>
#include <optional>
#include <string>
#include <vector>

namespace desktop {

// What a page gives for a transport stream that it left out.
constexpr uint32_t anyTransportStream = 8191;

struct Channel {
    enum class Origin { testMultiplex, file, nowhere };

    TELIX_JS_CM_HANDLE handle = 0;
    Origin origin = Origin::nowhere;
    std::string file; // of the origin "file"
    int32_t type = 0; // 0 television, 1 radio, 2 other
    uint32_t onid = 0;
    uint32_t tsid = 0;
    uint32_t sid = 0;
    std::string name;
    Bytes deliveryDescriptor;
};

// Any thread.
class Channels {
public:
    // Reads the services of the sources; a file that cannot be read stays in the line-up under its own name.
    explicit Channels(const std::vector<Configuration::Source>& sources);

    // In the order of the line-up; does not change.
    const std::vector<TELIX_JS_CM_HANDLE>& list() const { return m_list; }

    std::optional<Channel> find(TELIX_JS_CM_HANDLE handle) const;

    // The channel of the line-up with these ids; 0 if there is none.
    TELIX_JS_CM_HANDLE findByTriplet(uint32_t onid, uint32_t tsid, uint32_t sid) const;

    // The same, but makes a channel that comes from nowhere if there is none; 0 if there are too many of
    // those.
    TELIX_JS_CM_HANDLE makeByTriplet(uint32_t onid, uint32_t tsid, uint32_t sid);
    TELIX_JS_CM_HANDLE makeByDescriptor(const Bytes& descriptor, uint32_t sid);

    // The one before or behind a channel of the line-up, round its ends; the first one for any other.
    TELIX_JS_CM_HANDLE neighbour(TELIX_JS_CM_HANDLE handle, int distance) const;

    bool usesTestMultiplex() const;

private:
    void add(Channel channel);
    void addFile(const std::string& file, std::optional<uint16_t> service);
    TELIX_JS_CM_HANDLE addUnlisted(Channel channel);

    mutable std::mutex m_mutex;      // for the channels that are added later
    std::vector<Channel> m_channels; // the handle is the index and 1
    std::vector<TELIX_JS_CM_HANDLE> m_list;
};

} // namespace desktop

#endif

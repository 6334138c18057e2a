// The services of transport stream files, and channel lookup.
#include "desktop/platform/Channels.h"

#include <glib.h>

#include <algorithm>
#include <cstdio>

#include "desktop/platform/Multiplex.h"
#include "desktop/platform/RegularFile.h"
#include "desktop/platform/Sections.h"

namespace desktop {

namespace {

constexpr size_t kBytesScanned = size_t{8} << 20; // tables are repeated every two seconds at least
constexpr size_t kPacketsRead = 1024;             // at once
constexpr size_t kMaxUnlisted = 256;

// The tables of a file that describe its services.
struct Scan {
    std::optional<Pat> pat;
    std::optional<Sdt> sdt;
    std::optional<Nit> nit;
};

Scan scanFile(const std::string& file) {
    Scan scan;
    std::string error;
    const auto opened = RegularFile::open(file, error);
    if (!opened) {
        std::fprintf(stderr, "libtelix: %s: %s\n", file.c_str(), error.c_str());
        return scan;
    }
    Bytes packets(kPacketsRead * kPacketSize);
    const auto start = findPackets(packets.data(), opened->read(packets.data(), packets.size(), 0));
    if (!start) {
        std::fprintf(stderr, "libtelix: %s: not a transport stream\n", file.c_str());
        return scan;
    }
    SectionDemultiplexer demultiplexer([&](uint16_t pid, const Bytes& section) {
        if (pid == kPidPat && !scan.pat) {
            scan.pat = parsePat(section);
        } else if (pid == kPidSdt && !scan.sdt) {
            scan.sdt = parseSdt(section);
        } else if (pid == kPidNit && !scan.nit) {
            scan.nit = parseNit(section);
        }
    });
    for (const uint16_t pid : {kPidPat, kPidSdt, kPidNit}) {
        demultiplexer.add(pid);
    }
    for (size_t offset = *start; offset < kBytesScanned; offset += packets.size()) {
        const size_t length = opened->read(packets.data(), packets.size(), offset);
        for (size_t at = 0; at + kPacketSize <= length; at += kPacketSize) {
            if (scan.pat && scan.sdt && scan.nit) {
                return scan;
            }
            demultiplexer.push(packets.data() + at);
        }
        if (length < packets.size()) {
            break;
        }
    }
    return scan;
}

Channel::Type typeOf(uint8_t serviceType) {
    switch (serviceType) {
    case kServiceTypeDigitalTelevision:
    case kServiceTypeMpeg2HdTelevision:
    case kServiceTypeAdvancedCodecSdTelevision:
    case kServiceTypeAdvancedCodecHdTelevision:
    case kServiceTypeHevcTelevision:
        return Channel::Television;
    case kServiceTypeDigitalRadio:
    case kServiceTypeAdvancedCodecRadio:
        return Channel::Radio;
    default:
        return Channel::Other;
    }
}

// What the SDT says of the channel's service.
void describe(Channel& channel, const Sdt& sdt) {
    channel.onid = sdt.originalNetworkId;
    for (const SdtService& service : sdt.services) {
        if (service.serviceId == channel.sid) {
            channel.type = typeOf(service.type);
            channel.name = service.name.empty() ? channel.name : service.name;
        }
    }
}

std::string stemOf(const std::string& file) {
    const size_t slash = file.rfind('/');
    const std::string name = slash == std::string::npos ? file : file.substr(slash + 1);
    return name.substr(0, name.rfind('.'));
}

std::vector<std::string> filesIn(const std::string& folder) {
    std::vector<std::string> files;
    if (GDir* dir = g_dir_open(folder.c_str(), 0, nullptr)) {
        while (const char* name = g_dir_read_name(dir)) {
            if (g_str_has_suffix(name, ".ts")) {
                files.push_back(folder + "/" + name);
            }
        }
        g_dir_close(dir);
    }
    std::sort(files.begin(), files.end());
    return files;
}

} // namespace

Channels::Channels(const std::vector<Configuration::Source>& sources) {
    for (const Configuration::Source& source : sources) {
        if (source.path.empty()) {
            for (const TestService& service : testServices()) {
                if (!source.service || *source.service == service.serviceId) {
                    add({0, Channel::Origin::TestMultiplex, "", Channel::Television, kTestOriginalNetworkId,
                         kTestTransportStreamId, service.serviceId, service.name, testDeliveryDescriptor()});
                }
            }
        } else if (g_file_test(source.path.c_str(), G_FILE_TEST_IS_DIR)) {
            for (const std::string& file : filesIn(source.path)) {
                addFile(file, source.service);
            }
        } else {
            addFile(source.path, source.service);
        }
    }
    for (const Channel& channel : m_channels) {
        m_list.push_back(channel.handle);
    }
}

void Channels::add(Channel channel) {
    channel.handle = static_cast<TELIX_JS_CM_HANDLE>(m_channels.size() + 1);
    m_channels.push_back(std::move(channel));
}

void Channels::addFile(const std::string& file, std::optional<uint16_t> service) {
    const Scan scan = scanFile(file);
    Channel channel;
    channel.origin = Channel::Origin::File;
    channel.file = file;
    if (scan.nit) {
        channel.deliveryDescriptor = scan.nit->deliveryDescriptor;
    }
    bool isFound = false;
    for (const auto& [sid, pid] : scan.pat ? scan.pat->programs : decltype(Pat::programs)()) {
        if (sid == kProgramNumberNetwork || (service && *service != sid)) {
            continue;
        }
        isFound = true;
        channel.sid = sid;
        channel.tsid = scan.pat->transportStreamId;
        channel.name = stemOf(file);
        if (scan.pat->programs.size() > 1) {
            channel.name += " " + std::to_string(sid);
        }
        if (scan.sdt) {
            describe(channel, *scan.sdt);
        }
        add(channel);
    }
    if (!isFound) { // the viewer learns the reason by tuning to it
        channel.sid = service.value_or(0);
        channel.name = stemOf(file);
        add(channel);
    }
}

std::optional<Channel> Channels::find(TELIX_JS_CM_HANDLE handle) const {
    std::lock_guard<std::mutex> lock(m_mutex);
    if (handle == 0 || handle > m_channels.size()) {
        return std::nullopt;
    }
    return m_channels[handle - 1];
}

TELIX_JS_CM_HANDLE Channels::findByTriplet(uint32_t onid, uint32_t tsid, uint32_t sid) const {
    std::lock_guard<std::mutex> lock(m_mutex);
    for (const TELIX_JS_CM_HANDLE handle : m_list) {
        const Channel& channel = m_channels[handle - 1];
        const bool isStream = tsid == kAnyTransportStream || channel.tsid == tsid;
        if (channel.onid == onid && isStream && channel.sid == sid) {
            return handle;
        }
    }
    return 0;
}

TELIX_JS_CM_HANDLE Channels::makeByTriplet(uint32_t onid, uint32_t tsid, uint32_t sid) {
    if (const TELIX_JS_CM_HANDLE listed = findByTriplet(onid, tsid, sid)) {
        return listed;
    }
    Channel channel;
    channel.onid = onid;
    channel.tsid = tsid;
    channel.sid = sid;
    return addUnlisted(channel);
}

TELIX_JS_CM_HANDLE Channels::makeByDescriptor(const Bytes& descriptor, uint32_t sid) {
    {
        std::lock_guard<std::mutex> lock(m_mutex);
        for (const TELIX_JS_CM_HANDLE handle : m_list) {
            const Channel& channel = m_channels[handle - 1];
            if (!descriptor.empty() && channel.deliveryDescriptor == descriptor && channel.sid == sid) {
                return handle;
            }
        }
    }
    Channel channel;
    channel.deliveryDescriptor = descriptor;
    channel.sid = sid;
    return addUnlisted(channel);
}

TELIX_JS_CM_HANDLE Channels::addUnlisted(Channel channel) {
    std::lock_guard<std::mutex> lock(m_mutex);
    for (size_t index = m_list.size(); index < m_channels.size(); ++index) {
        const Channel& each = m_channels[index];
        if (each.onid == channel.onid && each.tsid == channel.tsid && each.sid == channel.sid &&
            each.deliveryDescriptor == channel.deliveryDescriptor) {
            return each.handle;
        }
    }
    if (m_channels.size() - m_list.size() >= kMaxUnlisted) {
        return 0;
    }
    add(std::move(channel));
    return m_channels.back().handle;
}

TELIX_JS_CM_HANDLE Channels::neighbour(TELIX_JS_CM_HANDLE handle, int offset) const {
    if (m_list.empty()) {
        return 0;
    }
    const auto at = std::find(m_list.begin(), m_list.end(), handle);
    if (at == m_list.end()) {
        return m_list.front();
    }
    const auto count = static_cast<int>(m_list.size());
    const int index = (static_cast<int>(at - m_list.begin()) + offset % count + count) % count;
    return m_list[static_cast<size_t>(index)];
}

bool Channels::usesTestMultiplex() const {
    return std::any_of(m_channels.begin(), m_channels.end(),
                       [](const Channel& each) { return each.origin == Channel::Origin::TestMultiplex; });
}

} // namespace desktop

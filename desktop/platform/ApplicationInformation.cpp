// Reading of the descriptors of an AIT. Each application stands on its own: what is wrong with one of them
// does not concern the others.
#include "desktop/platform/ApplicationInformation.h"

#include <algorithm>
#include <cstdio>
#include <glib.h>
#include <optional>
#include <utility>

#include "desktop/platform/ByteReader.h"
#include "desktop/platform/OwnedString.h"

namespace desktop {

namespace {

// The highest version of HbbTV whose applications the set runs: 1.2.1.
constexpr uint8_t kVersionMajor = 1;
constexpr uint8_t kVersionMinor = 2;

constexpr size_t kProfileSize = 5;
constexpr size_t kLabelSize = 1;

// What the descriptors of an application say, before it is known whether that is enough.
struct Descriptors {
    SignalledApplication application;
    bool hasApplicationDescriptor = false;
    bool isSupported = false;
    std::vector<uint8_t> labels; // of its transport protocols, the preferred one first
    std::string initialPath;
    std::string fault; // the first descriptor that is malformed
};

// HTTP locations by label.
using Transports = std::map<uint8_t, std::string>;

std::string takeRaw(ByteReader& reader) {
    const Bytes bytes = reader.take(reader.read8()).rest();
    return {bytes.begin(), bytes.end()};
}

// Of several extensions the first one counts: all lead to the same application.
bool readTransport(ByteReader body, Transports& transports) {
    const bool isHttp = body.read16() == kTransportProtocolHttp;
    const auto label = static_cast<uint8_t>(body.read8());
    if (!isHttp || !body.good()) {
        return body.good();
    }
    std::string url = takeRaw(body);
    if (body.read8() > 0) {
        url += takeRaw(body);
    }
    if (body.good()) {
        transports.emplace(label, url);
    }
    return body.good();
}

bool readApplicationDescriptor(ByteReader body, Descriptors& read) {
    ByteReader profiles = body.take(body.read8());
    while (profiles.left() >= kProfileSize) {
        ApplicationProfile profile;
        profile.profile = static_cast<uint16_t>(profiles.read16());
        profile.versionMajor = static_cast<uint8_t>(profiles.read8());
        profile.versionMinor = static_cast<uint8_t>(profiles.read8());
        profile.versionMicro = static_cast<uint8_t>(profiles.read8());
        read.isSupported = read.isSupported || isSupported(profile);
    }
    const unsigned int flags = body.read8();
    read.application.isServiceBound = (flags & kServiceBoundFlag) != 0;
    read.application.visibility = flags >> kVisibilityShift & kVisibilityMask;
    read.application.priority = static_cast<uint8_t>(body.read8());
    while (body.left() >= kLabelSize) {
        read.labels.push_back(static_cast<uint8_t>(body.read8()));
    }
    read.hasApplicationDescriptor = body.good() && profiles.left() == 0;
    return read.hasApplicationDescriptor;
}

bool readName(ByteReader body, std::string& name) {
    body.takeCode();
    const std::string first = body.takeString();
    if (body.good() && name.empty()) {
        name = first;
    }
    return body.good();
}

bool readBoundaries(ByteReader body, std::vector<std::string>& boundaries) {
    for (unsigned int count = body.read8(); count > 0 && body.good(); --count) {
        const std::string url = takeRaw(body);
        if (body.good()) {
            boundaries.push_back(url);
        }
    }
    return body.good();
}

// False if the descriptor is malformed. Unknown ones are ignored.
bool readDescriptor(uint8_t tag, ByteReader body, Descriptors& read, Transports& transports) {
    switch (tag) {
    case kTagApplication:
        return readApplicationDescriptor(body, read);
    case kTagApplicationName:
        return readName(body, read.application.name);
    case kTagTransportProtocol:
        return readTransport(body, transports);
    case kTagSimpleApplicationLocation: {
        const Bytes path = body.rest();
        read.initialPath.assign(path.begin(), path.end());
        return true;
    }
    case kTagApplicationUsage:
        read.application.usage = static_cast<uint8_t>(body.read8());
        return body.good();
    case kTagSimpleApplicationBoundary:
        return readBoundaries(body, read.application.boundaries);
    default:
        return true;
    }
}

void readDescriptors(const Bytes& descriptors, Descriptors& read, Transports& transports) {
    const auto visit = [&](uint8_t tag, const uint8_t* body, size_t length) {
        if (!readDescriptor(tag, ByteReader(body, length), read, transports) && read.fault.empty()) {
            char hexadecimal[8];
            std::snprintf(hexadecimal, sizeof(hexadecimal), "0x%02X", tag);
            read.fault = std::string("the descriptor ") + hexadecimal + " is malformed";
        }
    };
    if (!forEachDescriptor(descriptors, visit) && read.fault.empty()) {
        read.fault = "a descriptor is longer than the descriptors of the application";
    }
}

// What is missing in the descriptors of an application that can be started; empty if it has all.
std::string findGap(const Descriptors& read, const Transports& transports) {
    if (!read.fault.empty()) {
        return read.fault;
    }
    if (!read.application.isStartable()) {
        return "";
    }
    if (!read.hasApplicationDescriptor) {
        return "no application descriptor";
    }
    if (!read.isSupported) {
        return "the set does not support the profile or version";
    }
    if (read.initialPath.empty()) {
        return "no simple application location descriptor";
    }
    const bool hasHttp = std::any_of(read.labels.begin(), read.labels.end(),
                                     [&](uint8_t label) { return transports.count(label) != 0; });
    return hasHttp ? "" : "no HTTP transport protocol";
}

void setUrl(Descriptors& read, const Transports& transports) {
    for (const uint8_t label : read.labels) {
        const auto transport = transports.find(label);
        if (transport != transports.end()) {
            read.application.url = transport->second + read.initialPath;
            return;
        }
    }
}

// As valid UTF-8 without control characters.
std::string printable(const std::string& string) {
    std::string valid =
        OwnedString(g_utf8_make_valid(string.data(), static_cast<gssize>(string.size()))).get();
    valid.erase(std::remove_if(valid.begin(), valid.end(), [](char each) { return g_ascii_iscntrl(each); }),
                valid.end());
    return valid;
}

bool isAbsoluteUrl(const std::string& url) {
    const OwnedString scheme(g_uri_parse_scheme(url.c_str()));
    return scheme != nullptr;
}

// No URL has control characters or spaces; UTF-8 is common although it should be escaped.
bool isPrintable(const std::string& url) {
    return g_utf8_validate(url.data(), static_cast<gssize>(url.size()), nullptr) != FALSE &&
           std::none_of(url.begin(), url.end(),
                        [](char each) { return g_ascii_iscntrl(each) || g_ascii_isspace(each); });
}

} // namespace

const std::vector<ControlCode>& controlCodes() {
    static const auto& codes = *new std::vector<ControlCode>{
        {"AUTOSTART", kControlCodeAutostart},
        {"PRESENT", kControlCodePresent},
        {"KILL", kControlCodeKill},
        {"DISABLED", kControlCodeDisabled},
    };
    return codes;
}

std::string controlCodeName(uint8_t value) {
    const auto found = std::find_if(controlCodes().begin(), controlCodes().end(),
                                    [&](const ControlCode& each) { return each.value == value; });
    return found == controlCodes().end() ? "" : found->name;
}

std::string toString(const ApplicationId& id) {
    char string[16];
    std::snprintf(string, sizeof(string), "%x.%x", id.organisation,
                  static_cast<unsigned int>(id.application));
    return string;
}

// The bits of the profile are features that this set does not have: download, recording, RTSP.
bool isSupported(const ApplicationProfile& profile) {
    return profile.profile == 0 && profile.versionMajor == kVersionMajor &&
           profile.versionMinor <= kVersionMinor;
}

std::string findFault(const SignalledApplication& application) {
    if (controlCodeName(application.controlCode).empty()) {
        return "the set does not support control code " + std::to_string(application.controlCode);
    }
    if (!isPrintable(application.url)) {
        return "the URL has invalid characters";
    }
    if (application.isStartable() && !isAbsoluteUrl(application.url)) {
        return "\"" + application.url + "\" is not an absolute URL";
    }
    return "";
}

void addApplication(SignalledApplication application, const std::string& fault, ApplicationList& list) {
    const std::string name = "application " + toString(application.id) + ": ";
    std::string reason = fault.empty() ? findFault(application) : fault;
    if (reason.empty() && list.applications.size() >= kMaxSignalledApplications) {
        reason = "more than " + std::to_string(kMaxSignalledApplications) + " applications";
    }
    application.name = printable(application.name);
    std::vector<std::string>& boundaries = application.boundaries;
    const auto firstBad = std::stable_partition(boundaries.begin(), boundaries.end(), isPrintable);
    if (firstBad != boundaries.end()) {
        list.skipped.push_back(name + "a boundary has invalid characters");
        boundaries.erase(firstBad, boundaries.end());
    }
    if (reason.empty()) {
        list.applications.push_back(std::move(application));
    } else {
        list.skipped.push_back(name + printable(reason));
    }
}

void readApplications(const Ait& ait, ApplicationList& list) {
    Transports common;
    Descriptors shared; // descriptors of applications are ignored among the common ones
    readDescriptors(ait.commonDescriptors, shared, common);
    if (!shared.fault.empty()) {
        list.skipped.push_back("common descriptors: " + shared.fault);
    }
    for (const AitApplication& each : ait.applications) {
        Transports transports;
        Descriptors read;
        read.application.id = {each.organisationId, each.applicationId};
        read.application.controlCode = each.controlCode;
        readDescriptors(each.descriptors, read, transports);
        transports.insert(common.begin(), common.end()); // those of the application come first
        setUrl(read, transports);
        addApplication(std::move(read.application), findGap(read, transports), list);
    }
}

// ---- ApplicationTable

bool ApplicationTable::add(const Bytes& section) {
    const auto ait = parseAit(section);
    if (!ait) {
        return onDamage();
    }
    if (ait->applicationType != kApplicationTypeHbbTv || ait->isTest) {
        return false;
    }
    if (ait->version != m_version) {
        m_version = ait->version;
        m_sections.clear();
        m_isDamaged = false;
        m_isListed = false;
    }
    Bytes& known = m_sections[ait->sectionNumber];
    const bool isRepetition = known == section;
    known = section;
    const bool isComplete = m_sections.size() == size_t{ait->lastSectionNumber} + 1;
    return isComplete || m_isListed ? !isRepetition && makeList() : isRepetition && makeList();
}

// A table of which no section is intact has an empty list.
bool ApplicationTable::onDamage() {
    const bool isRepetition = std::exchange(m_isDamaged, true);
    return m_isListed ? !isRepetition && makeList() : isRepetition && m_sections.empty() && makeList();
}

bool ApplicationTable::makeList() {
    m_isListed = true;
    m_list = {};
    if (m_isDamaged) {
        m_list.skipped.emplace_back("section: malformed");
    }
    for (const auto& [number, section] : m_sections) {
        readApplications(*parseAit(section), m_list);
    }
    return true;
}

bool carriesApplications(const ElementaryStream& stream) {
    bool carries = false;
    if (stream.type == kStreamTypePrivateSections) {
        forEachDescriptor(stream.descriptors, [&](uint8_t tag, const uint8_t* body, size_t length) {
            if (tag != kTagApplicationSignalling) {
                return;
            }
            carries = carries || length == 0; // an empty descriptor: of any type
            ByteReader entries(body, length);
            while (entries.left() >= kAitSignallingEntrySize) {
                carries = (entries.read16() & kApplicationTypeMask) == kApplicationTypeHbbTv || carries;
                entries.read8(); // the version
            }
        });
    }
    return carries;
}

} // namespace desktop

// State of the device, and the results of its DRM systems.
#include "desktop/platform/Device.h"

#include <cstdio>

namespace desktop {

namespace {

std::string drmMessageId(uint64_t number) {
    return number == 0 ? "" : "drm-" + std::to_string(number);
}

} // namespace

Device& Device::instance() {
    static auto* device = new Device; // never deleted: callbacks may be running at the exit
    return *device;
}

Device::Device()
    : m_platform(Platform::instance()), m_freeMemory(m_platform.configuration().freeMemory),
      m_keySet(m_platform.configuration().keySet) {
    const Configuration& configured = configuration();
    if (configured.capabilitiesFile.empty()) {
        m_capabilities = Capabilities::generate(configured);
    } else {
        std::string error;
        m_capabilities = Capabilities::load(configured.capabilitiesFile, error);
        if (!m_capabilities) {
            std::fprintf(stderr, "libtelix: capabilities: %s\n", error.c_str());
        }
    }
    addScheme({"dvb-si", {}, {}, 0}); // its ratings are ages, which have no names
    for (const Configuration::RatingScheme& scheme : configured.ratingSchemes) {
        addScheme(scheme);
    }
}

void Device::addScheme(const Configuration::RatingScheme& scheme) {
    SchemeStrings& kept = m_schemeStrings.emplace_back();
    kept.name = scheme.name;
    kept.strings = scheme.ratings;
    kept.strings.insert(kept.strings.end(), scheme.icons.begin(), scheme.icons.end());
    const size_t count = scheme.ratings.size();
    for (size_t index = 0; index < count; ++index) {
        kept.ratings.push_back(kept.strings[index].data());
        kept.icons.push_back(kept.strings[count + index].data());
    }
    kept.ratings.push_back(nullptr); // the address of an empty array must not be null
    kept.icons.push_back(nullptr);
    PARENTALRATTINGSCHEME_STRUCT_T_TAG record{};
    record.handle =
        kBroadcastScheme + static_cast<TELIX_JS_SI_PARENTALRATINGSCHEME_HANDLE>(m_schemeRecords.size());
    record.count = static_cast<uint32_t>(count);
    record.szName = kept.name.data();
    record.ratingNames = kept.ratings.data();
    record.iconUris = kept.icons.data();
    m_schemeRecords.push_back(record);
}

uint32_t Device::freeMemory() const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    return m_freeMemory;
}

void Device::setFreeMemory(uint32_t bytes) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    m_freeMemory = bytes;
}

uint32_t Device::keySet() const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    return m_keySet;
}

uint32_t Device::setKeySet(uint32_t mask) {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    m_keySet = mask & configuration().keys;
    return m_keySet;
}

std::optional<int32_t> Device::ratingThreshold(TELIX_JS_SI_PARENTALRATINGSCHEME_HANDLE scheme) const {
    if (scheme == kBroadcastScheme) {
        return static_cast<int32_t>(configuration().ratingThreshold);
    }
    const size_t index = size_t{scheme} - kBroadcastScheme - 1; // wraps around for 0
    if (index >= configuration().ratingSchemes.size()) {
        return std::nullopt;
    }
    return static_cast<int32_t>(configuration().ratingSchemes[index].threshold);
}

std::string Device::sendDrmMessage(const std::string& systemId) {
    std::string message = "unknown DRM system";
    TELIX_DRM_RESULT_CODE_ENUM_T result = kDrmUnknownSystem;
    for (const Configuration::DrmSystem& system : configuration().drmSystems) {
        if (system.id == systemId) {
            message = system.message;
            result = system.result;
        }
    }
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    std::string id = drmMessageId(++m_lastDrmMessage);
    m_platform.post([this, id, message, result] { reportDrmResult(id, message, result); });
    return id;
}

std::string Device::lastDrmMessage() const {
    std::lock_guard<std::mutex> lock(m_platform.mutex());
    return drmMessageId(m_lastDrmMessage);
}

void Device::reportDrmResult(std::string messageId, std::string message,
                             TELIX_DRM_RESULT_CODE_ENUM_T result) {
    onDrmMessageResult.call(reinterpret_cast<___UINT8*>(messageId.data()),
                            reinterpret_cast<___UINT8*>(message.data()), result);
}

bool Device::injectLowMemory() {
    if (!onLowMemory.isSet()) {
        return false;
    }
    m_platform.post([this] { onLowMemory.call(); });
    return true;
}

bool Device::injectDrmResult(const std::string& messageId, const std::string& message,
                             TELIX_DRM_RESULT_CODE_ENUM_T result) {
    if (!onDrmMessageResult.isSet()) {
        return false;
    }
    m_platform.post([this, messageId, message, result] { reportDrmResult(messageId, message, result); });
    return true;
}

} // namespace desktop

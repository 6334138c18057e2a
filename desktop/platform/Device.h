// The television apart from video and audio: preferences of the viewer, keys, memory, capabilities, rating
// schemes and DRM systems.
#ifndef TELIX_DESKTOP_PLATFORM_DEVICE_H
#define TELIX_DESKTOP_PLATFORM_DEVICE_H

#include <deque>
#include <optional>
#include <string>
#include <vector>

#include "desktop/platform/Callback.h"
#include "desktop/platform/Capabilities.h"
#include "desktop/platform/Platform.h"
#include "telix/telix_platform.h"

namespace desktop {

// Result code of a DRM message to a system that the configuration lacks, as pages see it (OIPF DAE,
// onDRMMessageResult: unknown DRM system).
constexpr TELIX_DRM_RESULT_CODE_ENUM_T kDrmUnknownSystem = 5;

// Handle of the scheme "dvb-si"; the schemes of the configuration have the handles after it.
constexpr TELIX_JS_SI_PARENTALRATINGSCHEME_HANDLE kBroadcastScheme = 1;

// All functions can be called on any thread and return without waiting.
class Device {
public:
    static Device& instance(); // never deleted, like the platform

    Device(const Device&) = delete;
    Device& operator=(const Device&) = delete;

    const Configuration& configuration() const { return m_platform.configuration(); }

    uint32_t freeMemory() const;
    void setFreeMemory(uint32_t bytes);

    // The mask of the key groups that pages receive. The setter ignores groups that the remote control lacks,
    // and returns the mask that it has set.
    uint32_t keySet() const;
    uint32_t setKeySet(uint32_t mask);

    // Nothing if the capabilities file is not readable any more.
    const std::optional<Capabilities>& capabilities() const { return m_capabilities; }

    // The records of all schemes, as the platform calls return them. They never change.
    std::vector<PARENTALRATTINGSCHEME_STRUCT_T_TAG>& ratingSchemes() { return m_schemeRecords; }

    // The threshold of the viewer for a scheme: an age for kBroadcastScheme, else the index of a rating.
    std::optional<int32_t> ratingThreshold(TELIX_JS_SI_PARENTALRATINGSCHEME_HANDLE scheme) const;

    // Sends a message to a DRM system and returns its id. The result follows through the callback, in the
    // order of the messages: the one that the configuration states for the system, or kDrmUnknownSystem.
    std::string sendDrmMessage(const std::string& systemId);

    // The id of the last message; empty if there was none.
    std::string lastDrmMessage() const;

    // ---- Events from outside. False if no listener is registered.

    bool injectLowMemory();
    bool injectDrmResult(const std::string& messageId, const std::string& message,
                         TELIX_DRM_RESULT_CODE_ENUM_T result);

    // ---- Callbacks

    Callback<TELIX_JS_APP_LOW_MEMORY_CB> onLowMemory;
    CountedCallback<TELIX_JS_DRM_MESSAGE_RESULT_CB> onDrmMessageResult;

private:
    // The strings that the record of a scheme points to.
    struct SchemeStrings {
        std::string name;
        std::vector<std::string> strings; // ratings, then icons
        std::vector<char*> ratings;
        std::vector<char*> icons;
    };

    Device();
    void addScheme(const Configuration::RatingScheme& scheme);
    void reportDrmResult(std::string messageId, std::string message, TELIX_DRM_RESULT_CODE_ENUM_T result);

    Platform& m_platform;
    std::optional<Capabilities> m_capabilities;
    std::deque<SchemeStrings> m_schemeStrings; // a deque, so that none moves
    std::vector<PARENTALRATTINGSCHEME_STRUCT_T_TAG> m_schemeRecords;

    // Guarded by the platform's mutex.
    uint32_t m_freeMemory;
    uint32_t m_keySet;
    uint64_t m_lastDrmMessage = 0; // number of messages so far
};

} // namespace desktop

#endif

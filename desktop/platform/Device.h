// The set itself, apart from pictures and sound: what the viewer has chosen, keys, memory, capabilities,
// rating schemes and DRM systems.
#ifndef TELIX_DESKTOP_DEVICE_H
#define TELIX_DESKTOP_DEVICE_H

#include "desktop/platform/Callback.h"
#include "desktop/platform/Capabilities.h"
#include "desktop/platform/Platform.h"
#include "telix/telix_platform.h"

#include <deque>
#include <optional>
#include <string>
#include <vector>

namespace desktop {

// What becomes of a DRM message; the numbers that pages know.
constexpr TELIX_DRM_RESULT_CODE_ENUM_T drmUnknownSystem = 5;

// The scheme of the broadcast; the schemes of the configuration have the handles behind it.
constexpr TELIX_JS_SI_PARENTALRATINGSCHEME_HANDLE broadcastScheme = 1;

// The functions are called on any thread and answer at once.
class Device {
public:
    static Device& instance(); // lives as long as the process, like the platform

    Device(const Device&) = delete;
    Device& operator=(const Device&) = delete;

    const Configuration& configuration() const { return m_platform.configuration(); }

    uint32_t freeMemory() const;
    void setFreeMemory(uint32_t bytes);

    // The groups of keys that go to the pages. Setting gives those that are in force then: no others than the
    // remote control has.
    uint32_t keySet() const;
    uint32_t setKeySet(uint32_t mask);

    // Nothing if the file of the configuration can't be read any more.
    const std::optional<Capabilities>& capabilities() const { return m_capabilities; }

    // All schemes as the calls give them out; valid and unchanged for life.
    std::vector<PARENTALRATTINGSCHEME_STRUCT_T_TAG>& ratingSchemes() { return m_schemeRecords; }

    // What the viewer has set for a scheme: an age for the broadcast's, else the index of a rating.
    std::optional<int32_t> ratingThreshold(TELIX_JS_SI_PARENTALRATINGSCHEME_HANDLE scheme) const;

    // Takes a message for a DRM system and gives its id. The answer follows on the platform thread, for each
    // message in its turn: what the configuration says of the system, or drmUnknownSystem.
    std::string sendDrmMessage(const std::string& systemId);

    // The id given last; empty if none was.
    std::string lastDrmMessage() const;

    // ---- What may be provoked from outside. False if nobody has asked for it.

    bool injectLowMemory();
    bool injectDrmResult(const std::string& messageId, const std::string& message,
                         TELIX_DRM_RESULT_CODE_ENUM_T result);

    // ---- Callbacks

    Callback<TELIX_JS_APP_LOW_MEMORY_CB> onLowMemory;
    CountedCallback<TELIX_JS_DRM_MESSAGE_RESULT_CB> onDrmMessageResult;

private:
    // The texts of a scheme, as its record points to them.
    struct SchemeTexts {
        std::string name;
        std::vector<std::string> texts;
        std::vector<char*> ratings;
        std::vector<char*> icons;
    };

    Device();
    void addScheme(const Configuration::RatingScheme& scheme);
    void answerDrm(std::string messageId, std::string message, TELIX_DRM_RESULT_CODE_ENUM_T result);

    Platform& m_platform;
    std::optional<Capabilities> m_capabilities;
    std::deque<SchemeTexts> m_schemeTexts; // none moves
    std::vector<PARENTALRATTINGSCHEME_STRUCT_T_TAG> m_schemeRecords;

    // Under the platform's mutex.
    uint32_t m_freeMemory;
    uint32_t m_keySet;
    uint64_t m_lastDrmMessage = 0;
};

} // namespace desktop

#endif

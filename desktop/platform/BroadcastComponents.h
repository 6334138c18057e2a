// The components of the service that is presented: from its PMT to handles, and which of them are active.
#ifndef TELIX_DESKTOP_PLATFORM_BROADCASTCOMPONENTS_H
#define TELIX_DESKTOP_PLATFORM_BROADCASTCOMPONENTS_H

#include <cstdint>
#include <optional>
#include <vector>

#include "desktop/platform/ComponentTable.h"
#include "desktop/platform/Platform.h"
#include "desktop/platform/TsTables.h"

namespace desktop {

struct BroadcastComponent : ComponentTraits {
    TELIX_JS_CM_HANDLE channel = 0;
    uint16_t pid = 0;

    // What the decoder finds out later makes no other component.
    bool operator==(const BroadcastComponent& other) const {
        return type == other.type && channel == other.channel && pid == other.pid &&
               encoding == other.encoding && language == other.language && isEncrypted == other.isEncrypted &&
               isAudioDescription == other.isAudioDescription &&
               isForHearingImpaired == other.isForHearingImpaired;
    }
};

// Platform::mutex() guards all data. Functions whose name ends in Locked need it held; all others take it
// themselves.
class BroadcastComponents {
public:
    struct Available {
        TELIX_JS_AVCOMPHANDLE handle;
        BroadcastComponent component;
        bool isActive;
    };

    // The PIDs of the active components.
    struct ActivePids {
        std::optional<uint16_t> video;
        std::optional<uint16_t> audio;
        std::optional<uint16_t> subtitle;
    };

    BroadcastComponents();

    // ---- What is received. Platform thread.

    // The components of the channel become available, and the default ones active.
    void onPmt(TELIX_JS_CM_HANDLE channel, const Pmt& pmt);

    // The default ones become active, as after onPmt().
    void selectDefaults();

    void onAudioFormat(TELIX_JS_CM_HANDLE channel, uint16_t pid, uint32_t audioChannels);

    // Reads the aspect ratio of the active video from the frame that is shown.
    void updateAspectRatio();

    // Nothing is available any more. Handles that the plug-in has stay valid.
    void clearLocked();

    // ---- Queries and selection. Any thread.

    std::optional<ComponentTraits> find(TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type) const;
    bool hasVideo() const; // false for radio, and as long as there is no PMT
    ActivePids activePids() const;

    std::vector<TELIX_JS_AVCOMPHANDLE> listLocked(TELIX_JS_AVCOMPTYPE type, bool activeOnly) const;
    bool selectLocked(TELIX_JS_AVCOMPHANDLE component, TELIX_JS_AVCOMPTYPE type, bool isActive);
    std::vector<Available> availableLocked() const;

private:
    std::optional<uint16_t> activePidLocked(TELIX_JS_AVCOMPTYPE type) const;

    Platform& m_platform;
    ComponentTable<BroadcastComponent> m_table; // guarded by Platform::mutex()
    ComponentSelection m_selection;             // guarded by Platform::mutex()
};

} // namespace desktop

#endif

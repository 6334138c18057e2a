// The list of commands.
#include "desktop/platform/ControlProtocol.h"

#include "telix/telix_platform.h"

namespace desktop {

const std::vector<ControlCommand>& controlCommands() {
    using Kind = ControlParameter::Kind;
    static const auto& commands = *new std::vector<ControlCommand>{
        {"channels", "list the channels", {}},
        {"state", "tell what is presented, by which objects and players, and who listens to what", {}},
        {"channel",
         "tune to a channel, as the viewer would",
         {{"number", Kind::number, true, "place in the list, from 1", 1, UINT32_MAX}}},
        {"channel-error",
         "tell the page that its channel can't be presented",
         {{"error", Kind::number, true, "reason, as pages know it; 1 is no signal", 0, 100}}},
        {"rating",
         "change the parental rating of what is shown",
         {{"age", Kind::number, true, "4 to 18 years, or 0 for none", 0, 18},
          {"region", Kind::text, false, "country, three letters (the viewer's)"}}},
        {"rating-error",
         "tell the page that a rating can't be evaluated",
         {{"content-id", Kind::text, false, "of the content"}, {"drm-system", Kind::text, false, "its id"}}},
        {"stream-event",
         "send a stream event to all listeners that meet the conditions",
         {{"id", Kind::number, false, "only to listeners to this event id", 0, 65535},
          {"tag", Kind::number, false, "only to those of this component tag", 0, 255},
          {"name", Kind::text, false, "only to those that gave this name"},
          {"data", Kind::text, false, "the event's data, as text"},
          {"hex", Kind::text, false, "the same, in hexadecimal digits"},
          {"status", Kind::text, false, "\"trigger\" or \"error\" (trigger)"}}},
        {"full-screen",
         "take the picture to full screen or back, as the viewer would",
         {{"on", Kind::flag, true, "on or off"}}},
        {"drm-result",
         "answer a DRM message",
         {{"result", Kind::number, true, "what became of it; 0 is success", 0, INT32_MAX},
          {"message", Kind::text, false, "text of the answer"},
          {"id", Kind::text, false, "id of the message (the last one)"}}},
        {"rights-error",
         "tell the page that rights for the media of its player are missing",
         {{"state", Kind::number, true, "what is wrong; 0 no licence, 1 invalid licence", 0, INT32_MAX},
          {"content-id", Kind::text, false, "of the media"},
          {"drm-system", Kind::text, false, "its id"},
          {"rights-issuer-url", Kind::text, false, "where rights are to be had"}}},
        {"low-memory",
         "tell the page that memory is short",
         {{"free", Kind::number, false, "bytes that are free from now on"}}},
        {"buffered",
         "report a buffering level of the players instead of the real one",
         {{"amount", Kind::number, false, "seconds, or any raw value (the real level again)"}}},
        {"player-message",
         "send a platform message of the player, by name or number",
         {{"message", Kind::text, true, "as play-end, err-not-found or 0xF000"}}},
    };
    return commands;
}

const ControlCommand* findControlCommand(const std::string& name) {
    for (const ControlCommand& command : controlCommands()) {
        if (command.name == name) {
            return &command;
        }
    }
    return nullptr;
}

const ControlParameter* findControlParameter(const ControlCommand& command, const std::string& name) {
    for (const ControlParameter& parameter : command.parameters) {
        if (parameter.name == name) {
            return &parameter;
        }
    }
    return nullptr;
}

const std::vector<PlayerMessage>& playerMessages() {
    static const auto& messages = *new std::vector<PlayerMessage>{
        {"play-end", TELIX_AV_CB_MSG_PLAYEND},
        {"play-start", TELIX_AV_CB_MSG_PLAYSTART},
        {"err-playing", TELIX_AV_CB_MSG_ERR_PLAYING},
        {"err-not-found", TELIX_AV_CB_MSG_ERR_NOT_FOUND},
        {"err-codec-not-supported", TELIX_AV_CB_MSG_ERR_CODEC_NOT_SUPPORTED},
        {"err-net-disconnected", TELIX_AV_CB_MSG_ERR_NET_DISCONNECTED},
        {"err-net-busy", TELIX_AV_CB_MSG_ERR_NET_BUSY},
        {"err-net-cannot-process", TELIX_AV_CB_MSG_ERR_NET_CANNOT_PROCESS},
        {"err-net-cannot-connect", TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT},
        {"err-drm-cannot-process", TELIX_AV_CB_MSG_ERR_WMDRM_CANNOT_PROCESS},
        {"err-drm-licence-local", TELIX_AV_CB_MSG_ERR_WMDRM_LIC_FAILLOCAL},
        {"err-drm-licence-transfer", TELIX_AV_CB_MSG_ERR_WMDRM_LIC_FAILTRANSFER},
        {"err-drm-licence-expired", TELIX_AV_CB_MSG_ERR_WMDRM_LIC_EXPIRED},
    };
    return messages;
}

} // namespace desktop

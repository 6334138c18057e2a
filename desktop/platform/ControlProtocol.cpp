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
        {"low-memory",
         "tell the page that memory is short",
         {{"free", Kind::number, false, "bytes that are free from now on"}}},
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

} // namespace desktop

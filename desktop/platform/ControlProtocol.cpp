// The command table as data, and what requests and command lines are checked with.
#include "desktop/platform/ControlProtocol.h"

#include <cstdlib>

#include "telix/telix_platform.h"

namespace desktop {

namespace {

// ---- What the rows of ControlCommands.h are written with

ControlValueType string() {
    return {ControlValueType::Kind::String};
}

ControlValueType strings() {
    return {ControlValueType::Kind::Strings};
}

ControlValueType file() {
    return {ControlValueType::Kind::File};
}

ControlValueType page() {
    return {ControlValueType::Kind::Page};
}

ControlValueType number(int64_t minimum, int64_t maximum) {
    return {ControlValueType::Kind::Number, minimum, maximum};
}

ControlValueType onOff() {
    return {ControlValueType::Kind::Boolean};
}

ControlValueType choice(const char* choices) {
    return {ControlValueType::Kind::Choice, 0, 0, choices};
}

ControlParameter argument(const char* name, ControlValueType type, const char* placeholder,
                          const char* meaning) {
    return {name, ControlParameter::Use::Argument, type, placeholder, "", meaning};
}

ControlParameter optionalArgument(const char* name, ControlValueType type, const char* placeholder,
                                  const char* defaultMeaning, const char* meaning) {
    return {name, ControlParameter::Use::OptionalArgument, type, placeholder, defaultMeaning, meaning};
}

ControlParameter option(const char* name, ControlValueType type, const char* placeholder,
                        const char* defaultMeaning, const char* meaning) {
    return {name, ControlParameter::Use::Option, type, placeholder, defaultMeaning, meaning};
}

// "a|b|c" as "a, b or c".
std::string inWords(std::string choices) {
    const size_t last = choices.rfind('|');
    if (last != std::string::npos) {
        choices.replace(last, 1, " or ");
    }
    for (size_t bar = choices.find('|'); bar != std::string::npos; bar = choices.find('|')) {
        choices.replace(bar, 1, ", ");
    }
    return choices;
}

} // namespace

bool ControlValueType::acceptsNumber(int64_t value) const {
    return value >= minimum && value <= maximum;
}

bool ControlValueType::acceptsChoice(const std::string& value) const {
    return value.find('|') == std::string::npos &&
           (std::string("|") + choices + "|").find("|" + value + "|") != std::string::npos;
}

std::string ControlValueType::description(const char* booleans) const {
    switch (kind) {
    case Kind::Number:
        return "a whole number from " + std::to_string(minimum) + " to " + std::to_string(maximum);
    case Kind::Boolean:
        return inWords(booleans);
    case Kind::Choice:
        return inWords(choices);
    case Kind::Strings:
        return "an array of strings, not empty";
    case Kind::File:
        return "an absolute file name";
    case Kind::Page:
        return "an absolute URL";
    default:
        return "a string";
    }
}

int64_t ControlCommand::defaultTimeout() const {
    const ControlParameter* timeout = findControlParameter(*this, "timeout");
    return timeout ? std::strtoll(timeout->defaultMeaning, nullptr, 10) : 0;
}

const std::vector<ControlCommand>& controlCommands() {
    using Handler = ControlCommand::Handler;
    static const auto& commands = *new std::vector<ControlCommand>{
#define CONTROL_COMMAND(name, handler, printer, help, ...) {name, Handler::Library, help, {__VA_ARGS__}},
#define WINDOW_COMMAND(name, windowHandler, printer, help, ...) {name, Handler::Window, help, {__VA_ARGS__}},
#define JOINT_COMMAND(name, handler, windowHandler, printer, help, ...)                                      \
    {name, Handler::Both, help, {__VA_ARGS__}},
#include "desktop/platform/ControlCommands.h"
    };
    return commands;
}

const std::vector<ControlCommand>& localCommands() {
    static const auto& commands = *new std::vector<ControlCommand>{
#define LOCAL_COMMAND(name, function, help, ...)                                                             \
    {name, ControlCommand::Handler::Library, help, {__VA_ARGS__}},
#include "desktop/platform/ControlCommands.h"
    };
    return commands;
}

const ControlCommand* findCommand(const std::vector<ControlCommand>& commands, const std::string& name) {
    for (const ControlCommand& command : commands) {
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

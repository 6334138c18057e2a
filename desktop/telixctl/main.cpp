// telixctl: looks into a running television and provokes events in it.
#include <clocale>
#include <cstdio>
#include <glib.h>
#include <json-glib/json-glib.h>
#include <memory>

#include "desktop/telixctl/CommandLine.h"
#include "desktop/telixctl/ExitStatus.h"
#include "desktop/telixctl/LocalCommands.h"
#include "desktop/telixctl/Printers.h"
#include "desktop/telixctl/Television.h"

namespace desktop {

namespace {

// Sends the request of the command line to a television and prints the response.
ExitStatus control(const CommandLine& line) {
    std::string error;
    const auto socket = findTelevision(line.socket, line.pid, error);
    const auto response =
        socket ? sendRequest(*socket, line.toRequest(), line.responseTimeout(), error) : std::nullopt;
    if (!response) {
        return fail(ExitStatus::Refused, error);
    }
    const std::unique_ptr<JsonParser, void (*)(void*)> parser(json_parser_new(), g_object_unref);
    JsonNode* root = json_parser_load_from_data(parser.get(), response->c_str(), -1, nullptr)
                         ? json_parser_get_root(parser.get())
                         : nullptr;
    if (!root || !JSON_NODE_HOLDS_OBJECT(root)) {
        return fail(ExitStatus::Refused, *socket + ": the response is not that of a television");
    }
    JsonObject* object = json_node_get_object(root);
    const bool isDone = json_object_get_boolean_member_with_default(object, "ok", FALSE);
    if (line.isJson) {
        std::printf("%s\n", response->c_str());
    } else if (isDone) {
        printerOf (*line.command)(object);
    }
    if (!isDone) {
        return fail(ExitStatus::Refused,
                    std::string(line.command->name) + ": " +
                        json_object_get_string_member_with_default(object, "error", "refused"));
    }
    return ExitStatus::Success;
}

ExitStatus run(const std::vector<std::string>& arguments) {
    const CommandLine line = CommandLine::parse(arguments);
    if (line.isVersion) {
        std::printf("telixctl %s\n", TELIX_VERSION);
        return ExitStatus::Success;
    }
    const bool isLocal = findCommand(localCommands(), line.command->name) != nullptr;
    return isLocal ? localFunctionOf(*line.command)(line) : control(line);
}

} // namespace

} // namespace desktop

int main(int argc, char** argv) {
    std::setlocale(LC_ALL, "");
    desktop::ExitStatus status = desktop::ExitStatus::Success;
    try {
        status = desktop::run(std::vector<std::string>(argv, argv + argc));
    } catch (const desktop::UsageError& error) {
        status = desktop::fail(desktop::ExitStatus::BadInput, error.what());
    }
    return static_cast<int>(status);
}

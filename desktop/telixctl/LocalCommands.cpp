#include "desktop/telixctl/LocalCommands.h"

#include <cstdio>

#include "desktop/platform/Configuration.h"
#include "desktop/platform/ControlSocket.h"

namespace desktop {

namespace {

ExitStatus listTelevisions(const CommandLine& line) {
    (void)line;
    std::string error;
    const std::string folder = controlFolder(error);
    if (folder.empty()) {
        return fail(ExitStatus::Refused, error);
    }
    const auto running = runningTelevisions(folder);
    for (const ControlSocket& each : running) {
        std::printf("%d  %s\n", static_cast<int>(each.pid), each.path.c_str());
    }
    return running.empty() ? fail(ExitStatus::Refused, "no television is running") : ExitStatus::Success;
}

ExitStatus checkConfiguration(const CommandLine& line) {
    const auto given = line.values.find("file");
    const std::string file = given == line.values.end() ? Configuration::file() : given->second.front();
    if (file.empty()) {
        std::printf("There is no configuration file; the defaults apply.\n");
        return ExitStatus::Success;
    }
    Configuration configuration;
    if (const auto error = Configuration::load(file, configuration)) {
        return fail(ExitStatus::BadInput, error->message());
    }
    std::printf("%s: no errors\n", file.c_str());
    return ExitStatus::Success;
}

// In the order of localCommands().
const LocalFunction kFunctions[] = {
#define LOCAL_COMMAND(name, function, help, ...) function,
#include "desktop/platform/ControlCommands.h"
};

} // namespace

LocalFunction localFunctionOf(const ControlCommand& command) {
    return kFunctions[&command - localCommands().data()];
}

} // namespace desktop

// What the command line lets the window show first.
#include "desktop/window/shared/FirstPage.h"

#include "desktop/window/shared/ApplicationTarget.h"
#include "desktop/window/shared/CommandLine.h"
#include "desktop/window/shared/Diagnostics.h"

namespace desktop {

std::optional<std::string> pageOf(const CommandLine& commandLine) {
    const auto refuse = [](const std::string& url, const std::string& error) {
        printError("cannot load " + url + ": " + error);
        return std::nullopt;
    };
    if (!commandLine.signalUrl.empty()) {
        const std::string error = loadError(commandLine.signalUrl, commandLine.requestOptions());
        if (!error.empty()) {
            return refuse(commandLine.signalUrl, error);
        }
    }
    if (commandLine.page.empty()) {
        return std::string();
    }
    const ApplicationTarget target =
        commandLine.isXmlAit ? findApplicationOfXmlAit(commandLine.page, commandLine.requestOptions())
                             : findApplication(commandLine.page, commandLine.requestOptions(), {});
    Warnings warnings;
    warnOfSkipped(target, commandLine.page, warnings);
    return target.error.empty() ? std::optional(target.url) : refuse(commandLine.page, target.error);
}

} // namespace desktop

// The commands of telixctl, one row each. The row is all there is to a command besides its functions: the
// command line, --help, the checks of the television and the table in docs/television.md come from it. Rows
// stand in the order of the documentation.
//
//   CONTROL_COMMAND(name, handler, printer, help, parameters...)
//     goes to a running television: `handler` is a function of ControlRequests.cpp, which does the work in
//     the television; `printer` is a function of desktop/telixctl/Printers.h, which prints the response
//     (printNothing if there is nothing to print).
//   WINDOW_COMMAND(name, windowHandler, printer, help, parameters...)
//     is passed on to the window of the television: `windowHandler` is a function of
//     desktop/window/control/WindowCommands.cpp.
//   JOINT_COMMAND(name, handler, windowHandler, printer, help, parameters...)
//     has the response of `handler` and, if there is a window, the results of `windowHandler`.
//   LOCAL_COMMAND(name, function, help, parameters...)
//     needs no television: `function` is a function of desktop/telixctl/LocalCommands.h.
//
// A parameter is an argument, an optionalArgument or an option (ControlProtocol.cpp), in the order of the
// command line: name, accepted values, placeholder in help texts, default unless required, meaning. A
// parameter "timeout" is the time in seconds that the command may wait for something.
//
// Define the macros of the rows that are needed before including this file; a macro that is not defined drops
// its rows, and all are undefined afterwards. There is no include guard on purpose: each inclusion expands
// the list again.
#ifndef CONTROL_COMMAND
#define CONTROL_COMMAND(name, handler, printer, help, ...)
#endif
#ifndef WINDOW_COMMAND
#define WINDOW_COMMAND(name, windowHandler, printer, help, ...)
#endif
#ifndef JOINT_COMMAND
#define JOINT_COMMAND(name, handler, windowHandler, printer, help, ...)
#endif
#ifndef LOCAL_COMMAND
#define LOCAL_COMMAND(name, function, help, ...)
#endif

CONTROL_COMMAND("channels", listChannels, printChannels, "List the channels; a star marks the current one")
CONTROL_COMMAND("state", reportState, printState,
                "Print what is presented, by which objects and players, and which listeners are registered")
CONTROL_COMMAND("channel", tuneToChannel, printChannel, "Tune to a channel, as the viewer would",
                argument("number", number(1, UINT32_MAX), "NUMBER", "Position in the channel list, from 1"))
WINDOW_COMMAND("key", pressKeys, printNothing,
               "Press keys of the remote control, each when the page that the one before opened is loaded",
               argument("names", strings(), "NAME...", "Names of keys, as those of telix-tv --keys"),
               option("timeout", number(1, kMaxTimeout), "SECONDS", "30", "How long pages may take to load"))
WINDOW_COMMAND("screenshot", writeScreenshot, printNothing,
               "Write a picture of the window, with page and video",
               argument("file", file(), "FILE", "PNG file"))
WINDOW_COMMAND("open", openPage, printNothing, "Open a page in place of the applications that run",
               argument("url", page(), "URL", "URL or file of the page"),
               option("timeout", number(1, kMaxTimeout), "SECONDS", "30",
                      "How long the page may take to load"))
WINDOW_COMMAND("reload", reloadPages, printNothing,
               "Load the pages of the applications again, also after the end of the web process",
               option("timeout", number(1, kMaxTimeout), "SECONDS", "30",
                      "How long the topmost page may take to load"))
WINDOW_COMMAND("wait", waitForExpression, printNothing,
               "Wait until an expression is true in the topmost application",
               argument("expression", string(), "EXPR", "Expression; one that throws counts as false"),
               option("timeout", number(1, kMaxTimeout), "SECONDS", "30", "How long to wait"))
JOINT_COMMAND("applications", listApplications, listRunningApplications, printApplications,
              "List the applications that the current channel signals, and those that run")
CONTROL_COMMAND("signal", signalApplication, printNothing,
                "Signal a page as application of a channel, beside those of the broadcast",
                optionalArgument("url", string(), "URL", "none, ends the signalling",
                                 "Absolute URL of the page"),
                option("on", number(1, UINT32_MAX), "CHANNEL", "the current channel",
                       "Position in the channel list, from 1"),
                option("control-code", choice("autostart|present|kill|disabled"),
                       "autostart|present|kill|disabled", "autostart", "Control code"),
                option("service-bound", onOff(), "on|off", "off",
                       "Whether the application ends when another channel is selected"))
CONTROL_COMMAND("instant-zap", setInstantZap, printNothing, "Switch instant channel changes on or off",
                argument("on", onOff(), "on|off",
                         "Whether a channel change presents at once what has been received since the last "
                         "keyframe"))
CONTROL_COMMAND("channel-error", sendChannelError, printNothing,
                "Report that the current channel cannot be presented",
                argument("error", number(0, 100), "ERROR", "Error code as pages see it; 1 is no signal"))
CONTROL_COMMAND("rating", changeRating, printNothing, "Change the parental rating of the current programme",
                argument("age", number(0, 18), "AGE", "Age in years from 4 to 18, or 0 for no rating"),
                option("region", string(), "CODE", "the viewer's country",
                       "Country, an ISO code of three letters"))
CONTROL_COMMAND("rating-error", sendRatingError, printNothing,
                "Report that a parental rating cannot be evaluated",
                option("content-id", string(), "ID", "empty", "Content that the rating belongs to"),
                option("drm-system", string(), "ID", "empty", "DRM system that the rating belongs to"))
CONTROL_COMMAND("stream-event", sendStreamEvent, printListenerCount,
                "Send a stream event to every listener that matches all given conditions",
                option("id", number(0, 65535), "ID", "any", "Condition: event id of the listener"),
                option("tag", number(0, 255), "TAG", "any", "Condition: component tag of the listener"),
                option("name", string(), "NAME", "any", "Condition: event name of the listener"),
                option("data", string(), "TEXT", "empty", "Data of the event as a string"),
                option("hex", string(), "DIGITS", "empty",
                       "Data of the event as hexadecimal digits, instead of --data"),
                option("status", choice("trigger|error"), "trigger|error", "trigger", "Status of the event"))
CONTROL_COMMAND("full-screen", setFullScreen, printNothing,
                "Switch full screen on or off, as the viewer would",
                argument("on", onOff(), "on|off", "Whether the video covers the whole page"))
CONTROL_COMMAND("drm-result", sendDrmResult, printMessageId, "Send the result of a DRM message",
                argument("result", number(0, INT32_MAX), "RESULT",
                         "Result code as pages see it; 0 is success"),
                option("message", string(), "TEXT", "empty", "Result message"),
                option("id", string(), "ID", "the last one sent", "Id of the DRM message"))
CONTROL_COMMAND("rights-error", sendRightsError, printNothing,
                "Report missing or invalid rights for the media of the player",
                argument("state", number(0, INT32_MAX), "STATE",
                         "Error state as pages see it; 0 is no licence, 1 an invalid licence"),
                option("content-id", string(), "ID", "empty", "Content that the rights are for"),
                option("drm-system", string(), "ID", "empty", "DRM system of the content"),
                option("rights-issuer-url", string(), "URL", "empty", "Where rights can be acquired"))
CONTROL_COMMAND("low-memory", sendLowMemory, printNothing, "Report that memory is low",
                option("free", number(0, UINT32_MAX), "BYTES", "unchanged",
                       "Free memory to report from now on"))
CONTROL_COMMAND("buffered", overrideBufferLevel, printNothing,
                "Override the buffer level that the players report",
                option("amount", number(0, UINT32_MAX), "AMOUNT", "the real level",
                       "Level in seconds, or any raw value of the play info record"))
CONTROL_COMMAND("player-message", sendPlayerMessage, printNothing, "Send a platform message of the player",
                argument("message", string(), "MESSAGE", "Name, as play-end, or number, as 0xF000"))
LOCAL_COMMAND("list", listTelevisions, "List the running televisions by process id")
LOCAL_COMMAND("check-config", checkConfiguration, "Check a configuration file",
              optionalArgument("file", string(), "FILE", "the file that a television would read",
                               "Configuration file"))

#undef CONTROL_COMMAND
#undef WINDOW_COMMAND
#undef JOINT_COMMAND
#undef LOCAL_COMMAND

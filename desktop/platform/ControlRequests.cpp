// The handlers of the commands that act on the television, and the dispatch of requests to them.
#include <memory>
#include <optional>
#include <utility>

#include "desktop/platform/Broadcast.h"
#include "desktop/platform/Control.h"
#include "desktop/platform/ControlJson.h"
#include "desktop/platform/ControlRequest.h"
#include "desktop/platform/ControlState.h"
#include "desktop/platform/Device.h"
#include "desktop/platform/PlayerRegistry.h"
#include "desktop/platform/WindowRequests.h"

namespace desktop {

namespace {

const char kNoObject[] = "no video/broadcast object owns the tuner";
const char kNoPlayer[] = "no player has media";

Broadcast& broadcast() {
    return Broadcast::instance();
}

Device& device() {
    return Device::instance();
}

// ---- Broadcast and the viewer

JsonObjectWriter tuneToChannel(const ControlRequest& request) {
    const auto& list = broadcast().channels().list();
    const auto number = static_cast<size_t>(request.number("number"));
    if (number > list.size()) {
        throw ControlError("\"number\" is out of range: there are " + std::to_string(list.size()) +
                           " channels");
    }
    require(broadcast().arbiter().zap(list[number - 1]), "the channel cannot be tuned");
    JsonObjectWriter response;
    setChannel(response, "channel", list[number - 1]);
    return response;
}

uint8_t controlCodeOf(const std::string& name) {
    for (const ControlCode& each : controlCodes()) {
        if (g_ascii_strcasecmp(name.c_str(), each.name) == 0) {
            return each.value;
        }
    }
    return kControlCodeAutostart; // not reached: the command table has the same names
}

JsonObjectWriter signalApplication(const ControlRequest& request) {
    const auto& list = broadcast().channels().list();
    const auto number = static_cast<size_t>(request.has("on") ? request.number("on") : 0);
    if (number > list.size()) {
        throw ControlError("\"on\" is out of range: there are " + std::to_string(list.size()) + " channels");
    }
    const TELIX_JS_CM_HANDLE channel =
        number == 0 ? broadcast().arbiter().currentChannel() : list[number - 1];
    require(channel != 0, "there are no channels");
    require(broadcast().applications().signal(
                channel, request.string("url"), controlCodeOf(request.string("control-code", "autostart")),
                request.has("service-bound") && request.boolean("service-bound")),
            "\"url\" is not an absolute URL");
    return {};
}

JsonObjectWriter setInstantZap(const ControlRequest& request) {
    broadcast().setInstantZap(request.boolean("on"));
    return {};
}

JsonObjectWriter sendChannelError(const ControlRequest& request) {
    require(broadcast().callbacks().onChannelError.isSet(), "no listener is registered for channel errors");
    require(broadcast().faults().channelError(static_cast<int32_t>(request.number("error"))), kNoObject);
    return {};
}

JsonObjectWriter changeRating(const ControlRequest& request) {
    const int64_t age = request.number("age");
    require(age == 0 || age >= 4, "\"age\" must be 0, or from 4 to 18");
    const std::string region = request.string("region", device().configuration().country);
    require(region.size() == 3, "\"region\" must be an ISO code of three letters");
    require(broadcast().callbacks().onRatingChange.isSet(), "no listener is registered for parental ratings");
    // EN 300 468, parental rating descriptor: the rating is the age minus 3.
    require(broadcast().faults().rating(region, static_cast<uint8_t>(age == 0 ? 0 : age - 3)), kNoObject);
    return {};
}

JsonObjectWriter sendRatingError(const ControlRequest& request) {
    require(broadcast().callbacks().onRatingError.isSet(),
            "no listener is registered for parental rating errors");
    require(broadcast().faults().ratingError(request.string("content-id"), request.string("drm-system")),
            kNoObject);
    return {};
}

Bytes bytesOfHex(const std::string& digits) {
    Bytes bytes;
    for (size_t at = 0; at < digits.size(); at += 2) {
        const int high = g_ascii_xdigit_value(digits[at]);
        const int low = at + 1 < digits.size() ? g_ascii_xdigit_value(digits[at + 1]) : -1;
        require(high >= 0 && low >= 0, "\"hex\" must be pairs of hexadecimal digits");
        bytes.push_back(static_cast<uint8_t>(high << 4 | low));
    }
    return bytes;
}

JsonObjectWriter sendStreamEvent(const ControlRequest& request) {
    FaultInjection::Event event;
    if (request.has("id")) {
        event.id = static_cast<uint16_t>(request.number("id"));
    }
    if (request.has("tag")) {
        event.componentTag = static_cast<uint8_t>(request.number("tag"));
    }
    if (request.has("name")) {
        event.name = request.string("name");
    }
    require(!request.has("data") || !request.has("hex"), "\"data\" and \"hex\" exclude each other");
    const std::string data = request.string("data");
    event.data = request.has("hex") ? bytesOfHex(request.string("hex")) : Bytes(data.begin(), data.end());
    event.status = request.string("status", event.status);
    const size_t listeners = broadcast().faults().streamEvent(event);
    require(listeners > 0, "no listener is registered for such a stream event");
    JsonObjectWriter response;
    response.number("listeners", static_cast<int64_t>(listeners));
    return response;
}

JsonObjectWriter setFullScreen(const ControlRequest& request) {
    require(broadcast().faults().fullScreen(request.boolean("on")), kNoObject);
    return {};
}

// ---- The device

JsonObjectWriter sendDrmResult(const ControlRequest& request) {
    const std::string id = request.string("id", device().lastDrmMessage());
    require(!id.empty(), "\"id\" is missing, and no DRM message has been sent");
    require(device().injectDrmResult(id, request.string("message"),
                                     static_cast<int32_t>(request.number("result"))),
            "no DRM agent is registered");
    JsonObjectWriter response;
    response.string("id", id);
    return response;
}

JsonObjectWriter sendLowMemory(const ControlRequest& request) {
    const char noManager[] = "no application manager is registered";
    require(device().onLowMemory.isSet(), noManager);
    if (request.has("free")) {
        device().setFreeMemory(static_cast<uint32_t>(request.number("free")));
    }
    require(device().injectLowMemory(), noManager);
    return {};
}

// ---- Players

JsonObjectWriter sendRightsError(const ControlRequest& request) {
    require(PlayerRegistry::instance().injectRightsError(
                static_cast<int32_t>(request.number("state")), request.string("content-id"),
                request.string("drm-system"), request.string("rights-issuer-url")),
            kNoPlayer);
    return {};
}

JsonObjectWriter overrideBufferLevel(const ControlRequest& request) {
    std::optional<uint32_t> level;
    if (request.has("amount")) {
        level = static_cast<uint32_t>(request.number("amount"));
    }
    PlayerRegistry::instance().injectBuffered(level);
    return {};
}

// A name of playerMessages(), or a number in decimal or, with the prefix 0x, in hexadecimal.
TELIX_AV_CB_MSG playerMessageOf(const std::string& message) {
    for (const PlayerMessage& each : playerMessages()) {
        if (message == each.name) {
            return each.value;
        }
    }
    const bool isHexadecimal = message.compare(0, 2, "0x") == 0;
    guint64 value = 0;
    require(g_ascii_string_to_unsigned(message.c_str() + (isHexadecimal ? 2 : 0), isHexadecimal ? 16 : 10, 0,
                                       G_MAXUINT32, &value, nullptr) != FALSE,
            "\"message\" is neither a known name nor a number");
    return static_cast<TELIX_AV_CB_MSG>(value);
}

JsonObjectWriter sendPlayerMessage(const ControlRequest& request) {
    require(PlayerRegistry::instance().injectMessage(playerMessageOf(request.string("message"))), kNoPlayer);
    return {};
}

// ---- Dispatch

using Handler = JsonObjectWriter (*)(const ControlRequest& request);

// In the order of controlCommands(); null for commands that are the window's alone.
const Handler kHandlers[] = {
#define CONTROL_COMMAND(name, handler, printer, help, ...) handler,
#define WINDOW_COMMAND(name, windowHandler, printer, help, ...) nullptr,
#define JOINT_COMMAND(name, handler, windowHandler, printer, help, ...) handler,
#include "desktop/platform/ControlCommands.h"
};

std::string failure(const char* reason) {
    return JsonObjectWriter().boolean("ok", false).string("error", reason).toString();
}

// Completes the response of the window, which may be any string, by the results of the library.
std::string joined(JsonObjectWriter results, const std::string& windowResponse) {
    const auto response = JsonObjectWriter::parse(windowResponse);
    if (!response || !response->isBoolean("ok")) {
        return failure("the response of the window is not one");
    }
    return response->isTrue("ok") ? results.members(*response).toString() : response->toString();
}

void handle(const std::string& line, const ControlRequest& request, const Respond& respond) {
    using By = ControlCommand::Handler;
    const ControlCommand& command = request.command();
    const Handler handler = kHandlers[&command - controlCommands().data()];
    JsonObjectWriter results = handler ? handler(request) : JsonObjectWriter();
    WindowRequests& window = WindowRequests::instance();
    if (command.handler == By::Library || (command.handler == By::Both && !window.hasWindow())) {
        respond(results.boolean("ok", true).toString());
        return;
    }
    // A function object must be copyable.
    const auto shared = std::make_shared<JsonObjectWriter>(std::move(results));
    window.send(line, kResponseTimeout + request.timeout(), [shared, respond](const std::string& response) {
        respond(joined(std::move(*shared), response));
    });
}

} // namespace

void handleControlRequest(const std::string& line, const Respond& respond) {
    try {
        handle(line, ControlRequest::parse(line), respond);
    } catch (const ControlError& error) {
        respond(failure(error.what()));
    }
}

} // namespace desktop

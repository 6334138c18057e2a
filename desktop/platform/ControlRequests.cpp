// What the control socket's commands do, and the JSON around them.
#include "desktop/platform/Broadcast.h"
#include "desktop/platform/Control.h"
#include "desktop/platform/ControlProtocol.h"
#include "desktop/platform/Device.h"
#include "desktop/platform/PlayerRegistry.h"

#include <algorithm>
#include <cstring>
#include <json-glib/json-glib.h>
#include <map>
#include <stdexcept>
#include <variant>

namespace desktop {

namespace {

// Why a request is not done.
class Refusal : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

struct Unref {
    void operator()(JsonObject* object) const { json_object_unref(object); }
    void operator()(JsonArray* array) const { json_array_unref(array); }
    void operator()(JsonParser* parser) const { g_object_unref(parser); }
    void operator()(JsonNode* node) const { json_node_unref(node); }
};

class Array;

// An object that is being written.
class Object {
public:
    Object& text(const char* name, const std::string& value) {
        char* valid = g_utf8_make_valid(value.data(), static_cast<gssize>(value.size())); // broadcast is not
        json_object_set_string_member(m_object.get(), name, valid);
        g_free(valid);
        return *this;
    }
    Object& number(const char* name, int64_t value) {
        json_object_set_int_member(m_object.get(), name, value);
        return *this;
    }
    Object& real(const char* name, double value) {
        json_object_set_double_member(m_object.get(), name, value);
        return *this;
    }
    Object& flag(const char* name, bool value) {
        json_object_set_boolean_member(m_object.get(), name, value ? TRUE : FALSE);
        return *this;
    }
    Object& none(const char* name) {
        json_object_set_null_member(m_object.get(), name);
        return *this;
    }
    Object& object(const char* name, Object value) {
        json_object_set_object_member(m_object.get(), name, value.m_object.release()); // taken over
        return *this;
    }
    inline Object& array(const char* name, Array value);

    std::string line() const {
        const std::unique_ptr<JsonNode, Unref> node(json_node_new(JSON_NODE_OBJECT));
        json_node_set_object(node.get(), m_object.get());
        char* text = json_to_string(node.get(), FALSE);
        std::string result = text;
        g_free(text);
        return result;
    }

private:
    friend class Array;
    std::unique_ptr<JsonObject, Unref> m_object{json_object_new()};
};

class Array {
public:
    void add(Object value) { json_array_add_object_element(m_array.get(), value.m_object.release()); }
    void add(const std::string& value) { json_array_add_string_element(m_array.get(), value.c_str()); }

private:
    friend class Object;
    std::unique_ptr<JsonArray, Unref> m_array{json_array_new()};
};

Object& Object::array(const char* name, Array value) {
    json_object_set_array_member(m_object.get(), name, value.m_array.release());
    return *this;
}

// ---- Requests

using Value = std::variant<std::string, int64_t, bool>;

struct Request {
    const ControlCommand* command = nullptr;
    std::map<std::string, Value> values; // of the kinds that the command states

    bool has(const char* name) const { return values.count(name) != 0; }
    std::string text(const char* name, const std::string& otherwise = "") const {
        return has(name) ? std::get<std::string>(values.at(name)) : otherwise;
    }
    int64_t number(const char* name) const { return std::get<int64_t>(values.at(name)); }
    bool flag(const char* name) const { return std::get<bool>(values.at(name)); }
};

// The parser takes more than JSON, reads as deep as the text goes, and ends texts at a zero: what could lead
// there is turned away before.
void checkShape(const std::string& line) {
    if (line.size() > longestControlRequest) {
        throw Refusal("the line is longer than " + std::to_string(longestControlRequest) + " bytes");
    }
    if (!g_utf8_validate(line.data(), static_cast<gssize>(line.size()), nullptr)) { // nor zeros
        throw Refusal("the line is no UTF-8 text");
    }
    constexpr unsigned int deepest = 4;
    unsigned int depth = 0;
    bool isText = false;
    bool isPast = false; // the object has ended
    for (size_t at = 0; at < line.size(); ++at) {
        const char character = line[at];
        if (isText) {
            if (line.compare(at, 6, "\\u0000") == 0) {
                throw Refusal("a text holds a zero");
            }
            at += character == '\\' ? 1 : 0;
            isText = character != '"';
        } else if (isPast && !g_ascii_isspace(character)) {
            throw Refusal("the line is no JSON object: it goes on behind it");
        } else if (character == '"') {
            isText = true;
        } else if (character == '{' || character == '[') {
            if (++depth > deepest) {
                throw Refusal("the request is nested too deeply");
            }
        } else if ((character == '}' || character == ']') && depth > 0) {
            isPast = --depth == 0;
        } else if (!g_ascii_isalnum(character) && !std::strchr("}]:,+-. \t\r", character)) {
            throw Refusal("the line is no JSON object");
        }
    }
}

Value readValue(const ControlParameter& parameter, JsonNode* node) {
    const std::string name = std::string("\"") + parameter.name + "\"";
    const GType type = JSON_NODE_HOLDS_VALUE(node) ? json_node_get_value_type(node) : G_TYPE_NONE;
    switch (parameter.kind) {
    case ControlParameter::Kind::text: {
        if (type != G_TYPE_STRING) {
            throw Refusal(name + " must be a text");
        }
        const char* text = json_node_get_string(node);
        if (!text || !g_utf8_validate(text, -1, nullptr)) { // halves of surrogate pairs
            throw Refusal(name + " is no UTF-8 text");
        }
        return std::string(text);
    }
    case ControlParameter::Kind::number: {
        if (type != G_TYPE_INT64) {
            throw Refusal(name + " must be a whole number");
        }
        const int64_t number = json_node_get_int(node);
        if (number < parameter.least || number > parameter.most) {
            throw Refusal(name + " must be from " + std::to_string(parameter.least) + " to " +
                          std::to_string(parameter.most));
        }
        return number;
    }
    default:
        if (type != G_TYPE_BOOLEAN) {
            throw Refusal(name + " must be true or false");
        }
        return json_node_get_boolean(node) != FALSE;
    }
}

Request readRequest(const std::string& line) {
    checkShape(line);
    const std::unique_ptr<JsonParser, Unref> parser(json_parser_new());
    GError* fault = nullptr;
    if (!json_parser_load_from_data(parser.get(), line.data(), static_cast<gssize>(line.size()), &fault)) {
        const std::string reason = fault->message;
        g_error_free(fault);
        throw Refusal("the line is no JSON object: " + reason);
    }
    JsonNode* root = json_parser_get_root(parser.get());
    if (!root || !JSON_NODE_HOLDS_OBJECT(root)) {
        throw Refusal("the line is no JSON object");
    }
    JsonObject* object = json_node_get_object(root);
    JsonNode* name = json_object_get_member(object, "command");
    if (!name || !JSON_NODE_HOLDS_VALUE(name) || json_node_get_value_type(name) != G_TYPE_STRING) {
        throw Refusal("\"command\" must be a text");
    }
    Request request;
    request.command = findControlCommand(json_node_get_string(name));
    if (!request.command) {
        throw Refusal(std::string("unknown command \"") + json_node_get_string(name) + "\"");
    }
    struct Members {
        std::unique_ptr<GList, void (*)(GList*)> list;
    } members{{json_object_get_members(object), g_list_free}};
    for (const GList* each = members.list.get(); each; each = each->next) {
        const std::string member = static_cast<const char*>(each->data);
        if (member == "command") {
            continue;
        }
        const ControlParameter* parameter = findControlParameter(*request.command, member);
        if (!parameter) {
            throw Refusal("\"" + member + "\" is no parameter of " + request.command->name);
        }
        request.values[member] = readValue(*parameter, json_object_get_member(object, member.c_str()));
    }
    for (const ControlParameter& parameter : request.command->parameters) {
        if (parameter.isRequired && !request.has(parameter.name)) {
            throw Refusal(std::string("\"") + parameter.name + "\" is missing");
        }
    }
    return request;
}

// ---- Commands

Broadcast& broadcast() {
    return Broadcast::instance();
}

Device& device() {
    return Device::instance();
}

void require(bool isDone, const char* otherwise) {
    if (!isDone) {
        throw Refusal(otherwise);
    }
}

const char noHolder[] = "no video/broadcast object presents";

Object channelObject(size_t number, const Channel& channel) {
    static const char* const types[] = {"television", "radio", "other"};
    Object object;
    if (number != 0) {
        object.number("number", static_cast<int64_t>(number));
    }
    object.number("handle", channel.handle)
        .text("name", channel.name)
        .text("type", types[std::min(std::max(channel.type, 0), 2)])
        .number("onid", channel.onid)
        .number("tsid", channel.tsid)
        .number("sid", channel.sid);
    return object;
}

// The channel with its place in the list, without one for others; nothing if there is none.
void setChannel(Object& object, const char* name, TELIX_JS_CM_HANDLE handle) {
    const auto& list = broadcast().channels().list();
    const auto at = std::find(list.begin(), list.end(), handle);
    const auto channel = broadcast().channels().find(handle);
    if (channel) {
        const size_t number = at == list.end() ? 0 : static_cast<size_t>(at - list.begin()) + 1;
        object.object(name, channelObject(number, *channel));
    } else {
        object.none(name);
    }
}

Object channels(const Request& request) {
    (void)request;
    Array list;
    size_t number = 0;
    for (const TELIX_JS_CM_HANDLE handle : broadcast().channels().list()) {
        Object channel = channelObject(++number, *broadcast().channels().find(handle));
        list.add(std::move(channel.flag("current", handle == broadcast().arbiter().currentChannel())));
    }
    Object answer;
    answer.array("channels", std::move(list));
    return answer;
}

Object tune(const Request& request) {
    const auto& list = broadcast().channels().list();
    const auto number = static_cast<size_t>(request.number("number"));
    if (number > list.size()) {
        throw Refusal("there are " + std::to_string(list.size()) + " channels");
    }
    require(broadcast().arbiter().zap(list[number - 1]), "the channel can't be tuned");
    Object answer;
    setChannel(answer, "channel", list[number - 1]);
    return answer;
}

Object channelError(const Request& request) {
    require(broadcast().callbacks().onChannelError.isSet(), "nobody listens to channel errors");
    require(broadcast().faults().channelError(static_cast<int32_t>(request.number("error"))), noHolder);
    return {};
}

Object rating(const Request& request) {
    const int64_t age = request.number("age");
    if (age > 0 && age < 4) {
        throw Refusal("\"age\" must be 0, or from 4 to 18");
    }
    const std::string region = request.text("region", device().configuration().country);
    if (region.size() != 3) {
        throw Refusal("\"region\" must be a code of three letters");
    }
    require(broadcast().callbacks().onRatingChange.isSet(), "nobody listens to ratings");
    require(broadcast().faults().rating(region, static_cast<uint8_t>(age == 0 ? 0 : age - 3)), noHolder);
    return {};
}

Object ratingError(const Request& request) {
    require(broadcast().callbacks().onRatingError.isSet(), "nobody listens to errors of ratings");
    require(broadcast().faults().ratingError(request.text("content-id"), request.text("drm-system")),
            noHolder);
    return {};
}

Bytes bytesOfHex(const std::string& digits) {
    Bytes bytes;
    for (size_t at = 0; at < digits.size(); at += 2) {
        const int high = g_ascii_xdigit_value(digits[at]);
        const int low = at + 1 < digits.size() ? g_ascii_xdigit_value(digits[at + 1]) : -1;
        if (high < 0 || low < 0) {
            throw Refusal("\"hex\" must be pairs of hexadecimal digits");
        }
        bytes.push_back(static_cast<uint8_t>(high << 4 | low));
    }
    return bytes;
}

Object streamEvent(const Request& request) {
    FaultInjection::Event event;
    if (request.has("id")) {
        event.id = static_cast<uint16_t>(request.number("id"));
    }
    if (request.has("tag")) {
        event.componentTag = static_cast<uint8_t>(request.number("tag"));
    }
    if (request.has("name")) {
        event.name = request.text("name");
    }
    if (request.has("data") && request.has("hex")) {
        throw Refusal("give either \"data\" or \"hex\"");
    }
    const std::string data = request.text("data");
    event.data = request.has("hex") ? bytesOfHex(request.text("hex")) : Bytes(data.begin(), data.end());
    event.status = request.text("status", event.status);
    if (event.status != "trigger" && event.status != "error") {
        throw Refusal("\"status\" must be trigger or error");
    }
    const size_t listeners = broadcast().faults().streamEvent(event);
    require(listeners > 0, "nobody listens to such a stream event");
    Object answer;
    answer.number("listeners", static_cast<int64_t>(listeners));
    return answer;
}

Object fullScreen(const Request& request) {
    require(broadcast().faults().fullScreen(request.flag("on")), noHolder);
    return {};
}

Object drmResult(const Request& request) {
    const std::string id = request.text("id", device().lastDrmMessage());
    if (id.empty()) {
        throw Refusal("no message has been sent: give an \"id\"");
    }
    require(
        device().injectDrmResult(id, request.text("message"), static_cast<int32_t>(request.number("result"))),
        "there is no DRM agent");
    Object answer;
    answer.text("id", id);
    return answer;
}

Object lowMemory(const Request& request) {
    require(device().onLowMemory.isSet(), "there is no application manager");
    if (request.has("free")) {
        device().setFreeMemory(static_cast<uint32_t>(request.number("free")));
    }
    require(device().injectLowMemory(), "there is no application manager");
    return {};
}

const char noPlayer[] = "there is no player with media";

Object rightsError(const Request& request) {
    require(PlayerRegistry::instance().injectRightsError(
                static_cast<int32_t>(request.number("state")), request.text("content-id"),
                request.text("drm-system"), request.text("rights-issuer-url")),
            noPlayer);
    return {};
}

Object buffered(const Request& request) {
    PlayerRegistry::instance().injectBuffered(
        request.has("amount") ? std::optional(static_cast<uint32_t>(request.number("amount")))
                              : std::nullopt);
    return {};
}

Object playerMessage(const Request& request) {
    const std::string text = request.text("message");
    std::optional<TELIX_AV_CB_MSG> message;
    for (const PlayerMessage& each : playerMessages()) {
        if (text == each.name) {
            message = each.number;
        }
    }
    if (!message) {
        const bool isHexadecimal = text.compare(0, 2, "0x") == 0;
        guint64 number = 0;
        if (!g_ascii_string_to_unsigned(text.c_str() + (isHexadecimal ? 2 : 0), isHexadecimal ? 16 : 10, 0,
                                        G_MAXUINT32, &number, nullptr)) {
            throw Refusal("\"message\" is neither a known name nor a number");
        }
        message = static_cast<TELIX_AV_CB_MSG>(number);
    }
    require(PlayerRegistry::instance().injectMessage(*message), noPlayer);
    return {};
}

// ---- The state

Array players() {
    Array list;
    for (const PlayerRegistry::State& each : PlayerRegistry::instance().states()) {
        Object player;
        player.number("handle", each.player)
            .text("url", each.url)
            .text("state", each.state)
            .number("position", each.position)
            .number("duration", each.duration)
            .number("bufferedEnd", each.bufferedEnd)
            .number("buffered", each.buffered)
            .real("speed", each.speed)
            .number("volume", each.volume);
        list.add(std::move(player));
    }
    return list;
}

const char* nameOf(TELIX_PLAYSTATE_ENUM_T state) {
    switch (state) {
    case TELIX_PLAYSTATE_UNREALIZED:
        return "unrealized";
    case TELIX_PLAYSTATE_CONNECTING:
        return "connecting";
    case TELIX_PLAYSTATE_PRESENTING:
        return "presenting";
    case TELIX_PLAYSTATE_STOPPED:
        return "stopped";
    default: // pages may write any number
        return "other";
    }
}

Object areaObject(int64_t x, int64_t y, int64_t width, int64_t height) {
    Object area;
    area.number("x", x).number("y", y).number("width", width).number("height", height);
    return area;
}

Array objectsOf(const Broadcast::State& state) {
    Array objects;
    for (const Broadcast::State::Object& each : state.objects) {
        Object object;
        object.number("handle", each.handle)
            .text("playState", nameOf(each.playState))
            .number("playStateNumber", each.playState)
            .flag("holdsTuner", each.ownsTuner)
            .number("channel", each.channel)
            .object("area", areaObject(each.view.x, each.view.y, each.view.width, each.view.height))
            .flag("fullScreen", each.view.fullScreen);
        objects.add(std::move(object));
    }
    return objects;
}

Array componentsOf(const Broadcast::State& state) {
    static const char* const types[] = {"video", "audio", "subtitle"};
    Array components;
    for (const BroadcastComponents::Available& each : state.components) {
        const BroadcastComponent& component = each.component;
        Object object;
        object.number("handle", each.handle)
            .text("type", types[component.type])
            .flag("active", each.isActive)
            .number("pid", component.pid)
            .text("encoding", component.encoding)
            .text("language", component.language)
            .flag("encrypted", component.isEncrypted)
            .flag("audioDescription", component.isAudioDescription)
            .flag("hearingImpaired", component.isForHearingImpaired)
            .number("audioChannels", component.audioChannels)
            .real("aspectRatio", static_cast<double>(component.aspectRatio));
        components.add(std::move(object));
    }
    return components;
}

void setProgramme(Object& programmes, const char* name, TELIX_JS_SI_HANDLE handle) {
    const auto programme = broadcast().programmes().find(handle);
    if (!programme) {
        programmes.none(name);
        return;
    }
    Object object;
    object.text("name", programme->name)
        .text("description", programme->description)
        .number("start", programme->start)
        .number("duration", programme->duration);
    Array ratings;
    for (const TELIX_JS_SI_PARENTALRATING_HANDLE each : programme->ratings) {
        if (const auto found = broadcast().programmes().findRating(each)) {
            Object rated;
            rated.text("region", found->region).number("value", found->value()).flag("isAge", found->isAge());
            ratings.add(std::move(rated));
        }
    }
    object.array("ratings", std::move(ratings));
    programmes.object(name, std::move(object));
}

Object pictureObject() {
    telix_desktop_frame frame{};
    telix_desktop_acquire_frame(&frame);
    Object picture;
    picture.flag("visible", frame.visible != 0)
        .number("serial", static_cast<int64_t>(frame.serial))
        .number("width", frame.width)
        .number("height", frame.height)
        .object("area", areaObject(frame.areaX, frame.areaY, frame.areaWidth, frame.areaHeight))
        .flag("fullScreen", frame.fullScreen != 0);
    telix_desktop_release_frame(&frame);
    return picture;
}

Object registrations(const Broadcast::State& state) {
    const BroadcastCallbacks& source = broadcast().callbacks();
    Object object;
    object.flag("channelChange", source.onChannelChange.isSet())
        .flag("channelError", source.onChannelError.isSet())
        .flag("fullScreen", source.onFullScreen.isSet())
        .flag("playState", source.onPlayState.isSet())
        .flag("programmes", source.onProgrammes.isSet())
        .flag("ratingChange", source.onRatingChange.isSet())
        .flag("ratingError", source.onRatingError.isSet())
        .flag("lowMemory", device().onLowMemory.isSet())
        .flag("drmMessageResult", device().onDrmMessageResult.isSet());
    Array watches;
    for (const StreamEvents::Subscription& each : state.subscriptions) {
        Object watch;
        watch.number("object", each.object)
            .number("id", each.eventId)
            .number("tag", each.componentTag)
            .text("name", each.name);
        watches.add(std::move(watch));
    }
    object.array("streamEvents", std::move(watches));
    return object;
}

Object tellState(const Request& request) {
    (void)request;
    const Broadcast::State state = broadcast().state();
    Object answer;
    setChannel(answer, "channel", state.channel);
    answer.array("objects", objectsOf(state)).array("components", componentsOf(state));
    if (const auto pid = broadcast().activeAudioPid()) {
        answer.number("heardAudio", *pid);
    } else {
        answer.none("heardAudio");
    }
    answer.none("shownSubtitle");
    for (const BroadcastComponents::Available& each : state.components) {
        if (each.isActive && each.component.type == TELIX_JS_AVCOMPTYPE_SUBTITLE) {
            answer.number("shownSubtitle", each.component.pid);
        }
    }
    Object programmes;
    setProgramme(programmes, "now", state.present);
    setProgramme(programmes, "next", state.following);
    answer.object("programmes", std::move(programmes)).object("picture", pictureObject());
    answer.array("players", players());
    Array keys;
    for (const KeyGroup& group : keyGroups()) {
        if ((device().keySet() & group.bit) != 0) {
            keys.add(group.name);
        }
    }
    answer.number("keySet", device().keySet())
        .array("keys", std::move(keys))
        .number("freeMemory", device().freeMemory())
        .text("lastDrmMessage", device().lastDrmMessage())
        .object("registrations", registrations(state));
    return answer;
}

using Function = Object (*)(const Request& request);

Function functionOf(const std::string& command) {
    static const auto& functions = *new std::map<std::string, Function>{
        {"channels", channels},
        {"state", tellState},
        {"channel", tune},
        {"channel-error", channelError},
        {"rating", rating},
        {"rating-error", ratingError},
        {"stream-event", streamEvent},
        {"full-screen", fullScreen},
        {"drm-result", drmResult},
        {"rights-error", rightsError},
        {"low-memory", lowMemory},
        {"buffered", buffered},
        {"player-message", playerMessage},
    };
    const auto found = functions.find(command);
    return found == functions.end() ? nullptr : found->second;
}

} // namespace

std::string answerControlRequest(const std::string& line) {
    try {
        const Request request = readRequest(line);
        const Function function = functionOf(request.command->name);
        require(function != nullptr, "not in this library");
        Object answer = function(request);
        return answer.flag("ok", true).line();
    } catch (const Refusal& refusal) {
        Object answer;
        return answer.flag("ok", false).text("error", refusal.what()).line();
    }
}

} // namespace desktop

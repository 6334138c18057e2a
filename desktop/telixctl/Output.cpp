// The words for channels, state and the smaller answers.
#include "desktop/telixctl/Output.h"

#include <cstdio>
#include <ctime>

namespace {

// Members that are missing read as empty: a television may be older than this command.
JsonObject* objectOf(JsonObject* object, const char* name) {
    JsonNode* node = object ? json_object_get_member(object, name) : nullptr;
    return node && JSON_NODE_HOLDS_OBJECT(node) ? json_node_get_object(node) : nullptr;
}

int64_t numberOf(JsonObject* object, const char* name) {
    return object ? json_object_get_int_member_with_default(object, name, 0) : 0;
}

bool isSo(JsonObject* object, const char* name) {
    return object && json_object_get_boolean_member_with_default(object, name, FALSE);
}

// Without characters that would steer the terminal.
std::string textOf(JsonObject* object, const char* name) {
    std::string text = object ? json_object_get_string_member_with_default(object, name, "") : "";
    for (char& character : text) {
        if (static_cast<unsigned char>(character) < 0x20 || character == 0x7F) {
            character = '?';
        }
    }
    return text;
}

template <typename Function>
void forEach(JsonObject* object, const char* name, Function function) {
    JsonNode* node = object ? json_object_get_member(object, name) : nullptr;
    if (!node || !JSON_NODE_HOLDS_ARRAY(node)) {
        return;
    }
    JsonArray* array = json_node_get_array(node);
    for (guint index = 0; index < json_array_get_length(array); ++index) {
        JsonNode* element = json_array_get_element(array, index);
        if (JSON_NODE_HOLDS_OBJECT(element)) {
            function(json_node_get_object(element));
        }
    }
}

void line(const char* title, const std::string& text) {
    std::printf("%-14s%s\n", title, text.c_str());
}

std::string areaText(JsonObject* object) {
    JsonObject* area = objectOf(object, "area");
    std::string text = std::to_string(numberOf(area, "width")) + "x" +
                       std::to_string(numberOf(area, "height")) + " at " +
                       std::to_string(numberOf(area, "x")) + "," + std::to_string(numberOf(area, "y"));
    return isSo(object, "fullScreen") ? text + ", full screen" : text;
}

std::string clockTime(int64_t seconds) {
    const auto time = static_cast<time_t>(seconds);
    tm broken{};
    char text[32] = "";
    if (localtime_r(&time, &broken)) {
        std::strftime(text, sizeof(text), "%H:%M:%S", &broken);
    }
    return text;
}

void printChannels(JsonObject* answer) {
    forEach(answer, "channels", [](JsonObject* channel) {
        std::printf("%c%3lld  %-24s %-11s %lld.%lld.%lld\n", isSo(channel, "current") ? '*' : ' ',
                    static_cast<long long>(numberOf(channel, "number")), textOf(channel, "name").c_str(),
                    textOf(channel, "type").c_str(), static_cast<long long>(numberOf(channel, "onid")),
                    static_cast<long long>(numberOf(channel, "tsid")),
                    static_cast<long long>(numberOf(channel, "sid")));
    });
}

void printProgramme(const char* title, JsonObject* programme) {
    if (!programme) {
        return;
    }
    const int64_t start = numberOf(programme, "start");
    std::string text = textOf(programme, "name") + ", " + clockTime(start) + " to " +
                       clockTime(start + numberOf(programme, "duration"));
    forEach(programme, "ratings", [&](JsonObject* rating) {
        text += ", " + textOf(rating, "region") + " " + std::to_string(numberOf(rating, "value"));
    });
    line(title, text);
}

void printPlayer(JsonObject* player) {
    char speed[32];
    std::snprintf(speed, sizeof(speed), "%g", json_object_get_double_member_with_default(player, "speed", 1));
    line("player", std::to_string(numberOf(player, "handle")) + " " + textOf(player, "state") + " " +
                       textOf(player, "url") + ", " + std::to_string(numberOf(player, "position")) + " of " +
                       std::to_string(numberOf(player, "duration")) + " ms, speed " + speed + ", volume " +
                       std::to_string(numberOf(player, "volume")) + ", buffered " +
                       std::to_string(numberOf(player, "buffered")));
}

void printState(JsonObject* answer) {
    JsonObject* channel = objectOf(answer, "channel");
    line("channel",
         channel ? std::to_string(numberOf(channel, "number")) + " " + textOf(channel, "name") : "none");
    forEach(answer, "objects", [](JsonObject* object) {
        if (textOf(object, "playState") != "unrealized" || isSo(object, "holdsTuner")) {
            line("object", std::to_string(numberOf(object, "handle")) + " " + textOf(object, "playState") +
                               (isSo(object, "holdsTuner") ? ", has the tuner, " : ", ") + areaText(object));
        }
    });
    const int64_t heard = numberOf(answer, "heardAudio");
    forEach(answer, "components", [&](JsonObject* component) {
        const std::string type = textOf(component, "type");
        std::string text = textOf(component, "encoding") + " " + textOf(component, "language") + " PID " +
                           std::to_string(numberOf(component, "pid"));
        text += isSo(component, "active") ? ", chosen" : "";
        text += type == "audio" && numberOf(component, "pid") == heard ? ", heard" : "";
        line(type.c_str(), text);
    });
    JsonObject* programmes = objectOf(answer, "programmes");
    printProgramme("now", objectOf(programmes, "now"));
    printProgramme("next", objectOf(programmes, "next"));
    JsonObject* picture = objectOf(answer, "picture");
    line("picture", isSo(picture, "visible")
                        ? "frame " + std::to_string(numberOf(picture, "serial")) + ", " +
                              std::to_string(numberOf(picture, "width")) + "x" +
                              std::to_string(numberOf(picture, "height")) + ", shown " + areaText(picture)
                        : "none");
    forEach(answer, "players", printPlayer);
    std::string keys;
    JsonNode* names = json_object_get_member(answer, "keys");
    JsonArray* array = names && JSON_NODE_HOLDS_ARRAY(names) ? json_node_get_array(names) : nullptr;
    for (guint index = 0; array && index < json_array_get_length(array); ++index) {
        const char* name = json_array_get_string_element(array, index);
        keys += std::string(keys.empty() ? "" : " ") + (name ? name : "?");
    }
    line("keys", keys.empty() ? "none" : keys);
    line("free memory", std::to_string(numberOf(answer, "freeMemory")) + " bytes");
    JsonObject* registrations = objectOf(answer, "registrations");
    std::string listeners;
    GList* members = registrations ? json_object_get_members(registrations) : nullptr;
    for (const GList* each = members; each; each = each->next) {
        const char* name = static_cast<const char*>(each->data);
        JsonNode* node = json_object_get_member(registrations, name);
        if (JSON_NODE_HOLDS_VALUE(node) && json_node_get_boolean(node)) {
            listeners += (listeners.empty() ? "" : " ") + std::string(name);
        }
    }
    g_list_free(members);
    line("listeners", listeners.empty() ? "none" : listeners);
    forEach(registrations, "streamEvents", [](JsonObject* watch) {
        line("stream event", "id " + std::to_string(numberOf(watch, "id")) + " tag " +
                                 std::to_string(numberOf(watch, "tag")) + " " + textOf(watch, "name"));
    });
}

} // namespace

void printAnswer(const std::string& command, JsonObject* answer) {
    if (command == "channels") {
        printChannels(answer);
    } else if (command == "state") {
        printState(answer);
    } else if (command == "channel") {
        JsonObject* channel = objectOf(answer, "channel");
        std::printf("%lld %s\n", static_cast<long long>(numberOf(channel, "number")),
                    textOf(channel, "name").c_str());
    } else if (command == "stream-event") {
        std::printf("listeners: %lld\n", static_cast<long long>(numberOf(answer, "listeners")));
    } else if (command == "drm-result") {
        std::printf("answered: %s\n", textOf(answer, "id").c_str());
    }
}

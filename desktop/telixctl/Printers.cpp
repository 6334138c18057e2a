// Members that are missing read as empty: a television may be older than telixctl.
#include "desktop/telixctl/Printers.h"

#include <cstdio>
#include <ctime>
#include <string>
#include <vector>

namespace desktop {

namespace {

// ---- Members of a response

JsonObject* objectMember(JsonObject* object, const char* name) {
    JsonNode* node = object ? json_object_get_member(object, name) : nullptr;
    return node && JSON_NODE_HOLDS_OBJECT(node) ? json_node_get_object(node) : nullptr;
}

JsonArray* arrayMember(JsonObject* object, const char* name) {
    JsonNode* node = object ? json_object_get_member(object, name) : nullptr;
    return node && JSON_NODE_HOLDS_ARRAY(node) ? json_node_get_array(node) : nullptr;
}

std::string numberMember(JsonObject* object, const char* name) {
    return std::to_string(object ? json_object_get_int_member_with_default(object, name, 0) : 0);
}

bool booleanMember(JsonObject* object, const char* name) {
    return object && json_object_get_boolean_member_with_default(object, name, FALSE);
}

// Control characters are replaced, because a terminal would interpret them.
std::string printable(std::string value) {
    for (char& character : value) {
        if (static_cast<unsigned char>(character) < 0x20 || character == 0x7F) {
            character = '?';
        }
    }
    return value;
}

std::string stringMember(JsonObject* object, const char* name) {
    return printable(object ? json_object_get_string_member_with_default(object, name, "") : "");
}

std::vector<std::string> stringsMember(JsonObject* object, const char* name) {
    std::vector<std::string> strings;
    JsonArray* array = arrayMember(object, name);
    for (guint index = 0; array && index < json_array_get_length(array); ++index) {
        const char* each = json_array_get_string_element(array, index);
        strings.push_back(printable(each ? each : "?"));
    }
    return strings;
}

template <typename Function>
void forEachObject(JsonObject* object, const char* name, Function function) {
    JsonArray* array = arrayMember(object, name);
    for (guint index = 0; array && index < json_array_get_length(array); ++index) {
        JsonNode* element = json_array_get_element(array, index);
        if (JSON_NODE_HOLDS_OBJECT(element)) {
            function(json_node_get_object(element));
        }
    }
}

// ---- Parts of the state

void printRow(const std::string& title, const std::string& value) {
    std::printf("%-14s%s\n", title.c_str(), value.c_str());
}

std::string orNone(const std::string& value) {
    return value.empty() ? "none" : value;
}

std::string areaOf(JsonObject* object) {
    JsonObject* area = objectMember(object, "area");
    const std::string rectangle = numberMember(area, "width") + "x" + numberMember(area, "height") + " at " +
                                  numberMember(area, "x") + "," + numberMember(area, "y");
    return booleanMember(object, "fullScreen") ? rectangle + ", full screen" : rectangle;
}

std::string localTime(int64_t seconds) {
    const auto time = static_cast<time_t>(seconds);
    tm broken{};
    char formatted[32] = "";
    if (localtime_r(&time, &broken)) {
        std::strftime(formatted, sizeof(formatted), "%H:%M:%S", &broken);
    }
    return formatted;
}

void printObject(JsonObject* object) {
    const bool ownsTuner = booleanMember(object, "ownsTuner");
    const std::string playState = stringMember(object, "playState");
    if (playState != "unrealized" || ownsTuner) {
        printRow("object", numberMember(object, "handle") + " " + playState +
                               (ownsTuner ? ", owns the tuner, " : ", ") + areaOf(object));
    }
}

void printComponent(JsonObject* component, const std::string& activeAudioPid) {
    const std::string type = stringMember(component, "type");
    const std::string pid = numberMember(component, "pid");
    printRow(type, stringMember(component, "encoding") + " " + stringMember(component, "language") + " PID " +
                       pid + (booleanMember(component, "active") ? ", active" : "") +
                       (type == "audio" && pid == activeAudioPid ? ", playing" : ""));
}

void printProgramme(const char* title, JsonObject* programme) {
    if (!programme) {
        return;
    }
    const int64_t start = json_object_get_int_member_with_default(programme, "start", 0);
    const int64_t duration = json_object_get_int_member_with_default(programme, "duration", 0);
    std::string row =
        stringMember(programme, "name") + ", " + localTime(start) + " to " + localTime(start + duration);
    forEachObject(programme, "ratings", [&](JsonObject* rating) {
        row += ", " + stringMember(rating, "region") + " " + numberMember(rating, "value");
    });
    printRow(title, row);
}

void printPicture(JsonObject* picture) {
    printRow("picture", booleanMember(picture, "visible")
                            ? "frame " + numberMember(picture, "serial") + ", " +
                                  numberMember(picture, "width") + "x" + numberMember(picture, "height") +
                                  ", shown " + areaOf(picture)
                            : "none");
}

void printPlayer(JsonObject* player) {
    char speed[32];
    std::snprintf(speed, sizeof(speed), "%g", json_object_get_double_member_with_default(player, "speed", 1));
    printRow("player", numberMember(player, "handle") + " " + stringMember(player, "state") + " " +
                           stringMember(player, "url") + ", " + numberMember(player, "position") + " of " +
                           numberMember(player, "duration") + " ms, speed " + speed + ", volume " +
                           numberMember(player, "volume") + ", buffered " + numberMember(player, "buffered"));
}

void printTuner(JsonObject* tuner) {
    const std::string multiplex = stringMember(tuner, "multiplex");
    printRow("tuner", multiplex.empty()
                          ? "receives nothing"
                          : multiplex + ", " + numberMember(tuner, "keptPackets") + " bytes kept" +
                                (booleanMember(tuner, "selected") ? ", selected" : ""));
}

std::string keysOf(JsonObject* response, const char* receiver) {
    std::string keys;
    for (const std::string& name : stringsMember(response, receiver)) {
        keys += (keys.empty() ? "" : " ") + name;
    }
    return keys;
}

// The names of the members that are true.
std::string listenersOf(JsonObject* registrations) {
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
    return listeners;
}

// ---- The printers of the command table

void printNothing(JsonObject* response) {
    (void)response;
}

void printChannels(JsonObject* response) {
    forEachObject(response, "channels", [](JsonObject* channel) {
        std::printf("%c%3s  %-24s %-11s %s.%s.%s\n", booleanMember(channel, "current") ? '*' : ' ',
                    numberMember(channel, "number").c_str(), stringMember(channel, "name").c_str(),
                    stringMember(channel, "type").c_str(), numberMember(channel, "onid").c_str(),
                    numberMember(channel, "tsid").c_str(), numberMember(channel, "sid").c_str());
    });
}

void printChannel(JsonObject* response) {
    JsonObject* channel = objectMember(response, "channel");
    std::printf("%s %s\n", numberMember(channel, "number").c_str(), stringMember(channel, "name").c_str());
}

void printApplications(JsonObject* response) {
    JsonObject* channel = objectMember(response, "channel");
    printRow("channel", channel ? numberMember(channel, "number") + " " + stringMember(channel, "name") +
                                      ", signalling " + stringMember(response, "state")
                                : "none");
    forEachObject(response, "applications", [](JsonObject* application) {
        const std::string name = stringMember(application, "name");
        printRow(stringMember(application, "id"),
                 stringMember(application, "controlCode") + " " + stringMember(application, "url") + ", " +
                     (name.empty() ? "" : name + ", ") + "priority " + numberMember(application, "priority") +
                     (booleanMember(application, "serviceBound") ? ", service-bound" : ""));
    });
    for (const std::string& each : stringsMember(response, "skipped")) {
        printRow("skipped", each);
    }
    forEachObject(response, "running", [](JsonObject* application) {
        const std::string id = stringMember(application, "id");
        printRow("running", stringMember(application, "url") + (id.empty() ? "" : ", " + id) +
                                (booleanMember(application, "visible") ? ", visible" : ""));
    });
}

void printListenerCount(JsonObject* response) {
    std::printf("listeners: %s\n", numberMember(response, "listeners").c_str());
}

void printMessageId(JsonObject* response) {
    std::printf("message: %s\n", stringMember(response, "id").c_str());
}

void printState(JsonObject* response) {
    JsonObject* channel = objectMember(response, "channel");
    printRow("channel",
             channel ? numberMember(channel, "number") + " " + stringMember(channel, "name") : "none");
    forEachObject(response, "objects", printObject);
    const std::string activeAudioPid = numberMember(response, "activeAudioPid");
    forEachObject(response, "components",
                  [&](JsonObject* component) { printComponent(component, activeAudioPid); });
    JsonObject* programmes = objectMember(response, "programmes");
    printProgramme("now", objectMember(programmes, "now"));
    printProgramme("next", objectMember(programmes, "next"));
    printPicture(objectMember(response, "picture"));
    printRow("instant zap", booleanMember(response, "instantZap")
                                ? "on, " + numberMember(response, "keptPackets") + " bytes kept"
                                : "off");
    forEachObject(response, "tuners", printTuner);
    printRow("zap delay", numberMember(response, "zapDelay") + " ms");
    forEachObject(response, "players", printPlayer);
    printRow("page keys", orNone(keysOf(response, "keys")));
    printRow("other keys", orNone(keysOf(response, "televisionKeys")));
    printRow("free memory", numberMember(response, "freeMemory") + " bytes");
    JsonObject* registrations = objectMember(response, "registrations");
    printRow("listeners", orNone(listenersOf(registrations)));
    forEachObject(registrations, "streamEvents", [](JsonObject* subscription) {
        printRow("stream event", "id " + numberMember(subscription, "id") + " tag " +
                                     numberMember(subscription, "tag") + " " +
                                     stringMember(subscription, "name"));
    });
}

// In the order of controlCommands().
const Printer kPrinters[] = {
#define CONTROL_COMMAND(name, handler, printer, help, ...) printer,
#define WINDOW_COMMAND(name, windowHandler, printer, help, ...) printer,
#define JOINT_COMMAND(name, handler, windowHandler, printer, help, ...) printer,
#include "desktop/platform/ControlCommands.h"
};

} // namespace

Printer printerOf(const ControlCommand& command) {
    return kPrinters[&command - controlCommands().data()];
}

} // namespace desktop

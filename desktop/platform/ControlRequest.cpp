// Strict parsing of a line into a request.
#include "desktop/platform/ControlRequest.h"

#include <cstring>
#include <memory>

#include "desktop/platform/ControlJson.h"

namespace desktop {

namespace {

// json-glib accepts more than JSON (comments, assignments, single quotes), recurses as deep as the input
// nests, and cuts strings at a null character. Lines with any of that are rejected before they reach it.
void rejectUnsafeJson(const std::string& line) {
    constexpr unsigned int kMaxDepth = 4;
    unsigned int depth = 0;
    bool isInString = false;
    bool isAfterObject = false;
    for (size_t at = 0; at < line.size(); ++at) {
        const char character = line[at];
        if (isInString) {
            require(line.compare(at, 6, "\\u0000") != 0, "a string contains a null character");
            at += character == '\\' ? 1 : 0;
            isInString = character != '"';
        } else if (isAfterObject && !g_ascii_isspace(character)) {
            throw ControlError("the line is not a JSON object: data follows the object");
        } else if (character == '"') {
            isInString = true;
        } else if (character == '{' || character == '[') {
            require(++depth <= kMaxDepth, "the request is nested too deeply");
        } else if ((character == '}' || character == ']') && depth > 0) {
            isAfterObject = --depth == 0;
        } else {
            require(g_ascii_isalnum(character) || std::strchr("}]:,+-. \t\r", character),
                    "the line is not a JSON object");
        }
    }
}

void checkLine(const std::string& line) {
    if (line.size() > kMaxControlRequest) {
        throw ControlError("the line is longer than " + std::to_string(kMaxControlRequest) + " bytes");
    }
    // Null characters are rejected, too.
    require(g_utf8_validate(line.data(), static_cast<gssize>(line.size()), nullptr) != FALSE,
            "the line is not valid UTF-8");
    rejectUnsafeJson(line);
}

std::unique_ptr<JsonParser, JsonUnref> parseJson(const std::string& line) {
    std::unique_ptr<JsonParser, JsonUnref> parser(json_parser_new());
    GError* error = nullptr;
    if (!json_parser_load_from_data(parser.get(), line.data(), static_cast<gssize>(line.size()), &error)) {
        const std::string reason = error->message;
        g_error_free(error);
        throw ControlError("the line is not a JSON object: " + reason);
    }
    JsonNode* root = json_parser_get_root(parser.get());
    require(root && JSON_NODE_HOLDS_OBJECT(root), "the line is not a JSON object");
    return parser;
}

GType valueTypeOf(JsonNode* node) {
    return JSON_NODE_HOLDS_VALUE(node) ? json_node_get_value_type(node) : G_TYPE_NONE;
}

// A string of the parameter's type.
std::string readString(const ControlParameter& parameter, JsonNode* node, const ControlError& mismatch) {
    using Kind = ControlValueType::Kind;
    const char* value = valueTypeOf(node) == G_TYPE_STRING ? json_node_get_string(node) : nullptr;
    if (!value || (parameter.type.kind == Kind::Choice && !parameter.type.acceptsChoice(value)) ||
        (parameter.type.kind == Kind::File && !g_path_is_absolute(value)) ||
        (parameter.type.kind == Kind::Page && !g_uri_peek_scheme(value))) {
        throw mismatch;
    }
    if (!g_utf8_validate(value, -1, nullptr)) { // escaped halves of surrogate pairs
        throw ControlError(std::string("\"") + parameter.name + "\" is not valid UTF-8");
    }
    return value;
}

std::vector<std::string> readStrings(const ControlParameter& parameter, JsonNode* node,
                                     const ControlError& mismatch) {
    JsonArray* array = JSON_NODE_HOLDS_ARRAY(node) ? json_node_get_array(node) : nullptr;
    if (!array || json_array_get_length(array) == 0) {
        throw mismatch;
    }
    std::vector<std::string> strings;
    for (guint index = 0; index < json_array_get_length(array); ++index) {
        strings.push_back(readString(parameter, json_array_get_element(array, index), mismatch));
    }
    return strings;
}

ControlRequest::Value readValue(const ControlParameter& parameter, JsonNode* node) {
    using Kind = ControlValueType::Kind;
    const ControlError mismatch(std::string("\"") + parameter.name + "\" must be " +
                                parameter.type.description("true|false"));
    const GType type = valueTypeOf(node);
    switch (parameter.type.kind) {
    case Kind::Number:
        if (type != G_TYPE_INT64 || !parameter.type.acceptsNumber(json_node_get_int(node))) {
            throw mismatch;
        }
        return json_node_get_int(node);
    case Kind::Boolean:
        if (type != G_TYPE_BOOLEAN) {
            throw mismatch;
        }
        return json_node_get_boolean(node) != FALSE;
    case Kind::Strings:
        return readStrings(parameter, node, mismatch);
    default:
        return readString(parameter, node, mismatch);
    }
}

const ControlCommand& commandOf(JsonObject* object) {
    JsonNode* name = json_object_get_member(object, "command");
    require(name && valueTypeOf(name) == G_TYPE_STRING, "\"command\" must be a string");
    const ControlCommand* command = findCommand(controlCommands(), json_node_get_string(name));
    if (!command) {
        throw ControlError(std::string("unknown command \"") + json_node_get_string(name) + "\"");
    }
    return *command;
}

} // namespace

ControlRequest ControlRequest::parse(const std::string& line) {
    checkLine(line);
    const auto parser = parseJson(line);
    JsonObject* object = json_node_get_object(json_parser_get_root(parser.get()));
    ControlRequest request;
    request.m_command = &commandOf(object);
    const std::unique_ptr<GList, void (*)(GList*)> members(json_object_get_members(object), g_list_free);
    for (const GList* each = members.get(); each; each = each->next) {
        const std::string member = static_cast<const char*>(each->data);
        if (member == "command") {
            continue;
        }
        const ControlParameter* parameter = findControlParameter(*request.m_command, member);
        if (!parameter) {
            throw ControlError("\"" + member + "\" is not a parameter of " + request.m_command->name);
        }
        request.m_values[member] = readValue(*parameter, json_object_get_member(object, member.c_str()));
    }
    for (const ControlParameter& parameter : request.m_command->parameters) {
        if (parameter.isRequired() && !request.has(parameter.name)) {
            throw ControlError(std::string("\"") + parameter.name + "\" is missing");
        }
    }
    return request;
}

} // namespace desktop

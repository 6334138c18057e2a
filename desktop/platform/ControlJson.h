// JSON objects and arrays of control responses while they are written.
#ifndef TELIX_DESKTOP_PLATFORM_CONTROLJSON_H
#define TELIX_DESKTOP_PLATFORM_CONTROLJSON_H

#include <cstdint>
#include <json-glib/json-glib.h>
#include <memory>
#include <optional>
#include <string>

namespace desktop {

struct JsonUnref {
    void operator()(JsonObject* object) const { json_object_unref(object); }
    void operator()(JsonArray* array) const { json_array_unref(array); }
    void operator()(JsonParser* parser) const { g_object_unref(parser); }
    void operator()(JsonNode* node) const { json_node_unref(node); }
};

class JsonArrayWriter;

// Each function sets one member and returns the object itself.
class JsonObjectWriter {
public:
    // Strings from the broadcast may be invalid UTF-8, which JSON does not allow: the invalid bytes are
    // replaced.
    JsonObjectWriter& string(const char* name, const std::string& value) {
        char* valid = g_utf8_make_valid(value.data(), static_cast<gssize>(value.size()));
        json_object_set_string_member(m_object.get(), name, valid);
        g_free(valid);
        return *this;
    }
    JsonObjectWriter& number(const char* name, int64_t value) {
        json_object_set_int_member(m_object.get(), name, value);
        return *this;
    }
    JsonObjectWriter& real(const char* name, double value) {
        json_object_set_double_member(m_object.get(), name, value);
        return *this;
    }
    JsonObjectWriter& boolean(const char* name, bool value) {
        json_object_set_boolean_member(m_object.get(), name, value ? TRUE : FALSE);
        return *this;
    }
    JsonObjectWriter& null(const char* name) {
        json_object_set_null_member(m_object.get(), name);
        return *this;
    }
    JsonObjectWriter& object(const char* name, JsonObjectWriter value) {
        json_object_set_object_member(m_object.get(), name, value.m_object.release()); // transferred
        return *this;
    }
    inline JsonObjectWriter& array(const char* name, JsonArrayWriter value);

    // Sets all members of another object.
    JsonObjectWriter& members(const JsonObjectWriter& other) {
        json_object_foreach_member(
            other.m_object.get(),
            [](JsonObject*, const char* name, JsonNode* value, gpointer object) {
                json_object_set_member(static_cast<JsonObject*>(object), name, json_node_copy(value));
            },
            m_object.get());
        return *this;
    }

    // The object that a string holds; nothing if the string is not the JSON of an object.
    static std::optional<JsonObjectWriter> parse(const std::string& json) {
        const std::unique_ptr<JsonParser, JsonUnref> parser(json_parser_new());
        JsonNode* root =
            json_parser_load_from_data(parser.get(), json.data(), static_cast<gssize>(json.size()), nullptr)
                ? json_parser_get_root(parser.get())
                : nullptr;
        if (!root || !JSON_NODE_HOLDS_OBJECT(root)) {
            return std::nullopt;
        }
        JsonObjectWriter object;
        object.m_object.reset(json_node_dup_object(root));
        return object;
    }

    // Whether a member is a boolean, and whether it is true.
    bool isBoolean(const char* name) const {
        JsonNode* node = json_object_get_member(m_object.get(), name);
        return node && JSON_NODE_HOLDS_VALUE(node) && json_node_get_value_type(node) == G_TYPE_BOOLEAN;
    }
    bool isTrue(const char* name) const {
        return isBoolean(name) && json_object_get_boolean_member(m_object.get(), name);
    }

    // The object on one line, without the end of the line.
    std::string toString() const {
        const std::unique_ptr<JsonNode, JsonUnref> node(json_node_new(JSON_NODE_OBJECT));
        json_node_set_object(node.get(), m_object.get());
        char* json = json_to_string(node.get(), FALSE);
        std::string result = json;
        g_free(json);
        return result;
    }

private:
    friend class JsonArrayWriter;
    std::unique_ptr<JsonObject, JsonUnref> m_object{json_object_new()};
};

class JsonArrayWriter {
public:
    void add(JsonObjectWriter value) {
        json_array_add_object_element(m_array.get(), value.m_object.release()); // transferred
    }
    void add(const std::string& value) { json_array_add_string_element(m_array.get(), value.c_str()); }

private:
    friend class JsonObjectWriter;
    std::unique_ptr<JsonArray, JsonUnref> m_array{json_array_new()};
};

JsonObjectWriter& JsonObjectWriter::array(const char* name, JsonArrayWriter value) {
    json_object_set_array_member(m_object.get(), name, value.m_array.release()); // transferred
    return *this;
}

} // namespace desktop

#endif

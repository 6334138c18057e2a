// The browser's own scripts: files in scripts/, each with one function expression.
#include "desktop/window/shared/PageScript.h"

#include <gio/gio.h>

#include <cassert>

#include "desktop/window/shared/DocumentTypes.h"
#include "desktop/window/shared/RemoteControl.h"

namespace desktop {

namespace {

// A string literal. In old engines two separators end a line inside of one, so they are escaped as well.
std::string literal(const std::string& text) {
    g_autofree gchar* valid = g_utf8_make_valid(text.c_str(), static_cast<gssize>(text.size()));
    std::string result = "\"";
    for (const char* position = valid; *position; position = g_utf8_next_char(position)) {
        const gunichar letter = g_utf8_get_char(position);
        const bool endsLine = letter == 0x2028 || letter == 0x2029;
        if (letter == '"' || letter == '\\') {
            result += '\\';
            result += static_cast<char>(letter);
        } else if (letter < ' ' || endsLine) {
            g_autofree gchar* escaped = g_strdup_printf("\\u%04x", letter);
            result += escaped;
        } else {
            result.append(position, static_cast<std::size_t>(g_utf8_next_char(position) - position));
        }
    }
    return result + '"';
}

// The function expression of scripts/`name`.js.
std::string functionOf(const std::string& name) {
    std::string function = resourceText("scripts/" + name + ".js");
    function.erase(function.find_last_not_of(" \n") + 1);
    return function;
}

} // namespace

ScriptValue::ScriptValue(const std::string& text) : m_source(literal(text)) {}

std::string resourceText(const std::string& name) {
    g_autoptr(GBytes) file =
        g_resources_lookup_data(("/telix/window/" + name).c_str(), G_RESOURCE_LOOKUP_FLAGS_NONE, nullptr);
    assert(file);
    gsize size = 0;
    const auto* text = static_cast<const char*>(g_bytes_get_data(file, &size));
    return {text, size};
}

std::string pageScriptCall(const std::string& name, const std::vector<ScriptValue>& arguments) {
    std::string list;
    for (const auto& argument : arguments) {
        list += (list.empty() ? "" : ",") + argument.source();
    }
    return functionOf(name) + ".call(null" + (list.empty() ? "" : ",") + list + ")";
}

std::string pageFunctionsScript() {
    std::string codes;
    for (const auto& key : remoteKeys()) {
        if (!key.constant) {
            continue;
        }
        codes += (codes.empty() ? "" : ",") + literal(key.constant) + ":" + std::to_string(key.keyCode);
    }
    return functionOf("pagefunctions") + ".call(null,{" + codes + "})," + pageScriptCall("tvglobals", {});
}

std::string keyNamesScript() {
    std::string names;
    for (const auto& key : remoteKeys()) {
        names += (names.empty() ? "" : ",") + std::to_string(key.keyCode) + ":[" + literal(key.domKey) + "," +
                 literal(key.domCode) + "]";
    }
    return functionOf("keynames") + ".call(null,{" + names + "})";
}

std::string hbbtvDocumentScript() {
    std::vector<ScriptValue> types;
    for (const auto& type : kDocumentTypes) {
        types.emplace_back(type.contentType);
    }
    return pageScriptCall("hbbtvdocument", types);
}

std::string dispatchKeyScript(const char* type, const RemoteKey& key, bool isRepeat) {
    return pageScriptCall("dispatchkey", {type, key.keyCode, key.domKey, key.domCode, isRepeat});
}

std::string sessionKeysScript() {
    std::string keys;
    for (const auto& key : remoteKeys()) {
        for (const uint32_t keysym : key.keyboardKeys) {
            const int code = keyCodeOfKeyboardKey(keysym);
            if (code != 0) {
                keys += (keys.empty() ? "" : ",") + std::to_string(code) + ":[" + literal(key.name) + "," +
                        std::to_string(key.keyCode) + "," + std::to_string(key.group) + "," +
                        (key.hasEngineCode ? "true" : "false") + "," + literal(key.domKey) + "," +
                        literal(key.domCode) + "]";
            }
        }
    }
    return functionOf("sessionkeys") + ".call(null," + functionOf("dispatchkey") + ",{" + keys + "})";
}

} // namespace desktop

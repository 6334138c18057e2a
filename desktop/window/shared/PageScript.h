// The browser's own scripts: files in scripts/, each with one function expression.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_PAGESCRIPT_H
#define TELIX_DESKTOP_WINDOW_SHARED_PAGESCRIPT_H

#include <string>
#include <vector>

namespace desktop {

struct RemoteKey;

// A value in the source of a script.
class ScriptValue {
public:
    // A string. `text` is UTF-8.
    ScriptValue(const std::string& text);
    ScriptValue(const char* text) : ScriptValue(std::string(text)) {}
    ScriptValue(int number) : m_source(std::to_string(number)) {}
    ScriptValue(bool truth) : m_source(truth ? "true" : "false") {}

    const std::string& source() const { return m_source; }

private:
    std::string m_source;
};

// The text of a file in the program: the name is relative to this folder.
std::string resourceText(const std::string& name);

// The source of an expression that calls the function of scripts/`name`.js.
std::string pageScriptCall(const std::string& name, const std::vector<ScriptValue>& arguments);

// The source of an expression that adds the names of scripts/pagefunctions.js and scripts/tvglobals.js to a
// window object.
std::string pageFunctionsScript();

// The source of an expression that calls the function of scripts/keynames.js with all keys.
std::string keyNamesScript();

// The source of an expression that calls the function of scripts/hbbtvdocument.js with all types.
std::string hbbtvDocumentScript();

// The source of an expression that dispatches an event of the key: "keydown", with "keypress", or "keyup".
std::string dispatchKeyScript(const char* type, const RemoteKey& key, bool isRepeat);

// The source of an expression that calls the function of scripts/sessionkeys.js with all keys.
std::string sessionKeysScript();

} // namespace desktop

#endif

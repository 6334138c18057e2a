// Fuzz target of what the plug-in makes of stream events and URLs: the data of an event, the scripts that
// hold texts, and addresses relative to the base of a playlist.
#include <algorithm>
#include <cassert>
#include <cstddef>
#include <cstdint>
#include <string>

#include "common/PluginUtils.h"
#include "src/avcontrol/Asx.h"

namespace {

void checkEventData(const std::string& text) {
    // Two digits become at most the two characters of an escape; the last one may stand alone.
    assert(parseDataAsUTF8(text).size() <= text.size() + 1);
}

void checkScripts(const std::string& first, const std::string& second) {
    const std::string script = streamEventScript(first, second, "trigger", "video");
    assert(script.find(first) != std::string::npos && script.find(second) != std::string::npos);
    assert(parseStreamEventXMLScript(first, second, "video", true).find(second) != std::string::npos);
    assert(getEncodedURL(first).find(first) != std::string::npos);
}

void checkBaseUrl(const std::string& base, const std::string& path) {
    const std::string url = asxAppendBaseUrl(base, path);
    assert(url.empty() == (base.empty() || path.empty()));
    assert(url.size() <= base.size() + path.size() + 1);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string text(reinterpret_cast<const char*>(data), size);
    const size_t lineEnd = std::min(text.find('\n'), text.size());
    const std::string first = text.substr(0, lineEnd);
    const std::string second = lineEnd < text.size() ? text.substr(lineEnd + 1) : "";
    checkEventData(text);
    checkScripts(first, second);
    checkBaseUrl(first, second);
    return 0;
}

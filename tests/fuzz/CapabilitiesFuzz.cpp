// Fuzz target of the capability document: the first line of the input is the name of a profile to look for,
// the rest is the document.
#include <cassert>
#include <cstddef>
#include <cstdint>
#include <string>

#include "desktop/platform/Capabilities.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string input(reinterpret_cast<const char*>(data), size);
    const size_t lineEnd = input.find('\n');
    const std::string profile = input.substr(0, lineEnd);
    const std::string document = lineEnd == std::string::npos ? "" : input.substr(lineEnd + 1);
    std::string reason;
    const auto capabilities = desktop::Capabilities::parse(document, reason);
    assert(capabilities.has_value() == reason.empty());
    if (capabilities) {
        assert(capabilities->document() == document);
        capabilities->hasProfile(profile);
    }
    return 0;
}

// Fuzz target of the control protocol: the input is one line. It is refused with a reason of one line, or has
// every required parameter.
#include <cassert>
#include <cstddef>
#include <cstdint>
#include <string>

#include "desktop/platform/ControlRequest.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    try {
        const std::string line(reinterpret_cast<const char*>(data), size);
        const auto request = desktop::ControlRequest::parse(line);
        for (const desktop::ControlParameter& parameter : request.command().parameters) {
            assert(request.has(parameter.name) || !parameter.isRequired());
            if (request.has(parameter.name) &&
                parameter.type.kind == desktop::ControlValueType::Kind::Number) {
                assert(parameter.type.acceptsNumber(request.number(parameter.name)));
            }
        }
    } catch (const desktop::ControlError& error) {
        assert(*error.what());
    }
    return 0;
}

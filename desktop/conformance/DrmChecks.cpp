// Messages to DRM systems and their results.
#include <algorithm>
#include <cstdlib>
#include <mutex>

#include "desktop/conformance/CheckGroup.h"

namespace desktop {

namespace {

struct DrmResult {
    std::string id;
    bool hasStrings;
};
std::mutex resultsMutex;
std::vector<DrmResult> results; // guarded by resultsMutex

TELIX_RETCODE_ENUM_T onResult(___UINT8* id, ___UINT8* message, TELIX_DRM_RESULT_CODE_ENUM_T result) {
    (void)result;
    std::lock_guard<std::mutex> lock(resultsMutex);
    results.push_back({id ? reinterpret_cast<char*>(id) : "", id && message});
    return 0;
}

size_t countOfResults(const std::string& id) {
    std::lock_guard<std::mutex> lock(resultsMutex);
    return static_cast<size_t>(
        std::count_if(results.begin(), results.end(), [&](const DrmResult& each) { return each.id == id; }));
}

// Sends a message and returns its id. Skips the check if the library refuses messages.
std::string sendMessage(const CheckContext& context) {
    char* id = nullptr;
    const TELIX_RETCODE_ENUM_T returnCode =
        context.library.TELIX_JS_DRM_SendDRMMessage("text/plain", "message", "urn:dvb:casystemid:0", &id);
    expect(returnCode == 0 || id == nullptr, "it refuses, but changes its output");
    if (returnCode != 0 || !id) {
        throw CheckSkipped{"the library refuses DRM messages"};
    }
    std::string copy = id;
    std::free(id);
    expect(!copy.empty() && isUtf8(copy.c_str()), "the id is empty or not valid UTF-8");
    return copy;
}

void checkIdsAndResults(const CheckContext& context) {
    context.library.TELIX_JS_DRM_RegisterOnDRMMessageResult(onResult);
    const std::string first = sendMessage(context);
    const std::string second = sendMessage(context);
    expect(first != second, "two messages have the id " + first);
    expect(context.waitUntil([&] { return countOfResults(first) > 0 && countOfResults(second) > 0; }),
           "no result is reported");
    expect(!context.happensWithin(kQuietPeriod,
                                  [&] { return countOfResults(first) > 1 || countOfResults(second) > 1; }),
           "one message has two results");
    std::lock_guard<std::mutex> lock(resultsMutex);
    expect(std::all_of(results.begin(), results.end(), [](const DrmResult& each) { return each.hasStrings; }),
           "a string is null");
}

void checkOneOfTwoAgents(const CheckContext& context) {
    context.library.TELIX_JS_DRM_RegisterOnDRMMessageResult(onResult); // a second agent
    context.library.TELIX_JS_DRM_UnregisterOnDRMMessageResult(onResult);
    const std::string id = sendMessage(context);
    expect(context.waitUntil([&] { return countOfResults(id) > 0; }), "no result is reported");
}

void checkNoAgent(const CheckContext& context) {
    context.library.TELIX_JS_DRM_UnregisterOnDRMMessageResult(onResult);
    context.library.TELIX_JS_DRM_UnregisterOnDRMMessageResult(onResult); // one too many must be harmless
    const std::string id = sendMessage(context);
    expect(!context.happensWithin(kQuietPeriod, [&] { return countOfResults(id) > 0; }), "one is reported");
}

} // namespace

std::vector<Check> drmChecks() {
    const std::vector<RequiredCall> calls{REQUIRED_CALL(TELIX_JS_DRM_RegisterOnDRMMessageResult),
                                          REQUIRED_CALL(TELIX_JS_DRM_UnregisterOnDRMMessageResult),
                                          REQUIRED_CALL(TELIX_JS_DRM_SendDRMMessage)};
    return {
        {"each DRM message has its own id and one result", calls, checkIdsAndResults},
        {"results are reported as long as one of two agents is registered", calls, checkOneOfTwoAgents},
        {"no result is reported after the last agent has unregistered", calls, checkNoAgent},
    };
}

} // namespace desktop

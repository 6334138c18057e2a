// A television without a window, for the tests of telixctl: loads a platform library as the plug-in does,
// registers all callbacks, tunes to the first channel or plays media, and prints each callback on a line of
// standard output. Exits at the end of its input.
#include "telix/telix_platform.h"

#include <cstdio>
#include <cstdlib>
#include <dlfcn.h>
#include <mutex>
#include <string>
#include <unistd.h>

namespace {

std::mutex outputMutex;

TELIX_RETCODE_ENUM_T printLine(const std::string& line) {
    std::lock_guard<std::mutex> lock(outputMutex);
    std::printf("%s\n", line.c_str());
    std::fflush(stdout);
    return 0;
}

std::string stringOf(const ___UINT8* argument) {
    return argument ? reinterpret_cast<const char*>(argument) : "";
}

TELIX_RETCODE_ENUM_T onChange(TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE channel) {
    return printLine("change " + std::to_string(channel));
}
TELIX_RETCODE_ENUM_T onError(TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE, TELIX_ERR_STATE_ENUM_T error) {
    return printLine("error " + std::to_string(error));
}
TELIX_RETCODE_ENUM_T onFullScreen(TELIX_JS_VB_HANDLE) {
    return printLine("full-screen");
}
TELIX_RETCODE_ENUM_T onRatingError(TELIX_JS_VB_HANDLE, ___UINT8* contentId, TELIX_JS_SI_PARENTALRATING_HANDLE,
                                   ___UINT8* drmSystemId) {
    return printLine("rating-error " + stringOf(contentId) + " " + stringOf(drmSystemId));
}
TELIX_RETCODE_ENUM_T onRating(TELIX_JS_VB_HANDLE, ___UINT8*, TELIX_JS_SI_PARENTALRATING_HANDLE, ___UINT8*) {
    return printLine("rating");
}
TELIX_RETCODE_ENUM_T onStreamEvent(TELIX_JS_VB_HANDLE, ___UINT8*, ___UINT8*, ___UINT8* name, ___UINT8* data,
                                   ___UINT32 length, ___UINT8* status) {
    return printLine("stream-event " + stringOf(name) + " " +
                     std::string(reinterpret_cast<char*>(data), length) + " " + stringOf(status));
}
TELIX_RETCODE_ENUM_T onLowMemory() {
    return printLine("low-memory");
}
TELIX_RETCODE_ENUM_T onDrmResult(___UINT8* id, ___UINT8* message, TELIX_DRM_RESULT_CODE_ENUM_T result) {
    return printLine("drm " + stringOf(id) + " " + stringOf(message) + " " + std::to_string(result));
}
TELIX_RETCODE_ENUM_T onMessage(TELIX_JS_AV_HANDLE, TELIX_AV_CB_MSG message) {
    return printLine("player-message " + std::to_string(message));
}
TELIX_RETCODE_ENUM_T onRights(TELIX_JS_AV_HANDLE, TELIX_AV_DRM_ERR_STATE_ENUM_T state, ___UINT8* contentId,
                              ___UINT8* drmSystemId, ___UINT8* url) {
    return printLine("rights-error " + std::to_string(state) + " " + stringOf(contentId) + " " +
                     stringOf(drmSystemId) + " " + stringOf(url));
}

} // namespace

// Arguments: LIBRARY [MEDIA]
int main(int argc, char** argv) {
    void* library = argc >= 2 ? dlopen(argv[1], RTLD_LAZY | RTLD_LOCAL) : nullptr;
    if (!library) {
        std::fprintf(stderr, "telix_television: %s\n", argc >= 2 ? dlerror() : "LIBRARY is missing");
        return 2;
    }
#define TELIX_CALL(name, parameters, arguments)                                                              \
    auto* const name = reinterpret_cast<TELIX_RETCODE_ENUM_T(*) parameters>(dlsym(library, #name));          \
    (void)name;
#define TELIX_CALL_UNBOUND(name, parameters, arguments)
#include "telix/telix_platform_calls.h"

    TELIX_JS_VB_RegisterOnChannelChangeSucceeded(onChange);
    TELIX_JS_VB_RegisterOnChannelChangeError(onError);
    TELIX_JS_VB_RegisterOnFullScreenChange(onFullScreen);
    TELIX_JS_VB_HANDLE object = 0;
    TELIX_JS_VB_GetHandle(&object);
    TELIX_JS_VB_RegisterOnParentalRatingChange(object, onRating);
    TELIX_JS_VB_RegisterOnParentalRatingError(object, onRatingError);
    TELIX_JS_VB_RegisterStreamEvent(object, onStreamEvent, "77", "2a", "offer");
    TELIX_JS_APP_RegisterLowMemory(onLowMemory);
    TELIX_JS_DRM_RegisterOnDRMMessageResult(onDrmResult);
    if (argc >= 3) {
        TELIX_JS_AV_HANDLE player = 0;
        TELIX_JS_AV_CreatePlayer(&player, 1280, 0, 0);
        TELIX_JS_AV_RegisterOnPlayStateChange(player, onMessage);
        TELIX_JS_AV_RegisterOnDRMRightsError(player, onRights);
        TELIX_JS_AV_Play(player, argv[2], 1, 6, 1280, 0, 0, 0);
    } else {
        TELIX_JS_VB_BindToCurrChannel(object);
    }
    printLine("ready");
    char ignored = 0;
    while (read(STDIN_FILENO, &ignored, 1) > 0) {
    }
    return 0;
}

// video/broadcast objects that are not tuned.
#include <set>

#include "desktop/conformance/BroadcastFixture.h"
#include "desktop/conformance/CheckGroup.h"

namespace desktop {

namespace {

// Arguments and outputs of calls that are refused.
const TELIX_JS_DISPLAY_AREA kArea{0, 0, 640, 360};
const ___UINT8 kDescriptor[] = {0x43, 0x00}; // satellite delivery system descriptor (EN 300 468), empty
constexpr ___UINT8 kIdTypeDvbC = 10;         // OIPF DAE, idType of a channel
constexpr ___UINT8 kIdTypeDvbSiDirect = 13;
TELIX_JS_CM_HANDLE refusedChannel = 0;
TELIX_JS_AVCOMPHANDLE* refusedComponents = nullptr;
uint32_t refusedCount = 0;

void checkHandles(const CheckContext& context) {
    std::set<uint32_t> handles;
    for (int time = 0; time < 20; ++time) {
        expect(handles.insert(newObject(context)).second, "two have the same");
    }
}

void checkRefusedOutputs(const CheckContext& context) {
    (void)context;
    expect(refusedChannel == 0 && refusedComponents == nullptr && refusedCount == 0, "one has changed");
}

void checkSize(const Library& library, TELIX_JS_VB_HANDLE object) {
    int32_t size = 0;
    if (library.TELIX_JS_VB_SetWidth && library.TELIX_JS_VB_GetWidth &&
        library.TELIX_JS_VB_SetWidth(object, 642) == 0 && library.TELIX_JS_VB_GetWidth(object, &size) == 0) {
        expect(size == 642, "the width is " + std::to_string(size) + " instead of 642");
    }
    if (library.TELIX_JS_VB_SetHeight && library.TELIX_JS_VB_GetHeight &&
        library.TELIX_JS_VB_SetHeight(object, 362) == 0 &&
        library.TELIX_JS_VB_GetHeight(object, &size) == 0) {
        expect(size == 362, "the height is " + std::to_string(size) + " instead of 362");
    }
    for (const int32_t number : {0, -1, 1 << 20, INT32_MIN, INT32_MAX}) { // pages may write any number
        if (library.TELIX_JS_VB_SetWidth && library.TELIX_JS_VB_SetHeight) {
            library.TELIX_JS_VB_SetWidth(object, number);
            library.TELIX_JS_VB_SetHeight(object, number);
        }
    }
}

void checkView(const CheckContext& context) {
    const Library& library = context.library;
    const TELIX_JS_VB_HANDLE object = newObject(context);
    for (const ___UINT8 isRequested : {1, 0}) {
        ___UINT8 isFullScreen = 0;
        if (library.TELIX_JS_VB_SetFullScreen && library.TELIX_JS_VB_IsFullScreen &&
            library.TELIX_JS_VB_SetFullScreen(object, isRequested) == 0 &&
            library.TELIX_JS_VB_IsFullScreen(object, &isFullScreen) == 0) {
            expect((isFullScreen != 0) == (isRequested != 0), "full screen is not as it was set");
        }
    }
    checkSize(library, object);
}

void checkReleasedObject(const CheckContext& context) {
    const Library& library = context.library;
    const TELIX_JS_VB_HANDLE object = newObject(context);
    for (int time = 0; time < 3; ++time) {
        library.TELIX_JS_VB_Release(object);
    }
    if (library.TELIX_JS_VB_Stop) {
        library.TELIX_JS_VB_Stop(object);
    }
    if (library.TELIX_JS_VB_UnRegisterStreamEvent) {
        library.TELIX_JS_VB_UnRegisterStreamEvent(object, ignoreStreamEvent, "1", "1f", "name");
    }
    for (const uint32_t handle : kUnknownHandles) {
        library.TELIX_JS_VB_Release(handle);
    }
}

void checkStreamEventSubscriptions(const CheckContext& context) {
    const Library& library = context.library;
    const TELIX_JS_VB_HANDLE object = newObject(context);
    for (const char* tag : {"1f", "31", "", "not a tag"}) {
        for (int time = 0; time < 2; ++time) {
            library.TELIX_JS_VB_RegisterStreamEvent(object, ignoreStreamEvent, "1", tag, "name");
        }
        for (int time = 0; time < 3; ++time) {
            library.TELIX_JS_VB_UnRegisterStreamEvent(object, ignoreStreamEvent, "1", tag, "other");
        }
    }
    for (const uint32_t handle : kUnknownHandles) {
        library.TELIX_JS_VB_RegisterStreamEvent(handle, ignoreStreamEvent, "1", "1f", "name");
        library.TELIX_JS_VB_UnRegisterStreamEvent(handle, ignoreStreamEvent, "1", "1f", "name");
    }
}

void checkCreatedChannel(const CheckContext& context) {
    const TELIX_JS_VB_HANDLE object = newObject(context);
    TELIX_JS_CM_HANDLE channel = 0;
    if (context.library.TELIX_JS_VB_CreateChannelObjectByTriplet(object, kIdTypeDvbC, 4711, 12, 34,
                                                                 &channel) != 0) {
        expect(channel == 0, "it is refused, but the output has changed");
        throw CheckSkipped{"the library refuses it"};
    }
    expect(tripletOf(context, channel) == Triplet{4711, 12, 34}, "it has another triplet");
}

std::vector<Check> refusals() {
    return {
        refusalWithOutput(NAMED_CALL(TELIX_JS_VB_IsFullScreen)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_VB_GetCurrentChannel)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_VB_GetWidth)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_VB_GetHeight)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_VB_GetPlayBackState)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_VB_PrevChannel)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_VB_NextChannel)),
        refusal(NAMED_CALL(TELIX_JS_VB_SetFullScreen), 1),
        refusal(NAMED_CALL(TELIX_JS_VB_SetWidth), 640),
        refusal(NAMED_CALL(TELIX_JS_VB_SetHeight), 360),
        refusal(NAMED_CALL(TELIX_JS_VB_SetPlayBackState), TELIX_PLAYSTATE_PRESENTING),
        refusal(NAMED_CALL(TELIX_JS_VB_Stop)),
        refusal(NAMED_CALL(TELIX_JS_VB_BindToCurrChannel)),
        refusal(NAMED_CALL(TELIX_JS_VB_SetChannel), 1, 0),
        refusal(NAMED_CALL(TELIX_JS_VB_SetChannelByTriplet), 1, 2, 3),
        refusal(NAMED_CALL(TELIX_JS_VB_SetDisplayArea), &kArea),
        refusal(NAMED_CALL(TELIX_JS_VB_CreateChannelObjectByTriplet), kIdTypeDvbC, 1, 2, 3, &refusedChannel),
        refusal(NAMED_CALL(TELIX_JS_VB_CreateChannelObjectByDsd), kIdTypeDvbSiDirect, &kDescriptor[0],
                sizeof(kDescriptor), 3, &refusedChannel),
        refusal(NAMED_CALL(TELIX_JS_VB_GetComponents), TELIX_JS_AVCOMPTYPE_VIDEO, &refusedComponents,
                &refusedCount),
        refusal(NAMED_CALL(TELIX_JS_VB_GetCurrActiveComponents), TELIX_JS_AVCOMPTYPE_VIDEO,
                &refusedComponents, &refusedCount),
        refusal(NAMED_CALL(TELIX_JS_VB_SelectComponent), 1, TELIX_JS_AVCOMPTYPE_AUDIO),
        refusal(NAMED_CALL(TELIX_JS_VB_UnselectComponent), 1, TELIX_JS_AVCOMPTYPE_AUDIO),
        refusalWithOutput(NAMED_CALL(TELIX_JS_VB_AVComponent_GetEncoding)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_VB_AVComponent_GetEncrypted)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_VB_AVComponent_GetAspectRatio)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_VB_AVComponent_GetLanguage)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_VB_AVComponent_GetAudioDescription)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_VB_AVComponent_GetAudioChannels)),
        refusalWithOutput(NAMED_CALL(TELIX_JS_VB_AVComponent_GetHearingImpaired)),
        {"refused calls leave the outputs of the objects unchanged", {}, checkRefusedOutputs},
    };
}

} // namespace

std::vector<Check> objectChecks() {
    std::vector<Check> checks{
        {"objects have distinct handles", {REQUIRED_CALL(TELIX_JS_VB_GetHandle)}, checkHandles}};
    for (const Check& check : refusals()) {
        checks.push_back(check);
    }
    const std::vector<Check> others{
        {"width, height and full screen read as they were set",
         {REQUIRED_CALL(TELIX_JS_VB_GetHandle)},
         checkView},
        {"calls with a released object are harmless",
         {REQUIRED_CALL(TELIX_JS_VB_GetHandle), REQUIRED_CALL(TELIX_JS_VB_Release)},
         checkReleasedObject},
        {"a stream event can be subscribed twice, and unsubscribed as often and once more",
         {REQUIRED_CALL(TELIX_JS_VB_GetHandle), REQUIRED_CALL(TELIX_JS_VB_RegisterStreamEvent),
          REQUIRED_CALL(TELIX_JS_VB_UnRegisterStreamEvent)},
         checkStreamEventSubscriptions},
        {"a channel created by a page keeps its triplet, or is refused",
         {REQUIRED_CALL(TELIX_JS_VB_GetHandle), REQUIRED_CALL(TELIX_JS_VB_CreateChannelObjectByTriplet),
          REQUIRED_CALL(TELIX_JS_CM_GetOnid), REQUIRED_CALL(TELIX_JS_CM_GetTsid),
          REQUIRED_CALL(TELIX_JS_CM_GetSid)},
         checkCreatedChannel},
    };
    checks.insert(checks.end(), others.begin(), others.end());
    return checks;
}

} // namespace desktop

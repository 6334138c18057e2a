// The calls of the video/broadcast object.
#include "desktop/platform/Broadcast.h"
#include "desktop/platform/ComponentCalls.h"
#include "desktop/platform/Output.h"

using namespace desktop;

namespace {

Broadcast& broadcast() {
    return Broadcast::instance();
}

template <typename Function>
TELIX_RETCODE_ENUM_T registered(Callback<Function>& callback, Function function) {
    callback.set(function);
    return TELIX_RETCODE_SUCCESS;
}

template <typename Function>
TELIX_RETCODE_ENUM_T unregistered(Callback<Function>& callback, Function function) {
    callback.clear(function);
    return TELIX_RETCODE_SUCCESS;
}

} // namespace

TELIX_RETCODE_ENUM_T TELIX_JS_VB_GetHandle(TELIX_JS_VB_HANDLE* object) {
    *object = broadcast().newObject();
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_Release(TELIX_JS_VB_HANDLE object) {
    return resultOf(broadcast().release(object));
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_Stop(TELIX_JS_VB_HANDLE object) {
    return resultOf(broadcast().stop(object));
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_BindToCurrChannel(TELIX_JS_VB_HANDLE object) {
    return resultOf(broadcast().bind(object));
}

// There is no recording, so trick play makes no difference.
TELIX_RETCODE_ENUM_T TELIX_JS_VB_SetChannel(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel,
                                            ___UINT8 flag) {
    (void)flag;
    return resultOf(broadcast().tune(object, channel));
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_PrevChannel(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE* channel) {
    *channel = broadcast().step(object, -1);
    return resultOf(*channel != 0);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_NextChannel(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE* channel) {
    *channel = broadcast().step(object, 1);
    return resultOf(*channel != 0);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_GetCurrentChannel(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE* channel) {
    *channel = broadcast().channelOf(object);
    return resultOf(*channel != 0);
}

// A service that the set does not know ends in an error of the tune.
TELIX_RETCODE_ENUM_T TELIX_JS_VB_SetChannelByTriplet(TELIX_JS_VB_HANDLE object, int32_t onid, int32_t tsid,
                                                     int32_t sid) {
    if (!broadcast().exists(object)) {
        return kRefused;
    }
    const TELIX_JS_CM_HANDLE channel = broadcast().channels().makeByTriplet(
        static_cast<uint32_t>(onid), static_cast<uint32_t>(tsid), static_cast<uint32_t>(sid));
    return resultOf(channel != 0 && broadcast().tune(object, channel));
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_CreateChannelObjectByTriplet(TELIX_JS_VB_HANDLE object, ___UINT8 idType,
                                                              uint32_t onid, uint32_t tsid, uint32_t sid,
                                                              TELIX_JS_CM_HANDLE* channel) {
    (void)idType; // every kind of broadcast is the same file here
    if (!broadcast().exists(object)) {
        return kRefused;
    }
    *channel = broadcast().channels().makeByTriplet(onid, tsid, sid);
    return resultOf(*channel != 0);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_CreateChannelObjectByDsd(TELIX_JS_VB_HANDLE object, ___UINT8 idType,
                                                          const ___UINT8* descriptor, uint32_t length,
                                                          uint32_t sid, TELIX_JS_CM_HANDLE* channel) {
    (void)idType;
    if (!broadcast().exists(object)) {
        return kRefused;
    }
    *channel = broadcast().channels().makeByDescriptor(Bytes(descriptor, descriptor + length), sid);
    return resultOf(*channel != 0);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_SetFullScreen(TELIX_JS_VB_HANDLE object, ___UINT8 fullScreen) {
    return resultOf(
        broadcast().changeView(object, [=](Picture::View& view) { view.fullScreen = fullScreen != 0; }));
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_IsFullScreen(TELIX_JS_VB_HANDLE object, ___UINT8* fullScreen) {
    const auto view = broadcast().viewOf(object);
    return view ? returnFlag(fullScreen, view->fullScreen) : kRefused;
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_SetWidth(TELIX_JS_VB_HANDLE object, int32_t width) {
    return resultOf(width >= 0 && broadcast().changeView(object, [=](Picture::View& view) {
        view.width = static_cast<uint32_t>(width);
    }));
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_SetHeight(TELIX_JS_VB_HANDLE object, int32_t height) {
    return resultOf(height >= 0 && broadcast().changeView(object, [=](Picture::View& view) {
        view.height = static_cast<uint32_t>(height);
    }));
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_GetWidth(TELIX_JS_VB_HANDLE object, int32_t* width) {
    const auto view = broadcast().viewOf(object);
    if (view) {
        *width = static_cast<int32_t>(view->width);
    }
    return resultOf(view.has_value());
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_GetHeight(TELIX_JS_VB_HANDLE object, int32_t* height) {
    const auto view = broadcast().viewOf(object);
    if (view) {
        *height = static_cast<int32_t>(view->height);
    }
    return resultOf(view.has_value());
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_SetPlayBackState(TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T state) {
    return resultOf(broadcast().setPlayState(object, state));
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_GetPlayBackState(TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T* state) {
    const auto found = broadcast().playState(object);
    if (found) {
        *state = *found;
    }
    return resultOf(found.has_value());
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_SetDisplayArea(TELIX_JS_VB_HANDLE object,
                                                const TELIX_JS_DISPLAY_AREA* area) {
    return resultOf(broadcast().changeView(object, [=](Picture::View& view) {
        view.x = area->x;
        view.y = area->y;
        view.width = area->width;
        view.height = area->height;
    }));
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_RegisterOnChannelChangeSucceeded(TELIX_JS_VB_CHANNEL_CHANGE_CB callback) {
    return registered(broadcast().onChannelChange, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_UnRegisterOnChannelChangeSucceeded(TELIX_JS_VB_CHANNEL_CHANGE_CB callback) {
    return unregistered(broadcast().onChannelChange, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_RegisterOnChannelChangeError(TELIX_JS_VB_CHANNEL_ERROR_CB callback) {
    return registered(broadcast().onChannelError, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_UnRegisterOnChannelChangeError(TELIX_JS_VB_CHANNEL_ERROR_CB callback) {
    return unregistered(broadcast().onChannelError, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_RegisterOnFullScreenChange(TELIX_JS_VB_FULLSCREEN_CB callback) {
    return registered(broadcast().onFullScreen, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_UnRegisterOnFullScreenChange(TELIX_JS_VB_FULLSCREEN_CB callback) {
    return unregistered(broadcast().onFullScreen, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_RegisterOnPlayStateChange(TELIX_JS_VB_PLAYSTATE_CB callback) {
    return registered(broadcast().onPlayState, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_UnRegisterOnPlayStateChange(TELIX_JS_VB_PLAYSTATE_CB callback) {
    return unregistered(broadcast().onPlayState, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_RegisterOnProgrammesChanged(TELIX_JS_VB_HANDLE object,
                                                             TELIX_JS_VB_PROGRAMMES_CB callback) {
    (void)object; // the registration is for all objects
    return registered(broadcast().onProgrammes, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_RegisterOnParentalRatingChange(TELIX_JS_VB_HANDLE object,
                                                                TELIX_JS_VB_PARENTAL_RATING_CB callback) {
    (void)object;
    return registered(broadcast().onRatingChange, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_RegisterOnParentalRatingError(TELIX_JS_VB_HANDLE object,
                                                               TELIX_JS_VB_PARENTAL_RATING_CB callback) {
    (void)object;
    return registered(broadcast().onRatingError, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_UnRegisterOnProgrammesChanged(TELIX_JS_VB_PROGRAMMES_CB callback) {
    return unregistered(broadcast().onProgrammes, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_UnRegisterOnParentalRatingChange(TELIX_JS_VB_PARENTAL_RATING_CB callback) {
    return unregistered(broadcast().onRatingChange, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_UnRegisterOnParentalRatingError(TELIX_JS_VB_PARENTAL_RATING_CB callback) {
    return unregistered(broadcast().onRatingError, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_RegisterStreamEvent(TELIX_JS_VB_HANDLE object,
                                                     TELIX_JS_VB_STREAM_EVENT_CB callback,
                                                     const char* eventId, const char* componentTag,
                                                     const char* eventName) {
    return resultOf(broadcast().watch(object, callback, eventId, componentTag, eventName));
}

// The name may differ from the one of the start.
TELIX_RETCODE_ENUM_T TELIX_JS_VB_UnRegisterStreamEvent(TELIX_JS_VB_HANDLE object,
                                                       TELIX_JS_VB_STREAM_EVENT_CB callback,
                                                       const char* eventId, const char* componentTag,
                                                       const char* eventName) {
    (void)eventName;
    return resultOf(broadcast().unwatch(object, callback, eventId, componentTag));
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_GetComponents(TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPTYPE type,
                                               TELIX_JS_AVCOMPHANDLE** components, uint32_t* count) {
    static std::vector<TELIX_JS_AVCOMPHANDLE> kept; // valid until the next call
    return returnComponents(kept, broadcast().components(object, type, false), components, count);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_GetCurrActiveComponents(TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPTYPE type,
                                                         TELIX_JS_AVCOMPHANDLE** components,
                                                         uint32_t* count) {
    static std::vector<TELIX_JS_AVCOMPHANDLE> kept; // valid until the next call
    return returnComponents(kept, broadcast().components(object, type, true), components, count);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_SelectComponent(TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPHANDLE component,
                                                 TELIX_JS_AVCOMPTYPE type) {
    return resultOf(broadcast().select(object, component, type, true));
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_UnselectComponent(TELIX_JS_VB_HANDLE object, TELIX_JS_AVCOMPHANDLE component,
                                                   TELIX_JS_AVCOMPTYPE type) {
    return resultOf(broadcast().select(object, component, type, false));
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_AVComponent_GetEncoding(TELIX_JS_AVCOMPHANDLE component,
                                                         TELIX_JS_AVCOMPTYPE type, char** encoding) {
    return returnTrait(broadcast().findComponent(component, type), &ComponentTraits::encoding, encoding);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_AVComponent_GetEncrypted(TELIX_JS_AVCOMPHANDLE component,
                                                          TELIX_JS_AVCOMPTYPE type, ___UINT8* encrypted) {
    return returnTrait(broadcast().findComponent(component, type), &ComponentTraits::isEncrypted, encrypted);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_AVComponent_GetAspectRatio(TELIX_JS_AVCOMPHANDLE component,
                                                            TELIX_JS_AVCOMPTYPE type, float* aspectRatio) {
    return returnTrait(broadcast().findComponent(component, type), &ComponentTraits::aspectRatio,
                       aspectRatio);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_AVComponent_GetLanguage(TELIX_JS_AVCOMPHANDLE component,
                                                         TELIX_JS_AVCOMPTYPE type, char** language) {
    return returnTrait(broadcast().findComponent(component, type), &ComponentTraits::language, language);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_AVComponent_GetAudioDescription(TELIX_JS_AVCOMPHANDLE component,
                                                                 TELIX_JS_AVCOMPTYPE type,
                                                                 ___UINT8* audioDescription) {
    return returnTrait(broadcast().findComponent(component, type), &ComponentTraits::isAudioDescription,
                       audioDescription);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_AVComponent_GetAudioChannels(TELIX_JS_AVCOMPHANDLE component,
                                                              TELIX_JS_AVCOMPTYPE type,
                                                              uint32_t* audioChannels) {
    return returnTrait(broadcast().findComponent(component, type), &ComponentTraits::audioChannels,
                       audioChannels);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_AVComponent_GetHearingImpaired(TELIX_JS_AVCOMPHANDLE component,
                                                                TELIX_JS_AVCOMPTYPE type,
                                                                ___UINT8* hearingImpaired) {
    return returnTrait(broadcast().findComponent(component, type), &ComponentTraits::isForHearingImpaired,
                       hearingImpaired);
}

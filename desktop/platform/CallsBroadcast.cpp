// The platform calls for video/broadcast objects.
#include "desktop/platform/Broadcast.h"
#include "desktop/platform/ComponentCalls.h"
#include "desktop/platform/Output.h"

using namespace desktop;

namespace {

Broadcast& broadcast() {
    return Broadcast::instance();
}

TunerArbiter& arbiter() {
    return Broadcast::instance().arbiter();
}

BroadcastCallbacks& callbacks() {
    return Broadcast::instance().callbacks();
}

template <typename Function>
TELIX_RETCODE_ENUM_T registerCallback(Callback<Function>& callback, Function function) {
    callback.set(function);
    return TELIX_RETCODE_SUCCESS;
}

template <typename Function>
TELIX_RETCODE_ENUM_T unregisterCallback(Callback<Function>& callback, Function function) {
    callback.clear(function);
    return TELIX_RETCODE_SUCCESS;
}

} // namespace

TELIX_RETCODE_ENUM_T TELIX_JS_VB_GetHandle(TELIX_JS_VB_HANDLE* object) {
    *object = arbiter().newObject();
    return TELIX_RETCODE_SUCCESS;
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_Release(TELIX_JS_VB_HANDLE object) {
    return resultOf(arbiter().release(object));
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_Stop(TELIX_JS_VB_HANDLE object) {
    return resultOf(arbiter().stop(object));
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_BindToCurrChannel(TELIX_JS_VB_HANDLE object) {
    return resultOf(arbiter().bind(object));
}

// Nothing is recorded, so trick play is the same as none.
TELIX_RETCODE_ENUM_T TELIX_JS_VB_SetChannel(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel,
                                            ___UINT8 trickPlay) {
    (void)trickPlay;
    return resultOf(arbiter().tune(object, channel));
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_PrevChannel(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE* channel) {
    *channel = arbiter().step(object, -1);
    return resultOf(*channel != 0);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_NextChannel(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE* channel) {
    *channel = arbiter().step(object, 1);
    return resultOf(*channel != 0);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_GetCurrentChannel(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE* channel) {
    *channel = arbiter().channelOf(object);
    return resultOf(*channel != 0);
}

// An unknown service is not refused: its tune fails.
TELIX_RETCODE_ENUM_T TELIX_JS_VB_SetChannelByTriplet(TELIX_JS_VB_HANDLE object, int32_t onid, int32_t tsid,
                                                     int32_t sid) {
    if (!arbiter().exists(object)) {
        return kRefused;
    }
    const TELIX_JS_CM_HANDLE channel = broadcast().channels().makeByTriplet(
        static_cast<uint32_t>(onid), static_cast<uint32_t>(tsid), static_cast<uint32_t>(sid));
    return resultOf(channel != 0 && arbiter().tune(object, channel));
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_CreateChannelObjectByTriplet(TELIX_JS_VB_HANDLE object, ___UINT8 idType,
                                                              uint32_t onid, uint32_t tsid, uint32_t sid,
                                                              TELIX_JS_CM_HANDLE* channel) {
    (void)idType; // satellite, cable and terrestrial services all come from files
    if (!arbiter().exists(object)) {
        return kRefused;
    }
    *channel = broadcast().channels().makeByTriplet(onid, tsid, sid);
    return resultOf(*channel != 0);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_CreateChannelObjectByDsd(TELIX_JS_VB_HANDLE object, ___UINT8 idType,
                                                          const ___UINT8* descriptor, uint32_t length,
                                                          uint32_t sid, TELIX_JS_CM_HANDLE* channel) {
    (void)idType;
    if (!arbiter().exists(object)) {
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
    const auto view = arbiter().viewOf(object);
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
    const auto view = arbiter().viewOf(object);
    if (view) {
        *width = static_cast<int32_t>(view->width);
    }
    return resultOf(view.has_value());
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_GetHeight(TELIX_JS_VB_HANDLE object, int32_t* height) {
    const auto view = arbiter().viewOf(object);
    if (view) {
        *height = static_cast<int32_t>(view->height);
    }
    return resultOf(view.has_value());
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_SetPlayBackState(TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T state) {
    return resultOf(arbiter().setPlayState(object, state));
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_GetPlayBackState(TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T* state) {
    const auto found = arbiter().playState(object);
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
    return registerCallback(callbacks().onChannelChange, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_UnRegisterOnChannelChangeSucceeded(TELIX_JS_VB_CHANNEL_CHANGE_CB callback) {
    return unregisterCallback(callbacks().onChannelChange, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_RegisterOnChannelChangeError(TELIX_JS_VB_CHANNEL_ERROR_CB callback) {
    return registerCallback(callbacks().onChannelError, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_UnRegisterOnChannelChangeError(TELIX_JS_VB_CHANNEL_ERROR_CB callback) {
    return unregisterCallback(callbacks().onChannelError, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_RegisterOnFullScreenChange(TELIX_JS_VB_FULLSCREEN_CB callback) {
    return registerCallback(callbacks().onFullScreen, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_UnRegisterOnFullScreenChange(TELIX_JS_VB_FULLSCREEN_CB callback) {
    return unregisterCallback(callbacks().onFullScreen, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_RegisterOnPlayStateChange(TELIX_JS_VB_PLAYSTATE_CB callback) {
    return registerCallback(callbacks().onPlayState, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_UnRegisterOnPlayStateChange(TELIX_JS_VB_PLAYSTATE_CB callback) {
    return unregisterCallback(callbacks().onPlayState, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_RegisterOnProgrammesChanged(TELIX_JS_VB_HANDLE object,
                                                             TELIX_JS_VB_PROGRAMMES_CB callback) {
    (void)object; // the registration is for all objects
    return registerCallback(callbacks().onProgrammes, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_RegisterOnParentalRatingChange(TELIX_JS_VB_HANDLE object,
                                                                TELIX_JS_VB_PARENTAL_RATING_CB callback) {
    (void)object;
    return registerCallback(callbacks().onRatingChange, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_RegisterOnParentalRatingError(TELIX_JS_VB_HANDLE object,
                                                               TELIX_JS_VB_PARENTAL_RATING_CB callback) {
    (void)object;
    return registerCallback(callbacks().onRatingError, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_UnRegisterOnProgrammesChanged(TELIX_JS_VB_PROGRAMMES_CB callback) {
    return unregisterCallback(callbacks().onProgrammes, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_UnRegisterOnParentalRatingChange(TELIX_JS_VB_PARENTAL_RATING_CB callback) {
    return unregisterCallback(callbacks().onRatingChange, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_UnRegisterOnParentalRatingError(TELIX_JS_VB_PARENTAL_RATING_CB callback) {
    return unregisterCallback(callbacks().onRatingError, callback);
}

TELIX_RETCODE_ENUM_T TELIX_JS_VB_RegisterStreamEvent(TELIX_JS_VB_HANDLE object,
                                                     TELIX_JS_VB_STREAM_EVENT_CB callback,
                                                     const char* eventId, const char* componentTag,
                                                     const char* eventName) {
    if (!callback || !arbiter().exists(object)) {
        return kRefused;
    }
    broadcast().streamEvents().subscribe(object, callback, eventId, componentTag, eventName);
    return TELIX_RETCODE_SUCCESS;
}

// The name may differ from that of the registration.
TELIX_RETCODE_ENUM_T TELIX_JS_VB_UnRegisterStreamEvent(TELIX_JS_VB_HANDLE object,
                                                       TELIX_JS_VB_STREAM_EVENT_CB callback,
                                                       const char* eventId, const char* componentTag,
                                                       const char* eventName) {
    (void)eventName;
    return resultOf(broadcast().streamEvents().unsubscribe(object, callback, eventId, componentTag));
}

TELIX_DEFINE_COMPONENT_CALLS(TELIX_JS_VB, TELIX_JS_VB_HANDLE, Broadcast)

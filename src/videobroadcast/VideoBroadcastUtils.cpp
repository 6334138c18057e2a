// The events of the broadcast: callback on a platform thread, record, main loop, delivery to the page. Each
// event's payload, copy, disposal, delivery and callback are together below.
#include "src/videobroadcast/VideoBroadcastUtils.h"

#include <glib.h>

#include <cassert>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <iterator>
#include <new>
#include <string>

#include "common/BrowserGates.h"
#include "common/Log.h"
#include "common/PluginUtils.h"
#include "common/ScriptValues.h"
#include "src/videobroadcast/VideoBroadcast.h"

namespace {

// A statement of the handler, wherever its code stands.
#define HANDLER_LOG(...) PLUGIN_LOG_FOR(LogModule::VIDEOBCAST, "handleVideoBroadcastEvent", __VA_ARGS__)

// The first statement of most callbacks.
#define CALLBACK_LOG() PLUGIN_LOG(VIDEOBCAST, " VB Handle %d . \n", vbHandle)

// The record of an event for the object with the handle, or null if there is none.
VideoBcastEvent* newEvent(TELIX_JS_VB_HANDLE vbHandle, VBEventType type) {
    auto* event = new VideoBcastEvent;
    event->vbInstance = VideoBroadcast::refOf(vbHandle);
    if (!event->vbInstance.address()) {
        // The record of an event without a receiver is not freed.
        // NOLINTNEXTLINE(clang-analyzer-cplusplus.NewDeleteLeaks)
        return nullptr;
    }
    event->eventType = type;
    return event;
}

void queueEvent(const char* callback, TELIX_JS_VB_HANDLE vbHandle, VideoBcastEvent* event) {
    PLUGIN_LOG_FOR(LogModule::VIDEOBCAST, callback, " VB Inst:( %p ) for vbHandle:( %d ), Event:( %p )\n",
                   static_cast<void*>(event->vbInstance.address()), vbHandle, static_cast<void*>(event));
    postIdle(handleVideoBroadcastEvent, event);
}

// The rest of a callback: `Payload` is made of what the platform gave.
template <class Payload, class... Given>
TELIX_RETCODE_ENUM_T carry(const char* callback, TELIX_JS_VB_HANDLE vbHandle, VBEventType type,
                           Given... given) {
    VideoBcastEvent* event = newEvent(vbHandle, type);
    if (!event) {
        return TELIX_RETCODE_SUCCESS;
    }
    event->eventData = new (std::nothrow) Payload(given...);
    if (event->eventData) {
        queueEvent(callback, vbHandle, event);
    }
    // A record that found no memory for its payload is not freed.
    // NOLINTNEXTLINE(clang-analyzer-cplusplus.NewDeleteLeaks)
    return TELIX_RETCODE_SUCCESS;
}

// The same for an event that carries no payload.
TELIX_RETCODE_ENUM_T carryNothing(const char* callback, TELIX_JS_VB_HANDLE vbHandle, VBEventType type) {
    if (VideoBcastEvent* event = newEvent(vbHandle, type)) {
        queueEvent(callback, vbHandle, event);
    }
    return TELIX_RETCODE_SUCCESS;
}

// ---- No event

void deliverNoEvent(VideoBroadcast&, const std::string&, void*) {
    HANDLER_LOG("VBEvent_NoEvent: Case. \n");
}

// ---- Stream event

struct StreamEventData {
    StreamEventData(const void* szName, const void* bytes, size_t length, const void* szStatus) {
        // If memory runs out, the strings that follow stay null.
        name = copyOf(szName, std::strlen(static_cast<const char*>(szName)));
        data = name ? copyOf(bytes, length) : nullptr;
        status = data ? copyOf(szStatus, std::strlen(static_cast<const char*>(szStatus))) : nullptr;
    }
    StreamEventData(const StreamEventData&) = delete;
    StreamEventData& operator=(const StreamEventData&) = delete;
    ~StreamEventData() {
        std::free(name);
        std::free(data);
        std::free(status);
    }

    static char* copyOf(const void* bytes, size_t length) {
        auto* copy = static_cast<char*>(length < SIZE_MAX ? std::malloc(length + 1) : nullptr);
        if (copy) {
            if (length != 0) {
                std::memcpy(copy, bytes, length);
            }
            copy[length] = '\0';
        }
        return copy;
    }

    char* name = nullptr;
    char* data = nullptr;
    char* status = nullptr;
};

void deliverStreamEvent(VideoBroadcast& videoBroadcast, const std::string& id, void* payload) {
    const auto textOf = [](const char* text) { return std::string(text ? text : ""); };
    const auto* event = static_cast<const StreamEventData*>(payload);
    const std::string name = textOf(event->name);
    const std::string data = textOf(event->data);
    const std::string status = textOf(event->status);
    HANDLER_LOG("VBEvent_StreamEvent: Case. \n");
    HANDLER_LOG("Event Name:-- %s --, Data:-- %s --, Status:-- %s --\n", name.c_str(), data.c_str(),
                status.c_str());
    if (videoBroadcast.invokeJScript(streamEventScript(name, data, status, id))) {
        HANDLER_LOG("StreamEvent success.\n");
    } else {
        HANDLER_LOG("StreamEvent failed.\n");
    }
}

} // namespace

TELIX_RETCODE_ENUM_T streamEventHandler(TELIX_JS_VB_HANDLE vbHandle, ___UINT8*, ___UINT8*,
                                        ___UINT8* szEventName, ___UINT8* szEventData, ___UINT32 dataLength,
                                        ___UINT8* szEventStatus) {
    assert(szEventName);
    assert(szEventStatus);
    if (dataLength != 0) {
        assert(szEventData);
    }
    const LiveRef<VideoBroadcast> videoBroadcast = VideoBroadcast::refOf(vbHandle);
    if (!videoBroadcast.address()) {
        return TELIX_RETCODE_SUCCESS;
    }
    auto* event = new VideoBcastEvent;
    event->eventType = VBEvent_StreamEvent;
    event->vbInstance = videoBroadcast;
    event->eventData =
        new (std::nothrow) StreamEventData(szEventName, szEventData, dataLength, szEventStatus);
    if (event->eventData) {
        queueEvent(__func__, vbHandle, event);
    }
    return TELIX_RETCODE_SUCCESS;
}

namespace {

// ---- Channel change that succeeded

struct ChannelChange {
    explicit ChannelChange(TELIX_JS_CM_HANDLE handle) : channelHandle(handle) {}

    unsigned int channelHandle;
};

// None of the references that the steps below are given is released: the objects stay alive.

void deliverChannelChange(VideoBroadcast& videoBroadcast, const std::string&, void* payload) {
    NPObject* handler = videoBroadcast.getOnChannelChangeSucceeded();
    NPObject* channel = videoBroadcast.getChannel(static_cast<const ChannelChange*>(payload)->channelHandle);
    if (handler && channel) {
        NPVariant argument{};
        setResult(argument, channel);
        videoBroadcast.invokeJScriptFunc(handler, &argument, 1);
    }
}

} // namespace

TELIX_RETCODE_ENUM_T onChannelChangeSuccededCb(TELIX_JS_VB_HANDLE vbHandle,
                                               TELIX_JS_CM_HANDLE channelHandle) {
    CALLBACK_LOG();
    return carry<ChannelChange>(__func__, vbHandle, VBEvent_ChannelChangeSucceded, channelHandle);
}

namespace {

// ---- Channel change that failed

struct ChannelChangeEvent {
    ChannelChangeEvent(TELIX_JS_CM_HANDLE handle, TELIX_ERR_STATE_ENUM_T error)
        : channelHandle(handle), errorState(error) {}

    unsigned int channelHandle;
    TELIX_ERR_STATE_ENUM_T errorState;
};

void deliverChannelChangeError(VideoBroadcast& videoBroadcast, const std::string&, void* payload) {
    const auto* event = static_cast<const ChannelChangeEvent*>(payload);
    NPObject* handler = videoBroadcast.getOnChannelChangeError();
    NPObject* channel = videoBroadcast.getChannel(event->channelHandle);
    if (handler && channel) {
        NPVariant args[2]{};
        setResult(args[0], channel);
        setResult(args[1], event->errorState);
        videoBroadcast.invokeJScriptFunc(handler, args, 2);
    }
}

} // namespace

TELIX_RETCODE_ENUM_T onChannelChangeErrorCb(TELIX_JS_VB_HANDLE vbHandle, TELIX_JS_CM_HANDLE channelHandle,
                                            TELIX_ERR_STATE_ENUM_T errorState) {
    CALLBACK_LOG();
    return carry<ChannelChangeEvent>(__func__, vbHandle, VBEvent_ChannelChangeError, channelHandle,
                                     errorState);
}

namespace {

// ---- Programmes that changed

void deliverProgrammesChanged(VideoBroadcast& videoBroadcast, const std::string&, void*) {
    if (NPObject* handler = videoBroadcast.getOnProgrammesChanged()) {
        videoBroadcast.invokeJScriptFunc(handler, nullptr, 0);
    }
}

} // namespace

TELIX_RETCODE_ENUM_T onProgrammesChangedCb(TELIX_JS_VB_HANDLE vbHandle) {
    CALLBACK_LOG();
    return carryNothing(__func__, vbHandle, VBEvent_ProgrammesChanged);
}

namespace {

// ---- Parental rating that changed, or that could not be determined

struct ParentalRatingEvent {
    ParentalRatingEvent(const ___UINT8* first, TELIX_JS_SI_PARENTALRATING_HANDLE handle,
                        const ___UINT8* second)
        : contentId(textOf(first)), drmSystemId(textOf(second)), ratingHandle(handle) {}

    static const char* textOf(const ___UINT8* text) {
        return text ? reinterpret_cast<const char*>(text) : "";
    }

    std::string contentId;
    std::string drmSystemId;
    unsigned int ratingHandle;
};

// quirk 78: both events call the handler of the change; the handler of the error is never called.
void deliverParentalRating(VideoBroadcast& videoBroadcast, const std::string&, void* payload) {
    const auto* event = static_cast<const ParentalRatingEvent*>(payload);
    NPObject* handler = videoBroadcast.getOnParentalRatingChange();
    NPObject* rating = videoBroadcast.getParentalRatingObj(event->ratingHandle);
    if (!handler || !rating) {
        return;
    }
    // The browser reads the string in place.
    const auto textArgument = [](NPVariant& argument, const std::string& text) {
        if (text.empty()) {
            setNull(argument);
        } else {
            argument.type = NPVariantType_String;
            argument.value.stringValue = {text.data(), static_cast<uint32_t>(text.size())};
        }
    };
    NPVariant args[3]{};
    textArgument(args[0], event->contentId);
    setResult(args[1], rating);
    textArgument(args[2], event->drmSystemId);
    videoBroadcast.invokeJScriptFunc(handler, args, 3);
}

} // namespace

TELIX_RETCODE_ENUM_T onParentalRatingChangeCb(TELIX_JS_VB_HANDLE vbHandle, ___UINT8* contentId,
                                              TELIX_JS_SI_PARENTALRATING_HANDLE ratingHandle,
                                              ___UINT8* drmSystemId) {
    CALLBACK_LOG();
    return carry<ParentalRatingEvent>(__func__, vbHandle, VBEvent_ParentalRatingChange, contentId,
                                      ratingHandle, drmSystemId);
}

TELIX_RETCODE_ENUM_T onParentalRatingErrorCb(TELIX_JS_VB_HANDLE vbHandle, ___UINT8* contentId,
                                             TELIX_JS_SI_PARENTALRATING_HANDLE ratingHandle,
                                             ___UINT8* drmSystemId) {
    CALLBACK_LOG();
    return carry<ParentalRatingEvent>(__func__, vbHandle, VBEvent_ParentalRatingError, contentId,
                                      ratingHandle, drmSystemId);
}

namespace {

// ---- Play state that changed

struct PlayStateEvent {
    PlayStateEvent(uint32_t carried, TELIX_PLAYSTATE_ENUM_T playState, TELIX_ERR_STATE_ENUM_T errorState)
        : value(carried), state(playState), error(errorState) {}

    unsigned int value; // carried, never read
    TELIX_PLAYSTATE_ENUM_T state;
    TELIX_ERR_STATE_ENUM_T error;
};

void deliverPlayState(VideoBroadcast& videoBroadcast, const std::string&, void* payload) {
    const auto* event = static_cast<const PlayStateEvent*>(payload);
    HANDLER_LOG("VBEvent_PlayStateChange:: Case. VB State: %d, Plugin State: %d \n", event->state,
                videoBroadcast.getPluginState());
    NPObject* handler = videoBroadcast.getOnPlayStateChange();
    if (!handler) {
        // Without a handler the object stays as active as it was.
        return;
    }
    HANDLER_LOG("VBEvent_PlayStateChange:: Case. State: %d \n", event->state);
    NPVariant args[2]{};
    setResult(args[0], event->state);
    if (event->error == TELIX_ERR_STATE_NONE) {
        setVoid(args[1]);
    } else {
        setResult(args[1], event->error);
    }
    videoBroadcast.invokeJScriptFunc(handler, args, 2);
    const bool ended = event->state == TELIX_PLAYSTATE_UNREALIZED ||
                       event->state == TELIX_PLAYSTATE_CONNECTING || event->state == TELIX_PLAYSTATE_STOPPED;
    if (ended) {
        videoBroadcast.setActive(false);
    }
}

} // namespace

TELIX_RETCODE_ENUM_T onPlayStateChangeCb(TELIX_JS_VB_HANDLE vbHandle, uint32_t value,
                                         TELIX_PLAYSTATE_ENUM_T state, TELIX_ERR_STATE_ENUM_T error) {
    PLUGIN_LOG(VIDEOBCAST, " VB Handle %d, State: %d, Error: %d \n", vbHandle, state, error);
    return carry<PlayStateEvent>(__func__, vbHandle, VBEvent_PlayStateChange, value, state, error);
}

namespace {

// ---- Full screen that changed

void deliverFullScreenChange(VideoBroadcast& videoBroadcast, const std::string&, void*) {
    if (NPObject* handler = videoBroadcast.getOnFullScreenChange()) {
        videoBroadcast.invokeJScriptFunc(handler, nullptr, 0);
    }
}

} // namespace

TELIX_RETCODE_ENUM_T onFullScreenChangeCb(TELIX_JS_VB_HANDLE vbHandle) {
    CALLBACK_LOG();
    return carryNothing(__func__, vbHandle, VBEvent_FullScreenChange);
}

namespace {

// ---- All of them

using Deliver = void (*)(VideoBroadcast& videoBroadcast, const std::string& id, void* payload);

struct EventClass {
    const char* domEvent;           // dispatched first; null for none
    Deliver deliver;                // to the script handler, mostly
    void (*dispose)(void* payload); // null for an event that carries nothing
};

template <class Payload>
constexpr EventClass carrying(const char* domEvent, Deliver deliver) {
    return {domEvent, deliver, [](void* payload) { delete static_cast<Payload*>(payload); }};
}

// quirk 77: the DOM event is "ChannelChangeSucceded", while the page's property is
// "onChannelChangeSucceeded".
constexpr EventClass kEvents[] = {
    {nullptr, deliverNoEvent, nullptr},
    carrying<StreamEventData>(nullptr, deliverStreamEvent),
    carrying<ChannelChange>("ChannelChangeSucceded", deliverChannelChange),
    carrying<ChannelChangeEvent>("ChannelChangeError", deliverChannelChangeError),
    {"ProgrammesChanged", deliverProgrammesChanged, nullptr},
    carrying<ParentalRatingEvent>("ParentalRatingChange", deliverParentalRating),
    carrying<ParentalRatingEvent>("ParentalRatingError", deliverParentalRating),
    carrying<PlayStateEvent>("PlayStateChange", deliverPlayState),
    {"FullScreenChange", deliverFullScreenChange, nullptr},
};

} // namespace

namespace {

// The DOM event, then what the event's class does; disposes of the payload.
void deliverEvent(VideoBroadcast& instance, const std::string& id, const VideoBcastEvent& event) {
    if (event.eventType >= std::size(kEvents)) {
        return;
    }
    const CallGuard guard(instance);
    const EventClass& eventClass = kEvents[event.eventType];
    if (eventClass.domEvent) {
        instance.invokeJScript(domEventScript(id, eventClass.domEvent, false, false));
    }
    // A listener of the DOM event may have taken the object out of the page.
    if ((event.eventData || !eventClass.dispose) && event.vbInstance.get()) {
        eventClass.deliver(instance, id, event.eventData);
    }
    if (eventClass.dispose) {
        eventClass.dispose(event.eventData);
    }
}

} // namespace

int handleVideoBroadcastEvent(void* eventData) {
    auto* event = static_cast<VideoBcastEvent*>(eventData);
    VideoBroadcast* address = event ? event->vbInstance.address() : nullptr;
    PLUGIN_LOG(VIDEOBCAST, "VideoBroadcast class, bCallbacksRegistered : %d \n",
               VideoBroadcast::callbacksRegistered());
    if (!address || !VideoBroadcast::callbacksRegistered()) {
        PLUGIN_LOG(VIDEOBCAST, "Could not process eventData:( %p ), eventType:( %d ), VBInstance: (%p)\n",
                   eventData, event ? event->eventType : VBEvent_NoEvent, static_cast<void*>(address));
        return G_SOURCE_REMOVE; // neither record nor payload is freed
    }
    PLUGIN_LOG(VIDEOBCAST, "VB EventType: %d, VB Instance from eventData : %p \n", event->eventType,
               static_cast<void*>(address));
    // An address in the list is not enough: the next object may have been made there since.
    const bool isListed = VideoBroadcast::checkValidInstance(address);
    VideoBroadcast* instance = isListed ? event->vbInstance.get() : nullptr;
    const std::string id = instance ? instance->getId() : std::string();
    // quirk 76: an element without an id gets neither DOM events nor calls of its handlers.
    if (!instance || id.empty()) {
        PLUGIN_LOG(
            VIDEOBCAST,
            "Invalid VB Instance received or Id attribute is not present with object. isValidInst: %d\n",
            instance != nullptr);
        delete event;
        return G_SOURCE_REMOVE; // the payload is not freed
    }
    deliverEvent(*instance, id, *event);
    delete event;
    return G_SOURCE_REMOVE;
}

// The script interface of the video/broadcast object.
#include "src/videobroadcast/JSVideoBroadcast.h"

#include <cstdlib>

#include "common/ScriptReferences.h"
#include "src/avcomponent/JSAVcomponent.h"
#include "src/channel/JSChannel.h"
#include "src/videobroadcast/VideoBroadcast.h"

namespace {

using Model = VideoBroadcast;

// The transport stream id where script leaves it out.
constexpr int32_t kAnyTransportStream = 8191;

VideoBroadcast& videoBroadcast(PluginBase& model) {
    return static_cast<VideoBroadcast&>(model);
}

template <class Type>
bool fits(const NPVariant& value) {
    return ScriptArgument<Type>::fits(value);
}

template <class Type>
Type valueOf(const NPVariant& value) {
    return ScriptArgument<Type>::read(value);
}

// This object counts its arguments: a missing one does not match.
template <auto Operation>
bool countAndInvoke(PluginBase& model, const NPVariant* args, unsigned int argCount, NPVariant& result) {
    using Arguments = typename script_detail::Signature<decltype(Operation)>::Arguments;
    return argCount >= std::tuple_size_v<Arguments> &&
           script_detail::invokeOperation<Operation>(model, args, argCount, result);
}

template <auto Operation>
constexpr TypedFunction<ScriptInvoker> invokeCounted{countAndInvoke<Operation>,
                                                     script_detail::typesOf<Operation>()};

// quirk 79: unlike the other handlers, whatever is not an object clears it.
bool writeOnParentalRatingChange(PluginBase& model, const NPVariant& value) {
    videoBroadcast(model).setOnParentalRatingChange(fits<NPObject*>(value) ? value.value.objectValue
                                                                           : nullptr);
    return true;
}

// quirk 80: whatever is not an object clears the handler of rating changes and leaves this one as it was.
bool writeOnParentalRatingError(PluginBase& model, const NPVariant& value) {
    if (fits<NPObject*>(value)) {
        videoBroadcast(model).setOnParentalRatingError(value.value.objectValue);
    } else {
        videoBroadcast(model).setOnParentalRatingChange(nullptr);
    }
    return true;
}

// Takes exactly (onid, tsid or null, sid) or (onid, sid).
bool setChannelByTriplet(PluginBase& model, const NPVariant* args, unsigned int argCount, NPVariant&) {
    if (argCount == 3 && fits<int32_t>(args[0]) &&
        (fits<int32_t>(args[1]) || args[1].type == NPVariantType_Null) && fits<int32_t>(args[2])) {
        PLUGIN_LOG_FOR(LogModule::VIDEOBCAST, "Invoke",
                       "mId_setChannelByTriplet is called with 3 arguments\n");
        const int32_t tsid =
            args[1].type == NPVariantType_Null ? kAnyTransportStream : valueOf<int32_t>(args[1]);
        videoBroadcast(model).setChannelByTriplet(valueOf<int32_t>(args[0]), tsid, valueOf<int32_t>(args[2]));
        return true;
    }
    if (argCount == 2 && fits<int32_t>(args[0]) && fits<int32_t>(args[1])) {
        PLUGIN_LOG_FOR(LogModule::VIDEOBCAST, "Invoke",
                       "mId_setChannelByTriplet is called with 2 arguments\n");
        videoBroadcast(model).setChannelByTriplet(valueOf<int32_t>(args[0]), kAnyTransportStream,
                                                  valueOf<int32_t>(args[1]));
        return true;
    }
    return false;
}

// Takes a channel or null; a second argument that is not a boolean counts as false.
bool setChannel(PluginBase& model, const NPVariant* args, unsigned int argCount, NPVariant&) {
    if (argCount < 1 || !(fits<JSChannel*>(args[0]) || args[0].type == NPVariantType_Null)) {
        return false;
    }
    bool trickPlay = false;
    if (argCount >= 2 && fits<bool>(args[1])) {
        PLUGIN_LOG_FOR(LogModule::VIDEOBCAST, "Invoke", "mId_setChannel is called With 2 Parameters\n");
        trickPlay = valueOf<bool>(args[1]);
    }
    videoBroadcast(model).setChannel(
        args[0].type == NPVariantType_Null ? nullptr : valueOf<JSChannel*>(args[0]), trickPlay);
    return true;
}

// quirk 90: refused even with the types that it asks for.
// It would read the object as a string and the last string as a listener.
bool addCarouselListener(PluginBase&, const NPVariant* args, unsigned int argCount, NPVariant&) {
    if (argCount >= 3 && fits<std::string>(args[0]) && fits<NPObject*>(args[1]) &&
        fits<std::string>(args[2])) {
        PLUGIN_LOG_FOR(LogModule::VIDEOBCAST, "Invoke", "mId_addCarouselListener is called \n");
    }
    return false;
}

// The page's form (URL, name, listener), or the registering one (URL, name, id, component tag).
// quirk 91: the registering form is open to pages too.
bool addStreamEventListener(PluginBase& model, const NPVariant* args, unsigned int argCount,
                            NPVariant& result) {
    using PageForm = void (Model::*)(const std::string&, const std::string&, NPObject*);
    using RegisteringForm =
        void (Model::*)(const std::string&, const std::string&, const std::string&, const std::string&);
    constexpr PageForm pageForm = &Model::addStreamEventListener;
    constexpr RegisteringForm registeringForm = &Model::addStreamEventListener;
    return countAndInvoke<pageForm>(model, args, argCount, result) ||
           countAndInvoke<registeringForm>(model, args, argCount, result);
}

// quirk 89: any argument with a value is accepted, of whatever type, but for an object that is no component.
// Only a component can be unselected; a value of another type is logged as the operation logs its object, and
// that is all.
bool unselectComponent(PluginBase& model, const NPVariant* args, unsigned int argCount, NPVariant&) {
    if (argCount < 1 || !args[0].value.objectValue) {
        return false;
    }
    if (!fits<NPObject*>(args[0])) {
        PLUGIN_LOG_FOR(LogModule::VIDEOBCAST, "unSelectComponent", "AVCompObj: %p \n",
                       static_cast<void*>(args[0].value.objectValue));
        return true;
    }
    if (!fits<JSAVcomponent*>(args[0])) {
        return false;
    }
    videoBroadcast(model).unSelectComponent(valueOf<JSAVcomponent*>(args[0]));
    return true;
}

// quirk 96: exactly (idType, onid, tsid, sid), (idType, onid, sid) or (idType, descriptor, sid).
bool createChannelObject(PluginBase& model, const NPVariant* args, unsigned int argCount, NPVariant& result) {
    if (argCount < 3 || !fits<uint32_t>(args[0]) || !fits<uint32_t>(args[2])) {
        return false;
    }
    const uint32_t idType = valueOf<uint32_t>(args[0]);
    if (fits<uint32_t>(args[1])) {
        uint32_t onid = 0;
        uint32_t tsid = kAnyTransportStream;
        uint32_t sid = 0;
        PLUGIN_LOG_FOR(LogModule::VIDEOBCAST, "Invoke", "Before assignment, onid: %u, tsid: %u, sid: %u \n",
                       onid, tsid, sid);
        if (argCount == 4 && fits<uint32_t>(args[3])) {
            PLUGIN_LOG_FOR(LogModule::VIDEOBCAST, "Invoke",
                           "mId_createChannelObject is called with 4 parameters\n");
            onid = valueOf<uint32_t>(args[1]);
            tsid = valueOf<uint32_t>(args[2]);
            sid = valueOf<uint32_t>(args[3]);
        } else if (argCount == 3) {
            PLUGIN_LOG_FOR(LogModule::VIDEOBCAST, "Invoke",
                           "mId_createChannelObject is called with 3 parameters\n");
            onid = valueOf<uint32_t>(args[1]);
            sid = valueOf<uint32_t>(args[2]);
        } else {
            return false;
        }
        setResult(result, videoBroadcast(model).createChannelObject(idType, onid, tsid, sid));
        return true;
    }
    if (!fits<std::string>(args[1])) {
        return false;
    }
    PLUGIN_LOG_FOR(LogModule::VIDEOBCAST, "Invoke", "mId_createChannelObject is called with Dsd\n");
    unsigned int length = 0;
    NPObject* channel = nullptr;
    if (unsigned char* dsd = utf8ToUtf16Converter(args[1].value.stringValue, &length)) {
        channel = videoBroadcast(model).createChannelObject(idType, dsd, length, valueOf<uint32_t>(args[2]));
        std::free(dsd);
    }
    setResult(result, channel);
    return true;
}

constexpr ScriptMember kMembers[] = {
    property("width", reader<&Model::getWidth>, writer<&Model::setWidth>),
    property("height", reader<&Model::getHeight>, writer<&Model::setHeight>),
    property("fullScreen", reader<&Model::isFullScreen>),
    // quirk 84: a write asks the platform for that state.
    property("playState", reader<&Model::getPlayState>, writer<&Model::setPlayState>),
    property("onFullScreenChange", reader<&Model::getOnFullScreenChange>,
             listenerWriter<&Model::setOnFullScreenChange>),
    property("onChannelChangeSucceeded", reader<&Model::getOnChannelChangeSucceeded>,
             listenerWriter<&Model::setOnChannelChangeSucceeded>),
    property("onChannelChangeError", reader<&Model::getOnChannelChangeError>,
             listenerWriter<&Model::setOnChannelChangeError>),
    property("onPlayStateChange", reader<&Model::getOnPlayStateChange>,
             listenerWriter<&Model::setOnPlayStateChange>),
    property("onProgrammesChanged", reader<&Model::getOnProgrammesChanged>,
             listenerWriter<&Model::setOnProgrammesChanged>),
    property("onParentalRatingChange", reader<&Model::getOnParentalRatingChange>,
             writeOnParentalRatingChange),
    property("onParentalRatingError", reader<&Model::getOnParentalRatingError>, writeOnParentalRatingError),
    property("programmes", reader<&Model::getProgrammes>),
    property("currentChannel", reader<&Model::getCurrChannel>),
    method("getChannelConfig", invoker<&Model::getChannelConfig>),
    method("setChannelByTriplet", setChannelByTriplet),
    // quirk 85: no result.
    method("bindToCurrentChannel", invoker<&Model::bindToCurrentChannel>),
    method("setChannel", setChannel),
    method("prevChannel", invoker<&Model::prevChannel>),
    method("nextChannel", invoker<&Model::nextChannel>),
    method("setFullScreen", invokeCounted<&Model::setFullScreenChange>),
    method("release", invoker<&Model::release>),
    method("addCarouselListener", addCarouselListener),
    method("addStreamEventListener", addStreamEventListener),
    method("removeStreamEventListener", invokeCounted<&Model::removeStreamEventListener>),
    method("selectComponent", invokeCounted<&Model::selectComponent>),
    method("unselectComponent", unselectComponent),
    method("createChannelObject", createChannelObject),
    constant("COMPONENT_TYPE_VIDEO", 0),
    constant("COMPONENT_TYPE_AUDIO", 1),
    constant("COMPONENT_TYPE_SUBTITLE", 2),
    method("getComponents", invokeCounted<&Model::getComponents>),
    method("getCurrentActiveComponents", invokeCounted<&Model::getCurrentActiveComponents>),
    method("stop", invoker<&Model::stop>),
};

constexpr ScriptClass kClass("JSVideoBroadcast", LogModule::VIDEOBCAST, kMembers);

} // namespace

JSVideoBroadcast::JSVideoBroadcast(NPP npp) : EmbeddedObjectWrapper(npp, kClass) {}

// quirk 97: without a model each of these stops the process.
bool JSVideoBroadcast::Invoke(NPIdentifier name, const NPVariant* args, unsigned int argCount,
                              NPVariant* result) {
    const PluginBase* pPlugin = model();
    assert(pPlugin);
    return EmbeddedObjectWrapper::Invoke(name, args, argCount, result);
}

bool JSVideoBroadcast::GetProperty(NPIdentifier name, NPVariant* result) {
    setVoid(*result);
    const PluginBase* pPlugin = model();
    assert(pPlugin);
    return EmbeddedObjectWrapper::GetProperty(name, result);
}

bool JSVideoBroadcast::SetProperty(NPIdentifier name, const NPVariant* value) {
    const PluginBase* pPlugin = model();
    assert(pPlugin);
    return EmbeddedObjectWrapper::SetProperty(name, value);
}

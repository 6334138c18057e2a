// The script interface of the A/V control object.
#include "src/avcontrol/JSAVControl.h"

#include "common/ScriptReferences.h"
#include "src/avcomponent/JSAVcomponent.h"
#include "src/avcontrol/AVControl.h"

namespace {

using Model = AVControl;

Model& controlOf(PluginBase& model) {
    return static_cast<Model&>(model);
}

// Undefined, not null, where there was no memory for the string.
bool readData(PluginBase& model, NPVariant& result) {
    const std::string data = controlOf(model).getData();
    if (data.empty()) {
        setNull(result);
    } else {
        setText(result, data.data(), data.size());
    }
    return true;
}

bool readPlayPosition(PluginBase& model, NPVariant& result) {
    unsigned int duration = 0;
    unsigned int position = 0;
    controlOf(model).getPlayInfo(&duration, &position);
    setResult(result, static_cast<double>(position));
    return true;
}

bool readPlayTime(PluginBase& model, NPVariant& result) {
    unsigned int duration = 0;
    unsigned int position = 0;
    controlOf(model).getPlayInfo(&duration, &position);
    setResult(result, static_cast<double>(duration));
    return true;
}

bool readPlayState(PluginBase& model, NPVariant& result) {
    setResult(result, static_cast<int32_t>(controlOf(model).getPlayState()));
    return true;
}

bool readError(PluginBase& model, NPVariant& result) {
    const int32_t error = controlOf(model).getError();
    if (error < 0 || error > 7) {
        PLUGIN_LOG_FOR(LogModule::AVCONTROL, "GetProperty", "Setting Error property to Undefined");
        return true;
    }
    setResult(result, error);
    return true;
}

// quirk 50: null clears the listener of the play state and leaves this one in place.
bool writeOnFullScreenChange(PluginBase& model, const NPVariant& value) {
    if (value.type == NPVariantType_Null) {
        controlOf(model).setOnPlayStateChange(nullptr);
        return true;
    }
    return listenerWriter<&Model::setOnFullScreenChange>(model, value);
}

template <int Direction>
bool invokeChangeClip(PluginBase& model, const NPVariant*, unsigned int, NPVariant&) {
    controlOf(model).changeClip(Direction);
    return true;
}

// A URL, or null to withdraw one; anything else gives script the result false.
bool invokeQueue(PluginBase& model, const NPVariant* args, unsigned int, NPVariant& result) {
    bool queued = false;
    if (args[0].type == NPVariantType_String) {
        const std::string url = stringValue(args[0].value.stringValue);
        const bool isAbsolute = url.find("://") != std::string::npos;
        queued = controlOf(model).queue(isAbsolute ? url : controlOf(model).getBaseURL(url));
    } else if (args[0].type == NPVariantType_Null) {
        queued = controlOf(model).queue("");
    }
    setResult(result, queued);
    return true;
}

constexpr ScriptMember kMembers[] = {
    property("data", readData, writer<&Model::setData>),
    property("playPosition", readPlayPosition),
    property("playTime", readPlayTime),
    property("playState", readPlayState),
    property("error", readError),
    property("speed", reader<&Model::getPlaySpeed>),
    property("fullScreen", reader<&Model::isFullScreen>),
    property("onPlayStateChange", reader<&Model::getOnPlayStateChange>,
             listenerWriter<&Model::setOnPlayStateChange>),
    property("nrTracks", reader<&Model::getNrTracks>),
    property("currentTrackIndex", reader<&Model::getCurTrackIndex>, writer<&Model::setCurTrackIndex>),
    // quirk 60: stored and read back; no other effect.
    property("persist", reader<&Model::getPersist>, writer<&Model::setPersist>),
    property("width", reader<&Model::getWidth>, writer<&Model::setWidth>),
    property("height", reader<&Model::getHeight>, writer<&Model::setHeight>),
    property("onFullScreenChange", reader<&Model::getOnFullScreenChange>, writeOnFullScreenChange),
    property("onPlaySpeedChanged", reader<&Model::getOnPlaySpeedChanged>,
             listenerWriter<&Model::setOnPlaySpeedChanged>),
    property("onPlayPositionChanged", reader<&Model::getOnPlayPositionChanged>,
             listenerWriter<&Model::setOnPlayPositionChanged>),
    method("play", invoker<&Model::play>),
    method("seek", invoker<&Model::seek>),
    method("stop", invoker<&Model::stop>),
    method("next", invokeChangeClip<1>),
    method("previous", invokeChangeClip<-1>),
    method("getComponents", invoker<&Model::getComponents>),
    method("getCurrentActiveComponents", invoker<&Model::getCurrentActiveComponents>),
    method("selectComponent", invoker<&Model::selectComponent>),
    method("unselectComponent", invoker<&Model::unSelectComponent>),
    method("setVolume", invoker<&Model::setVolume>),
    method("setFullScreen", invoker<&Model::setFullScreenChange>),
    constant("COMPONENT_TYPE_VIDEO", 0),
    constant("COMPONENT_TYPE_AUDIO", 1),
    constant("COMPONENT_TYPE_SUBTITLE", 2),
    method("queue", invokeQueue),
    property("onDRMRightsError", reader<&Model::getOnDRMRightsError>,
             listenerWriter<&Model::setOnDRMRightsError>),
};

constexpr ScriptClass kClass = ScriptClass("JSAVControl", LogModule::AVCONTROL, kMembers)
                                   .missingModelSays("Can't find plugin pointer\n");

} // namespace

JSAVControl::JSAVControl(NPP npp) : EmbeddedObjectWrapper(npp, kClass) {}

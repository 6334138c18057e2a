// The response of "state" is put together at the end of the file, its parts before.
#include "desktop/platform/ControlState.h"

#include <algorithm>

#include "desktop/platform/Broadcast.h"
#include "desktop/platform/Device.h"
#include "desktop/platform/PlayerRegistry.h"

namespace desktop {

namespace {

Broadcast& broadcast() {
    return Broadcast::instance();
}

Device& device() {
    return Device::instance();
}

JsonObjectWriter channelJson(size_t number, const Channel& channel) {
    static const char* const kTypes[] = {"television", "radio", "other"};
    JsonObjectWriter json;
    if (number != 0) {
        json.number("number", static_cast<int64_t>(number));
    }
    json.number("handle", channel.handle)
        .string("name", channel.name)
        .string("type", kTypes[std::min(std::max(channel.type, 0), 2)])
        .number("onid", channel.onid)
        .number("tsid", channel.tsid)
        .number("sid", channel.sid);
    return json;
}

JsonObjectWriter areaJson(int64_t x, int64_t y, int64_t width, int64_t height) {
    JsonObjectWriter json;
    json.number("x", x).number("y", y).number("width", width).number("height", height);
    return json;
}

const char* nameOf(TELIX_PLAYSTATE_ENUM_T state) {
    switch (state) {
    case TELIX_PLAYSTATE_UNREALIZED:
        return "unrealized";
    case TELIX_PLAYSTATE_CONNECTING:
        return "connecting";
    case TELIX_PLAYSTATE_PRESENTING:
        return "presenting";
    case TELIX_PLAYSTATE_STOPPED:
        return "stopped";
    default: // pages may write any number
        return "other";
    }
}

JsonArrayWriter objectsJson(const Broadcast::State& state) {
    JsonArrayWriter objects;
    for (const Broadcast::State::Object& each : state.objects) {
        JsonObjectWriter object;
        object.number("handle", each.handle)
            .string("playState", nameOf(each.playState))
            .number("playStateNumber", each.playState)
            .boolean("ownsTuner", each.ownsTuner)
            .number("channel", each.channel)
            .object("area", areaJson(each.view.x, each.view.y, each.view.width, each.view.height))
            .boolean("fullScreen", each.view.fullScreen);
        objects.add(std::move(object));
    }
    return objects;
}

JsonArrayWriter componentsJson(const Broadcast::State& state) {
    static const char* const kTypes[] = {"video", "audio", "subtitle"};
    JsonArrayWriter components;
    for (const BroadcastComponents::Available& each : state.components) {
        const BroadcastComponent& component = each.component;
        JsonObjectWriter object;
        object.number("handle", each.handle)
            .string("type", kTypes[component.type])
            .boolean("active", each.isActive)
            .number("pid", component.pid)
            .string("encoding", component.encoding)
            .string("language", component.language)
            .boolean("encrypted", component.isEncrypted)
            .boolean("audioDescription", component.isAudioDescription)
            .boolean("hearingImpaired", component.isForHearingImpaired)
            .number("audioChannels", component.audioChannels)
            .real("aspectRatio", static_cast<double>(component.aspectRatio));
        components.add(std::move(object));
    }
    return components;
}

JsonArrayWriter tunersJson(const Broadcast::State& state) {
    JsonArrayWriter tuners;
    for (const BroadcastSource::Reception& each : state.tuners) {
        JsonObjectWriter tuner;
        if (each.file.empty()) {
            tuner.null("multiplex");
        } else {
            tuner.string("multiplex", each.file);
        }
        tuner.boolean("selected", each.isSelected).number("keptPackets", static_cast<int64_t>(each.keptSize));
        tuners.add(std::move(tuner));
    }
    return tuners;
}

// In milliseconds, negative for what waits for its time; null before anything is presented.
void setLateness(JsonObjectWriter& json) {
    const ServicePresentation::Lateness lateness = broadcast().lateness();
    for (const auto& [name, value] :
         {std::pair("videoLateness", lateness.video), std::pair("audioLateness", lateness.audio)}) {
        if (value) {
            json.number(name, value->count());
        } else {
            json.null(name);
        }
    }
}

// The PIDs that are presented: of the audio, the one that leaves the pipeline, which follows the active
// component a little later.
void setActivePids(JsonObjectWriter& json, const Broadcast::State& state) {
    if (const auto pid = broadcast().activeAudioPid()) {
        json.number("activeAudioPid", *pid);
    } else {
        json.null("activeAudioPid");
    }
    json.null("activeSubtitlePid");
    for (const BroadcastComponents::Available& each : state.components) {
        if (each.isActive && each.component.type == TELIX_JS_AVCOMPTYPE_SUBTITLE) {
            json.number("activeSubtitlePid", each.component.pid);
        }
    }
}

void setProgramme(JsonObjectWriter& programmes, const char* name, TELIX_JS_SI_HANDLE handle) {
    const auto programme = broadcast().programmes().find(handle);
    if (!programme) {
        programmes.null(name);
        return;
    }
    JsonObjectWriter object;
    object.string("name", programme->name)
        .string("description", programme->description)
        .number("start", programme->start)
        .number("duration", programme->duration);
    JsonArrayWriter ratings;
    for (const TELIX_JS_SI_PARENTALRATING_HANDLE each : programme->ratings) {
        if (const auto found = broadcast().programmes().findRating(each)) {
            JsonObjectWriter rating;
            rating.string("region", found->region)
                .number("value", found->value())
                .boolean("isAge", found->isAge());
            ratings.add(std::move(rating));
        }
    }
    object.array("ratings", std::move(ratings));
    programmes.object(name, std::move(object));
}

const char* nameOf(ApplicationSignalling::State state) {
    switch (state) {
    case ApplicationSignalling::State::Known:
        return "known";
    case ApplicationSignalling::State::Awaited:
        return "awaited";
    default:
        return "no service";
    }
}

JsonObjectWriter applicationJson(const SignalledApplication& application) {
    JsonArrayWriter boundaries;
    for (const std::string& each : application.boundaries) {
        boundaries.add(each);
    }
    JsonObjectWriter json;
    json.string("id", toString(application.id))
        .string("controlCode", controlCodeName(application.controlCode))
        .string("name", application.name)
        .string("url", application.url)
        .number("priority", application.priority)
        .boolean("serviceBound", application.isServiceBound)
        .number("visibility", application.visibility)
        .number("usage", application.usage)
        .array("boundaries", std::move(boundaries));
    return json;
}

JsonObjectWriter pictureJson() {
    telix_desktop_frame frame{};
    telix_desktop_acquire_frame(&frame);
    JsonObjectWriter picture;
    picture.boolean("visible", frame.visible != 0)
        .number("serial", static_cast<int64_t>(frame.serial))
        .number("width", frame.width)
        .number("height", frame.height)
        .object("area", areaJson(frame.areaX, frame.areaY, frame.areaWidth, frame.areaHeight))
        .boolean("fullScreen", frame.fullScreen != 0);
    telix_desktop_release_frame(&frame);
    return picture;
}

JsonArrayWriter playersJson() {
    JsonArrayWriter players;
    for (const PlayerRegistry::State& each : PlayerRegistry::instance().states()) {
        JsonObjectWriter player;
        player.number("handle", each.player)
            .string("url", each.url)
            .string("state", each.state)
            .number("position", each.position)
            .number("duration", each.duration)
            .number("bufferedEnd", each.bufferedEnd)
            .number("buffered", each.buffered)
            .real("speed", each.speed)
            .number("volume", each.volume);
        players.add(std::move(player));
    }
    return players;
}

// The names of the key groups of a mask.
JsonArrayWriter keysJson(uint32_t mask) {
    JsonArrayWriter keys;
    for (const KeyGroup& group : keyGroups()) {
        if ((mask & group.bit) != 0) {
            keys.add(group.name);
        }
    }
    return keys;
}

JsonObjectWriter registrationsJson(const Broadcast::State& state) {
    const BroadcastCallbacks& source = broadcast().callbacks();
    JsonObjectWriter registrations;
    registrations.boolean("channelChange", source.onChannelChange.isSet())
        .boolean("channelError", source.onChannelError.isSet())
        .boolean("fullScreen", source.onFullScreen.isSet())
        .boolean("playState", source.onPlayState.isSet())
        .boolean("programmes", source.onProgrammes.isSet())
        .boolean("ratingChange", source.onRatingChange.isSet())
        .boolean("ratingError", source.onRatingError.isSet())
        .boolean("lowMemory", device().onLowMemory.isSet())
        .boolean("drmMessageResult", device().onDrmMessageResult.isSet());
    JsonArrayWriter streamEvents;
    for (const StreamEvents::Subscription& each : state.subscriptions) {
        JsonObjectWriter subscription;
        subscription.number("object", each.object)
            .number("id", each.eventId)
            .number("tag", each.componentTag)
            .string("name", each.name);
        streamEvents.add(std::move(subscription));
    }
    registrations.array("streamEvents", std::move(streamEvents));
    return registrations;
}

} // namespace

void setChannel(JsonObjectWriter& object, const char* name, TELIX_JS_CM_HANDLE handle) {
    const auto& list = broadcast().channels().list();
    const auto at = std::find(list.begin(), list.end(), handle);
    const auto channel = broadcast().channels().find(handle);
    if (channel) {
        const size_t number = at == list.end() ? 0 : static_cast<size_t>(at - list.begin()) + 1;
        object.object(name, channelJson(number, *channel));
    } else {
        object.null(name);
    }
}

JsonObjectWriter listChannels(const ControlRequest& request) {
    (void)request;
    JsonArrayWriter channels;
    size_t number = 0;
    for (const TELIX_JS_CM_HANDLE handle : broadcast().channels().list()) {
        JsonObjectWriter channel = channelJson(++number, *broadcast().channels().find(handle));
        channel.boolean("current", handle == broadcast().arbiter().currentChannel());
        channels.add(std::move(channel));
    }
    JsonObjectWriter response;
    response.array("channels", std::move(channels));
    return response;
}

JsonObjectWriter listApplications(const ControlRequest& request) {
    (void)request;
    const ApplicationSignalling::Snapshot snapshot = broadcast().applications().snapshot();
    JsonArrayWriter applications;
    for (const SignalledApplication& each : snapshot.list.applications) {
        applications.add(applicationJson(each));
    }
    JsonArrayWriter skipped;
    for (const std::string& each : snapshot.list.skipped) {
        skipped.add(each);
    }
    JsonObjectWriter response;
    setChannel(response, "channel", snapshot.channel);
    response.string("state", nameOf(snapshot.state))
        .array("applications", std::move(applications))
        .array("skipped", std::move(skipped));
    return response;
}

JsonObjectWriter reportState(const ControlRequest& request) {
    (void)request;
    const Broadcast::State state = broadcast().state();
    JsonObjectWriter programmes;
    setProgramme(programmes, "now", state.present);
    setProgramme(programmes, "next", state.following);
    JsonObjectWriter response;
    setChannel(response, "channel", state.channel);
    response.array("objects", objectsJson(state)).array("components", componentsJson(state));
    setActivePids(response, state);
    setLateness(response);
    response.object("programmes", std::move(programmes))
        .object("picture", pictureJson())
        .boolean("instantZap", state.instantZap)
        .number("keptPackets", static_cast<int64_t>(state.keptPackets))
        .array("tuners", tunersJson(state))
        .number("zapDelay", device().configuration().zapDelay)
        .array("players", playersJson())
        .number("keySet", device().keySet())
        .array("keys", keysJson(device().keySet()))
        .array("televisionKeys", keysJson(device().configuration().keys & ~device().keySet()))
        .number("freeMemory", device().freeMemory())
        .string("lastDrmMessage", device().lastDrmMessage())
        .object("registrations", registrationsJson(state));
    return response;
}

} // namespace desktop

// A television with three channels, two programmes, components and schemes of ratings. It answers every
// request later, from a thread of its own, and hands a page its own record of the calls that it got.
//
// Two original networks are not real ones. A channel made from a triplet of `recordNetwork` has the calls
// since the last such channel for a name, one a line. Tuning to a triplet of `occurrenceNetwork` tunes to
// nothing: it makes happen what the transport stream id names (see Occurrence), with the service id for an
// argument.
#include "tests/support/RecordingPlatform.h"

#include <algorithm>
#include <atomic>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <iterator>
#include <map>
#include <mutex>
#include <string>
#include <thread>
#include <utility>
#include <vector>

namespace {

constexpr TELIX_RETCODE_ENUM_T refused = 1;
constexpr uint32_t recordNetwork = 0xFFFF;
constexpr int32_t occurrenceNetwork = 0xFFFE;
constexpr TELIX_ERR_STATE_ENUM_T unknownChannel = 5;
constexpr TELIX_JS_SI_HANDLE guardedProgramme = 202; // refuses what pages write

enum Occurrence {
    programmesChange = 1,
    ratingChanges = 2,     // the argument is the handle of the rating
    ratingFails = 3,       // likewise
    streamEventComes = 4,  // of the stream event that was registered last
    playStateFails = 5,    // the argument is the new play state
    channelListFails = 6,  // from now on for one request
    currentChannelGoes = 7 // for one request
};

struct Channel {
    int32_t type;
    uint32_t onid, tsid, sid;
    std::string name, descriptor;
};

struct Programme {
    std::string name, description, channelId;
    uint32_t startTime, duration;
    std::vector<TELIX_JS_SI_PARENTALRATING_HANDLE> ratings;
};

struct Component {
    TELIX_JS_AVCOMPTYPE type;
    const char* encoding;
    const char* language;
    float aspectRatio;
    uint32_t audioChannels;
    ___UINT8 encrypted, audioDescription, hearingImpaired;
};

struct Rating {
    const char* name;
    const char* scheme;
    const char* region;
    int32_t value, labels;
};

const std::map<TELIX_JS_AVCOMPHANDLE, Component> components{
    {501, {0, "video/mpeg", "", 1.7777778F, 0, 1, 0, 0}},
    {511, {1, "audio/mpeg", "eng", 0, 2, 0, 0, 0}},
    {512, {1, "audio/mp4", "deu", 0, 6, 0, 1, 0}},
    {521, {2, "", "fra", 0, 0, 0, 0, 1}},
};

const std::map<TELIX_JS_SI_PARENTALRATING_HANDLE, Rating> ratings{
    {301, {"12", "dvb-si", "", 9, 1}},
    {302, {"FSK 16", "fsk", "de", 3, 0}},
};

// What the browser's thread and those of the answers share.
std::mutex guard;
std::map<TELIX_JS_CM_HANDLE, Channel> channels{
    {11, {0, 1, 10, 101, "One", "dsd one"}},
    {12, {1, 1, 10, 102, "Two", ""}},
    {13, {2, 2, 20, 103, "Three", ""}},
};
TELIX_JS_CM_HANDLE channelList[]{11, 12, 13};
TELIX_JS_CM_HANDLE currentChannel = 11;
std::string callsSinceTheLastRecord;

// What the browser's thread alone touches. The library keeps what it gives out.
std::map<TELIX_JS_SI_HANDLE, Programme> programmes{
    {201, {"News", "What has happened", "11", 1700000000, 1800, {301}}},
    {guardedProgramme, {"Film", "", "12", 1700001800, 5400, {302}}},
};
TELIX_JS_SI_HANDLE programmeList[]{201, guardedProgramme};
std::map<TELIX_JS_AVCOMPTYPE, std::vector<TELIX_JS_AVCOMPHANDLE>> componentLists{
    {0, {501}}, {1, {511, 512}}, {2, {521}}};
std::map<TELIX_JS_AVCOMPTYPE, std::vector<TELIX_JS_AVCOMPHANDLE>> activeComponents{
    {0, {501}}, {1, {511}}, {2, {}}};
TELIX_JS_VB_HANDLE lastObject = 0;
TELIX_JS_CM_HANDLE lastMadeChannel = 1000;
TELIX_PLAYSTATE_ENUM_T playState = TELIX_PLAYSTATE_UNREALIZED;
bool channelListRefused = false;
bool currentChannelRefused = false;
std::string streamEventId, streamEventTag, streamEventName;

std::atomic<___UINT8> fullScreen{0};
std::atomic<TELIX_JS_VB_CHANNEL_CHANGE_CB> onChannelChange{nullptr};
std::atomic<TELIX_JS_VB_CHANNEL_ERROR_CB> onChannelError{nullptr};
std::atomic<TELIX_JS_VB_FULLSCREEN_CB> onFullScreen{nullptr};
std::atomic<TELIX_JS_VB_PLAYSTATE_CB> onPlayState{nullptr};
std::atomic<TELIX_JS_VB_PROGRAMMES_CB> onProgrammes{nullptr};
std::atomic<TELIX_JS_VB_PARENTAL_RATING_CB> onRatingChange{nullptr};
std::atomic<TELIX_JS_VB_PARENTAL_RATING_CB> onRatingError{nullptr};
std::atomic<TELIX_JS_VB_STREAM_EVENT_CB> onStreamEvent{nullptr};

// Calls back from another thread, unless the registration has been given up by then.
template <class Callback, class... Arguments>
void report(const std::atomic<Callback>& registered, Arguments... arguments) {
    std::thread([&registered, arguments...] {
        if (Callback callback = registered) {
            callback(arguments...);
        }
    }).detach();
}

___UINT8* bytes(const char* text) {
    // The callbacks only read it.
    return reinterpret_cast<___UINT8*>(const_cast<char*>(text));
}

TELIX_RETCODE_ENUM_T give(char** out, const std::string& text) {
    *out = strdup(text.c_str());
    return TELIX_RETCODE_SUCCESS;
}

// As stream events carry their payload.
std::string hexadecimal(const std::string& text) {
    static const char digits[] = "0123456789abcdef";
    std::string result;
    for (const char c : text) {
        result += digits[static_cast<unsigned char>(c) >> 4];
        result += digits[static_cast<unsigned char>(c) & 0xF];
    }
    return result;
}

// 0 if there is none.
TELIX_JS_CM_HANDLE listedChannel(uint32_t onid, uint32_t tsid, uint32_t sid) {
    std::lock_guard<std::mutex> lock(guard);
    for (TELIX_JS_CM_HANDLE handle : channelList) {
        const Channel& channel = channels.at(handle);
        if (channel.onid == onid && (channel.tsid == tsid || tsid == 8191) && channel.sid == sid) {
            return handle;
        }
    }
    return 0;
}

bool isListed(TELIX_JS_CM_HANDLE channel) {
    return std::find(std::begin(channelList), std::end(channelList), channel) != std::end(channelList);
}

TELIX_JS_CM_HANDLE makeChannel(Channel channel) {
    std::lock_guard<std::mutex> lock(guard);
    channels.emplace(++lastMadeChannel, std::move(channel));
    return lastMadeChannel;
}

TELIX_RETCODE_ENUM_T tune(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel) {
    std::thread([object, channel] {
        if (!isListed(channel)) {
            if (auto callback = onChannelError.load()) {
                callback(object, channel, unknownChannel);
            }
            return;
        }
        {
            std::lock_guard<std::mutex> lock(guard);
            currentChannel = channel;
        }
        if (auto callback = onChannelChange.load()) {
            callback(object, channel);
        }
    }).detach();
    return TELIX_RETCODE_SUCCESS;
}

// Selects a neighbour in the list at once, as both calls promise; the tuning itself follows.
TELIX_RETCODE_ENUM_T step(TELIX_JS_VB_HANDLE object, std::size_t distance, TELIX_JS_CM_HANDLE* channel) {
    {
        std::lock_guard<std::mutex> lock(guard);
        const std::size_t count = std::size(channelList);
        const auto here = static_cast<std::size_t>(
            std::find(std::begin(channelList), std::end(channelList), currentChannel) - channelList);
        currentChannel = channelList[(here + distance) % count];
        *channel = currentChannel;
    }
    return tune(object, *channel);
}

void happen(TELIX_JS_VB_HANDLE object, int32_t occurrence, int32_t argument) {
    const auto rating = static_cast<TELIX_JS_SI_PARENTALRATING_HANDLE>(argument);
    switch (occurrence) {
    case programmesChange:
        report(onProgrammes, object);
        break;
    case ratingChanges:
        report(onRatingChange, object, bytes("content-7"), rating, static_cast<___UINT8*>(nullptr));
        break;
    case ratingFails:
        report(onRatingError, object, static_cast<___UINT8*>(nullptr), rating,
               bytes("urn:dvb:casystemid:4096"));
        break;
    case streamEventComes:
        std::thread([object, name = streamEventName,
                     data = hexadecimal("id " + streamEventId + " tag " + streamEventTag)] {
            if (auto callback = onStreamEvent.load()) {
                callback(object, nullptr, nullptr, bytes(name.c_str()), bytes(data.c_str()),
                         static_cast<___UINT32>(data.size()), bytes("trigger"));
            }
        }).detach();
        break;
    case playStateFails:
        report(onPlayState, object, 0U, argument, unknownChannel);
        break;
    case channelListFails:
        channelListRefused = true;
        break;
    case currentChannelGoes:
        currentChannelRefused = true;
        break;
    default:
        std::fprintf(stderr, "occurrence %d does not exist\n", occurrence);
    }
}

void scriptChannels(RecordingPlatform& platform) {
    platform.TELIX_JS_CM_GetChannelList = [](uint32_t* count, TELIX_JS_CM_HANDLE** list) {
        if (std::exchange(channelListRefused, false)) {
            return refused;
        }
        *count = std::size(channelList);
        *list = channelList;
        return TELIX_RETCODE_ENUM_T{TELIX_RETCODE_SUCCESS};
    };
    platform.TELIX_JS_CM_GetChannelByTriplet = [](uint32_t onid, uint32_t tsid, uint32_t sid,
                                                  TELIX_JS_CM_HANDLE* channel) {
        *channel = listedChannel(onid, tsid, sid);
        return *channel == 0 ? refused : TELIX_RETCODE_SUCCESS;
    };
    const auto read = [](auto& call, auto deliver) {
        call = [deliver](TELIX_JS_CM_HANDLE handle, auto* out) {
            std::lock_guard<std::mutex> lock(guard);
            const auto found = channels.find(handle);
            if (found == channels.end()) {
                return refused;
            }
            deliver(found->second, out);
            return TELIX_RETCODE_ENUM_T{TELIX_RETCODE_SUCCESS};
        };
    };
    read(platform.TELIX_JS_CM_GetChannelType,
         [](const Channel& channel, int32_t* out) { *out = channel.type; });
    read(platform.TELIX_JS_CM_GetOnid, [](const Channel& channel, uint32_t* out) { *out = channel.onid; });
    read(platform.TELIX_JS_CM_GetTsid, [](const Channel& channel, uint32_t* out) { *out = channel.tsid; });
    read(platform.TELIX_JS_CM_GetSid, [](const Channel& channel, uint32_t* out) { *out = channel.sid; });
    read(platform.TELIX_JS_CM_GetName, [](const Channel& channel, char** out) { give(out, channel.name); });
    read(platform.TELIX_JS_CM_GetDsd,
         [](const Channel& channel, char** out) { give(out, channel.descriptor); });
}

void scriptTuning(RecordingPlatform& platform) {
    platform.TELIX_JS_VB_GetHandle = [](TELIX_JS_VB_HANDLE* object) {
        *object = ++lastObject;
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_VB_GetCurrentChannel = [](TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE* channel) {
        std::lock_guard<std::mutex> lock(guard);
        *channel = currentChannel;
        return std::exchange(currentChannelRefused, false) ? refused : TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_VB_SetChannel = [](TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel, ___UINT8) {
        return tune(object, channel);
    };
    platform.TELIX_JS_VB_SetChannelByTriplet = [](TELIX_JS_VB_HANDLE object, int32_t onid, int32_t tsid,
                                                  int32_t sid) {
        if (onid == occurrenceNetwork) {
            happen(object, tsid, sid);
            return TELIX_RETCODE_ENUM_T{TELIX_RETCODE_SUCCESS};
        }
        return tune(object, listedChannel(static_cast<uint32_t>(onid), static_cast<uint32_t>(tsid),
                                          static_cast<uint32_t>(sid)));
    };
    platform.TELIX_JS_VB_NextChannel = [](TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE* channel) {
        return step(object, 1, channel);
    };
    platform.TELIX_JS_VB_PrevChannel = [](TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE* channel) {
        return step(object, std::size(channelList) - 1, channel);
    };
    platform.TELIX_JS_VB_BindToCurrChannel = [](TELIX_JS_VB_HANDLE object) {
        std::unique_lock<std::mutex> lock(guard);
        const TELIX_JS_CM_HANDLE channel = currentChannel;
        lock.unlock();
        return tune(object, channel);
    };
    platform.TELIX_JS_VB_CreateChannelObjectByTriplet = [](TELIX_JS_VB_HANDLE, ___UINT8, uint32_t onid,
                                                           uint32_t tsid, uint32_t sid,
                                                           TELIX_JS_CM_HANDLE* channel) {
        if (onid == recordNetwork) {
            std::unique_lock<std::mutex> lock(guard);
            std::string calls = std::exchange(callsSinceTheLastRecord, "");
            lock.unlock();
            *channel = makeChannel({0, onid, tsid, sid, std::move(calls), ""});
        } else {
            *channel = listedChannel(onid, tsid, sid);
        }
        return *channel == 0 ? refused : TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_VB_CreateChannelObjectByDsd = [](TELIX_JS_VB_HANDLE, ___UINT8, const ___UINT8*,
                                                       uint32_t, uint32_t sid, TELIX_JS_CM_HANDLE* channel) {
        *channel = makeChannel({0, 0, 0, sid, "Made by descriptor", "dsd"});
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_VB_SetFullScreen = [](TELIX_JS_VB_HANDLE object, ___UINT8 wanted) {
        fullScreen = wanted;
        report(onFullScreen, object);
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_VB_IsFullScreen = [](TELIX_JS_VB_HANDLE, ___UINT8* out) {
        *out = fullScreen;
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_VB_SetPlayBackState = [](TELIX_JS_VB_HANDLE object, TELIX_PLAYSTATE_ENUM_T state) {
        playState = state;
        report(onPlayState, object, 0U, state, TELIX_ERR_STATE_ENUM_T{TELIX_ERR_STATE_NONE});
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_VB_GetPlayBackState = [](TELIX_JS_VB_HANDLE, TELIX_PLAYSTATE_ENUM_T* state) {
        *state = playState;
        return TELIX_RETCODE_SUCCESS;
    };
}

void scriptEvents(RecordingPlatform& platform) {
    const auto take = [](auto& registration, auto& removal, auto& place) {
        registration = [&place](auto callback) {
            place = callback;
            return TELIX_RETCODE_SUCCESS;
        };
        removal = [&place](auto) {
            place = nullptr;
            return TELIX_RETCODE_SUCCESS;
        };
    };
    const auto takeWithObject = [](auto& registration, auto& removal, auto& place) {
        registration = [&place](TELIX_JS_VB_HANDLE, auto callback) {
            place = callback;
            return TELIX_RETCODE_SUCCESS;
        };
        removal = [&place](auto) {
            place = nullptr;
            return TELIX_RETCODE_SUCCESS;
        };
    };
    take(platform.TELIX_JS_VB_RegisterOnChannelChangeSucceeded,
         platform.TELIX_JS_VB_UnRegisterOnChannelChangeSucceeded, onChannelChange);
    take(platform.TELIX_JS_VB_RegisterOnChannelChangeError,
         platform.TELIX_JS_VB_UnRegisterOnChannelChangeError, onChannelError);
    take(platform.TELIX_JS_VB_RegisterOnFullScreenChange, platform.TELIX_JS_VB_UnRegisterOnFullScreenChange,
         onFullScreen);
    take(platform.TELIX_JS_VB_RegisterOnPlayStateChange, platform.TELIX_JS_VB_UnRegisterOnPlayStateChange,
         onPlayState);
    takeWithObject(platform.TELIX_JS_VB_RegisterOnProgrammesChanged,
                   platform.TELIX_JS_VB_UnRegisterOnProgrammesChanged, onProgrammes);
    takeWithObject(platform.TELIX_JS_VB_RegisterOnParentalRatingChange,
                   platform.TELIX_JS_VB_UnRegisterOnParentalRatingChange, onRatingChange);
    takeWithObject(platform.TELIX_JS_VB_RegisterOnParentalRatingError,
                   platform.TELIX_JS_VB_UnRegisterOnParentalRatingError, onRatingError);
    platform.TELIX_JS_VB_RegisterStreamEvent = [](TELIX_JS_VB_HANDLE, TELIX_JS_VB_STREAM_EVENT_CB callback,
                                                  const char* id, const char* tag, const char* name) {
        streamEventId = id;
        streamEventTag = tag;
        streamEventName = name;
        onStreamEvent = callback;
        return TELIX_RETCODE_SUCCESS;
    };
}

void scriptProgrammes(RecordingPlatform& platform) {
    platform.TELIX_JS_SI_GetProgrammeHandles = [](uint32_t* count, TELIX_JS_SI_HANDLE** list) {
        *count = std::size(programmeList);
        *list = programmeList;
        return TELIX_RETCODE_SUCCESS;
    };
    const auto write = [](auto& call, auto member) {
        call = [member](TELIX_JS_SI_HANDLE programme, auto value) {
            if (programme == guardedProgramme) {
                return refused;
            }
            programmes.at(programme).*member = value;
            return TELIX_RETCODE_ENUM_T{TELIX_RETCODE_SUCCESS};
        };
    };
    write(platform.TELIX_JS_SI_SetName, &Programme::name);
    write(platform.TELIX_JS_SI_SetDescription, &Programme::description);
    write(platform.TELIX_JS_SI_SetChannelID, &Programme::channelId);
    write(platform.TELIX_JS_SI_SetStartTime, &Programme::startTime);
    write(platform.TELIX_JS_SI_SetDuration, &Programme::duration);
    const auto readText = [](auto& call, std::string Programme::*member) {
        call = [member](TELIX_JS_SI_HANDLE programme, char** out, ___UINT8* length) {
            const std::string& text = programmes.at(programme).*member;
            *length = static_cast<___UINT8>(text.size());
            return text.empty() ? TELIX_RETCODE_SUCCESS : give(out, text);
        };
    };
    readText(platform.TELIX_JS_SI_GetName, &Programme::name);
    readText(platform.TELIX_JS_SI_GetDescription, &Programme::description);
    platform.TELIX_JS_SI_GetChannelID = [](TELIX_JS_SI_HANDLE programme, char** out) {
        return give(out, programmes.at(programme).channelId);
    };
    platform.TELIX_JS_SI_GetStartTime = [](TELIX_JS_SI_HANDLE programme, uint32_t* out) {
        *out = programmes.at(programme).startTime;
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_SI_GetDuration = [](TELIX_JS_SI_HANDLE programme, uint32_t* out) {
        *out = programmes.at(programme).duration;
        return TELIX_RETCODE_SUCCESS;
    };
}

void scriptRatings(RecordingPlatform& platform) {
    platform.TELIX_JS_SI_GetParentalRatingHandles = [](TELIX_JS_SI_HANDLE programme, uint32_t* count,
                                                       TELIX_JS_SI_PARENTALRATING_HANDLE** list) {
        auto& held = programmes.at(programme).ratings;
        *count = static_cast<uint32_t>(held.size());
        *list = held.data();
        return TELIX_RETCODE_SUCCESS;
    };
    const auto read = [](auto& call, auto deliver) {
        call = [deliver](TELIX_JS_SI_PARENTALRATING_HANDLE handle, auto* out) {
            const auto found = ratings.find(handle);
            if (found == ratings.end()) {
                return refused;
            }
            deliver(found->second, out);
            return TELIX_RETCODE_ENUM_T{TELIX_RETCODE_SUCCESS};
        };
    };
    read(platform.TELIX_JS_SI_PARENTALRATING_GetName,
         [](const Rating& rating, char** out) { give(out, rating.name); });
    read(platform.TELIX_JS_SI_PARENTALRATING_GetScheme,
         [](const Rating& rating, char** out) { give(out, rating.scheme); });
    read(platform.TELIX_JS_SI_PARENTALRATING_GetRegion,
         [](const Rating& rating, char** out) { give(out, rating.region); });
    read(platform.TELIX_JS_SI_PARENTALRATING_GetValue,
         [](const Rating& rating, int32_t* out) { *out = rating.value; });
    read(platform.TELIX_JS_SI_PARENTALRATING_GetLabels,
         [](const Rating& rating, int32_t* out) { *out = rating.labels; });
    platform.TELIX_JS_SI_PARENTALCONTROL_GetParentalRatingSchemes =
        [](uint32_t* count, PARENTALRATTINGSCHEME_STRUCT_T_TAG** list) {
            static char ageNames[][8]{"child", "adult"};
            static char noIcon[] = "";
            static char* ages[]{ageNames[0], ageNames[1]};
            static char* ageIcons[]{noIcon, noIcon};
            static char gradeNames[][8]{"FSK 0", "FSK 6", "FSK 16"};
            static char icon[] = "icons/fsk6.png";
            static char* grades[]{gradeNames[0], gradeNames[1], gradeNames[2]};
            static char* gradeIcons[]{noIcon, icon, noIcon};
            static char names[][8]{"dvb-si", "fsk", "DVB-SI"};
            static PARENTALRATTINGSCHEME_STRUCT_T_TAG schemes[]{
                {401, 2, names[0], ages, ageIcons},
                {402, 3, names[1], grades, gradeIcons},
                {403, 2, names[2], ages, ageIcons},
                {404, 2, nullptr, ages, ageIcons},
            };
            *count = std::size(schemes);
            *list = schemes;
            return TELIX_RETCODE_SUCCESS;
        };
    platform.TELIX_JS_SI_PARENTALRATINGSCHEME_GetThreshold =
        [](TELIX_JS_SI_PARENTALRATINGSCHEME_HANDLE scheme, int32_t* threshold) {
            *threshold = 12;
            return scheme == 401 ? TELIX_RETCODE_SUCCESS : refused;
        };
}

void scriptComponents(RecordingPlatform& platform) {
    const auto list = [](auto& call, auto& lists) {
        call = [&lists](TELIX_JS_VB_HANDLE, TELIX_JS_AVCOMPTYPE type, TELIX_JS_AVCOMPHANDLE** handles,
                        uint32_t* count) {
            static TELIX_JS_AVCOMPHANDLE none = 0;
            auto& held = lists[type];
            *handles = held.empty() ? &none : held.data();
            *count = static_cast<uint32_t>(held.size());
            return TELIX_RETCODE_SUCCESS;
        };
    };
    list(platform.TELIX_JS_VB_GetComponents, componentLists);
    list(platform.TELIX_JS_VB_GetCurrActiveComponents, activeComponents);
    platform.TELIX_JS_VB_SelectComponent = [](TELIX_JS_VB_HANDLE, TELIX_JS_AVCOMPHANDLE component,
                                              TELIX_JS_AVCOMPTYPE type) {
        activeComponents[type] = {component};
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_VB_UnselectComponent = [](TELIX_JS_VB_HANDLE, TELIX_JS_AVCOMPHANDLE,
                                                TELIX_JS_AVCOMPTYPE type) {
        activeComponents[type].clear();
        return TELIX_RETCODE_SUCCESS;
    };
    const auto text = [](auto& call, const char* Component::*member) {
        call = [member](TELIX_JS_AVCOMPHANDLE handle, TELIX_JS_AVCOMPTYPE, char** out) {
            return give(out, components.at(handle).*member);
        };
    };
    text(platform.TELIX_JS_VB_AVComponent_GetEncoding, &Component::encoding);
    text(platform.TELIX_JS_VB_AVComponent_GetLanguage, &Component::language);
    const auto number = [](auto& call, auto member) {
        call = [member](TELIX_JS_AVCOMPHANDLE handle, TELIX_JS_AVCOMPTYPE, auto* out) {
            *out = components.at(handle).*member;
            return TELIX_RETCODE_SUCCESS;
        };
    };
    number(platform.TELIX_JS_VB_AVComponent_GetEncrypted, &Component::encrypted);
    number(platform.TELIX_JS_VB_AVComponent_GetAspectRatio, &Component::aspectRatio);
    number(platform.TELIX_JS_VB_AVComponent_GetAudioDescription, &Component::audioDescription);
    number(platform.TELIX_JS_VB_AVComponent_GetAudioChannels, &Component::audioChannels);
    number(platform.TELIX_JS_VB_AVComponent_GetHearingImpaired, &Component::hearingImpaired);
}

const bool scenario = [] {
    RecordingPlatform& platform = *telix_recording_platform();
    platform.onCall = [](const std::string& call) {
        std::lock_guard<std::mutex> lock(guard);
        callsSinceTheLastRecord += call + "\n";
    };
    scriptChannels(platform);
    scriptTuning(platform);
    scriptEvents(platform);
    scriptProgrammes(platform);
    scriptRatings(platform);
    scriptComponents(platform);
    return true;
}();

} // namespace

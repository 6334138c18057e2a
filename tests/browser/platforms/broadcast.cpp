// A platform with three channels, two programmes, components and parental rating schemes. It completes every
// request later, on a thread of its own, and makes the record of its calls available to the page.
//
// Two original network ids have a special meaning. The name of a channel created from a triplet of
// kRecordNetwork is the list of calls since the previous such channel, one per line. Tuning to a triplet of
// kEventNetwork triggers the event that the transport stream id stands for (see Event), with the service id
// as its argument.
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

constexpr TELIX_RETCODE_ENUM_T kError = 1;
constexpr uint32_t kRecordNetwork = 0xFFFF;
constexpr int32_t kEventNetwork = 0xFFFE;
constexpr uint32_t kAnyTransportStream = 8191;
constexpr TELIX_ERR_STATE_ENUM_T kUnknownChannel = 5;
constexpr TELIX_JS_SI_HANDLE kReadOnlyProgramme = 202; // rejects what pages write

enum class Event {
    ProgrammesChange = 1,
    RatingChange = 2,       // the argument is the handle of the rating
    RatingError = 3,        // likewise
    StreamEvent = 4,        // the one that was registered last
    PlayStateError = 5,     // the argument is the new play state
    ChannelListError = 6,   // of the next request
    CurrentChannelError = 7 // of the next request
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

const std::map<TELIX_JS_AVCOMPHANDLE, Component> kComponents{
    {501, {0, "video/mpeg", "", 1.7777778F, 0, 1, 0, 0}},
    {511, {1, "audio/mpeg", "eng", 0, 2, 0, 0, 0}},
    {512, {1, "audio/mp4", "deu", 0, 6, 0, 1, 0}},
    {521, {2, "", "fra", 0, 0, 0, 0, 1}},
};

const std::map<TELIX_JS_SI_PARENTALRATING_HANDLE, Rating> kRatings{
    {301, {"12", "dvb-si", "", 9, 1}},
    {302, {"FSK 16", "fsk", "de", 3, 0}},
};

// Shared by the browser thread and the threads that complete requests.
std::mutex mutex;
std::map<TELIX_JS_CM_HANDLE, Channel> channels{
    {11, {0, 1, 10, 101, "One", "dsd one"}},
    {12, {1, 1, 10, 102, "Two", ""}},
    {13, {2, 2, 20, 103, "Three", ""}},
};
TELIX_JS_CM_HANDLE channelList[]{11, 12, 13};
TELIX_JS_CM_HANDLE currentChannel = 11;
std::string recordedCalls;

// Accessed by the browser thread only. The library owns the lists that it returns.
std::map<TELIX_JS_SI_HANDLE, Programme> programmes{
    {201, {"News", "What has happened", "11", 1700000000, 1800, {301}}},
    {kReadOnlyProgramme, {"Film", "", "12", 1700001800, 5400, {302}}},
};
TELIX_JS_SI_HANDLE programmeList[]{201, kReadOnlyProgramme};
std::map<TELIX_JS_AVCOMPTYPE, std::vector<TELIX_JS_AVCOMPHANDLE>> componentLists{
    {0, {501}}, {1, {511, 512}}, {2, {521}}};
std::map<TELIX_JS_AVCOMPTYPE, std::vector<TELIX_JS_AVCOMPHANDLE>> activeComponents{
    {0, {501}}, {1, {511}}, {2, {}}};
TELIX_JS_VB_HANDLE lastObject = 0;
TELIX_JS_CM_HANDLE lastMadeChannel = 1000;
TELIX_PLAYSTATE_ENUM_T playState = TELIX_PLAYSTATE_UNREALIZED;
bool channelListFails = false;
bool currentChannelFails = false;
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

// Runs the callback on another thread, unless it has been unregistered by then.
template <class Callback, class... Arguments>
void report(const std::atomic<Callback>& registered, Arguments... arguments) {
    std::thread([&registered, arguments...] {
        if (Callback callback = registered) {
            callback(arguments...);
        }
    }).detach();
}

___UINT8* bytes(const char* text) {
    // The callbacks do not write to it.
    return reinterpret_cast<___UINT8*>(const_cast<char*>(text));
}

TELIX_RETCODE_ENUM_T returnString(char** out, const std::string& text) {
    *out = strdup(text.c_str());
    return TELIX_RETCODE_SUCCESS;
}

// The form in which stream events carry their payload.
std::string hexadecimal(const std::string& text) {
    static const char kDigits[] = "0123456789abcdef";
    std::string result;
    for (const char c : text) {
        result += kDigits[static_cast<unsigned char>(c) >> 4];
        result += kDigits[static_cast<unsigned char>(c) & 0xF];
    }
    return result;
}

// The handle of the channel; 0 if there is none.
TELIX_JS_CM_HANDLE listedChannel(uint32_t onid, uint32_t tsid, uint32_t sid) {
    std::lock_guard<std::mutex> lock(mutex);
    for (TELIX_JS_CM_HANDLE handle : channelList) {
        const Channel& channel = channels.at(handle);
        if (channel.onid == onid && (channel.tsid == tsid || tsid == kAnyTransportStream) &&
            channel.sid == sid) {
            return handle;
        }
    }
    return 0;
}

bool isListed(TELIX_JS_CM_HANDLE channel) {
    return std::find(std::begin(channelList), std::end(channelList), channel) != std::end(channelList);
}

TELIX_JS_CM_HANDLE makeChannel(Channel channel) {
    std::lock_guard<std::mutex> lock(mutex);
    channels.emplace(++lastMadeChannel, std::move(channel));
    return lastMadeChannel;
}

TELIX_RETCODE_ENUM_T tune(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel) {
    std::thread([object, channel] {
        if (!isListed(channel)) {
            if (auto callback = onChannelError.load()) {
                callback(object, channel, kUnknownChannel);
            }
            return;
        }
        {
            std::lock_guard<std::mutex> lock(mutex);
            currentChannel = channel;
        }
        if (auto callback = onChannelChange.load()) {
            callback(object, channel);
        }
    }).detach();
    return TELIX_RETCODE_SUCCESS;
}

// Selects another channel of the list synchronously, as both calls require, and tunes to it later.
TELIX_RETCODE_ENUM_T step(TELIX_JS_VB_HANDLE object, std::size_t offset, TELIX_JS_CM_HANDLE* channel) {
    {
        std::lock_guard<std::mutex> lock(mutex);
        const std::size_t count = std::size(channelList);
        const auto index = static_cast<std::size_t>(
            std::find(std::begin(channelList), std::end(channelList), currentChannel) - channelList);
        currentChannel = channelList[(index + offset) % count];
        *channel = currentChannel;
    }
    return tune(object, *channel);
}

void trigger(TELIX_JS_VB_HANDLE object, Event event, int32_t argument) {
    const auto rating = static_cast<TELIX_JS_SI_PARENTALRATING_HANDLE>(argument);
    switch (event) {
    case Event::ProgrammesChange:
        report(onProgrammes, object);
        break;
    case Event::RatingChange:
        report(onRatingChange, object, bytes("content-7"), rating, static_cast<___UINT8*>(nullptr));
        break;
    case Event::RatingError:
        report(onRatingError, object, static_cast<___UINT8*>(nullptr), rating,
               bytes("urn:dvb:casystemid:4096"));
        break;
    case Event::StreamEvent:
        std::thread([object, name = streamEventName,
                     data = hexadecimal("id " + streamEventId + " tag " + streamEventTag)] {
            if (auto callback = onStreamEvent.load()) {
                callback(object, nullptr, nullptr, bytes(name.c_str()), bytes(data.c_str()),
                         static_cast<___UINT32>(data.size()), bytes("trigger"));
            }
        }).detach();
        break;
    case Event::PlayStateError:
        report(onPlayState, object, 0U, argument, kUnknownChannel);
        break;
    case Event::ChannelListError:
        channelListFails = true;
        break;
    case Event::CurrentChannelError:
        currentChannelFails = true;
        break;
    default:
        std::fprintf(stderr, "event %d does not exist\n", static_cast<int>(event));
    }
}

void scriptChannels(RecordingPlatform& platform) {
    platform.TELIX_JS_CM_GetChannelList = [](uint32_t* count, TELIX_JS_CM_HANDLE** list) {
        if (std::exchange(channelListFails, false)) {
            return kError;
        }
        *count = std::size(channelList);
        *list = channelList;
        return TELIX_RETCODE_ENUM_T{TELIX_RETCODE_SUCCESS};
    };
    platform.TELIX_JS_CM_GetChannelByTriplet = [](uint32_t onid, uint32_t tsid, uint32_t sid,
                                                  TELIX_JS_CM_HANDLE* channel) {
        *channel = listedChannel(onid, tsid, sid);
        return *channel == 0 ? kError : TELIX_RETCODE_SUCCESS;
    };
    const auto read = [](auto& call, auto deliver) {
        call = [deliver](TELIX_JS_CM_HANDLE handle, auto* out) {
            std::lock_guard<std::mutex> lock(mutex);
            const auto found = channels.find(handle);
            if (found == channels.end()) {
                return kError;
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
    read(platform.TELIX_JS_CM_GetName,
         [](const Channel& channel, char** out) { returnString(out, channel.name); });
    read(platform.TELIX_JS_CM_GetDsd,
         [](const Channel& channel, char** out) { returnString(out, channel.descriptor); });
}

void scriptTuning(RecordingPlatform& platform) {
    platform.TELIX_JS_VB_GetHandle = [](TELIX_JS_VB_HANDLE* object) {
        *object = ++lastObject;
        return TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_VB_GetCurrentChannel = [](TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE* channel) {
        std::lock_guard<std::mutex> lock(mutex);
        *channel = currentChannel;
        return std::exchange(currentChannelFails, false) ? kError : TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_VB_SetChannel = [](TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel, ___UINT8) {
        return tune(object, channel);
    };
    platform.TELIX_JS_VB_SetChannelByTriplet = [](TELIX_JS_VB_HANDLE object, int32_t onid, int32_t tsid,
                                                  int32_t sid) {
        if (onid == kEventNetwork) {
            trigger(object, static_cast<Event>(tsid), sid);
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
        std::unique_lock<std::mutex> lock(mutex);
        const TELIX_JS_CM_HANDLE channel = currentChannel;
        lock.unlock();
        return tune(object, channel);
    };
}

void scriptChannelObjects(RecordingPlatform& platform) {
    platform.TELIX_JS_VB_CreateChannelObjectByTriplet = [](TELIX_JS_VB_HANDLE, ___UINT8, uint32_t onid,
                                                           uint32_t tsid, uint32_t sid,
                                                           TELIX_JS_CM_HANDLE* channel) {
        if (onid == kRecordNetwork) {
            std::unique_lock<std::mutex> lock(mutex);
            std::string calls = std::exchange(recordedCalls, "");
            lock.unlock();
            *channel = makeChannel({0, onid, tsid, sid, std::move(calls), ""});
        } else {
            *channel = listedChannel(onid, tsid, sid);
        }
        return *channel == 0 ? kError : TELIX_RETCODE_SUCCESS;
    };
    platform.TELIX_JS_VB_CreateChannelObjectByDsd = [](TELIX_JS_VB_HANDLE, ___UINT8, const ___UINT8*,
                                                       uint32_t, uint32_t sid, TELIX_JS_CM_HANDLE* channel) {
        *channel = makeChannel({0, 0, 0, sid, "Made by descriptor", "dsd"});
        return TELIX_RETCODE_SUCCESS;
    };
}

void scriptPresentation(RecordingPlatform& platform) {
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
            if (programme == kReadOnlyProgramme) {
                return kError;
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
            return text.empty() ? TELIX_RETCODE_SUCCESS : returnString(out, text);
        };
    };
    readText(platform.TELIX_JS_SI_GetName, &Programme::name);
    readText(platform.TELIX_JS_SI_GetDescription, &Programme::description);
    platform.TELIX_JS_SI_GetChannelID = [](TELIX_JS_SI_HANDLE programme, char** out) {
        return returnString(out, programmes.at(programme).channelId);
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
            const auto found = kRatings.find(handle);
            if (found == kRatings.end()) {
                return kError;
            }
            deliver(found->second, out);
            return TELIX_RETCODE_ENUM_T{TELIX_RETCODE_SUCCESS};
        };
    };
    read(platform.TELIX_JS_SI_PARENTALRATING_GetName,
         [](const Rating& rating, char** out) { returnString(out, rating.name); });
    read(platform.TELIX_JS_SI_PARENTALRATING_GetScheme,
         [](const Rating& rating, char** out) { returnString(out, rating.scheme); });
    read(platform.TELIX_JS_SI_PARENTALRATING_GetRegion,
         [](const Rating& rating, char** out) { returnString(out, rating.region); });
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
            return scheme == 401 ? TELIX_RETCODE_SUCCESS : kError;
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
            return returnString(out, kComponents.at(handle).*member);
        };
    };
    text(platform.TELIX_JS_VB_AVComponent_GetEncoding, &Component::encoding);
    text(platform.TELIX_JS_VB_AVComponent_GetLanguage, &Component::language);
    const auto number = [](auto& call, auto member) {
        call = [member](TELIX_JS_AVCOMPHANDLE handle, TELIX_JS_AVCOMPTYPE, auto* out) {
            *out = kComponents.at(handle).*member;
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
        std::lock_guard<std::mutex> lock(mutex);
        recordedCalls += call + "\n";
    };
    scriptChannels(platform);
    scriptTuning(platform);
    scriptChannelObjects(platform);
    scriptPresentation(platform);
    scriptEvents(platform);
    scriptProgrammes(platform);
    scriptRatings(platform);
    scriptComponents(platform);
    return true;
}();

} // namespace

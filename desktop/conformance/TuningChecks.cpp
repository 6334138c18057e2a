// Tuning, and what is known of the channel that is presented. The checks share one object, which the first
// one tunes.
#include <algorithm>
#include <cstdlib>
#include <glib.h>
#include <mutex>
#include <set>

#include "desktop/conformance/BroadcastFixture.h"
#include "desktop/conformance/CheckGroup.h"

namespace desktop {

namespace {

using std::chrono::milliseconds;

// How long a channel change without listeners is given to finish.
constexpr milliseconds kSilentTuneTime{3000};

// ---- Events

struct Event {
    enum class Kind { ChannelChange, ChannelError };

    Kind kind;
    TELIX_JS_VB_HANDLE object;
    TELIX_JS_CM_HANDLE channel;
};
std::mutex eventsMutex;
std::vector<Event> events; // guarded by eventsMutex

TELIX_RETCODE_ENUM_T record(const Event& event) {
    std::lock_guard<std::mutex> lock(eventsMutex);
    events.push_back(event);
    return 0;
}
TELIX_RETCODE_ENUM_T onChange(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel) {
    return record({Event::Kind::ChannelChange, object, channel});
}
TELIX_RETCODE_ENUM_T onError(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel, TELIX_ERR_STATE_ENUM_T) {
    return record({Event::Kind::ChannelError, object, channel});
}
TELIX_RETCODE_ENUM_T onPlayState(TELIX_JS_VB_HANDLE, uint32_t, TELIX_PLAYSTATE_ENUM_T,
                                 TELIX_ERR_STATE_ENUM_T) {
    return 0;
}
TELIX_RETCODE_ENUM_T onObjectEvent(TELIX_JS_VB_HANDLE) {
    return 0;
}
TELIX_RETCODE_ENUM_T onRating(TELIX_JS_VB_HANDLE, ___UINT8*, TELIX_JS_SI_PARENTALRATING_HANDLE, ___UINT8*) {
    return 0;
}

bool hasEvent(const std::function<bool(const Event& event)>& matches) {
    std::lock_guard<std::mutex> lock(eventsMutex);
    return std::any_of(events.begin(), events.end(), matches);
}

bool hasAnyEvent() {
    return hasEvent([](const Event&) { return true; });
}

void clearEvents() {
    std::lock_guard<std::mutex> lock(eventsMutex);
    events.clear();
}

// ---- The object under test

TELIX_JS_VB_HANDLE tunedObject = 0;
bool isPresented = false;

void requirePresentation() {
    if (!isPresented) {
        throw CheckSkipped{"no channel is presented"};
    }
}

// Tunes and waits for the outcome. Returns whether the channel is presented; otherwise an error was reported.
bool tune(const CheckContext& context, TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel) {
    clearEvents();
    const auto begin = std::chrono::steady_clock::now();
    expect(context.library.TELIX_JS_VB_SetChannel(object, channel, 0) == 0, "the request is refused");
    expect(std::chrono::steady_clock::now() - begin < kMaxRequestDuration,
           "the request waits for its outcome");
    const auto isOutcome = [&](const Event& event) {
        return event.object == object && event.channel == channel;
    };
    expect(context.waitUntil([&] { return hasEvent(isOutcome); }),
           "neither a change nor an error is reported for object " + std::to_string(object) +
               " and channel " + std::to_string(channel));
    return hasEvent(
        [&](const Event& event) { return isOutcome(event) && event.kind == Event::Kind::ChannelChange; });
}

// ---- Programmes

using ProgrammeString = TELIX_RETCODE_ENUM_T (*)(TELIX_JS_SI_HANDLE, char**, ___UINT8*);

// These strings have a length and need not be terminated.
void checkProgrammeString(ProgrammeString function, TELIX_JS_SI_HANDLE programme) {
    char* first = nullptr;
    char* second = nullptr;
    ___UINT8 length = 0;
    ___UINT8 secondLength = 0;
    if (!function || function(programme, &first, &length) != 0 || length == 0) {
        return;
    }
    expect(first != nullptr, "a string with a length is null");
    function(programme, &second, &secondLength);
    expect(first != second, "a string is the same block twice");
    const bool isValid = g_utf8_validate(first, length, nullptr) != FALSE;
    std::free(first);
    std::free(second);
    expect(isValid, "a string is not valid UTF-8");
}

void checkRating(const Library& library, TELIX_JS_SI_PARENTALRATING_HANDLE rating) {
    constexpr int32_t kFirstPattern = 0x5A5A5A5A;
    constexpr int32_t kSecondPattern = 0x25A5A5A5;
    for (auto* function :
         {library.TELIX_JS_SI_PARENTALRATING_GetName, library.TELIX_JS_SI_PARENTALRATING_GetScheme,
          library.TELIX_JS_SI_PARENTALRATING_GetRegion}) {
        checkStringOf("a string of a rating", function, rating);
    }
    for (auto* function :
         {library.TELIX_JS_SI_PARENTALRATING_GetValue, library.TELIX_JS_SI_PARENTALRATING_GetLabels}) {
        int32_t first = kFirstPattern;
        int32_t second = kSecondPattern;
        if (function && function(rating, &first) == 0) {
            expect(function(rating, &second) == 0 && first == second, "a number of a rating is not written");
        }
    }
}

void checkRatings(const Library& library, TELIX_JS_SI_HANDLE programme) {
    uint32_t count = 0;
    TELIX_JS_SI_PARENTALRATING_HANDLE* handles = nullptr;
    if (!library.TELIX_JS_SI_GetParentalRatingHandles ||
        library.TELIX_JS_SI_GetParentalRatingHandles(programme, &count, &handles) != 0) {
        return;
    }
    expect(count == 0 || handles, "the array of ratings is null");
    // A copy, because further calls may invalidate the array.
    for (const uint32_t rating : std::vector<uint32_t>(handles, handles + count)) {
        checkRating(library, rating);
    }
}

void checkProgrammes(const CheckContext& context) {
    requirePresentation();
    const Library& library = context.library;
    uint32_t count = 0;
    TELIX_JS_SI_HANDLE* handles = nullptr;
    const auto hasProgrammes = [&] {
        return library.TELIX_JS_SI_GetProgrammeHandles(&count, &handles) == 0 && count > 0;
    };
    if (!context.waitUntil(hasProgrammes)) {
        throw CheckSkipped{"the channel has none"};
    }
    expect(handles != nullptr, "the array is null");
    for (const TELIX_JS_SI_HANDLE programme : std::vector<TELIX_JS_SI_HANDLE>(handles, handles + count)) {
        checkProgrammeString(library.TELIX_JS_SI_GetName, programme);
        checkProgrammeString(library.TELIX_JS_SI_GetDescription, programme);
        checkStringOf("TELIX_JS_SI_GetChannelID", library.TELIX_JS_SI_GetChannelID, programme);
        checkRatings(library, programme);
    }
}

// ---- Components

void checkComponentsOf(const Library& library, TELIX_JS_AVCOMPTYPE type) {
    uint32_t count = 0;
    TELIX_JS_AVCOMPHANDLE* handles = nullptr;
    if (library.TELIX_JS_VB_GetComponents(tunedObject, type, &handles, &count) != 0) {
        return;
    }
    expect(handles != nullptr, "the array of type " + std::to_string(type) + " is null");
    const std::set<uint32_t> components(handles, handles + count);
    expect(components.size() == count, "a component is listed twice");
    uint32_t activeCount = 0;
    TELIX_JS_AVCOMPHANDLE* active = nullptr;
    if (library.TELIX_JS_VB_GetCurrActiveComponents(tunedObject, type, &active, &activeCount) == 0) {
        expect(active != nullptr, "the array of active components is null");
        for (uint32_t index = 0; index < activeCount; ++index) {
            expect(components.count(active[index]) != 0, "an active component is not one of all");
        }
    }
    for (const uint32_t component : components) {
        for (auto* function :
             {library.TELIX_JS_VB_AVComponent_GetEncoding, library.TELIX_JS_VB_AVComponent_GetLanguage}) {
            if (function) {
                checkedString("a string of a component",
                              [&](char** string) { return function(component, type, string); });
            }
        }
    }
}

void checkComponents(const CheckContext& context) {
    requirePresentation();
    for (const TELIX_JS_AVCOMPTYPE type : {0U, 1U, 2U, 3U, 77U, 0xFFFFFFFFU}) {
        checkComponentsOf(context.library, type);
    }
}

// ---- Channel changes

void checkTune(const CheckContext& context) {
    tunedObject = newObject(context);
    context.library.TELIX_JS_VB_RegisterOnChannelChangeSucceeded(onChange);
    context.library.TELIX_JS_VB_RegisterOnChannelChangeError(onError);
    isPresented = tune(context, tunedObject, firstChannel(context));
}

void checkCurrentChannel(const CheckContext& context) {
    requirePresentation();
    TELIX_JS_CM_HANDLE channel = 0;
    expect(context.library.TELIX_JS_VB_GetCurrentChannel(tunedObject, &channel) == 0, "it has none");
    expect(channel == firstChannel(context), "it has another one");
}

void checkNextChannel(const CheckContext& context) {
    requirePresentation();
    const auto channels = channelsOf(context);
    if (channels.size() < 2) {
        throw CheckSkipped{"there is only one channel"};
    }
    clearEvents();
    TELIX_JS_CM_HANDLE before = 0;
    expect(context.library.TELIX_JS_VB_NextChannel(tunedObject, &before) == 0, "it is refused");
    expect(before == channels[0], "it returns another channel");
    expect(context.waitUntil(
               [] { return hasEvent([](const Event& each) { return each.object == tunedObject; }); }),
           "no outcome is reported");
}

void checkEventObject(const CheckContext& context) {
    requirePresentation();
    const TELIX_JS_VB_HANDLE other = newObject(context);
    tune(context, other, firstChannel(context));
    expect(!hasEvent([&](const Event& event) {
        return event.kind == Event::Kind::ChannelChange && event.object != other;
    }),
           "the change is reported for another object");
}

void checkUnknownChannel(const CheckContext& context) {
    clearEvents();
    const auto isError = [](const Event& event) { return event.kind == Event::Kind::ChannelError; };
    for (const TELIX_JS_CM_HANDLE channel : {0x7FFFFFF1U, 0xFFFFFFFFU}) {
        if (context.library.TELIX_JS_VB_SetChannel(tunedObject, channel, 0) == 0) {
            expect(context.waitUntil([&] { return hasEvent(isError); }), "nothing is reported");
        }
    }
    expect(!hasEvent([](const Event& event) { return event.kind == Event::Kind::ChannelChange; }),
           "a change is reported");
}

void checkUnregistered(const CheckContext& context) {
    requirePresentation();
    const Library& library = context.library;
    tune(context, tunedObject, firstChannel(context));
    library.TELIX_JS_VB_UnRegisterOnChannelChangeSucceeded(onChange);
    library.TELIX_JS_VB_UnRegisterOnChannelChangeError(onError);
    clearEvents();
    library.TELIX_JS_VB_SetChannel(tunedObject, channelsOf(context).back(), 0);
    context.happensWithin(kSilentTuneTime, [&] {
        TELIX_PLAYSTATE_ENUM_T state = 0;
        return library.TELIX_JS_VB_GetPlayBackState &&
               library.TELIX_JS_VB_GetPlayBackState(tunedObject, &state) == 0 &&
               state == TELIX_PLAYSTATE_PRESENTING;
    });
    expect(!context.happensWithin(kQuietPeriod, hasAnyEvent), "one is reported");
}

// ---- Registrations

// Calls a function that the library may lack.
template <typename... Parameters, typename... Arguments>
void callIfPresent(TELIX_RETCODE_ENUM_T (*function)(Parameters...), Arguments... arguments) {
    if (function) {
        function(arguments...);
    }
}

void checkRegistrations(const CheckContext& context) {
    const Library& library = context.library;
    for (int time = 0; time < 2; ++time) {
        callIfPresent(library.TELIX_JS_VB_RegisterOnProgrammesChanged, tunedObject, onObjectEvent);
        callIfPresent(library.TELIX_JS_VB_RegisterOnParentalRatingChange, tunedObject, onRating);
        callIfPresent(library.TELIX_JS_VB_RegisterOnParentalRatingError, tunedObject, onRating);
        callIfPresent(library.TELIX_JS_VB_RegisterOnFullScreenChange, onObjectEvent);
        callIfPresent(library.TELIX_JS_VB_RegisterOnPlayStateChange, onPlayState);
        for (int end = 0; end < 2; ++end) {
            callIfPresent(library.TELIX_JS_VB_UnRegisterOnProgrammesChanged, onObjectEvent);
            callIfPresent(library.TELIX_JS_VB_UnRegisterOnParentalRatingChange, onRating);
            callIfPresent(library.TELIX_JS_VB_UnRegisterOnParentalRatingError, onRating);
            callIfPresent(library.TELIX_JS_VB_UnRegisterOnFullScreenChange, onObjectEvent);
            callIfPresent(library.TELIX_JS_VB_UnRegisterOnPlayStateChange, onPlayState);
        }
    }
}

void checkStop(const CheckContext& context) {
    context.library.TELIX_JS_VB_Stop(tunedObject);
    context.library.TELIX_JS_VB_Release(tunedObject);
    context.library.TELIX_JS_VB_Release(tunedObject);
}

} // namespace

std::vector<Check> tuningChecks() {
    const std::vector<RequiredCall> tuningCalls{REQUIRED_CALL(TELIX_JS_VB_GetHandle),
                                                REQUIRED_CALL(TELIX_JS_VB_SetChannel),
                                                REQUIRED_CALL(TELIX_JS_CM_GetChannelList),
                                                REQUIRED_CALL(TELIX_JS_VB_RegisterOnChannelChangeSucceeded),
                                                REQUIRED_CALL(TELIX_JS_VB_UnRegisterOnChannelChangeSucceeded),
                                                REQUIRED_CALL(TELIX_JS_VB_RegisterOnChannelChangeError),
                                                REQUIRED_CALL(TELIX_JS_VB_UnRegisterOnChannelChangeError)};
    return {
        {"a tune request returns at once, and its outcome is reported for that object and channel",
         tuningCalls, checkTune},
        {"the object then has that channel",
         {REQUIRED_CALL(TELIX_JS_VB_GetCurrentChannel)},
         checkCurrentChannel},
        {"the components of the channel are complete, for any type",
         {REQUIRED_CALL(TELIX_JS_VB_GetComponents), REQUIRED_CALL(TELIX_JS_VB_GetCurrActiveComponents)},
         checkComponents},
        {"the programmes of the channel are complete, with their ratings",
         {REQUIRED_CALL(TELIX_JS_SI_GetProgrammeHandles)},
         checkProgrammes},
        {"a step to the next channel returns the channel before it, then changes",
         {REQUIRED_CALL(TELIX_JS_VB_NextChannel)},
         checkNextChannel},
        {"an event concerns the object that was tuned", tuningCalls, checkEventObject},
        {"an unknown channel is refused, or an error is reported", tuningCalls, checkUnknownChannel},
        {"no event is reported after its callback has been unregistered", tuningCalls, checkUnregistered},
        {"the callbacks of all objects can be registered and unregistered repeatedly",
         {},
         checkRegistrations},
        {"a presentation can be stopped and released",
         {REQUIRED_CALL(TELIX_JS_VB_Stop), REQUIRED_CALL(TELIX_JS_VB_Release)},
         checkStop},
    };
}

} // namespace desktop

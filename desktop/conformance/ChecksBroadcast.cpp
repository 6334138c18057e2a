// Channels, programmes and video/broadcast objects.
#include "desktop/conformance/Checks.h"

#include <algorithm>
#include <cstdlib>
#include <glib.h>
#include <mutex>
#include <set>

namespace {

using std::chrono::milliseconds;

constexpr milliseconds longestCall{2000}; // of a request, which has to return without waiting

std::vector<TELIX_JS_CM_HANDLE> channelsOf(const Means& m) {
    uint32_t count = 0;
    TELIX_JS_CM_HANDLE* channels = nullptr;
    expect(m.library.TELIX_JS_CM_GetChannelList(&count, &channels) == 0, "the channel list is refused");
    expect(channels != nullptr, "the array is null");
    return {channels, channels + count};
}

TELIX_JS_CM_HANDLE firstChannel(const Means& m) {
    const auto channels = channelsOf(m);
    if (channels.empty()) {
        throw Skip{"there are no channels"};
    }
    return channels.front();
}

TELIX_JS_VB_HANDLE newObject(const Means& m) {
    TELIX_JS_VB_HANDLE object = 0;
    expect(m.library.TELIX_JS_VB_GetHandle(&object) == 0 && object != 0, "no object is given");
    return object;
}

// ---- Events

struct Event {
    char kind; // c: changed, e: error, s: play state, p: programmes
    TELIX_JS_VB_HANDLE object;
    TELIX_JS_CM_HANDLE channel;
};
std::mutex eventsMutex;
std::vector<Event> events;

TELIX_RETCODE_ENUM_T note(const Event& event) {
    std::lock_guard<std::mutex> lock(eventsMutex);
    events.push_back(event);
    return 0;
}
TELIX_RETCODE_ENUM_T onChange(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel) {
    return note({'c', object, channel});
}
TELIX_RETCODE_ENUM_T onError(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel, TELIX_ERR_STATE_ENUM_T) {
    return note({'e', object, channel});
}
TELIX_RETCODE_ENUM_T onPlayState(TELIX_JS_VB_HANDLE object, uint32_t, TELIX_PLAYSTATE_ENUM_T,
                                 TELIX_ERR_STATE_ENUM_T) {
    return note({'s', object, 0});
}
TELIX_RETCODE_ENUM_T onProgrammes(TELIX_JS_VB_HANDLE object) {
    return note({'p', object, 0});
}
TELIX_RETCODE_ENUM_T onFullScreen(TELIX_JS_VB_HANDLE) {
    return 0;
}
TELIX_RETCODE_ENUM_T onRating(TELIX_JS_VB_HANDLE, ___UINT8*, TELIX_JS_SI_PARENTALRATING_HANDLE, ___UINT8*) {
    return 0;
}
TELIX_RETCODE_ENUM_T onStreamEvent(TELIX_JS_VB_HANDLE, ___UINT8*, ___UINT8*, ___UINT8*, ___UINT8*, ___UINT32,
                                   ___UINT8*) {
    return 0;
}

bool hasCome(const std::function<bool(const Event& event)>& isMeant) {
    std::lock_guard<std::mutex> lock(eventsMutex);
    return std::any_of(events.begin(), events.end(), isMeant);
}

void forgetEvents() {
    std::lock_guard<std::mutex> lock(eventsMutex);
    events.clear();
}

// Tunes and waits for the outcome: true if the channel is presented, false if an error came.
bool tune(const Means& m, TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel) {
    forgetEvents();
    const auto begin = std::chrono::steady_clock::now();
    expect(m.library.TELIX_JS_VB_SetChannel(object, channel, 0) == 0, "the tune is refused");
    expect(std::chrono::steady_clock::now() - begin < longestCall, "the call waits for the tune");
    bool isChanged = false;
    const bool isOver = m.waitUntil([&] {
        return hasCome([&](const Event& event) {
            const bool isOutcome = event.object == object && event.channel == channel;
            isChanged = isChanged || (isOutcome && event.kind == 'c');
            return isOutcome && (event.kind == 'c' || event.kind == 'e');
        });
    });
    expect(isOver, "neither a change nor an error comes for object " + std::to_string(object) +
                       " and channel " + std::to_string(channel));
    return isChanged;
}

// ---- Channels

void checkChannel(const Means& m, TELIX_JS_CM_HANDLE channel) {
    const Library& library = m.library;
    const std::string name = "channel " + std::to_string(channel);
    int32_t type = -1;
    if (library.TELIX_JS_CM_GetChannelType && library.TELIX_JS_CM_GetChannelType(channel, &type) == 0) {
        expect(type >= 0 && type <= 2, name + " has the type " + std::to_string(type));
    }
    if (library.TELIX_JS_CM_GetName) {
        takeText("TELIX_JS_CM_GetName", library.TELIX_JS_CM_GetName, channel);
    }
    if (library.TELIX_JS_CM_GetDsd) {
        takeText("TELIX_JS_CM_GetDsd", library.TELIX_JS_CM_GetDsd, channel);
    }
}

struct Triplet {
    uint32_t onid = 0;
    uint32_t tsid = 0;
    uint32_t sid = 0;

    bool operator==(const Triplet& other) const {
        return onid == other.onid && tsid == other.tsid && sid == other.sid;
    }
};

Triplet tripletOf(const Means& m, TELIX_JS_CM_HANDLE channel) {
    Triplet triplet;
    m.library.TELIX_JS_CM_GetOnid(channel, &triplet.onid);
    m.library.TELIX_JS_CM_GetTsid(channel, &triplet.tsid);
    m.library.TELIX_JS_CM_GetSid(channel, &triplet.sid);
    return triplet;
}

// ---- What is known while a channel is presented

void checkProgrammes(const Means& m) {
    const Library& library = m.library;
    uint32_t count = 0;
    TELIX_JS_SI_HANDLE* handles = nullptr;
    const auto areThere = [&] {
        return library.TELIX_JS_SI_GetProgrammeHandles(&count, &handles) == 0 && count > 0;
    };
    if (!m.waitUntil(areThere)) {
        throw Skip{"the channel has none"};
    }
    expect(handles != nullptr, "the array is null");
    const std::vector<TELIX_JS_SI_HANDLE> programmes(handles, handles + count);
    for (const TELIX_JS_SI_HANDLE programme : programmes) {
        for (auto* function : {library.TELIX_JS_SI_GetName, library.TELIX_JS_SI_GetDescription}) {
            char* first = nullptr;
            char* second = nullptr;
            ___UINT8 length = 0;
            ___UINT8 again = 0;
            if (function && function(programme, &first, &length) == 0 && length > 0) {
                expect(first != nullptr, "a text with a length is null");
                function(programme, &second, &again);
                expect(first != second, "a text is the same block twice");
                const bool isGood = g_utf8_validate(first, length, nullptr);
                std::free(first);
                std::free(second);
                expect(isGood, "a text is no UTF-8");
            }
        }
        if (library.TELIX_JS_SI_GetChannelID) {
            takeText("TELIX_JS_SI_GetChannelID", library.TELIX_JS_SI_GetChannelID, programme);
        }
        uint32_t ratingCount = 0;
        TELIX_JS_SI_PARENTALRATING_HANDLE* ratings = nullptr;
        if (!library.TELIX_JS_SI_GetParentalRatingHandles ||
            library.TELIX_JS_SI_GetParentalRatingHandles(programme, &ratingCount, &ratings) != 0) {
            continue;
        }
        expect(ratingCount == 0 || ratings, "the array of ratings is null");
        const std::vector<uint32_t> rated(ratings, ratings + ratingCount);
        for (const uint32_t rating : rated) {
            for (auto* function :
                 {library.TELIX_JS_SI_PARENTALRATING_GetName, library.TELIX_JS_SI_PARENTALRATING_GetScheme,
                  library.TELIX_JS_SI_PARENTALRATING_GetRegion}) {
                if (function) {
                    takeText("a text of a rating", function, rating);
                }
            }
            for (auto* function : {library.TELIX_JS_SI_PARENTALRATING_GetValue,
                                   library.TELIX_JS_SI_PARENTALRATING_GetLabels}) {
                int32_t first = 0x5A5A5A5A;
                int32_t second = 0x25A5A5A5;
                if (function && function(rating, &first) == 0) {
                    expect(function(rating, &second) == 0 && first == second,
                           "a number of a rating is not written");
                }
            }
        }
    }
}

void checkComponents(const Means& m, TELIX_JS_VB_HANDLE object) {
    const Library& library = m.library;
    for (const TELIX_JS_AVCOMPTYPE type : {0U, 1U, 2U, 3U, 77U, 0xFFFFFFFFU}) {
        uint32_t count = 0;
        TELIX_JS_AVCOMPHANDLE* handles = nullptr;
        if (library.TELIX_JS_VB_GetComponents(object, type, &handles, &count) != 0) {
            continue;
        }
        expect(handles != nullptr, "the array of type " + std::to_string(type) + " is null");
        const std::set<uint32_t> all(handles, handles + count);
        expect(all.size() == count, "a component stands twice in the array");
        uint32_t activeCount = 0;
        TELIX_JS_AVCOMPHANDLE* active = nullptr;
        if (library.TELIX_JS_VB_GetCurrActiveComponents(object, type, &active, &activeCount) == 0) {
            expect(active != nullptr, "the array of active ones is null");
            for (uint32_t index = 0; index < activeCount; ++index) {
                expect(all.count(active[index]) != 0, "an active component is none of all");
            }
        }
        for (const uint32_t component : all) {
            for (auto* function :
                 {library.TELIX_JS_VB_AVComponent_GetEncoding, library.TELIX_JS_VB_AVComponent_GetLanguage}) {
                if (function) {
                    takeText("a text of a component",
                             [&](char** text) { return function(component, type, text); });
                }
            }
        }
    }
}

} // namespace

void checkChannels(const Means& m) {
    const Library& library = m.library;
    m.check("the channel list has distinct handles, and is the same each time",
            {NEED(TELIX_JS_CM_GetChannelList)}, [&] {
                const auto channels = channelsOf(m);
                const std::set<uint32_t> distinct(channels.begin(), channels.end());
                expect(distinct.size() == channels.size(), "a handle stands twice in it");
                expect(distinct.count(0) == 0, "a handle is 0");
                expect(channelsOf(m) == channels, "the second call gives another list");
            });
    m.check("each channel has a type and texts of its own", {NEED(TELIX_JS_CM_GetChannelList)}, [&] {
        for (const TELIX_JS_CM_HANDLE channel : channelsOf(m)) {
            checkChannel(m, channel);
        }
    });
    const std::initializer_list<Need> triplets{
        NEED(TELIX_JS_CM_GetChannelList), NEED(TELIX_JS_CM_GetChannelByTriplet), NEED(TELIX_JS_CM_GetOnid),
        NEED(TELIX_JS_CM_GetTsid), NEED(TELIX_JS_CM_GetSid)};
    m.check("a channel of the list is found by its triplet, also without the transport stream", triplets,
            [&] {
                firstChannel(m);
                for (const TELIX_JS_CM_HANDLE channel : channelsOf(m)) {
                    const Triplet triplet = tripletOf(m, channel);
                    for (const uint32_t tsid : {triplet.tsid, 8191U}) {
                        TELIX_JS_CM_HANDLE found = 0;
                        expect(library.TELIX_JS_CM_GetChannelByTriplet(triplet.onid, tsid, triplet.sid,
                                                                       &found) == 0,
                               "channel " + std::to_string(channel) + " is not found");
                        const Triplet other = tripletOf(m, found);
                        expect(other.onid == triplet.onid && other.sid == triplet.sid,
                               "another channel is found");
                    }
                }
            });
    m.check("a triplet that no channel has is refused", triplets, [&] {
        TELIX_JS_CM_HANDLE found = 0;
        expect(library.TELIX_JS_CM_GetChannelByTriplet(0xFFFFFFFF, 0xFFFFFFFE, 0xFFFFFFFD, &found) != 0,
               "it is taken");
        expect(found == 0, "the output has changed");
    });
    checkRefusal(m, ALL_CALLS(TELIX_JS_CM_GetChannelType));
    checkRefusal(m, ALL_CALLS(TELIX_JS_CM_GetSid));
    checkRefusal(m, ALL_CALLS(TELIX_JS_CM_GetOnid));
    checkRefusal(m, ALL_CALLS(TELIX_JS_CM_GetTsid));
    checkRefusal(m, ALL_CALLS(TELIX_JS_CM_GetDsd));
    checkRefusal(m, ALL_CALLS(TELIX_JS_CM_GetName));
    checkRefusal(m, ALL_CALLS(TELIX_JS_SI_GetStartTime));
    checkRefusal(m, ALL_CALLS(TELIX_JS_SI_GetDuration));
    checkRefusal(m, ALL_CALLS(TELIX_JS_SI_GetChannelID));
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_SI_SetName), "name");
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_SI_SetChannelID), "1");
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_SI_SetDescription), "text");
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_SI_SetStartTime), 1);
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_SI_SetDuration), 1);
    char* text = nullptr;
    ___UINT8 length = 0;
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_SI_GetName), &text, &length);
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_SI_GetDescription), &text, &length);
    uint32_t count = 0;
    TELIX_JS_SI_PARENTALRATING_HANDLE* ratings = nullptr;
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_SI_GetParentalRatingHandles), &count, &ratings);
}

void checkObjects(const Means& m) {
    const Library& library = m.library;
    m.check("objects have distinct handles", {NEED(TELIX_JS_VB_GetHandle)}, [&] {
        std::set<uint32_t> handles;
        for (int time = 0; time < 20; ++time) {
            expect(handles.insert(newObject(m)).second, "two have the same");
        }
    });
    checkRefusal(m, ALL_CALLS(TELIX_JS_VB_IsFullScreen));
    checkRefusal(m, ALL_CALLS(TELIX_JS_VB_GetCurrentChannel));
    checkRefusal(m, ALL_CALLS(TELIX_JS_VB_GetWidth));
    checkRefusal(m, ALL_CALLS(TELIX_JS_VB_GetHeight));
    checkRefusal(m, ALL_CALLS(TELIX_JS_VB_GetPlayBackState));
    checkRefusal(m, ALL_CALLS(TELIX_JS_VB_PrevChannel));
    checkRefusal(m, ALL_CALLS(TELIX_JS_VB_NextChannel));
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_VB_SetFullScreen), 1);
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_VB_SetWidth), 640);
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_VB_SetHeight), 360);
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_VB_SetPlayBackState), 2);
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_VB_Stop));
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_VB_BindToCurrChannel));
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_VB_SetChannel), 1, 0);
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_VB_SetChannelByTriplet), 1, 2, 3);
    const TELIX_JS_DISPLAY_AREA area{0, 0, 640, 360};
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_VB_SetDisplayArea), &area);
    TELIX_JS_CM_HANDLE channel = 0;
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_VB_CreateChannelObjectByTriplet), 10, 1, 2, 3, &channel);
    const ___UINT8 descriptor[] = {0x43, 0x00};
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_VB_CreateChannelObjectByDsd), 13, &descriptor[0], 2, 3, &channel);
    TELIX_JS_AVCOMPHANDLE* components = nullptr;
    uint32_t count = 0;
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_VB_GetComponents), 0, &components, &count);
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_VB_GetCurrActiveComponents), 0, &components, &count);
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_VB_SelectComponent), 1, 1);
    checkRefusalOf(m, ALL_CALLS(TELIX_JS_VB_UnselectComponent), 1, 1);
    checkRefusal(m, ALL_CALLS(TELIX_JS_VB_AVComponent_GetEncoding));
    checkRefusal(m, ALL_CALLS(TELIX_JS_VB_AVComponent_GetEncrypted));
    checkRefusal(m, ALL_CALLS(TELIX_JS_VB_AVComponent_GetAspectRatio));
    checkRefusal(m, ALL_CALLS(TELIX_JS_VB_AVComponent_GetLanguage));
    checkRefusal(m, ALL_CALLS(TELIX_JS_VB_AVComponent_GetAudioDescription));
    checkRefusal(m, ALL_CALLS(TELIX_JS_VB_AVComponent_GetAudioChannels));
    checkRefusal(m, ALL_CALLS(TELIX_JS_VB_AVComponent_GetHearingImpaired));

    m.check("a refused call leaves the outputs of the objects alone", {},
            [&] { expect(channel == 0 && components == nullptr && count == 0, "one has changed"); });
    m.check("width, height and full screen read as they were set", {NEED(TELIX_JS_VB_GetHandle)}, [&] {
        const TELIX_JS_VB_HANDLE object = newObject(m);
        int32_t number = 0;
        if (library.TELIX_JS_VB_SetWidth && library.TELIX_JS_VB_GetWidth &&
            library.TELIX_JS_VB_SetWidth(object, 642) == 0 &&
            library.TELIX_JS_VB_GetWidth(object, &number) == 0) {
            expect(number == 642, "the width is " + std::to_string(number) + " instead of 642");
        }
        if (library.TELIX_JS_VB_SetHeight && library.TELIX_JS_VB_GetHeight &&
            library.TELIX_JS_VB_SetHeight(object, 362) == 0 &&
            library.TELIX_JS_VB_GetHeight(object, &number) == 0) {
            expect(number == 362, "the height is " + std::to_string(number) + " instead of 362");
        }
        for (const ___UINT8 wanted : {1, 0}) {
            ___UINT8 isFull = 0;
            if (library.TELIX_JS_VB_SetFullScreen && library.TELIX_JS_VB_IsFullScreen &&
                library.TELIX_JS_VB_SetFullScreen(object, wanted) == 0 &&
                library.TELIX_JS_VB_IsFullScreen(object, &isFull) == 0) {
                expect((isFull != 0) == (wanted != 0), "full screen is not what was set");
            }
        }
        for (const int32_t number : {0, -1, 1 << 20, INT32_MIN, INT32_MAX}) { // whatever a page writes
            if (library.TELIX_JS_VB_SetWidth && library.TELIX_JS_VB_SetHeight) {
                library.TELIX_JS_VB_SetWidth(object, number);
                library.TELIX_JS_VB_SetHeight(object, number);
            }
        }
    });
    m.check("a released object does no harm", {NEED(TELIX_JS_VB_GetHandle), NEED(TELIX_JS_VB_Release)}, [&] {
        const TELIX_JS_VB_HANDLE object = newObject(m);
        for (int time = 0; time < 3; ++time) {
            library.TELIX_JS_VB_Release(object);
        }
        if (library.TELIX_JS_VB_Stop) {
            library.TELIX_JS_VB_Stop(object);
        }
        if (library.TELIX_JS_VB_UnRegisterStreamEvent) {
            library.TELIX_JS_VB_UnRegisterStreamEvent(object, onStreamEvent, "1", "1f", "name");
        }
        for (const uint32_t handle : nonsenseHandles) {
            library.TELIX_JS_VB_Release(handle);
        }
    });
    m.check("a stream event is watched twice and given up as often, and once more",
            {NEED(TELIX_JS_VB_GetHandle), NEED(TELIX_JS_VB_RegisterStreamEvent),
             NEED(TELIX_JS_VB_UnRegisterStreamEvent)},
            [&] {
                const TELIX_JS_VB_HANDLE object = newObject(m);
                for (const char* tag : {"1f", "31", "", "not a tag"}) {
                    for (int time = 0; time < 2; ++time) {
                        library.TELIX_JS_VB_RegisterStreamEvent(object, onStreamEvent, "1", tag, "name");
                    }
                    for (int time = 0; time < 3; ++time) {
                        library.TELIX_JS_VB_UnRegisterStreamEvent(object, onStreamEvent, "1", tag, "other");
                    }
                }
                for (const uint32_t handle : nonsenseHandles) {
                    library.TELIX_JS_VB_RegisterStreamEvent(handle, onStreamEvent, "1", "1f", "name");
                    library.TELIX_JS_VB_UnRegisterStreamEvent(handle, onStreamEvent, "1", "1f", "name");
                }
            });
    m.check("a channel that a page makes keeps its triplet, or is refused",
            {NEED(TELIX_JS_VB_GetHandle), NEED(TELIX_JS_VB_CreateChannelObjectByTriplet),
             NEED(TELIX_JS_CM_GetOnid), NEED(TELIX_JS_CM_GetTsid), NEED(TELIX_JS_CM_GetSid)},
            [&] {
                const TELIX_JS_VB_HANDLE object = newObject(m);
                TELIX_JS_CM_HANDLE made = 0;
                if (library.TELIX_JS_VB_CreateChannelObjectByTriplet(object, 10, 4711, 12, 34, &made) != 0) {
                    expect(made == 0, "it is refused, and the output has changed");
                    throw Skip{"it is refused"};
                }
                expect(tripletOf(m, made) == Triplet{4711, 12, 34}, "the triplet is another one");
            });
}

void checkTuning(const Means& m) {
    const Library& library = m.library;
    const std::initializer_list<Need> needs{NEED(TELIX_JS_VB_GetHandle),
                                            NEED(TELIX_JS_VB_SetChannel),
                                            NEED(TELIX_JS_CM_GetChannelList),
                                            NEED(TELIX_JS_VB_RegisterOnChannelChangeSucceeded),
                                            NEED(TELIX_JS_VB_UnRegisterOnChannelChangeSucceeded),
                                            NEED(TELIX_JS_VB_RegisterOnChannelChangeError),
                                            NEED(TELIX_JS_VB_UnRegisterOnChannelChangeError)};
    TELIX_JS_VB_HANDLE object = 0;
    bool isPresented = false;
    const auto requirePicture = [&] {
        if (!isPresented) {
            throw Skip{"no channel is presented"};
        }
    };
    m.check("a request to tune returns at once, and its outcome comes for that object and channel", needs,
            [&] {
                object = newObject(m);
                library.TELIX_JS_VB_RegisterOnChannelChangeSucceeded(onChange);
                library.TELIX_JS_VB_RegisterOnChannelChangeError(onError);
                isPresented = tune(m, object, firstChannel(m));
            });
    m.check("the object then has that channel", {NEED(TELIX_JS_VB_GetCurrentChannel)}, [&] {
        requirePicture();
        TELIX_JS_CM_HANDLE channel = 0;
        expect(library.TELIX_JS_VB_GetCurrentChannel(object, &channel) == 0, "it has none");
        expect(channel == firstChannel(m), "it has another one");
    });
    m.check("its components are complete, for any type",
            {NEED(TELIX_JS_VB_GetComponents), NEED(TELIX_JS_VB_GetCurrActiveComponents)}, [&] {
                requirePicture();
                checkComponents(m, object);
            });
    m.check("its programmes are complete, with their ratings", {NEED(TELIX_JS_SI_GetProgrammeHandles)}, [&] {
        requirePicture();
        checkProgrammes(m);
    });
    m.check("a step to the next channel gives out the one before it, then changes",
            {NEED(TELIX_JS_VB_NextChannel)}, [&] {
                requirePicture();
                const auto channels = channelsOf(m);
                if (channels.size() < 2) {
                    throw Skip{"there is one channel alone"};
                }
                forgetEvents();
                TELIX_JS_CM_HANDLE former = 0;
                expect(library.TELIX_JS_VB_NextChannel(object, &former) == 0, "it is refused");
                expect(former == channels[0], "it gives out another channel");
                expect(m.waitUntil([&] {
                    return hasCome([&](const Event& event) {
                        return event.object == object && (event.kind == 'c' || event.kind == 'e');
                    });
                }),
                       "no outcome comes");
            });
    m.check("an event concerns the object that tuned", needs, [&] {
        requirePicture();
        const TELIX_JS_VB_HANDLE other = newObject(m);
        tune(m, other, firstChannel(m));
        expect(!hasCome([&](const Event& event) { return event.kind == 'c' && event.object != other; }),
               "another object got the change");
    });
    m.check("a channel that does not exist is refused, or ends in an error", needs, [&] {
        forgetEvents();
        for (const TELIX_JS_CM_HANDLE nonsense : {0x7FFFFFF1U, 0xFFFFFFFFU}) {
            if (library.TELIX_JS_VB_SetChannel(object, nonsense, 0) == 0) {
                expect(m.waitUntil(
                           [&] { return hasCome([](const Event& event) { return event.kind == 'e'; }); }),
                       "nothing comes");
            }
        }
        expect(!hasCome([](const Event& event) { return event.kind == 'c'; }), "a change came");
    });
    m.check("no event comes after it has been given up", needs, [&] {
        requirePicture();
        tune(m, object, firstChannel(m));
        library.TELIX_JS_VB_UnRegisterOnChannelChangeSucceeded(onChange);
        library.TELIX_JS_VB_UnRegisterOnChannelChangeError(onError);
        forgetEvents();
        library.TELIX_JS_VB_SetChannel(object, channelsOf(m).back(), 0);
        const auto isPresenting = [&] {
            TELIX_PLAYSTATE_ENUM_T state = 0;
            return library.TELIX_JS_VB_GetPlayBackState &&
                   library.TELIX_JS_VB_GetPlayBackState(object, &state) == 0 &&
                   state == TELIX_PLAYSTATE_PRESENTING;
        };
        m.comesWithin(milliseconds(3000), isPresenting);
        const auto any = [](const Event& event) { return event.kind == 'c' || event.kind == 'e'; };
        expect(!m.comesWithin(milliseconds(300), [&] { return hasCome(any); }), "one came");
    });
    m.check("the registrations of all objects can be given up twice, and made again", {}, [&] {
        for (int time = 0; time < 2; ++time) {
            for (auto* function : {library.TELIX_JS_VB_RegisterOnProgrammesChanged}) {
                if (function) {
                    function(object, onProgrammes);
                }
            }
            for (auto* function : {library.TELIX_JS_VB_RegisterOnParentalRatingChange,
                                   library.TELIX_JS_VB_RegisterOnParentalRatingError}) {
                if (function) {
                    function(object, onRating);
                }
            }
            if (library.TELIX_JS_VB_RegisterOnFullScreenChange) {
                library.TELIX_JS_VB_RegisterOnFullScreenChange(onFullScreen);
            }
            if (library.TELIX_JS_VB_RegisterOnPlayStateChange) {
                library.TELIX_JS_VB_RegisterOnPlayStateChange(onPlayState);
            }
            for (int end = 0; end < 2; ++end) {
                if (library.TELIX_JS_VB_UnRegisterOnProgrammesChanged) {
                    library.TELIX_JS_VB_UnRegisterOnProgrammesChanged(onProgrammes);
                }
                for (auto* function : {library.TELIX_JS_VB_UnRegisterOnParentalRatingChange,
                                       library.TELIX_JS_VB_UnRegisterOnParentalRatingError}) {
                    if (function) {
                        function(onRating);
                    }
                }
                if (library.TELIX_JS_VB_UnRegisterOnFullScreenChange) {
                    library.TELIX_JS_VB_UnRegisterOnFullScreenChange(onFullScreen);
                }
                if (library.TELIX_JS_VB_UnRegisterOnPlayStateChange) {
                    library.TELIX_JS_VB_UnRegisterOnPlayStateChange(onPlayState);
                }
            }
        }
    });
    m.check("a presentation can be stopped and released", {NEED(TELIX_JS_VB_Stop), NEED(TELIX_JS_VB_Release)},
            [&] {
                library.TELIX_JS_VB_Stop(object);
                library.TELIX_JS_VB_Release(object);
                library.TELIX_JS_VB_Release(object);
            });
}

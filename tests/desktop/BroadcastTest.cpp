// Television through the calls of the plug-in: real pipelines on the test multiplex. Pictures and sound come
// in real time; the time of day and the timers stand still until a test advances them.
#include <gtest/gtest.h>

#include <future>

#include "desktop/platform/Broadcast.h"
#include "desktop/platform/Multiplex.h"
#include "desktop/platform/OutputVolume.h"
#include "desktop/platform/telix_picture.h"
#include "desktop/platform/telix_viewer.h"
#include "telix/telix_platform.h"
#include "tests/desktop/ManualClock.h"
#include "tests/desktop/PlatformThread.h"
#include "tests/desktop/Received.h"

using namespace desktop;
using testing::Test;

namespace {

// At the start of a programme: tests/desktop/tv.conf makes them four seconds long.
constexpr int64_t kUtcStart = 1795253700;

BroadcastClock& testClock() {
    static auto* const clock = new BroadcastClock(kUtcStart); // broadcast uses it until the process ends
    return *clock;
}

// The arguments of a callback.
struct Event {
    std::string kind;
    TELIX_JS_VB_HANDLE object = 0;
    int64_t first = 0;
    int64_t second = 0;
    std::string text;
};
Received<Event> events;

TELIX_RETCODE_ENUM_T onChange(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel) {
    return events.add({"change", object, channel, 0, ""});
}
TELIX_RETCODE_ENUM_T onError(TELIX_JS_VB_HANDLE object, TELIX_JS_CM_HANDLE channel,
                             TELIX_ERR_STATE_ENUM_T error) {
    return events.add({"error", object, channel, error, ""});
}
TELIX_RETCODE_ENUM_T onState(TELIX_JS_VB_HANDLE object, uint32_t, TELIX_PLAYSTATE_ENUM_T state,
                             TELIX_ERR_STATE_ENUM_T error) {
    return events.add({"state", object, state, error, ""});
}
// Stops as soon as the tune begins.
TELIX_RETCODE_ENUM_T stopWhenConnecting(TELIX_JS_VB_HANDLE object, uint32_t session,
                                        TELIX_PLAYSTATE_ENUM_T state, TELIX_ERR_STATE_ENUM_T error) {
    if (state == TELIX_PLAYSTATE_CONNECTING) {
        EXPECT_EQ(TELIX_JS_VB_Stop(object), 0);
    }
    return onState(object, session, state, error);
}
TELIX_RETCODE_ENUM_T onProgrammes(TELIX_JS_VB_HANDLE object) {
    return events.add({"programmes", object, 0, 0, ""});
}
TELIX_RETCODE_ENUM_T onRating(TELIX_JS_VB_HANDLE object, ___UINT8*, TELIX_JS_SI_PARENTALRATING_HANDLE rating,
                              ___UINT8*) {
    return events.add({"rating", object, rating, 0, ""});
}
TELIX_RETCODE_ENUM_T addStreamEvent(const char* kind, TELIX_JS_VB_HANDLE object, ___UINT8* name,
                                    ___UINT8* data, ___UINT32 length, ___UINT8* status) {
    return events.add({kind, object, 0, 0,
                       std::string(reinterpret_cast<char*>(name)) + "/" +
                           std::string(reinterpret_cast<char*>(data), length) + "/" +
                           reinterpret_cast<char*>(status)});
}
TELIX_RETCODE_ENUM_T onStreamEvent(TELIX_JS_VB_HANDLE object, ___UINT8*, ___UINT8*, ___UINT8* name,
                                   ___UINT8* data, ___UINT32 length, ___UINT8* status) {
    return addStreamEvent("event", object, name, data, length, status);
}
TELIX_RETCODE_ENUM_T onOtherStreamEvent(TELIX_JS_VB_HANDLE object, ___UINT8*, ___UINT8*, ___UINT8* name,
                                        ___UINT8* data, ___UINT32 length, ___UINT8* status) {
    return addStreamEvent("other event", object, name, data, length, status);
}

// The latest frame, copied.
struct Shot {
    uint64_t serial = 0;
    uint32_t width = 0;
    uint32_t height = 0;
    bool visible = false;
    std::vector<uint8_t> pixels; // without padding
};

Shot takeShot() {
    telix_desktop_frame frame{};
    telix_desktop_acquire_frame(&frame);
    Shot shot{frame.serial, frame.width, frame.height, frame.visible != 0, {}};
    for (uint32_t line = 0; frame.pixels && line < frame.height; ++line) {
        const uint8_t* begin = frame.pixels + size_t{line} * frame.stride;
        shot.pixels.insert(shot.pixels.end(), begin, begin + size_t{frame.width} * 4);
    }
    telix_desktop_release_frame(&frame);
    return shot;
}

// The share of pixels of a part of the picture that differ clearly.
double difference(const Shot& left, const Shot& right, double from, double to) {
    if (left.pixels.size() != right.pixels.size() || left.pixels.empty()) {
        return 1;
    }
    const auto begin = static_cast<size_t>(from * left.height) * left.width;
    const auto end = static_cast<size_t>(to * left.height) * left.width;
    size_t count = 0;
    for (size_t pixel = begin; pixel < end; ++pixel) {
        for (size_t colour = 0; colour < 3; ++colour) {
            if (std::abs(left.pixels[pixel * 4 + colour] - right.pixels[pixel * 4 + colour]) > 40) {
                ++count;
                break;
            }
        }
    }
    return static_cast<double>(count) / static_cast<double>(end - begin);
}

class BroadcastTest : public Test {
protected:
    static void SetUpTestSuite() { Broadcast::useClock(testClock()); }

    void SetUp() override {
        events.clear();
        TELIX_JS_VB_RegisterOnChannelChangeSucceeded(onChange);
        TELIX_JS_VB_RegisterOnChannelChangeError(onError);
        TELIX_JS_VB_RegisterOnPlayStateChange(onState);
        ASSERT_EQ(TELIX_JS_VB_GetHandle(&m_object), 0);
        TELIX_JS_VB_RegisterOnProgrammesChanged(m_object, onProgrammes);
        TELIX_JS_VB_RegisterOnParentalRatingChange(m_object, onRating);
        uint32_t count = 0;
        TELIX_JS_CM_HANDLE* handles = nullptr;
        ASSERT_EQ(TELIX_JS_CM_GetChannelList(&count, &handles), 0);
        m_channels.assign(handles, handles + count);
    }

    void TearDown() override {
        TELIX_JS_VB_Release(m_object);
        TELIX_JS_VB_UnRegisterOnChannelChangeSucceeded(onChange);
        TELIX_JS_VB_UnRegisterOnChannelChangeError(onError);
        TELIX_JS_VB_UnRegisterOnPlayStateChange(onState);
        TELIX_JS_VB_UnRegisterOnProgrammesChanged(onProgrammes);
        TELIX_JS_VB_UnRegisterOnParentalRatingChange(onRating);
    }

    static std::vector<Event> ofKind(const std::string& kind) {
        std::vector<Event> found;
        for (const Event& each : events.all()) {
            if (each.kind == kind) {
                found.push_back(each);
            }
        }
        return found;
    }

    static size_t countOf(const std::string& kind) { return ofKind(kind).size(); }

    // Waits for an event of a kind; they count from 0.
    static Event waitFor(const std::string& kind, size_t index = 0) {
        if (!waitUntil([&] { return countOf(kind) > index; })) {
            ADD_FAILURE() << "no " << kind << " " << index;
            return {};
        }
        return ofKind(kind)[index];
    }

    void tune(TELIX_JS_CM_HANDLE channel) {
        const size_t before = countOf("change");
        ASSERT_EQ(TELIX_JS_VB_SetChannel(m_object, channel, 0), 0);
        const Event change = waitFor("change", before);
        ASSERT_EQ(change.object, m_object);
        ASSERT_EQ(change.first, channel);
    }

    TELIX_JS_VB_HANDLE m_object = 0;
    std::vector<TELIX_JS_CM_HANDLE> m_channels;
};

TEST_F(BroadcastTest, ShowsADifferentMovingPictureOnEachOfItsChannels) {
    ASSERT_EQ(m_channels.size(), 3U);
    std::vector<Shot> shots;
    for (const TELIX_JS_CM_HANDLE channel : m_channels) {
        tune(channel);
        const Shot first = takeShot();
        ASSERT_TRUE(first.visible);
        EXPECT_EQ(first.width, 720U);
        EXPECT_EQ(first.height, 576U);
        EXPECT_TRUE(waitUntil([&] { return takeShot().serial >= first.serial + 20; }))
            << "the picture stands still";
        const Shot later = takeShot();
        EXPECT_NE(first.pixels, later.pixels);
        shots.push_back(later);
    }
    EXPECT_GT(difference(shots[0], shots[1], 0, 1), 0.2);
    EXPECT_GT(difference(shots[1], shots[2], 0, 1), 0.2);
    EXPECT_GT(difference(shots[0], shots[2], 0, 1), 0.2);
    EXPECT_EQ(events.threads().size(), 1U);
    EXPECT_EQ(events.threads().count(std::this_thread::get_id()), 0U);
}

TEST_F(BroadcastTest, ListsItsChannelsWithIdsNamesAndDescriptor) {
    ASSERT_EQ(m_channels.size(), testServices().size());
    for (size_t index = 0; index < m_channels.size(); ++index) {
        int32_t type = -1;
        uint32_t onid = 0;
        uint32_t tsid = 0;
        uint32_t sid = 0;
        char* name = nullptr;
        char* descriptor = nullptr;
        EXPECT_EQ(TELIX_JS_CM_GetChannelType(m_channels[index], &type), 0);
        EXPECT_EQ(TELIX_JS_CM_GetOnid(m_channels[index], &onid), 0);
        EXPECT_EQ(TELIX_JS_CM_GetTsid(m_channels[index], &tsid), 0);
        EXPECT_EQ(TELIX_JS_CM_GetSid(m_channels[index], &sid), 0);
        EXPECT_EQ(TELIX_JS_CM_GetName(m_channels[index], &name), 0);
        EXPECT_EQ(TELIX_JS_CM_GetDsd(m_channels[index], &descriptor), 0);
        EXPECT_EQ(type, Channel::Television);
        EXPECT_EQ(onid, kTestOriginalNetworkId);
        EXPECT_EQ(tsid, kTestTransportStreamId);
        EXPECT_EQ(sid, testServices()[index].serviceId);
        EXPECT_EQ(textOf(name), testServices()[index].name);
        EXPECT_EQ(textOf(descriptor).substr(0, 2),
                  (std::string{static_cast<char>(kTagSatelliteDeliverySystem), 0x0B}));
        TELIX_JS_CM_HANDLE found = 0;
        EXPECT_EQ(TELIX_JS_CM_GetChannelByTriplet(onid, kAnyTransportStream, sid, &found), 0);
        EXPECT_EQ(found, m_channels[index]);
        found = 0;
        const Bytes& bytes = testDeliveryDescriptor();
        EXPECT_EQ(TELIX_JS_VB_CreateChannelObjectByDsd(m_object, 10, bytes.data(),
                                                       static_cast<uint32_t>(bytes.size()), sid, &found),
                  0);
        EXPECT_EQ(found, m_channels[index]);
    }
}

TEST_F(BroadcastTest, StepsRoundTheEndsOfTheLineUp) {
    tune(m_channels.back());
    TELIX_JS_CM_HANDLE selected = 0;
    ASSERT_EQ(TELIX_JS_VB_NextChannel(m_object, &selected), 0);
    EXPECT_EQ(selected, m_channels.back()); // as it was before
    EXPECT_EQ(waitFor("change", 1).first, m_channels.front());
    ASSERT_EQ(TELIX_JS_VB_PrevChannel(m_object, &selected), 0);
    EXPECT_EQ(selected, m_channels.front());
    EXPECT_EQ(waitFor("change", 2).first, m_channels.back());
}

TEST_F(BroadcastTest, GoesFromConnectingToPresentingAndStopped) {
    ASSERT_EQ(TELIX_JS_VB_BindToCurrChannel(m_object), 0);
    EXPECT_EQ(waitFor("change").first, m_channels.front());
    EXPECT_EQ(waitFor("state", 0).first, TELIX_PLAYSTATE_CONNECTING);
    EXPECT_EQ(waitFor("state", 1).first, TELIX_PLAYSTATE_PRESENTING);
    EXPECT_EQ(waitFor("state", 1).second, TELIX_ERR_STATE_NONE);
    EXPECT_TRUE(takeShot().visible);
    ASSERT_EQ(TELIX_JS_VB_Stop(m_object), 0);
    EXPECT_EQ(waitFor("state", 2).first, TELIX_PLAYSTATE_STOPPED);
    EXPECT_TRUE(waitUntil([] { return !takeShot().visible; }));
    TELIX_JS_CM_HANDLE channel = 0;
    EXPECT_EQ(TELIX_JS_VB_GetCurrentChannel(m_object, &channel), 0);
    EXPECT_EQ(channel, m_channels.front());
    ASSERT_EQ(TELIX_JS_VB_Release(m_object), 0);
    EXPECT_NE(TELIX_JS_VB_GetCurrentChannel(m_object, &channel), 0);
    tune(m_channels[1]); // a released object is good for another tune
}

// Where the frame is shown; nothing if there is none.
std::optional<std::pair<int32_t, uint32_t>> placeOfPicture() {
    telix_desktop_frame frame{};
    telix_desktop_acquire_frame(&frame);
    const auto place =
        frame.visible != 0 ? std::optional(std::pair(frame.areaX, frame.areaWidth)) : std::nullopt;
    telix_desktop_release_frame(&frame);
    return place;
}

TEST_F(BroadcastTest, PresentsTheChannelByItselfWhileNoObjectDoes) {
    const std::pair<int32_t, uint32_t> whole{0, 1280};
    const std::pair<int32_t, uint32_t> part{100, 640};
    telix_desktop_present_channel();
    EXPECT_TRUE(waitUntil([&] { return placeOfPicture() == whole; }));
    EXPECT_EQ(countOf("change") + countOf("state") + countOf("programmes"), 0U);
    const TELIX_JS_DISPLAY_AREA area{100, 50, 640, 360};
    ASSERT_EQ(TELIX_JS_VB_SetDisplayArea(m_object, &area), 0);
    ASSERT_EQ(TELIX_JS_VB_BindToCurrChannel(m_object), 0);
    EXPECT_EQ(waitFor("change").first, m_channels.front());
    EXPECT_EQ(placeOfPicture(), part);
    ASSERT_EQ(TELIX_JS_VB_Stop(m_object), 0);
    EXPECT_TRUE(waitUntil([] { return !placeOfPicture(); }));
    ASSERT_EQ(TELIX_JS_VB_Release(m_object), 0);
    EXPECT_TRUE(waitUntil([&] { return placeOfPicture() == whole; }));
    EXPECT_EQ(countOf("change"), 1U);
    EXPECT_EQ(countOf("error"), 0U);
}

TEST_F(BroadcastTest, KeepsThePictureFromAnObjectToTheSetAndToTheNextObject) {
    const std::pair<int32_t, uint32_t> whole{0, 1280};
    const std::pair<int32_t, uint32_t> part{100, 640};
    const TELIX_JS_DISPLAY_AREA area{100, 50, 640, 360};
    telix_desktop_present_channel();
    tune(m_channels[0]);
    waitFor("programmes");
    ASSERT_EQ(TELIX_JS_VB_Release(m_object), 0);
    flushPlatformThread();
    EXPECT_EQ(placeOfPicture(), whole);
    TELIX_JS_VB_HANDLE next = 0;
    ASSERT_EQ(TELIX_JS_VB_GetHandle(&next), 0);
    TELIX_JS_VB_RegisterOnProgrammesChanged(next, onProgrammes);
    ASSERT_EQ(TELIX_JS_VB_SetDisplayArea(next, &area), 0);
    events.clear();
    ASSERT_EQ(TELIX_JS_VB_BindToCurrChannel(next), 0);
    flushPlatformThread();
    EXPECT_EQ(placeOfPicture(), part);
    EXPECT_EQ(waitFor("state", 0).first, TELIX_PLAYSTATE_CONNECTING);
    EXPECT_EQ(waitFor("state", 1).first, TELIX_PLAYSTATE_PRESENTING);
    EXPECT_EQ(waitFor("change").object, next);
    EXPECT_EQ(waitFor("programmes").object, next);
    ASSERT_EQ(TELIX_JS_VB_BindToCurrChannel(m_object), 0); // without a release of the other one
    flushPlatformThread();
    EXPECT_EQ(placeOfPicture(), whole);
    TELIX_PLAYSTATE_ENUM_T state = TELIX_PLAYSTATE_PRESENTING;
    EXPECT_EQ(TELIX_JS_VB_GetPlayBackState(next, &state), 0);
    EXPECT_EQ(state, TELIX_PLAYSTATE_UNREALIZED);
}

TEST_F(BroadcastTest, AStopStaysInForceWhateverTheTuneBeforeItReports) {
    tune(m_channels[0]);
    TELIX_JS_VB_HANDLE next = 0;
    ASSERT_EQ(TELIX_JS_VB_GetHandle(&next), 0);
    TELIX_JS_VB_RegisterOnPlayStateChange(stopWhenConnecting);
    events.clear();
    ASSERT_EQ(TELIX_JS_VB_BindToCurrChannel(next), 0); // takes over a picture that is there already
    ASSERT_TRUE(waitUntil([&] {
        const auto states = ofKind("state");
        return !states.empty() && states.back().object == next &&
               states.back().first == TELIX_PLAYSTATE_STOPPED;
    }));
    flushPlatformThread();
    TELIX_PLAYSTATE_ENUM_T state = 0;
    EXPECT_EQ(TELIX_JS_VB_GetPlayBackState(next, &state), 0);
    EXPECT_EQ(state, TELIX_PLAYSTATE_STOPPED);
    EXPECT_FALSE(takeShot().visible);
    TELIX_JS_VB_UnRegisterOnPlayStateChange(stopWhenConnecting);
    TELIX_JS_VB_Release(next);
}

TEST_F(BroadcastTest, SelectsTheDefaultAudioForTheNextObject) {
    telix_desktop_present_channel();
    tune(m_channels[0]);
    const auto audio = [](TELIX_JS_VB_HANDLE object, bool activeOnly) {
        return Broadcast::instance()
            .components(object, TELIX_JS_AVCOMPTYPE_AUDIO, activeOnly)
            .value_or(std::vector<TELIX_JS_AVCOMPHANDLE>());
    };
    const auto first = audio(m_object, true);
    ASSERT_EQ(audio(m_object, false).size(), 2U);
    ASSERT_TRUE(Broadcast::instance().selectComponent(m_object, audio(m_object, false)[1],
                                                      TELIX_JS_AVCOMPTYPE_AUDIO, true));
    ASSERT_NE(audio(m_object, true), first);
    TELIX_JS_VB_HANDLE next = 0;
    ASSERT_EQ(TELIX_JS_VB_GetHandle(&next), 0);
    ASSERT_EQ(TELIX_JS_VB_BindToCurrChannel(next), 0);
    waitFor("change", 1);
    EXPECT_EQ(audio(next, true), first);
}

TEST_F(BroadcastTest, HandsTheChannelOnBeforeItIsPresented) {
    telix_desktop_present_channel();
    ASSERT_EQ(TELIX_JS_VB_BindToCurrChannel(m_object), 0);
    TELIX_JS_VB_HANDLE next = 0;
    ASSERT_EQ(TELIX_JS_VB_GetHandle(&next), 0);
    ASSERT_EQ(TELIX_JS_VB_BindToCurrChannel(next), 0);
    EXPECT_EQ(waitFor("change").object, next);
    flushPlatformThread();
    // The first request has an outcome as well.
    EXPECT_EQ(waitFor("error").object, m_object);
    EXPECT_EQ(countOf("change") + countOf("error"), 2U);
    TELIX_JS_VB_Release(next);
}

TEST_F(BroadcastTest, KeepsTheChannelOffWhileAnObjectHasStoppedIt) {
    telix_desktop_present_channel();
    EXPECT_TRUE(waitUntil([] { return placeOfPicture().has_value(); }));
    tune(m_channels[0]);
    ASSERT_EQ(TELIX_JS_VB_Stop(m_object), 0);
    ASSERT_EQ(telix_desktop_tune(2), 1);
    flushPlatformThread();
    flushPlatformThread(); // what follows from the channel
    EXPECT_FALSE(Broadcast::instance().arbiter().backgroundTune());
    EXPECT_FALSE(placeOfPicture());
}

TEST_F(BroadcastTest, FollowsTheViewerWithoutAnObject) {
    telix_desktop_present_channel();
    EXPECT_TRUE(waitUntil([] { return placeOfPicture().has_value(); }));
    const Shot first = takeShot();
    ASSERT_EQ(telix_desktop_tune(2), 1);
    EXPECT_EQ(telix_desktop_channel(), 2U);
    EXPECT_TRUE(waitUntil([&] { return placeOfPicture() && difference(first, takeShot(), 0.1, 0.9) > 0.5; }));
}

TEST_F(BroadcastTest, NamesItsChannelsForTheViewer) {
    char name[32];
    EXPECT_EQ(telix_desktop_channel_name(2, name, sizeof(name)), 9U);
    EXPECT_STREQ(name, "Telix Two");
    EXPECT_EQ(telix_desktop_channel_name(2, name, 4), 9U);
    EXPECT_STREQ(name, "Tel");
    EXPECT_EQ(telix_desktop_channel_name(1, name, sizeof(name)), 9U);
    EXPECT_STREQ(name, "Telix One");
    for (const uint32_t unknown : {0U, 4U, 9U}) {
        EXPECT_EQ(telix_desktop_channel_name(unknown, name, sizeof(name)), 0U);
        EXPECT_STREQ(name, "");
    }
}

TEST(OutputVolumeTest, MultipliesTheVolumeOfEachElement) {
    gst_init(nullptr, nullptr);
    GstElement* element = GST_ELEMENT(gst_object_ref_sink(gst_element_factory_make("volume", nullptr)));
    const auto volume = [element] {
        gdouble value = 0;
        g_object_get(element, "volume", &value, nullptr);
        return value;
    };
    OutputVolume& output = OutputVolume::instance();
    output.apply(element, 0.5);
    EXPECT_DOUBLE_EQ(volume(), 0.5);
    telix_desktop_set_volume(50);
    EXPECT_DOUBLE_EQ(volume(), 0.25);
    output.apply(element, 1);
    EXPECT_DOUBLE_EQ(volume(), 0.5);
    telix_desktop_set_volume(1000);
    EXPECT_DOUBLE_EQ(volume(), 1);
    output.remove(element);
    telix_desktop_set_volume(0);
    EXPECT_DOUBLE_EQ(volume(), 1);
    gst_object_unref(element);
}

// How late picture and sound are presented.
ServicePresentation::Lateness latenessOf(Broadcast& broadcast) {
    std::promise<ServicePresentation::Lateness> lateness;
    Platform::instance().post([&] { lateness.set_value(broadcast.lateness()); });
    return lateness.get_future().get();
}

TEST_F(BroadcastTest, CatchesUpWithTheBroadcastAfterAChange) {
    tune(m_channels[0]);
    ASSERT_TRUE(waitUntil([] { return Broadcast::instance().state().keptPackets > 0; }));
    for (const TELIX_JS_CM_HANDLE channel : {m_channels[1], m_channels[2]}) {
        tune(channel);
        EXPECT_TRUE(waitUntil([] {
            const auto lateness = latenessOf(Broadcast::instance());
            return lateness.video && lateness.audio && *lateness.video < SinkTiming::kTolerance &&
                   *lateness.audio < SinkTiming::kTolerance;
        }));
    }
}

TEST_F(BroadcastTest, KeepsNothingWhileInstantChangesAreOff) {
    tune(m_channels[0]);
    ASSERT_TRUE(waitUntil([] { return Broadcast::instance().state().keptPackets > 0; }));
    Broadcast::instance().setInstantZap(false);
    EXPECT_FALSE(Broadcast::instance().state().instantZap);
    EXPECT_EQ(Broadcast::instance().state().keptPackets, 0U);
    tune(m_channels[1]);
    EXPECT_EQ(Broadcast::instance().state().keptPackets, 0U);
    Broadcast::instance().setInstantZap(true);
}

TEST_F(BroadcastTest, TellsThatAChannelIsUnknown) {
    ASSERT_EQ(TELIX_JS_VB_SetChannelByTriplet(m_object, kTestOriginalNetworkId, kTestTransportStreamId, 999),
              0);
    const Event error = waitFor("error");
    EXPECT_EQ(error.object, m_object);
    EXPECT_EQ(error.second, kErrorUnknownChannel);
    uint32_t sid = 0;
    EXPECT_EQ(TELIX_JS_CM_GetSid(static_cast<TELIX_JS_CM_HANDLE>(error.first), &sid), 0);
    EXPECT_EQ(sid, 999U);
}

int64_t startOf(TELIX_JS_SI_HANDLE programme) {
    uint32_t start = 0;
    return TELIX_JS_SI_GetStartTime(programme, &start) == 0 ? start : -1;
}

// Waits for both, because their sections arrive one after the other.
std::vector<TELIX_JS_SI_HANDLE> waitForProgrammes(const EitEvent& present, const EitEvent& following) {
    uint32_t count = 0;
    TELIX_JS_SI_HANDLE* handles = nullptr;
    EXPECT_TRUE(waitUntil([&] {
        return TELIX_JS_SI_GetProgrammeHandles(&count, &handles) == 0 && count == 2 &&
               startOf(handles[0]) == present.start && startOf(handles[1]) == following.start;
    }));
    return {handles, handles + count};
}

void expectProgramme(TELIX_JS_SI_HANDLE programme, TELIX_JS_CM_HANDLE channel, const EitEvent& sent) {
    char* name = nullptr;
    ___UINT8 length = 0;
    ASSERT_EQ(TELIX_JS_SI_GetName(programme, &name, &length), 0);
    EXPECT_EQ(std::string(name, length), sent.name);
    std::free(name);
    EXPECT_EQ(startOf(programme), sent.start);
    uint32_t duration = 0;
    EXPECT_EQ(TELIX_JS_SI_GetDuration(programme, &duration), 0);
    EXPECT_EQ(duration, sent.duration);
    char* channelId = nullptr;
    EXPECT_EQ(TELIX_JS_SI_GetChannelID(programme, &channelId), 0);
    EXPECT_EQ(textOf(channelId), std::to_string(channel));
    uint32_t ratingCount = 0;
    TELIX_JS_SI_PARENTALRATING_HANDLE* ratings = nullptr;
    ASSERT_EQ(TELIX_JS_SI_GetParentalRatingHandles(programme, &ratingCount, &ratings), 0);
    ASSERT_EQ(ratingCount, sent.ratings.size());
    if (ratingCount == 1) {
        int32_t value = 0;
        EXPECT_EQ(TELIX_JS_SI_PARENTALRATING_GetValue(ratings[0], &value), 0);
        EXPECT_EQ(value, sent.ratings[0].value + kParentalRatingAgeOffset);
    }
}

TEST_F(BroadcastTest, NamesThePresentAndTheFollowingProgrammeAndTellsWhenTheyChange) {
    const uint32_t seconds = Platform::instance().configuration().programmeSeconds;
    const TestService& service = testServices()[0];
    tune(m_channels[0]);
    for (uint32_t change = 0; change < 3; ++change) {
        const int64_t utc = testClock().utcSeconds();
        const EitEvent present = testProgramme(service, utc, seconds, 0);
        const EitEvent following = testProgramme(service, utc, seconds, 1);
        const auto programmes = waitForProgrammes(present, following);
        ASSERT_EQ(programmes.size(), 2U);
        expectProgramme(programmes[0], m_channels[0], present);
        expectProgramme(programmes[1], m_channels[0], following);
        testClock().advance(std::chrono::seconds(seconds));
    }
    EXPECT_TRUE(waitUntil([] { return countOf("programmes") >= 6; })); // two for each change
    EXPECT_TRUE(waitUntil([] { return countOf("rating") >= 1; }));
}

TEST_F(BroadcastTest, LetsTheAudioBeHeardThatIsSelected) {
    tune(m_channels[0]);
    TELIX_JS_AVCOMPHANDLE* handles = nullptr;
    uint32_t count = 0;
    ASSERT_EQ(TELIX_JS_VB_GetComponents(m_object, TELIX_JS_AVCOMPTYPE_AUDIO, &handles, &count), 0);
    ASSERT_EQ(count, 2U);
    const std::vector<TELIX_JS_AVCOMPHANDLE> audio(handles, handles + count);
    const auto activeAudioPid = [] {
        std::promise<std::optional<uint16_t>> result;
        Platform::instance().post([&] { result.set_value(Broadcast::instance().activeAudioPid()); });
        return result.get_future().get();
    };
    const auto languageOf = [](TELIX_JS_AVCOMPHANDLE component) {
        char* language = nullptr;
        TELIX_JS_VB_AVComponent_GetLanguage(component, TELIX_JS_AVCOMPTYPE_AUDIO, &language);
        return textOf(language);
    };
    EXPECT_EQ(languageOf(audio[0]), "deu");
    EXPECT_EQ(languageOf(audio[1]), "eng");
    const uint16_t german = testServices()[0].streams[1].pid;
    const uint16_t english = testServices()[0].streams[2].pid;
    EXPECT_TRUE(waitUntil([&] { return activeAudioPid() == german; }));
    ASSERT_EQ(TELIX_JS_VB_SelectComponent(m_object, audio[1], TELIX_JS_AVCOMPTYPE_AUDIO), 0);
    EXPECT_TRUE(waitUntil([&] { return activeAudioPid() == english; }));
    ASSERT_EQ(TELIX_JS_VB_GetCurrActiveComponents(m_object, TELIX_JS_AVCOMPTYPE_AUDIO, &handles, &count), 0);
    ASSERT_EQ(count, 1U);
    EXPECT_EQ(handles[0], audio[1]);
    ASSERT_EQ(TELIX_JS_VB_UnselectComponent(m_object, audio[1], TELIX_JS_AVCOMPTYPE_AUDIO), 0);
    EXPECT_TRUE(waitUntil([&] { return !activeAudioPid(); }));
    uint32_t channels = 0;
    EXPECT_TRUE(waitUntil([&] {
        return TELIX_JS_VB_AVComponent_GetAudioChannels(audio[0], TELIX_JS_AVCOMPTYPE_AUDIO, &channels) == 0;
    }));
    EXPECT_EQ(channels, 1U);
}

TEST_F(BroadcastTest, DescribesItsVideo) {
    tune(m_channels[0]);
    TELIX_JS_AVCOMPHANDLE* handles = nullptr;
    uint32_t count = 0;
    ASSERT_EQ(TELIX_JS_VB_GetComponents(m_object, TELIX_JS_AVCOMPTYPE_VIDEO, &handles, &count), 0);
    ASSERT_EQ(count, 1U);
    float aspectRatio = 0;
    EXPECT_EQ(TELIX_JS_VB_AVComponent_GetAspectRatio(handles[0], TELIX_JS_AVCOMPTYPE_VIDEO, &aspectRatio), 0);
    EXPECT_NEAR(aspectRatio, 16.0 / 9.0, 0.01);
    char* encoding = nullptr;
    EXPECT_EQ(TELIX_JS_VB_AVComponent_GetEncoding(handles[0], TELIX_JS_AVCOMPTYPE_VIDEO, &encoding), 0);
    EXPECT_EQ(textOf(encoding), "MPEG2");
}

TEST_F(BroadcastTest, ShowsSubtitlesOnlyWhileTheyAreSelected) {
    tune(m_channels[2]); // its picture has nothing white below
    const auto whitePixels = [] {
        const Shot shot = takeShot();
        size_t count = 0;
        for (size_t at = shot.pixels.size() / 4 * 3 / 4 * 4; at + 4 <= shot.pixels.size(); at += 4) {
            count += shot.pixels[at] > 200 && shot.pixels[at + 1] > 200 && shot.pixels[at + 2] > 200 ? 1 : 0;
        }
        return count;
    };
    TELIX_JS_AVCOMPHANDLE* handles = nullptr;
    uint32_t count = 0;
    ASSERT_EQ(TELIX_JS_VB_GetComponents(m_object, TELIX_JS_AVCOMPTYPE_SUBTITLE, &handles, &count), 0);
    ASSERT_EQ(count, 2U);
    const TELIX_JS_AVCOMPHANDLE german = handles[0];
    EXPECT_EQ(whitePixels(), 0U);
    ASSERT_EQ(TELIX_JS_VB_SelectComponent(m_object, german, TELIX_JS_AVCOMPTYPE_SUBTITLE), 0);
    EXPECT_TRUE(waitUntil([&] { return whitePixels() > 200; }));
    ASSERT_EQ(TELIX_JS_VB_UnselectComponent(m_object, german, TELIX_JS_AVCOMPTYPE_SUBTITLE), 0);
    EXPECT_TRUE(waitUntil([&] { return whitePixels() == 0; }));
    // The longest pause between two subtitles is shorter than these two seconds of frames.
    const uint64_t last = takeShot().serial + 50;
    EXPECT_TRUE(waitUntil([&] {
        EXPECT_EQ(whitePixels(), 0U);
        return HasFailure() || takeShot().serial >= last;
    }));
}

TEST_F(BroadcastTest, HandsStreamEventsOfTheMultiplexToWhoeverWatchesThem) {
    tune(m_channels[0]);
    TELIX_JS_VB_RegisterStreamEvent(m_object, onStreamEvent, "1", "1f", "red");
    TELIX_JS_VB_RegisterStreamEvent(m_object, onStreamEvent, "2", "1f", "of another id");
    TELIX_JS_VB_RegisterStreamEvent(m_object, onStreamEvent, "1", "20", "of another component");
    std::string digits;
    for (const char letter : std::string("Red button on Telix One")) {
        char pair[3];
        std::snprintf(pair, sizeof(pair), "%02x", static_cast<unsigned int>(letter));
        digits += pair;
    }
    // There is one event in each second.
    EXPECT_EQ(waitFor("event", 0).text, "red/" + digits + "/trigger");
    testClock().advance(std::chrono::seconds(1));
    waitFor("event", 1);
    TELIX_JS_VB_RegisterStreamEvent(m_object, onOtherStreamEvent, "1", "1f", "of another callback");
    ASSERT_EQ(TELIX_JS_VB_UnRegisterStreamEvent(m_object, onStreamEvent, "1", "1f", "a name that differs"),
              0);
    waitFor("other event", 0); // a repetition of the one before
    const size_t before = countOf("event");
    for (size_t more = 1; more <= 2; ++more) {
        testClock().advance(std::chrono::seconds(1));
        waitFor("other event", more);
    }
    EXPECT_EQ(countOf("event"), before);
}

TEST_F(BroadcastTest, PlacesThePictureWhereThePageWantsIt) {
    const TELIX_JS_DISPLAY_AREA area{100, 50, 640, 360};
    ASSERT_EQ(TELIX_JS_VB_SetDisplayArea(m_object, &area), 0);
    tune(m_channels[0]);
    telix_desktop_frame frame{};
    telix_desktop_acquire_frame(&frame);
    EXPECT_EQ(frame.areaX, 100);
    EXPECT_EQ(frame.areaY, 50);
    EXPECT_EQ(frame.areaWidth, 640U);
    EXPECT_EQ(frame.areaHeight, 360U);
    EXPECT_EQ(frame.fullScreen, 0);
    EXPECT_EQ(frame.aspectWidth, 16U);
    EXPECT_EQ(frame.aspectHeight, 9U);
    telix_desktop_release_frame(&frame);
    ASSERT_EQ(TELIX_JS_VB_SetFullScreen(m_object, 1), 0);
    ___UINT8 isFull = 0;
    ASSERT_EQ(TELIX_JS_VB_IsFullScreen(m_object, &isFull), 0);
    EXPECT_EQ(isFull, 1);
    telix_desktop_acquire_frame(&frame);
    EXPECT_EQ(frame.fullScreen, 1);
    telix_desktop_release_frame(&frame);
    int32_t width = 0;
    EXPECT_EQ(TELIX_JS_VB_SetWidth(m_object, 320), 0);
    EXPECT_EQ(TELIX_JS_VB_GetWidth(m_object, &width), 0);
    EXPECT_EQ(width, 320);
}

TEST_F(BroadcastTest, RefusesHandlesThatItNeverGave) {
    for (const uint32_t nonsense : {0U, 4711U, 0xFFFFFFFFU}) {
        uint32_t number = 0;
        int32_t value = 0;
        float ratio = 0;
        ___UINT8 flag = 0;
        char* text = nullptr;
        uint32_t* array = nullptr;
        const TELIX_JS_DISPLAY_AREA area{};
        EXPECT_NE(TELIX_JS_CM_GetChannelType(nonsense, &value), 0);
        EXPECT_NE(TELIX_JS_CM_GetSid(nonsense, &number), 0);
        EXPECT_NE(TELIX_JS_CM_GetName(nonsense, &text), 0);
        EXPECT_NE(TELIX_JS_CM_GetDsd(nonsense, &text), 0);
        EXPECT_NE(TELIX_JS_SI_SetName(nonsense, "x"), 0);
        EXPECT_NE(TELIX_JS_SI_GetName(nonsense, &text, &flag), 0);
        EXPECT_NE(TELIX_JS_SI_GetParentalRatingHandles(nonsense, &number, &array), 0);
        EXPECT_NE(TELIX_JS_SI_PARENTALRATING_GetValue(nonsense, &value), 0);
        EXPECT_NE(TELIX_JS_VB_Release(nonsense), 0);
        EXPECT_NE(TELIX_JS_VB_Stop(nonsense), 0);
        EXPECT_NE(TELIX_JS_VB_BindToCurrChannel(nonsense), 0);
        EXPECT_NE(TELIX_JS_VB_SetChannel(nonsense, m_channels[0], 0), 0);
        EXPECT_NE(TELIX_JS_VB_SetChannel(nonsense, 0, 0), 0);
        EXPECT_NE(TELIX_JS_VB_NextChannel(nonsense, &number), 0);
        EXPECT_NE(TELIX_JS_VB_PrevChannel(nonsense, &number), 0);
        EXPECT_NE(TELIX_JS_VB_GetCurrentChannel(nonsense, &number), 0);
        EXPECT_NE(TELIX_JS_VB_SetChannelByTriplet(nonsense, 1, 2, 3), 0);
        EXPECT_NE(TELIX_JS_VB_CreateChannelObjectByTriplet(nonsense, 0, 1, 2, 3, &number), 0);
        EXPECT_NE(TELIX_JS_VB_SetFullScreen(nonsense, 1), 0);
        EXPECT_NE(TELIX_JS_VB_IsFullScreen(nonsense, &flag), 0);
        EXPECT_NE(TELIX_JS_VB_SetWidth(nonsense, 1), 0);
        EXPECT_NE(TELIX_JS_VB_GetHeight(nonsense, &value), 0);
        EXPECT_NE(TELIX_JS_VB_GetPlayBackState(nonsense, &value), 0);
        EXPECT_NE(TELIX_JS_VB_SetDisplayArea(nonsense, &area), 0);
        EXPECT_NE(TELIX_JS_VB_GetComponents(nonsense, 0, &array, &number), 0);
        EXPECT_NE(TELIX_JS_VB_SelectComponent(nonsense, nonsense, nonsense), 0);
        EXPECT_NE(TELIX_JS_VB_RegisterStreamEvent(nonsense, onStreamEvent, "1", "1f", ""), 0);
        EXPECT_NE(TELIX_JS_VB_UnRegisterStreamEvent(nonsense, onStreamEvent, "1", "1f", ""), 0);
        EXPECT_NE(TELIX_JS_VB_AVComponent_GetAspectRatio(nonsense, nonsense, &ratio), 0);
        EXPECT_NE(TELIX_JS_VB_AVComponent_GetLanguage(nonsense, 1, &text), 0);
        EXPECT_EQ(text, nullptr);
        EXPECT_EQ(array, nullptr);
    }
    EXPECT_NE(TELIX_JS_VB_SetChannel(m_object, 4711, 0), 0);
    EXPECT_NE(TELIX_JS_VB_SelectComponent(m_object, 4711, 77), 0);
}

TEST_F(BroadcastTest, AnswersFiftyQuickTunesAndShowsTheLast) {
    constexpr size_t tunes = 50;
    for (size_t index = 0; index < tunes; ++index) {
        ASSERT_EQ(TELIX_JS_VB_SetChannel(m_object, m_channels[index % m_channels.size()], 0), 0);
        if (index % 10 == 0) {
            flushPlatformThread(); // this one gets as far as a pipeline
        }
    }
    EXPECT_TRUE(waitUntil([&] { return countOf("change") + countOf("error") == tunes; }));
    for (const Event& error : ofKind("error")) {
        EXPECT_EQ(error.second, kErrorInterrupted);
    }
    ASSERT_GT(countOf("change"), 0U);
    EXPECT_EQ(ofKind("change").back().first, m_channels[(tunes - 1) % m_channels.size()]);
    EXPECT_TRUE(takeShot().visible);
}

} // namespace

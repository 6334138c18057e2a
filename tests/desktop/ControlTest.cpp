// The control socket of a running television: state, events, and the handling of bad input.
#include <algorithm>
#include <atomic>
#include <csignal>
#include <cstdlib>
#include <fcntl.h>
#include <fstream>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <json-glib/json-glib.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include "desktop/platform/Broadcast.h"
#include "desktop/platform/ControlProtocol.h"
#include "desktop/platform/ControlSocket.h"
#include "desktop/platform/Device.h"
#include "desktop/platform/WindowRequests.h"
#include "telix/telix_platform.h"
#include "tests/desktop/Received.h"

using namespace desktop;
using testing::HasSubstr;
using testing::Test;

namespace {

constexpr int kResponseTimeout = 60000; // milliseconds; reached only if the test fails

// The callbacks with their arguments.
Received<std::string> events;

std::string stringOf(const ___UINT8* argument) {
    return argument ? reinterpret_cast<const char*>(argument) : "null";
}

TELIX_RETCODE_ENUM_T onChange(TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE channel) {
    return events.add("change " + std::to_string(channel));
}
TELIX_RETCODE_ENUM_T onError(TELIX_JS_VB_HANDLE, TELIX_JS_CM_HANDLE channel, TELIX_ERR_STATE_ENUM_T error) {
    return events.add("error " + std::to_string(channel) + " " + std::to_string(error));
}
TELIX_RETCODE_ENUM_T onFullScreen(TELIX_JS_VB_HANDLE) {
    return events.add("full screen");
}
TELIX_RETCODE_ENUM_T onRating(TELIX_JS_VB_HANDLE, ___UINT8*, TELIX_JS_SI_PARENTALRATING_HANDLE rating,
                              ___UINT8*) {
    int32_t value = 0;
    char* region = nullptr;
    TELIX_JS_SI_PARENTALRATING_GetValue(rating, &value);
    TELIX_JS_SI_PARENTALRATING_GetRegion(rating, &region);
    return events.add("rating " + std::to_string(value) + " " + (region ? textOf(region) : "none"));
}
TELIX_RETCODE_ENUM_T onRatingError(TELIX_JS_VB_HANDLE, ___UINT8* contentId, TELIX_JS_SI_PARENTALRATING_HANDLE,
                                   ___UINT8* drmSystemId) {
    return events.add("rating error " + stringOf(contentId) + " " + stringOf(drmSystemId));
}
TELIX_RETCODE_ENUM_T onStreamEvent(TELIX_JS_VB_HANDLE, ___UINT8*, ___UINT8*, ___UINT8* name, ___UINT8* data,
                                   ___UINT32 length, ___UINT8* status) {
    return events.add("event " + stringOf(name) + " " + std::string(reinterpret_cast<char*>(data), length) +
                      " " + stringOf(status));
}
TELIX_RETCODE_ENUM_T onLowMemory() {
    return events.add("low memory");
}
TELIX_RETCODE_ENUM_T onDrmResult(___UINT8* id, ___UINT8* message, TELIX_DRM_RESULT_CODE_ENUM_T result) {
    return events.add("drm " + stringOf(id) + " " + stringOf(message) + " " + std::to_string(result));
}

bool waitForEvent(const std::string& event) {
    return waitUntil([&] {
        const std::vector<std::string> all = events.all();
        return std::find(all.begin(), all.end(), event) != all.end();
    });
}

// One connection to the television of this process.
class Client {
public:
    explicit Client(const std::string& path) : m_socket(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
        const auto address = socketAddress(path);
        EXPECT_EQ(connect(m_socket, reinterpret_cast<const sockaddr*>(&*address), sizeof(*address)), 0)
            << path;
    }
    ~Client() { close(m_socket); }
    Client(const Client&) = delete;
    Client& operator=(const Client&) = delete;

    void write(const std::string& bytes) const {
        EXPECT_EQ(::send(m_socket, bytes.data(), bytes.size(), MSG_NOSIGNAL),
                  static_cast<ssize_t>(bytes.size()));
    }

    // Returns false if not all bytes can be sent without waiting.
    bool writeSome(const std::string& bytes) const {
        return ::send(m_socket, bytes.data(), bytes.size(), MSG_NOSIGNAL | MSG_DONTWAIT) ==
               static_cast<ssize_t>(bytes.size());
    }

    void shutDownWriting() const { shutdown(m_socket, SHUT_WR); }

    // The next line; "end" if the television has closed the connection, "timeout" if it sends nothing.
    std::string readLine() {
        for (;;) {
            const size_t end = m_input.find('\n');
            if (end != std::string::npos) {
                const std::string line = m_input.substr(0, end);
                m_input.erase(0, end + 1);
                return line;
            }
            pollfd ready{m_socket, POLLIN, 0};
            if (poll(&ready, 1, kResponseTimeout) != 1) {
                return "timeout";
            }
            char buffer[4096];
            const ssize_t size = recv(m_socket, buffer, sizeof(buffer), 0);
            if (size <= 0) {
                return "end";
            }
            m_input.append(buffer, static_cast<size_t>(size));
        }
    }

    // Sends a request and returns the response.
    std::string send(const std::string& request) {
        write(request + "\n");
        return readLine();
    }

private:
    int m_socket;
    std::string m_input;
};

const char kState[] = R"({"command":"state"})";
const char kChannels[] = R"({"command":"channels"})";
const char kDone[] = R"({"ok":true})";

// The value at a JSON path of a response, as JSON; empty if there is none.
std::string find(const std::string& response, const std::string& path) {
    JsonParser* parser = json_parser_new();
    std::string found;
    if (json_parser_load_from_data(parser, response.c_str(), -1, nullptr)) {
        JsonNode* result = json_path_query(path.c_str(), json_parser_get_root(parser), nullptr);
        char* json = json_to_string(result, FALSE);
        found = json;
        g_free(json);
        json_node_unref(result);
    }
    g_object_unref(parser);
    return found.size() > 2 ? found.substr(1, found.size() - 2) : ""; // the result is an array
}

class ControlTest : public Test {
protected:
    void SetUp() override {
        Platform::instance();
        std::string error;
        m_folder = controlFolder(error);
        ASSERT_NE(m_folder, "") << error;
        m_path = controlSocketPath(m_folder, getpid());
        struct stat status {};
        ASSERT_TRUE(waitUntil([&] { return stat(m_path.c_str(), &status) == 0; })) << m_path;
        TELIX_JS_VB_GetHandle(&m_object);
    }

    void TearDown() override {
        TELIX_JS_VB_Release(m_object);
        TELIX_JS_VB_UnRegisterOnChannelChangeSucceeded(onChange);
    }

    void tune(TELIX_JS_CM_HANDLE channel) {
        TELIX_JS_VB_RegisterOnChannelChangeSucceeded(onChange);
        ASSERT_EQ(TELIX_JS_VB_SetChannel(m_object, channel, 0), 0);
        ASSERT_TRUE(waitForEvent("change " + std::to_string(channel)));
    }

    std::string m_folder;
    std::string m_path;
    TELIX_JS_VB_HANDLE m_object = 0;
};

TEST_F(ControlTest, ListsTheChannelsAndTunesAsTheViewerWould) {
    Client client(m_path);
    const std::string list = client.send(kChannels);
    EXPECT_EQ(find(list, "$.channels[*].name"), "\"Telix One\",\"Telix Two\",\"Telix Three\"");
    EXPECT_EQ(find(list, "$.channels[*].number"), "1,2,3");
    EXPECT_EQ(find(list, "$.channels[*].current"), "true,false,false");

    // Without an object the channel is kept for the next one that binds.
    EXPECT_EQ(find(client.send(R"({"command":"channel","number":3})"), "$.channel.name"), "\"Telix Three\"");
    TELIX_JS_VB_RegisterOnChannelChangeSucceeded(onChange);
    ASSERT_EQ(TELIX_JS_VB_BindToCurrChannel(m_object), 0);
    ASSERT_TRUE(waitForEvent("change 3"));
    client.send(R"({"command":"channel","number":2})");
    ASSERT_TRUE(waitForEvent("change 2"));
    TELIX_JS_CM_HANDLE current = 0;
    EXPECT_EQ(TELIX_JS_VB_GetCurrentChannel(m_object, &current), 0);
    EXPECT_EQ(current, 2U);
    EXPECT_EQ(find(client.send(R"({"command":"channel","number":4})"), "$.error"),
              "\"\\\"number\\\" is out of range: there are 3 channels\"");
}

TEST_F(ControlTest, ListsTheApplicationsOfTheChannelAndSignalsAnother) {
    Client client(m_path);
    const char list[] = R"({"command":"applications"})";
    EXPECT_EQ(find(client.send(list), "$.state"), "\"no service\"");
    tune(1);
    std::string applications;
    const auto hasUrls = [&](const std::string& urls) {
        applications = client.send(list);
        return find(applications, "$.applications[*].url") == urls;
    };
    const std::string own =
        R"("http://127.0.0.1/apps/demo/index.html","http://127.0.0.1/apps/media/index.html")";
    ASSERT_TRUE(waitUntil([&] { return hasUrls(own); })) << applications;
    EXPECT_EQ(find(applications, "$.state"), "\"known\"");
    EXPECT_EQ(find(applications, "$.channel.number"), "1");
    EXPECT_EQ(find(applications, "$.applications[*].id"), R"("7e11.1","7e11.2")");
    EXPECT_EQ(find(applications, "$.applications[*].controlCode"), R"("AUTOSTART","PRESENT")");
    EXPECT_EQ(find(applications, "$.applications[*].serviceBound"), "false,true");
    EXPECT_EQ(find(applications, "$.applications[*].boundaries"),
              R"(["http://127.0.0.1/apps/"],["http://127.0.0.1/apps/"])");
    EXPECT_EQ(find(applications, "$.skipped"), "[]");

    EXPECT_EQ(client.send(R"({"command":"signal","url":"http://a.example/","control-code":"kill"})"), kDone);
    ASSERT_TRUE(hasUrls(own + ",\"http://a.example/\""));
    EXPECT_EQ(find(applications, "$.applications[2].controlCode"), "\"KILL\"");
    EXPECT_EQ(client.send(R"({"command":"signal","url":"http://b.example/","service-bound":true})"), kDone);
    ASSERT_TRUE(hasUrls(own + ",\"http://b.example/\""));
    EXPECT_EQ(find(applications, "$.applications[2].serviceBound"), "true");
    EXPECT_EQ(client.send(R"({"command":"signal"})"), kDone);
    EXPECT_TRUE(hasUrls(own));
    EXPECT_EQ(client.send(R"({"command":"signal","url":"http://c.example/","on":2})"), kDone);
    EXPECT_TRUE(hasUrls(own)); // not on this channel
    EXPECT_EQ(find(client.send(R"({"command":"signal","url":"c.html"})"), "$.error"),
              "\"\\\"url\\\" is not an absolute URL\"");
    EXPECT_THAT(client.send(R"({"command":"signal","url":"http://c.example/","on":4})"),
                HasSubstr("there are 3 channels"));
}

TEST_F(ControlTest, SwitchesInstantChannelChanges) {
    Client client(m_path);
    tune(1);
    ASSERT_TRUE(waitUntil([&] { return find(client.send(kState), "$.keptPackets") != "0"; }));
    EXPECT_EQ(find(client.send(kState), "$.instantZap"), "true");
    EXPECT_EQ(find(client.send(kState), "$.zapDelay"), "0");
    EXPECT_THAT(find(client.send(kState), "$.tuners[0].multiplex"), HasSubstr("test-multiplex"));
    EXPECT_EQ(find(client.send(kState), "$.tuners[0].selected"), "true");
    EXPECT_EQ(client.send(R"({"command":"instant-zap","on":false})"), kDone);
    EXPECT_EQ(find(client.send(kState), "$.instantZap"), "false");
    EXPECT_EQ(find(client.send(kState), "$.keptPackets"), "0");
    EXPECT_EQ(client.send(R"({"command":"instant-zap","on":true})"), kDone);
}

TEST_F(ControlTest, TellsWhatIsPresented) {
    Client client(m_path);
    const std::string before = client.send(kState);
    EXPECT_EQ(find(before, "$.ok"), "true");
    EXPECT_EQ(find(before, "$.picture.visible"), "false");
    EXPECT_EQ(find(before, "$.activeAudioPid"), "null");
    EXPECT_EQ(find(before, "$.registrations.channelChange"), "false");
    tune(1);
    const TELIX_JS_DISPLAY_AREA area{10, 20, 640, 360};
    TELIX_JS_VB_SetDisplayArea(m_object, &area);
    uint32_t count = 0;
    TELIX_JS_AVCOMPHANDLE* components = nullptr;
    ASSERT_EQ(TELIX_JS_VB_GetComponents(m_object, TELIX_JS_AVCOMPTYPE_SUBTITLE, &components, &count), 0);
    ASSERT_EQ(count, 2U);
    EXPECT_EQ(find(client.send(kState), "$.activeSubtitlePid"), "null");
    TELIX_JS_VB_SelectComponent(m_object, components[1], TELIX_JS_AVCOMPTYPE_SUBTITLE);
    ASSERT_EQ(TELIX_JS_VB_GetComponents(m_object, TELIX_JS_AVCOMPTYPE_AUDIO, &components, &count), 0);
    ASSERT_EQ(count, 2U);
    TELIX_JS_VB_SelectComponent(m_object, components[1], TELIX_JS_AVCOMPTYPE_AUDIO);

    // Audio and tables follow a little later.
    std::string state;
    const auto isSettled = [&] {
        state = client.send(kState);
        return find(state, "$.activeAudioPid") == find(state, "$.components[2].pid") &&
               find(state, "$.programmes.next") != "null";
    };
    ASSERT_TRUE(waitUntil(isSettled)) << state;
    EXPECT_EQ(find(state, "$.channel.name"), "\"Telix One\"");
    EXPECT_EQ(find(state, "$.objects[0].playState"), "\"presenting\"");
    EXPECT_EQ(find(state, "$.objects[0].ownsTuner"), "true");
    EXPECT_EQ(find(state, "$.objects[0].area.width"), "640");
    EXPECT_EQ(find(state, "$.picture.visible"), "true");
    EXPECT_EQ(find(state, "$.picture.width"), "720");
    EXPECT_EQ(find(state, "$.picture.area"), R"({"x":10,"y":20,"width":640,"height":360})");
    EXPECT_EQ(find(state, "$.components[*].type"), "\"video\",\"audio\",\"audio\",\"subtitle\",\"subtitle\"");
    EXPECT_EQ(find(state, "$.components[*].active"), "true,false,true,false,true");
    EXPECT_EQ(find(state, "$.activeSubtitlePid"), find(state, "$.components[4].pid"));
    EXPECT_EQ(find(state, "$.registrations.channelChange"), "true");
    EXPECT_EQ(find(state, "$.registrations.channelError"), "false");
    EXPECT_EQ(find(state, "$.keys"), R"(["red","navigation"])");
    EXPECT_EQ(find(state, "$.televisionKeys"), R"(["green","yellow","blue","vcr","info","numeric"])");
    EXPECT_EQ(find(state, "$.keySet"), "17");
    EXPECT_EQ(find(state, "$.freeMemory"), "123456");

    uint32_t programmeCount = 0;
    TELIX_JS_SI_HANDLE* programmes = nullptr;
    ASSERT_EQ(TELIX_JS_SI_GetProgrammeHandles(&programmeCount, &programmes), 0);
    ASSERT_EQ(programmeCount, 2U);
    EXPECT_TRUE(waitUntil([&] { // a programme may begin between the two
        uint32_t start = 0;
        return TELIX_JS_SI_GetProgrammeHandles(&programmeCount, &programmes) == 0 && programmeCount > 0 &&
               TELIX_JS_SI_GetStartTime(programmes[0], &start) == 0 &&
               find(client.send(kState), "$.programmes.now.start") == std::to_string(start);
    }));
    const std::string serial = find(state, "$.picture.serial");
    EXPECT_TRUE(waitUntil([&] { return find(client.send(kState), "$.picture.serial") != serial; }));
}

TEST_F(ControlTest, NamesAStateThatPagesMakeUp) {
    Client client(m_path);
    ASSERT_EQ(TELIX_JS_VB_SetPlayBackState(m_object, 77), 0);
    const std::string state = client.send(kState);
    EXPECT_EQ(find(state, "$.objects[0].playState"), "\"other\"");
    EXPECT_EQ(find(state, "$.objects[0].playStateNumber"), "77");
}

TEST_F(ControlTest, TellsWhatPlayersDo) {
    Client client(m_path);
    EXPECT_EQ(find(client.send(kState), "$.players"), "[]");
    TELIX_JS_AV_HANDLE player = 0;
    ASSERT_EQ(TELIX_JS_AV_CreatePlayer(&player, 0, 0, 0), 0);
    ASSERT_EQ(TELIX_JS_AV_SetVolume(player, 30), 0);
    EXPECT_EQ(find(client.send(kState), "$.players"),
              R"([{"handle":)" + std::to_string(player) +
                  R"(,"url":"","state":"stopped","position":0,"duration":0,"bufferedEnd":0,)"
                  R"("buffered":4294967295,"speed":1.0,"volume":30}])");
    ASSERT_EQ(TELIX_JS_AV_Play(player, "file:///absent", 1, 6, 512, 0, 0, 0), 0);
    EXPECT_TRUE(waitUntil([&] { return find(client.send(kState), "$.players[0].state") == "\"error\""; }));
    EXPECT_EQ(find(client.send(kState), "$.players[0].url"), "\"file:///absent\"");
    TELIX_JS_AV_DestroyPlayer(player);
}

TEST_F(ControlTest, ProvokesWhatBroadcastAndTheViewerMayDo) {
    Client client(m_path);
    TELIX_JS_VB_RegisterOnChannelChangeError(onError);
    TELIX_JS_VB_RegisterOnFullScreenChange(onFullScreen);
    TELIX_JS_VB_RegisterOnParentalRatingChange(m_object, onRating);
    TELIX_JS_VB_RegisterOnParentalRatingError(m_object, onRatingError);
    const char noObject[] = R"({"ok":false,"error":"no video/broadcast object owns the tuner"})";
    for (const char* request :
         {R"({"command":"channel-error","error":1})", R"({"command":"rating","age":16})",
          R"({"command":"rating-error"})", R"({"command":"full-screen","on":true})"}) {
        EXPECT_EQ(client.send(request), noObject) << request;
    }
    tune(1);
    EXPECT_EQ(client.send(R"({"command":"channel-error","error":2})"), kDone);
    EXPECT_TRUE(waitForEvent("error 1 2"));
    for (int time = 0; time < 2; ++time) { // the same rating is reported again
        events.clear();
        EXPECT_EQ(client.send(R"({"command":"rating","age":7,"region":"FRA"})"), kDone);
        EXPECT_TRUE(waitForEvent("rating 7 FRA"));
    }
    EXPECT_EQ(client.send(R"({"command":"rating","age":0})"), kDone);
    EXPECT_TRUE(waitForEvent("rating 0 none"));
    EXPECT_EQ(client.send(R"({"command":"rating-error","content-id":"c","drm-system":"urn:d"})"), kDone);
    EXPECT_TRUE(waitForEvent("rating error c urn:d"));
    EXPECT_EQ(client.send(R"({"command":"full-screen","on":true})"), kDone);
    EXPECT_TRUE(waitForEvent("full screen"));
    ___UINT8 isFull = 0;
    TELIX_JS_VB_IsFullScreen(m_object, &isFull);
    EXPECT_EQ(isFull, 1);
    TELIX_JS_VB_UnRegisterOnChannelChangeError(onError);
    TELIX_JS_VB_UnRegisterOnFullScreenChange(onFullScreen);
    TELIX_JS_VB_UnRegisterOnParentalRatingChange(onRating);
    TELIX_JS_VB_UnRegisterOnParentalRatingError(onRatingError);
    EXPECT_THAT(client.send(R"({"command":"channel-error","error":2})"),
                HasSubstr("no listener is registered"));
}

TEST_F(ControlTest, SendsStreamEventsToTheListenersThatMeetTheConditions) {
    Client client(m_path);
    EXPECT_THAT(client.send(R"({"command":"stream-event","data":"x"})"),
                HasSubstr("no listener is registered"));
    TELIX_JS_VB_RegisterStreamEvent(m_object, onStreamEvent, "200", "1f", "first");
    TELIX_JS_VB_RegisterStreamEvent(m_object, onStreamEvent, "201", "20", "second");
    EXPECT_EQ(find(client.send(kState), "$.registrations.streamEvents[*].name"), R"("first","second")");
    EXPECT_EQ(find(client.send(R"({"command":"stream-event","id":200,"data":"Hi"})"), "$.listeners"), "1");
    EXPECT_TRUE(waitForEvent("event first 4869 trigger"));
    EXPECT_EQ(find(client.send(R"({"command":"stream-event","tag":32,"hex":"00fF","status":"error"})"),
                   "$.listeners"),
              "1");
    EXPECT_TRUE(waitForEvent("event second 00ff error"));
    EXPECT_EQ(find(client.send(R"({"command":"stream-event","name":"second"})"), "$.listeners"), "1");
    EXPECT_TRUE(waitForEvent("event second  trigger"));
    EXPECT_EQ(find(client.send(R"({"command":"stream-event","data":"all"})"), "$.listeners"), "2");
    EXPECT_THAT(client.send(R"({"command":"stream-event","id":200,"tag":32})"),
                HasSubstr("no listener is registered"));
    TELIX_JS_VB_UnRegisterStreamEvent(m_object, onStreamEvent, "200", "1f", "");
    TELIX_JS_VB_UnRegisterStreamEvent(m_object, onStreamEvent, "201", "20", "");
}

TEST_F(ControlTest, ProvokesDrmAnswersAndShortageOfMemory) {
    Client client(m_path);
    EXPECT_THAT(client.send(R"({"command":"drm-result","result":0})"),
                HasSubstr("no DRM message has been sent"));
    EXPECT_THAT(client.send(R"({"command":"drm-result","result":0,"id":"x"})"),
                HasSubstr("no DRM agent is registered"));
    EXPECT_THAT(client.send(R"({"command":"low-memory","free":7})"),
                HasSubstr("no application manager is registered"));
    EXPECT_EQ(find(client.send(kState), "$.freeMemory"), "123456"); // unchanged

    TELIX_JS_DRM_RegisterOnDRMMessageResult(onDrmResult);
    char* id = nullptr;
    ASSERT_EQ(TELIX_JS_DRM_SendDRMMessage("type", "message", "urn:unknown", &id), 0);
    const std::string sent = id;
    std::free(id);
    EXPECT_TRUE(waitForEvent("drm " + sent + " unknown DRM system 5"));
    EXPECT_EQ(find(client.send(R"({"command":"drm-result","result":3,"message":"again"})"), "$.id"),
              "\"" + sent + "\"");
    EXPECT_TRUE(waitForEvent("drm " + sent + " again 3"));
    client.send(R"({"command":"drm-result","result":0,"id":"other"})");
    EXPECT_TRUE(waitForEvent("drm other  0"));
    TELIX_JS_DRM_UnregisterOnDRMMessageResult(onDrmResult);

    TELIX_JS_APP_RegisterLowMemory(onLowMemory);
    EXPECT_EQ(client.send(R"({"command":"low-memory","free":1000})"), kDone);
    EXPECT_TRUE(waitForEvent("low memory"));
    uint32_t free = 0;
    TELIX_JS_APP_GetFreeMem(&free);
    EXPECT_EQ(free, 1000U);
    TELIX_JS_APP_UnRegisterLowMemory(onLowMemory);
}

// ---- The window

// A window that gets the requests of the socket. `onRequest` runs on the platform thread.
class Window {
public:
    using OnRequest = std::function<void(uint64_t request, const std::string& line)>;

    explicit Window(OnRequest onRequest) : m_onRequest(std::move(onRequest)) {
        const telix_desktop_control_handler handler{[](uint64_t request, const char* line, void* window) {
                                                        static_cast<Window*>(window)->m_onRequest(request,
                                                                                                  line);
                                                    },
                                                    this};
        telix_desktop_set_control_handler(&handler);
    }
    ~Window() { telix_desktop_set_control_handler(nullptr); }
    Window(const Window&) = delete;
    Window& operator=(const Window&) = delete;

private:
    OnRequest m_onRequest;
};

const char kReload[] = R"({"command":"reload"})";

TEST_F(ControlTest, PassesRequestsOfTheWindowOnAndItsResponseBack) {
    Client client(m_path);
    EXPECT_EQ(client.send(kReload), R"({"ok":false,"error":"the television has no window"})");
    Received<std::string> lines;
    const Window window([&](uint64_t request, const std::string& line) {
        lines.add(line);
        telix_desktop_answer_control_request(request, R"({"ok":true,"more":[1]})");
    });
    EXPECT_EQ(client.send(R"({"command":"key","names":["ok"]})"), R"({"ok":true,"more":[1]})");
    EXPECT_EQ(lines.all(), std::vector<std::string>{R"({"command":"key","names":["ok"]})"});
    EXPECT_THAT(client.send(R"({"command":"key","names":[]})"), HasSubstr("must be an array of strings"));
    EXPECT_EQ(lines.all().size(), 1U);
}

TEST_F(ControlTest, PassesARequestOnToAWindowThatAppearsALittleLater) {
    Client client(m_path);
    client.write(std::string(kReload) + "\n");
    Client other(m_path);
    EXPECT_THAT(other.send(kChannels), HasSubstr("Telix One")); // the request has been read
    Received<std::string> lines;
    const Window window([&](uint64_t request, const std::string& line) {
        lines.add(line);
        telix_desktop_answer_control_request(request, kDone);
    });
    EXPECT_EQ(client.readLine(), kDone);
    EXPECT_EQ(lines.all(), std::vector<std::string>{kReload});
}

TEST_F(ControlTest, AnswersTheRequestsOfAClientInTheirOrderAndOthersMeanwhile) {
    Client client(m_path);
    Client other(m_path);
    std::atomic<uint64_t> waiting{0};
    const Window window([&](uint64_t request, const std::string&) { waiting = request; });
    client.write(std::string(kReload) + "\n" + kChannels + "\n");
    ASSERT_TRUE(waitUntil([&] { return waiting != 0; }));
    EXPECT_THAT(other.send(kChannels), HasSubstr("Telix One"));
    std::thread([&] {
        telix_desktop_answer_control_request(waiting, R"({"ok":false,"error":"no"})");
    }).join();
    EXPECT_EQ(client.readLine(), R"({"ok":false,"error":"no"})");
    EXPECT_THAT(client.readLine(), HasSubstr("Telix One"));
    telix_desktop_answer_control_request(waiting, kDone); // ignored: it has been answered
    EXPECT_THAT(client.send(kChannels), HasSubstr("Telix One"));
}

TEST_F(ControlTest, AnswersAClientThatHasEndedItsRequestsAndForgetsOneThatHasLeft) {
    std::atomic<uint64_t> waiting{0};
    const Window window([&](uint64_t request, const std::string&) { waiting = request; });
    {
        Client gone(m_path);
        gone.write(std::string(kReload) + "\n");
        ASSERT_TRUE(waitUntil([&] { return waiting != 0; }));
    }
    const uint64_t first = waiting.exchange(0);
    Client client(m_path);
    client.write(kReload);
    client.shutDownWriting();
    ASSERT_TRUE(waitUntil([&] { return waiting != 0; }));
    telix_desktop_answer_control_request(first, kDone);
    telix_desktop_answer_control_request(waiting, kDone);
    EXPECT_EQ(client.readLine(), kDone);
    EXPECT_EQ(client.readLine(), "end");
}

TEST_F(ControlTest, SaysSoIfTheWindowIsClosedOrDoesNotRespondInTimeOrRespondsNonsense) {
    Client client(m_path);
    std::atomic<uint64_t> waiting{0};
    auto window = std::make_unique<Window>([&](uint64_t request, const std::string&) { waiting = request; });
    client.write(std::string(kReload) + "\n");
    ASSERT_TRUE(waitUntil([&] { return waiting != 0; }));
    window.reset();
    EXPECT_EQ(client.readLine(), R"({"ok":false,"error":"the window has been closed"})");

    window = std::make_unique<Window>([](uint64_t, const std::string&) {});
    Received<std::string> responses;
    Platform::instance().post([&] {
        WindowRequests::instance().send(kReload, 1,
                                        [&](const std::string& response) { responses.add(response); });
    });
    ASSERT_TRUE(waitUntil([&] { return !responses.all().empty(); }));
    EXPECT_EQ(responses.all(),
              std::vector<std::string>{R"({"ok":false,"error":"the window does not respond"})"});

    for (const char* response : {"", "hello", "[]", "{}", R"({"ok":1})"}) {
        window.reset(); // its end removes the handler
        window = std::make_unique<Window>([&](uint64_t request, const std::string&) {
            telix_desktop_answer_control_request(request, response);
        });
        EXPECT_EQ(client.send(kReload), R"({"ok":false,"error":"the response of the window is not one"})")
            << response;
    }
}

TEST_F(ControlTest, ListsWhatRunsInTheWindowBesideWhatIsSignalled) {
    Client client(m_path);
    const char list[] = R"({"command":"applications"})";
    EXPECT_EQ(client.send(list).find("running"), std::string::npos);
    const Window window([](uint64_t request, const std::string&) {
        telix_desktop_answer_control_request(request,
                                             R"({"ok":true,"running":[{"url":"http://a.example/"}]})");
    });
    const std::string response = client.send(list);
    EXPECT_EQ(find(response, "$.running[*].url"), "\"http://a.example/\"");
    EXPECT_EQ(find(response, "$.skipped"), "[]");
    EXPECT_EQ(find(response, "$.ok"), "true");
}

struct BadLine {
    std::string line;
    const char* reason; // part of the error message
};

std::vector<BadLine> badLines() {
    const std::string deep(2000, '[');
    return {
        {"hello", "not a JSON object"},
        {"{", "not a JSON object"},
        {R"({"command":"sta)", "not a JSON object"},
        {R"({"command":"state"}})", "not a JSON object"},
        {R"({"command":"state"} {"command":"state"})", "not a JSON object"},
        {R"({"command" "state"})", "not a JSON object"},
        {"{'command':'state'}", "not a JSON object"},
        {"var a = {}", "not a JSON object"},
        {"/* state */", "not a JSON object"},
        {"[]", "not a JSON object"},
        {"7", "not a JSON object"},
        {"\"state\"", "not a JSON object"},
        {"null", "not a JSON object"},
        {"{}", "\\\"command\\\" must be a string"},
        {R"({"command":null})", "\\\"command\\\" must be a string"},
        {R"({"command":["state"]})", "\\\"command\\\" must be a string"},
        {R"({"command":5})", "\\\"command\\\" must be a string"},
        {R"({"command":""})", "unknown command"},
        {R"({"command":"explode"})", "unknown command \\\"explode\\\""},
        {R"({"command":"STATE"})", "unknown command"},
        {R"({"command":"state","loud":true})", "\\\"loud\\\" is not a parameter of state"},
        {R"({"command":"channel"})", "\\\"number\\\" is missing"},
        {R"({"command":"channel","number":"1"})", "must be a whole number"},
        {R"({"command":"channel","number":1.5})", "must be a whole number"},
        {R"({"command":"channel","number":true})", "must be a whole number"},
        {R"({"command":"channel","number":null})", "must be a whole number"},
        {R"({"command":"channel","number":{}})", "must be a whole number"},
        {R"({"command":"channel","number":0})", "must be a whole number from 1 to 4294967295"},
        {R"({"command":"channel","number":-1})", "must be a whole number from 1 to 4294967295"},
        {R"({"command":"channel","number":99999999999999999999999})",
         "must be a whole number from 1 to 4294967295"},
        {R"({"command":"full-screen","on":1})", "must be true or false"},
        {R"({"command":"full-screen","on":"yes"})", "must be true or false"},
        {R"({"command":"stream-event","data":7})", "must be a string"},
        {R"({"command":"stream-event","data":["a"]})", "must be a string"},
        {R"({"command":"stream-event","hex":"0"})", "pairs of hexadecimal digits"},
        {R"({"command":"stream-event","hex":"0g"})", "pairs of hexadecimal digits"},
        {R"({"command":"stream-event","hex":"00","data":"a"})",
         "\\\"data\\\" and \\\"hex\\\" exclude each other"},
        {R"({"command":"stream-event","status":"fine"})", "\\\"status\\\" must be trigger or error"},
        {R"({"command":"stream-event","data":"a\u0000b"})", "a string contains a null character"},
        {R"({"command":"stream-event","tag":256})", "must be a whole number from 0 to 255"},
        {R"({"command":"rating","age":3})", "from 4 to 18"},
        {R"({"command":"key","names":"ok"})", "must be an array of strings, not empty"},
        {R"({"command":"key","names":[]})", "must be an array of strings, not empty"},
        {R"({"command":"key","names":["ok",5]})", "must be an array of strings, not empty"},
        {R"({"command":"key","names":["ok",["5"]]})", "must be an array of strings, not empty"},
        {R"({"command":"screenshot","file":"a.png"})", "must be an absolute file name"},
        {R"({"command":"open","url":"a.html"})", "must be an absolute URL"},
        {R"({"command":"wait","expression":"1","timeout":3601})", "from 1 to 3600"},
        {R"({"command":"rating","age":4,"region":"Germany"})", "three letters"},
        {deep, "nested too deeply"},
        {R"({"command":)" + deep, "nested too deeply"},
        {std::string("\0\0\0", 3), "not valid UTF-8"},
        {"\xff\xfe\x80", "not valid UTF-8"},
        {R"({"command":")" + std::string("\xc3\x28") + "\"}", "not valid UTF-8"},
        {std::string("\x01\x02\x1b", 3), "not a JSON object"},
    };
}

TEST_F(ControlTest, AnswersBadLinesWithAnErrorAndGoesOn) {
    Client client(m_path);
    for (const BadLine& each : badLines()) {
        const std::string response = client.send(each.line);
        EXPECT_THAT(response, HasSubstr(R"("ok":false)")) << each.line;
        EXPECT_THAT(response, HasSubstr(each.reason)) << each.line;
    }
    // Empty lines are ignored; lines may end in CR LF, and arrive in pieces or together.
    client.write("\n\r\n{\"command\":");
    client.write("\"channels\"}\r\n{\"command\":\"channels\"}\n");
    EXPECT_THAT(client.readLine(), HasSubstr(R"("ok":true)"));
    EXPECT_THAT(client.readLine(), HasSubstr(R"("ok":true)"));
}

TEST_F(ControlTest, KnowsEveryCommandOfTheListAndNeverFallsSilent) {
    Client client(m_path);
    for (const ControlCommand& command : controlCommands()) {
        const std::string response = client.send(std::string(R"({"command":")") + command.name + "\"}");
        EXPECT_THAT(response, HasSubstr("\"ok\":")) << command.name;
        EXPECT_EQ(response.find("unknown command"), std::string::npos) << command.name;
    }
    for (const ControlCommand& command : localCommands()) { // those are telixctl's own
        const std::string response = client.send(std::string(R"({"command":")") + command.name + "\"}");
        EXPECT_THAT(response, HasSubstr("unknown command")) << command.name;
    }
}

// "a|b" as `a|b`, in a cell of a table.
std::string codeCell(std::string code) {
    for (size_t bar = code.find('|'); bar != std::string::npos; bar = code.find('|', bar + 2)) {
        code.insert(bar, "\\");
    }
    return "`" + code + "`";
}

// The table of commands as docs/television.md has it.
std::string commandTable() {
    using Use = ControlParameter::Use;
    std::string table = "| Command | Default | Meaning |\n|---|---|---|\n";
    for (const auto* commands : {&controlCommands(), &localCommands()}) {
        for (const ControlCommand& command : *commands) {
            std::string synopsis = command.name;
            std::string rows;
            for (const ControlParameter& each : command.parameters) {
                const std::string value = each.placeholder;
                const bool isOption = each.use == Use::Option;
                synopsis += isOption ? "" : each.use == Use::Argument ? " " + value : " [" + value + "]";
                const std::string defaultCell = each.defaultMeaning;
                rows += "| " + codeCell(isOption ? std::string("--") + each.name + "=" + value : value) +
                        (defaultCell.empty() ? " | | " : " | " + defaultCell + " | ") + each.meaning + " |\n";
            }
            table += "| **" + codeCell(synopsis) + "** | | " + command.help + " |\n" + rows;
        }
    }
    return table;
}

TEST(ControlDocumentationTest, HasTheTableOfCommandsAndTheNamesOfPlayerMessages) {
    const char* folder = g_getenv("TELIX_DOCS");
    ASSERT_NE(folder, nullptr);
    std::ifstream file(std::string(folder) + "/television.md");
    const std::string document((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
    EXPECT_THAT(document, HasSubstr("\n" + commandTable() + "\n"));
    for (const PlayerMessage& message : playerMessages()) {
        EXPECT_THAT(document, HasSubstr(std::string("`") + message.name + "`"));
    }
}

TEST_F(ControlTest, TurnsAwayOverlongLinesAndEndsThatConnection) {
    Client long1(m_path);
    Client other(m_path);
    std::string line = R"({"command":"stream-event","data":")";
    line.append(kMaxControlRequest, 'x');
    long1.write(line + "\"}\n");
    EXPECT_THAT(long1.readLine(), HasSubstr("longer than"));
    Client endless(m_path);
    for (int piece = 0; piece < 200 && endless.writeSome(std::string(4096, 'y')); ++piece) {
    }
    EXPECT_THAT(endless.readLine(), HasSubstr("longer than"));
    EXPECT_EQ(endless.readLine(), "end");
    EXPECT_THAT(other.send(kChannels), HasSubstr(R"("ok":true)"));
    // A line of the maximum length is accepted.
    std::string longest = R"({"command":"stream-event","data":")";
    longest.append(kMaxControlRequest - longest.size() - 2, 'x');
    EXPECT_THAT(other.send(longest + "\"}"), HasSubstr("no listener is registered"));
}

TEST_F(ControlTest, TakesNoHarmFromClientsThatLeave) {
    {
        Client half(m_path);
        half.write(R"({"command":"sta)");
        half.shutDownWriting();
        EXPECT_THAT(half.readLine(), HasSubstr("not a JSON object"));
        EXPECT_EQ(half.readLine(), "end");
    }
    {
        Client last(m_path);
        last.write(R"({"command":"channels"})"); // without the end of the line
        last.shutDownWriting();
        EXPECT_THAT(last.readLine(), HasSubstr(R"("ok":true)"));
        EXPECT_EQ(last.readLine(), "end");
    }
    for (int time = 0; time < 50; ++time) {
        Client gone(m_path);
        gone.write("{\"command\":\"state\"}\n{\"command\":\"state\"}\n{\"comm"); // never reads
    }
    Client client(m_path);
    EXPECT_THAT(client.send(kChannels), HasSubstr(R"("ok":true)"));
}

TEST_F(ControlTest, DoesNotWaitForAClientThatNeverReads) {
    Client greedy(m_path);
    const std::string request = "{\"command\":\"state\"}\n";
    int taken = 0;
    const auto isFull = [&] {
        while (taken < 100000 && greedy.writeSome(request)) {
            ++taken;
        }
        // The television may still be reading: try again.
        std::this_thread::sleep_for(std::chrono::milliseconds(50));
        return !greedy.writeSome(request);
    };
    ASSERT_TRUE(waitUntil(isFull));
    EXPECT_LT(taken, 100000);
    Client client(m_path);
    EXPECT_THAT(client.send(kChannels), HasSubstr(R"("ok":true)"));
}

TEST_F(ControlTest, ServesManyClientsAtOnceUpToALimit) {
    std::vector<std::unique_ptr<Client>> clients;
    for (int count = 0; count < 32; ++count) {
        clients.push_back(std::make_unique<Client>(m_path));
        clients.back()->write("{\"command\":\"channels\"}\n");
    }
    for (const auto& client : clients) {
        EXPECT_THAT(client->readLine(), HasSubstr(R"("ok":true)"));
    }
    Client extra(m_path);
    EXPECT_THAT(extra.readLine(), HasSubstr("too many connections"));
    EXPECT_EQ(extra.readLine(), "end");
    clients.clear();
    EXPECT_TRUE(waitUntil([&] { // the connections are closed one after the other
        Client client(m_path);
        client.writeSome("{\"command\":\"channels\"}\n");
        return client.readLine().find(R"("ok":true)") != std::string::npos;
    }));
}

TEST_F(ControlTest, IsTheUsersAlone) {
    struct stat status {};
    ASSERT_EQ(stat(m_path.c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 0777, 0600U);
    EXPECT_EQ(status.st_uid, geteuid());
    if (geteuid() != 0) {
        GTEST_SKIP() << "only root can try as another user";
    }
    // Connects as another user, in a process of its own. Returns the status of that process.
    const auto connectAsAnotherUser = [&] {
        const pid_t child = fork();
        if (child == 0) {
            const auto address = socketAddress(m_path);
            syscall(SYS_setresgid, 65534, 65534, 65534);
            syscall(SYS_setresuid, 65534, 65534, 65534);
            const int socket = ::socket(AF_UNIX, SOCK_STREAM, 0);
            if (connect(socket, reinterpret_cast<const sockaddr*>(&*address), sizeof(*address)) != 0) {
                _exit(errno == EACCES ? 100 : 101);
            }
            const char request[] = "{\"command\":\"channels\"}\n";
            send(socket, request, sizeof(request) - 1, MSG_NOSIGNAL);
            char response = 0;
            _exit(recv(socket, &response, 1, 0) > 0 ? 102 : 0);
        }
        int result = 0;
        waitpid(child, &result, 0);
        return WIFEXITED(result) ? WEXITSTATUS(result) : -1;
    };
    EXPECT_EQ(connectAsAnotherUser(), 100);
    ASSERT_EQ(chmod(m_path.c_str(), 0666), 0); // the television still checks the user
    const int outcome = connectAsAnotherUser();
    chmod(m_path.c_str(), 0600);
    if (outcome == 100) {
        GTEST_SKIP() << "other users have no access to the folder";
    }
    EXPECT_EQ(outcome, 0);
}

TEST_F(ControlTest, FindsRunningTelevisionsAndForgetsDeadOnes) {
    const pid_t dead = fork();
    if (dead == 0) {
        _exit(0);
    }
    waitpid(dead, nullptr, 0);
    const std::string stale = controlSocketPath(m_folder, dead);
    const auto address = socketAddress(stale);
    const int socket = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    ASSERT_EQ(bind(socket, reinterpret_cast<const sockaddr*>(&*address), sizeof(*address)), 0);
    close(socket);
    const std::string number = std::to_string(getpid());
    std::vector<std::string> others = {"telix-x" + number + ".sock", "other-" + number + ".sock",
                                       "telix-" + number + ".lock", "telix-.sock", "telix-sock"};
    for (std::string& other : others) {
        other.insert(0, m_folder + '/');
        close(open(other.c_str(), O_CREAT | O_CLOEXEC, 0600));
    }
    const std::string nameless = controlSocketPath(m_folder, 0); // a number that no process has
    const auto namelessAddress = socketAddress(nameless);
    const int listening = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    ASSERT_EQ(bind(listening, reinterpret_cast<const sockaddr*>(&*namelessAddress), sizeof(*namelessAddress)),
              0);
    ASSERT_EQ(listen(listening, 1), 0);
    const auto running = runningTelevisions(m_folder);
    EXPECT_EQ(std::count_if(running.begin(), running.end(),
                            [&](const ControlSocket& each) { return each.path == m_path; }),
              1);
    EXPECT_TRUE(std::all_of(running.begin(), running.end(), [&](const ControlSocket& each) {
        return each.pid != dead && each.path != nameless;
    }));
    EXPECT_NE(access(stale.c_str(), F_OK), 0);
    for (const std::string& other : others) {
        EXPECT_EQ(access(other.c_str(), F_OK), 0) << other; // not a control socket
        unlink(other.c_str());
    }
    close(listening);
    unlink(nameless.c_str());
}

TEST(ControlFolderTest, IsNeverAPlaceThatOthersMadeReady) {
    const char* runtime = g_getenv("XDG_RUNTIME_DIR");
    const std::string before = runtime ? runtime : "";
    std::string error;
    g_setenv("XDG_RUNTIME_DIR", "/dev/null", TRUE);
    EXPECT_EQ(controlFolder(error), "");
    EXPECT_NE(error, "");
    g_unsetenv("XDG_RUNTIME_DIR");
    const std::string folder = controlFolder(error);
    struct stat status {};
    ASSERT_EQ(lstat(folder.c_str(), &status), 0) << error;
    EXPECT_EQ(status.st_mode & 07777, 0700U | (status.st_mode & 02000U)); // set-group-ID of the parent folder
    ASSERT_EQ(chmod(folder.c_str(), 0755), 0);
    EXPECT_EQ(controlFolder(error), "");
    ASSERT_EQ(chmod(folder.c_str(), 0700), 0);
    EXPECT_EQ(controlFolder(error), folder);
    rmdir(folder.c_str()); // fails if a television uses it
    if (runtime) {
        g_setenv("XDG_RUNTIME_DIR", before.c_str(), TRUE);
    }
    EXPECT_FALSE(socketAddress(std::string(200, 'x')));
}

} // namespace

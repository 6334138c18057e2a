// The control socket of a running television: what it tells and provokes, and what it makes of bad input.
#include "desktop/platform/Broadcast.h"
#include "desktop/platform/ControlProtocol.h"
#include "desktop/platform/ControlSocket.h"
#include "desktop/platform/Device.h"
#include "telix/telix_platform.h"
#include "tests/desktop/Received.h"

#include <csignal>
#include <cstdlib>
#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <json-glib/json-glib.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

using namespace desktop;
using testing::HasSubstr;
using testing::Test;

namespace {

// What the callbacks were given, as texts.
Received<std::string> events;

std::string given(const ___UINT8* text) {
    return text ? reinterpret_cast<const char*>(text) : "null";
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
    return events.add("rating error " + given(contentId) + " " + given(drmSystemId));
}
TELIX_RETCODE_ENUM_T onStreamEvent(TELIX_JS_VB_HANDLE, ___UINT8*, ___UINT8*, ___UINT8* name, ___UINT8* data,
                                   ___UINT32 length, ___UINT8* status) {
    return events.add("event " + given(name) + " " + std::string(reinterpret_cast<char*>(data), length) +
                      " " + given(status));
}
TELIX_RETCODE_ENUM_T onLowMemory() {
    return events.add("low memory");
}
TELIX_RETCODE_ENUM_T onDrmResult(___UINT8* id, ___UINT8* message, TELIX_DRM_RESULT_CODE_ENUM_T result) {
    return events.add("drm " + given(id) + " " + given(message) + " " + std::to_string(result));
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
        EXPECT_EQ(send(m_socket, bytes.data(), bytes.size(), MSG_NOSIGNAL),
                  static_cast<ssize_t>(bytes.size()));
    }

    // As much as goes without waiting; false when the other side takes no more.
    bool writeSome(const std::string& bytes) const {
        return send(m_socket, bytes.data(), bytes.size(), MSG_NOSIGNAL | MSG_DONTWAIT) ==
               static_cast<ssize_t>(bytes.size());
    }

    // Tells the other side that nothing more comes.
    void endWriting() const { shutdown(m_socket, SHUT_WR); }

    // The next line; "end" when the other side has closed, "none" when nothing comes.
    std::string readLine() {
        for (;;) {
            const size_t end = m_input.find('\n');
            if (end != std::string::npos) {
                const std::string line = m_input.substr(0, end);
                m_input.erase(0, end + 1);
                return line;
            }
            pollfd ready{m_socket, POLLIN, 0};
            if (poll(&ready, 1, 10000) != 1) {
                return "none";
            }
            char piece[4096];
            const ssize_t size = recv(m_socket, piece, sizeof(piece), 0);
            if (size <= 0) {
                return "end";
            }
            m_input.append(piece, static_cast<size_t>(size));
        }
    }

    std::string ask(const std::string& request) {
        write(request + "\n");
        return readLine();
    }

private:
    int m_socket;
    std::string m_input;
};

const char done[] = R"({"ok":true})";

// What stands at a path in an answer, as JSON; empty if there is nothing.
std::string find(const std::string& answer, const std::string& path) {
    JsonParser* parser = json_parser_new();
    std::string found;
    if (json_parser_load_from_data(parser, answer.c_str(), -1, nullptr)) {
        JsonNode* result = json_path_query(path.c_str(), json_parser_get_root(parser), nullptr);
        char* text = json_to_string(result, FALSE);
        found = text;
        g_free(text);
        json_node_unref(result);
    }
    g_object_unref(parser);
    return found.size() > 2 ? found.substr(1, found.size() - 2) : ""; // an array of what matches
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
    const std::string list = client.ask(R"({"command":"channels"})");
    EXPECT_EQ(find(list, "$.channels[*].name"), "\"Telix One\",\"Telix Two\",\"Telix Three\"");
    EXPECT_EQ(find(list, "$.channels[*].number"), "1,2,3");
    EXPECT_EQ(find(list, "$.channels[*].current"), "true,false,false");

    // Without an object the choice waits for the one that binds.
    EXPECT_EQ(find(client.ask(R"({"command":"channel","number":3})"), "$.channel.name"), "\"Telix Three\"");
    TELIX_JS_VB_RegisterOnChannelChangeSucceeded(onChange);
    ASSERT_EQ(TELIX_JS_VB_BindToCurrChannel(m_object), 0);
    ASSERT_TRUE(waitForEvent("change 3"));
    client.ask(R"({"command":"channel","number":2})");
    ASSERT_TRUE(waitForEvent("change 2"));
    TELIX_JS_CM_HANDLE current = 0;
    EXPECT_EQ(TELIX_JS_VB_GetCurrentChannel(m_object, &current), 0);
    EXPECT_EQ(current, 2U);
    EXPECT_EQ(find(client.ask(R"({"command":"channel","number":4})"), "$.error"), "\"there are 3 channels\"");
}

TEST_F(ControlTest, TellsWhatIsPresented) {
    Client client(m_path);
    const std::string before = client.ask(R"({"command":"state"})");
    EXPECT_EQ(find(before, "$.ok"), "true");
    EXPECT_EQ(find(before, "$.picture.visible"), "false");
    EXPECT_EQ(find(before, "$.heardAudio"), "null");
    EXPECT_EQ(find(before, "$.registrations.channelChange"), "false");
    tune(1);
    const TELIX_JS_DISPLAY_AREA area{10, 20, 640, 360};
    TELIX_JS_VB_SetDisplayArea(m_object, &area);
    uint32_t count = 0;
    TELIX_JS_AVCOMPHANDLE* components = nullptr;
    ASSERT_EQ(TELIX_JS_VB_GetComponents(m_object, TELIX_JS_AVCOMPTYPE_SUBTITLE, &components, &count), 0);
    ASSERT_EQ(count, 2U);
    TELIX_JS_VB_SelectComponent(m_object, components[1], TELIX_JS_AVCOMPTYPE_SUBTITLE);
    ASSERT_EQ(TELIX_JS_VB_GetComponents(m_object, TELIX_JS_AVCOMPTYPE_AUDIO, &components, &count), 0);
    ASSERT_EQ(count, 2U);
    TELIX_JS_VB_SelectComponent(m_object, components[1], TELIX_JS_AVCOMPTYPE_AUDIO);

    // Audio and tables come a little later.
    std::string state;
    const auto settled = [&] {
        state = client.ask(R"({"command":"state"})");
        return find(state, "$.heardAudio") == find(state, "$.components[2].pid") &&
               find(state, "$.programmes.next") != "null";
    };
    ASSERT_TRUE(waitUntil(settled)) << state;
    EXPECT_EQ(find(state, "$.channel.name"), "\"Telix One\"");
    EXPECT_EQ(find(state, "$.objects[0].playState"), "\"presenting\"");
    EXPECT_EQ(find(state, "$.objects[0].holdsTuner"), "true");
    EXPECT_EQ(find(state, "$.objects[0].area.width"), "640");
    EXPECT_EQ(find(state, "$.picture.visible"), "true");
    EXPECT_EQ(find(state, "$.picture.width"), "720");
    EXPECT_EQ(find(state, "$.picture.area"), R"({"x":10,"y":20,"width":640,"height":360})");
    EXPECT_EQ(find(state, "$.components[*].type"), "\"video\",\"audio\",\"audio\",\"subtitle\",\"subtitle\"");
    EXPECT_EQ(find(state, "$.components[*].active"), "true,false,true,false,true");
    EXPECT_EQ(find(state, "$.shownSubtitle"), find(state, "$.components[4].pid"));
    EXPECT_EQ(find(state, "$.registrations.channelChange"), "true");
    EXPECT_EQ(find(state, "$.registrations.channelError"), "false");
    EXPECT_EQ(find(state, "$.keys"), R"(["red","navigation"])");
    EXPECT_EQ(find(state, "$.keySet"), "17");
    EXPECT_EQ(find(state, "$.freeMemory"), "123456");

    uint32_t programmeCount = 0;
    TELIX_JS_SI_HANDLE* programmes = nullptr;
    ASSERT_EQ(TELIX_JS_SI_GetProgrammeHandles(&programmeCount, &programmes), 0);
    ASSERT_EQ(programmeCount, 2U);
    uint32_t start = 0;
    TELIX_JS_SI_GetStartTime(programmes[0], &start);
    const uint32_t told = static_cast<uint32_t>(std::stoul(find(state, "$.programmes.now.start")));
    EXPECT_LE(start - told, 4U); // one programme later at most
    const std::string serial = find(state, "$.picture.serial");
    EXPECT_TRUE(
        waitUntil([&] { return find(client.ask(R"({"command":"state"})"), "$.picture.serial") != serial; }));
}

TEST_F(ControlTest, ProvokesWhatBroadcastAndTheViewerMayDo) {
    Client client(m_path);
    TELIX_JS_VB_RegisterOnChannelChangeError(onError);
    TELIX_JS_VB_RegisterOnFullScreenChange(onFullScreen);
    TELIX_JS_VB_RegisterOnParentalRatingChange(m_object, onRating);
    TELIX_JS_VB_RegisterOnParentalRatingError(m_object, onRatingError);
    const char noObject[] = R"({"ok":false,"error":"no video/broadcast object presents"})";
    for (const char* request :
         {R"({"command":"channel-error","error":1})", R"({"command":"rating","age":16})",
          R"({"command":"rating-error"})", R"({"command":"full-screen","on":true})"}) {
        EXPECT_EQ(client.ask(request), noObject) << request;
    }
    tune(1);
    EXPECT_EQ(client.ask(R"({"command":"channel-error","error":2})"), done);
    EXPECT_TRUE(waitForEvent("error 1 2"));
    for (int time = 0; time < 2; ++time) { // the same rating comes again
        events.clear();
        EXPECT_EQ(client.ask(R"({"command":"rating","age":7,"region":"FRA"})"), done);
        EXPECT_TRUE(waitForEvent("rating 7 FRA"));
    }
    EXPECT_EQ(client.ask(R"({"command":"rating","age":0})"), done);
    EXPECT_TRUE(waitForEvent("rating 0 none"));
    EXPECT_EQ(client.ask(R"({"command":"rating-error","content-id":"c","drm-system":"urn:d"})"), done);
    EXPECT_TRUE(waitForEvent("rating error c urn:d"));
    EXPECT_EQ(client.ask(R"({"command":"full-screen","on":true})"), done);
    EXPECT_TRUE(waitForEvent("full screen"));
    ___UINT8 isFull = 0;
    TELIX_JS_VB_IsFullScreen(m_object, &isFull);
    EXPECT_EQ(isFull, 1);
    TELIX_JS_VB_UnRegisterOnChannelChangeError(onError);
    TELIX_JS_VB_UnRegisterOnFullScreenChange(onFullScreen);
    TELIX_JS_VB_UnRegisterOnParentalRatingChange(onRating);
    TELIX_JS_VB_UnRegisterOnParentalRatingError(onRatingError);
    EXPECT_THAT(client.ask(R"({"command":"channel-error","error":2})"), HasSubstr("nobody listens"));
}

TEST_F(ControlTest, SendsStreamEventsToTheListenersThatMeetTheConditions) {
    Client client(m_path);
    EXPECT_THAT(client.ask(R"({"command":"stream-event","data":"x"})"), HasSubstr("nobody listens"));
    TELIX_JS_VB_RegisterStreamEvent(m_object, onStreamEvent, "200", "1f", "first");
    TELIX_JS_VB_RegisterStreamEvent(m_object, onStreamEvent, "201", "20", "second");
    EXPECT_EQ(find(client.ask(R"({"command":"state"})"), "$.registrations.streamEvents[*].name"),
              R"("first","second")");
    EXPECT_EQ(find(client.ask(R"({"command":"stream-event","id":200,"data":"Hi"})"), "$.listeners"), "1");
    EXPECT_TRUE(waitForEvent("event first 4869 trigger"));
    EXPECT_EQ(find(client.ask(R"({"command":"stream-event","tag":32,"hex":"00fF","status":"error"})"),
                   "$.listeners"),
              "1");
    EXPECT_TRUE(waitForEvent("event second 00ff error"));
    EXPECT_EQ(find(client.ask(R"({"command":"stream-event","name":"second"})"), "$.listeners"), "1");
    EXPECT_TRUE(waitForEvent("event second  trigger"));
    EXPECT_EQ(find(client.ask(R"({"command":"stream-event","data":"all"})"), "$.listeners"), "2");
    EXPECT_THAT(client.ask(R"({"command":"stream-event","id":200,"tag":32})"), HasSubstr("nobody listens"));
    TELIX_JS_VB_UnRegisterStreamEvent(m_object, onStreamEvent, "200", "1f", "");
    TELIX_JS_VB_UnRegisterStreamEvent(m_object, onStreamEvent, "201", "20", "");
}

TEST_F(ControlTest, ProvokesDrmAnswersAndShortageOfMemory) {
    Client client(m_path);
    EXPECT_THAT(client.ask(R"({"command":"drm-result","result":0})"), HasSubstr("no message has been sent"));
    EXPECT_THAT(client.ask(R"({"command":"drm-result","result":0,"id":"x"})"), HasSubstr("no DRM agent"));
    EXPECT_THAT(client.ask(R"({"command":"low-memory","free":7})"), HasSubstr("no application manager"));
    EXPECT_EQ(find(client.ask(R"({"command":"state"})"), "$.freeMemory"), "123456"); // refused as a whole

    TELIX_JS_DRM_RegisterOnDRMMessageResult(onDrmResult);
    char* id = nullptr;
    ASSERT_EQ(TELIX_JS_DRM_SendDRMMessage("type", "message", "urn:unknown", &id), 0);
    const std::string sent = id;
    std::free(id);
    EXPECT_TRUE(waitForEvent("drm " + sent + " unknown DRM system 5"));
    EXPECT_EQ(find(client.ask(R"({"command":"drm-result","result":3,"message":"again"})"), "$.id"),
              "\"" + sent + "\"");
    EXPECT_TRUE(waitForEvent("drm " + sent + " again 3"));
    client.ask(R"({"command":"drm-result","result":0,"id":"other"})");
    EXPECT_TRUE(waitForEvent("drm other  0"));
    TELIX_JS_DRM_UnregisterOnDRMMessageResult(onDrmResult);

    TELIX_JS_APP_RegisterLowMemory(onLowMemory);
    EXPECT_EQ(client.ask(R"({"command":"low-memory","free":1000})"), done);
    EXPECT_TRUE(waitForEvent("low memory"));
    uint32_t free = 0;
    TELIX_JS_APP_GetFreeMem(&free);
    EXPECT_EQ(free, 1000U);
    TELIX_JS_APP_UnRegisterLowMemory(onLowMemory);
}

TEST_F(ControlTest, AnswersBadLinesWithAnErrorAndGoesOn) {
    Client client(m_path);
    const std::string deep(2000, '[');
    const struct {
        std::string line;
        const char* reason;
    } lines[] = {
        {"hello", "no JSON object"},
        {"{", "no JSON object"},
        {R"({"command":"sta)", "no JSON object"},
        {R"({"command":"state"}})", "no JSON object"},
        {R"({"command":"state"} {"command":"state"})", "no JSON object"},
        {R"({"command" "state"})", "no JSON object"},
        {"{'command':'state'}", "no JSON object"},
        {"var a = {}", "no JSON object"},
        {"/* state */", "no JSON object"},
        {"[]", "no JSON object"},
        {"7", "no JSON object"},
        {"\"state\"", "no JSON object"},
        {"null", "no JSON object"},
        {"{}", "\\\"command\\\" must be a text"},
        {R"({"command":null})", "\\\"command\\\" must be a text"},
        {R"({"command":["state"]})", "\\\"command\\\" must be a text"},
        {R"({"command":5})", "\\\"command\\\" must be a text"},
        {R"({"command":""})", "unknown command"},
        {R"({"command":"explode"})", "unknown command \\\"explode\\\""},
        {R"({"command":"STATE"})", "unknown command"},
        {R"({"command":"state","loud":true})", "no parameter of state"},
        {R"({"command":"channel"})", "\\\"number\\\" is missing"},
        {R"({"command":"channel","number":"1"})", "must be a whole number"},
        {R"({"command":"channel","number":1.5})", "must be a whole number"},
        {R"({"command":"channel","number":true})", "must be a whole number"},
        {R"({"command":"channel","number":null})", "must be a whole number"},
        {R"({"command":"channel","number":{}})", "must be a whole number"},
        {R"({"command":"channel","number":0})", "must be from 1"},
        {R"({"command":"channel","number":-1})", "must be from 1"},
        {R"({"command":"channel","number":99999999999999999999999})", "must be from 1"},
        {R"({"command":"full-screen","on":1})", "must be true or false"},
        {R"({"command":"full-screen","on":"yes"})", "must be true or false"},
        {R"({"command":"stream-event","data":7})", "must be a text"},
        {R"({"command":"stream-event","data":["a"]})", "must be a text"},
        {R"({"command":"stream-event","hex":"0"})", "pairs of hexadecimal digits"},
        {R"({"command":"stream-event","hex":"0g"})", "pairs of hexadecimal digits"},
        {R"({"command":"stream-event","hex":"00","data":"a"})", "either"},
        {R"({"command":"stream-event","status":"fine"})", "trigger or error"},
        {R"({"command":"stream-event","data":"a\u0000b"})", "holds a zero"},
        {R"({"command":"stream-event","tag":256})", "from 0 to 255"},
        {R"({"command":"rating","age":3})", "from 4 to 18"},
        {R"({"command":"rating","age":4,"region":"Germany"})", "three letters"},
        {deep, "nested too deeply"},
        {R"({"command":)" + deep, "nested too deeply"},
        {std::string("\0\0\0", 3), "no UTF-8 text"},
        {"\xff\xfe\x80", "no UTF-8 text"},
        {R"({"command":")" + std::string("\xc3\x28") + "\"}", "no UTF-8 text"},
        {std::string("\x01\x02\x1b", 3), "no JSON object"},
    };
    for (const auto& each : lines) {
        const std::string answer = client.ask(each.line);
        EXPECT_THAT(answer, HasSubstr(R"("ok":false)")) << each.line;
        EXPECT_THAT(answer, HasSubstr(each.reason)) << each.line;
    }
    // Empty lines are none; others may end as on other systems, and come in pieces or together.
    client.write("\n\r\n{\"command\":");
    client.write("\"channels\"}\r\n{\"command\":\"channels\"}\n");
    EXPECT_THAT(client.readLine(), HasSubstr(R"("ok":true)"));
    EXPECT_THAT(client.readLine(), HasSubstr(R"("ok":true)"));
}

TEST_F(ControlTest, KnowsEveryCommandOfTheListAndNeverFallsSilent) {
    Client client(m_path);
    for (const ControlCommand& command : controlCommands()) {
        const std::string answer = client.ask(std::string(R"({"command":")") + command.name + "\"}");
        EXPECT_THAT(answer, HasSubstr("\"ok\":")) << command.name;
        EXPECT_EQ(answer.find("not in this library"), std::string::npos) << command.name;
    }
}

TEST_F(ControlTest, TurnsAwayOverlongLinesAndEndsThatConnection) {
    Client long1(m_path);
    Client other(m_path);
    std::string line = R"({"command":"stream-event","data":")";
    line.append(longestControlRequest, 'x');
    long1.write(line + "\"}\n");
    EXPECT_THAT(long1.readLine(), HasSubstr("longer than"));
    Client endless(m_path);
    for (int piece = 0; piece < 200 && endless.writeSome(std::string(4096, 'y')); ++piece) {
    }
    EXPECT_THAT(endless.readLine(), HasSubstr("longer than"));
    EXPECT_EQ(endless.readLine(), "end");
    EXPECT_THAT(other.ask(R"({"command":"channels"})"), HasSubstr(R"("ok":true)"));
    // A line as long as allowed is read.
    std::string longest = R"({"command":"stream-event","data":")";
    longest.append(longestControlRequest - longest.size() - 2, 'x');
    EXPECT_THAT(other.ask(longest + "\"}"), HasSubstr("nobody listens"));
}

TEST_F(ControlTest, TakesNoHarmFromClientsThatLeave) {
    {
        Client half(m_path);
        half.write(R"({"command":"sta)");
        half.endWriting();
        EXPECT_THAT(half.readLine(), HasSubstr("no JSON object"));
        EXPECT_EQ(half.readLine(), "end");
    }
    {
        Client last(m_path);
        last.write(R"({"command":"channels"})"); // without an end of the line
        last.endWriting();
        EXPECT_THAT(last.readLine(), HasSubstr(R"("ok":true)"));
        EXPECT_EQ(last.readLine(), "end");
    }
    for (int time = 0; time < 50; ++time) {
        Client gone(m_path);
        gone.write("{\"command\":\"state\"}\n{\"command\":\"state\"}\n{\"comm"); // never reads
    }
    Client client(m_path);
    EXPECT_THAT(client.ask(R"({"command":"channels"})"), HasSubstr(R"("ok":true)"));
}

TEST_F(ControlTest, DoesNotWaitForAClientThatNeverReads) {
    Client greedy(m_path);
    const std::string request = "{\"command\":\"state\"}\n";
    int taken = 0;
    const auto isFull = [&] {
        while (taken < 100000 && greedy.writeSome(request)) {
            ++taken;
        }
        // What was written is still on its way: look again.
        std::this_thread::sleep_for(std::chrono::milliseconds(50));
        return !greedy.writeSome(request);
    };
    ASSERT_TRUE(waitUntil(isFull));
    EXPECT_LT(taken, 100000);
    Client client(m_path);
    EXPECT_THAT(client.ask(R"({"command":"channels"})"), HasSubstr(R"("ok":true)"));
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
    EXPECT_TRUE(waitUntil([&] { // they leave one after the other
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
    // What another user gets: the error of connecting, or the bytes received.
    const auto tryAsAnother = [&] {
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
            char answer = 0;
            _exit(recv(socket, &answer, 1, 0) > 0 ? 102 : 0);
        }
        int result = 0;
        waitpid(child, &result, 0);
        return WIFEXITED(result) ? WEXITSTATUS(result) : -1;
    };
    EXPECT_EQ(tryAsAnother(), 100);
    ASSERT_EQ(chmod(m_path.c_str(), 0666), 0); // even so
    const int outcome = tryAsAnother();
    chmod(m_path.c_str(), 0600);
    if (outcome == 100) {
        GTEST_SKIP() << "the folder is closed to others";
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
    const std::string strange = m_folder + "/telix-x" + std::to_string(getpid()) + ".sock";
    close(open(strange.c_str(), O_CREAT | O_CLOEXEC, 0600));
    const auto running = runningTelevisions(m_folder);
    EXPECT_EQ(std::count_if(running.begin(), running.end(),
                            [&](const ControlSocket& each) { return each.path == m_path; }),
              1);
    EXPECT_TRUE(std::all_of(running.begin(), running.end(),
                            [&](const ControlSocket& each) { return each.pid != dead; }));
    EXPECT_NE(access(stale.c_str(), F_OK), 0);
    EXPECT_EQ(access(strange.c_str(), F_OK), 0); // not ours
    unlink(strange.c_str());
}

TEST(ControlFolderTest, IsNeverAPlaceThatOthersMadeReady) {
    const char* runtime = g_getenv("XDG_RUNTIME_DIR");
    const std::string former = runtime ? runtime : "";
    std::string error;
    g_setenv("XDG_RUNTIME_DIR", "/dev/null", TRUE);
    EXPECT_EQ(controlFolder(error), "");
    EXPECT_NE(error, "");
    g_unsetenv("XDG_RUNTIME_DIR");
    const std::string folder = controlFolder(error);
    struct stat status {};
    ASSERT_EQ(lstat(folder.c_str(), &status), 0) << error;
    EXPECT_EQ(status.st_mode & 07777, 0700U | (status.st_mode & 02000U)); // a folder may pass its group on
    ASSERT_EQ(chmod(folder.c_str(), 0755), 0);
    EXPECT_EQ(controlFolder(error), "");
    ASSERT_EQ(chmod(folder.c_str(), 0700), 0);
    EXPECT_EQ(controlFolder(error), folder);
    rmdir(folder.c_str()); // stays if a television uses it
    if (runtime) {
        g_setenv("XDG_RUNTIME_DIR", former.c_str(), TRUE);
    }
    EXPECT_FALSE(socketAddress(std::string(200, 'x')));
}

} // namespace

// Media players through the calls of the plug-in: the fixture of their tests, and servers that they need.
#ifndef TELIX_TESTS_DESKTOP_MEDIATEST_H
#define TELIX_TESTS_DESKTOP_MEDIATEST_H

#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <future>

#include <gtest/gtest.h>

#include "desktop/platform/PlayerRegistry.h"
#include "desktop/platform/telix_picture.h"
#include "telix/telix_platform.h"
#include "tests/desktop/PlatformThread.h"
#include "tests/desktop/Received.h"

constexpr TELIX_AV_CB_MSG kPlayStart = TELIX_AV_CB_MSG_PLAYSTART;
constexpr TELIX_AV_CB_MSG kPlayEnd = TELIX_AV_CB_MSG_PLAYEND;

struct Message {
    TELIX_JS_AV_HANDLE player = 0;
    TELIX_AV_CB_MSG message = 0;
    std::string text; // not of a message to a player: what else was received
};
inline Received<Message> messages;

inline TELIX_RETCODE_ENUM_T onMessage(TELIX_JS_AV_HANDLE player, TELIX_AV_CB_MSG message) {
    return messages.add({player, message, ""});
}

inline TELIX_RETCODE_ENUM_T onRights(TELIX_JS_AV_HANDLE player, TELIX_AV_DRM_ERR_STATE_ENUM_T state,
                                     ___UINT8* contentId, ___UINT8* drmSystemId, ___UINT8* rightsIssuerUrl) {
    const auto text = [](___UINT8* bytes) { return std::string(reinterpret_cast<char*>(bytes)); };
    return messages.add({player, 0,
                         std::to_string(state) + "/" + text(contentId) + "/" + text(drmSystemId) + "/" +
                             text(rightsIssuerUrl)});
}

// Runs `function` on the platform thread and returns its result. What was posted before has run then, too.
template <typename Function>
auto runOnPlatformThread(Function function) {
    std::promise<decltype(function())> result;
    desktop::Platform::instance().post([&] { result.set_value(function()); });
    return result.get_future().get();
}

// Lets the platform thread work for some time, in which something must not happen. It reads the progress at
// least twice.
inline void letPlatformThreadWork() {
    std::promise<void> isOver;
    desktop::Platform::instance().postDelayed(300, [&] {
        isOver.set_value();
        return false;
    });
    isOver.get_future().wait();
}

// Blocks the platform thread: calls are accepted, and nothing follows from them before the block ends.
class PlatformThreadBlock {
public:
    PlatformThreadBlock() {
        std::promise<void> hasBegun;
        desktop::Platform::instance().post([&, end = m_end.get_future().share()] {
            hasBegun.set_value();
            end.wait();
        });
        hasBegun.get_future().wait();
    }
    ~PlatformThreadBlock() { m_end.set_value(); }
    PlatformThreadBlock(const PlatformThreadBlock&) = delete;
    PlatformThreadBlock& operator=(const PlatformThreadBlock&) = delete;

private:
    std::promise<void> m_end;
};

inline std::string folderOfClips() {
    const char* folder = std::getenv("TELIX_CLIPS");
    return folder ? folder : "";
}

inline std::string file(const std::string& name) {
    return "file://" + folderOfClips() + "/" + name;
}

// An HTTP server of the clips, as long as the object exists.
class Server {
public:
    // `options` are those of media_server.py.
    explicit Server(const std::vector<std::string>& options = {}) {
        int ends[2];
        if (pipe(ends) != 0) {
            return;
        }
        std::vector<std::string> command{"python3", "-B", std::getenv("TELIX_MEDIA_SERVER"),
                                         "--until-parent-ends", "=" + folderOfClips()};
        command.insert(command.end(), options.begin(), options.end());
        std::vector<char*> arguments;
        for (std::string& each : command) {
            arguments.push_back(each.data());
        }
        arguments.push_back(nullptr);
        m_process = fork();
        if (m_process == 0) {
            dup2(ends[1], STDOUT_FILENO);
            close(ends[0]);
            close(ends[1]);
            execvp("python3", arguments.data());
            _exit(127);
        }
        close(ends[1]);
        if (FILE* output = fdopen(ends[0], "r")) {
            char line[256];
            if (std::fgets(line, sizeof(line), output)) {
                m_url = line;
                m_url.erase(m_url.find_last_not_of('\n') + 1);
            }
            std::fclose(output);
        }
    }
    ~Server() { end(); }
    Server(const Server&) = delete;
    Server& operator=(const Server&) = delete;

    // Lets trickling responses continue.
    void release() const { kill(m_process, SIGUSR1); }

    // Drops the connections.
    void end() {
        if (m_process > 0) {
            kill(m_process, SIGKILL);
            waitpid(m_process, nullptr, 0);
            m_process = -1;
        }
    }

    std::string operator()(const std::string& name) const { return m_url + "/" + name; }

private:
    pid_t m_process = -1;
    std::string m_url;
};

// A port on which nobody listens: it is bound, so that no other program gets it.
class ClosedPort {
public:
    ClosedPort() : m_socket(socket(AF_INET, SOCK_STREAM, 0)) {
        sockaddr_in address{};
        address.sin_family = AF_INET;
        address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        socklen_t size = sizeof(address);
        EXPECT_EQ(bind(m_socket, reinterpret_cast<sockaddr*>(&address), size), 0);
        EXPECT_EQ(getsockname(m_socket, reinterpret_cast<sockaddr*>(&address), &size), 0);
        m_number = ntohs(address.sin_port);
    }
    ~ClosedPort() { close(m_socket); }
    ClosedPort(const ClosedPort&) = delete;
    ClosedPort& operator=(const ClosedPort&) = delete;

    // Accepts connections from now on, and never responds.
    void listenAndBeSilent() { EXPECT_EQ(listen(m_socket, 8), 0); }

    // Waits for a connection and for its request. The socket, or -1; the caller closes it.
    int acceptRequest() const {
        pollfd ready{m_socket, POLLIN, 0};
        const int connection = poll(&ready, 1, 60'000) == 1 ? accept(m_socket, nullptr, nullptr) : -1;
        std::string request;
        ready.fd = connection;
        while (request.find("\r\n\r\n") == std::string::npos && poll(&ready, 1, 60'000) == 1) {
            char piece[512];
            const ssize_t size = recv(connection, piece, sizeof(piece), 0);
            if (size <= 0) {
                break;
            }
            request.append(piece, static_cast<size_t>(size));
        }
        return connection;
    }

    std::string url() const { return "http://127.0.0.1:" + std::to_string(m_number) + "/clip.mp4"; }

private:
    int m_socket;
    unsigned int m_number = 0;
};

struct Shot {
    uint64_t serial = 0;
    bool isVisible = false;
    std::vector<uint8_t> pixels; // of the line in the middle
    int32_t areaX = 0;
    int32_t areaY = 0;
    uint32_t areaWidth = 0;
    uint32_t areaHeight = 0;
    bool isFullScreen = false;
    uint64_t presenter = 0;
};

inline Shot takeShot() {
    telix_desktop_frame frame{};
    telix_desktop_acquire_frame(&frame);
    Shot shot{frame.serial,     frame.visible != 0,    {},
              frame.areaX,      frame.areaY,           frame.areaWidth,
              frame.areaHeight, frame.fullScreen != 0, frame.presenter};
    if (frame.pixels) {
        const uint8_t* line = frame.pixels + size_t{frame.height} / 2 * frame.stride;
        shot.pixels.assign(line, line + size_t{frame.width} * 4);
    }
    telix_desktop_release_frame(&frame);
    return shot;
}

// The middle line of second.mp4 always begins in dark grey.
inline bool showsSecondClip(const Shot& shot) {
    bool isGrey = shot.pixels.size() > 64;
    for (size_t colour = 40; isGrey && colour < 43; ++colour) {
        isGrey = shot.pixels[colour] > 80 && shot.pixels[colour] < 130;
    }
    return isGrey;
}

inline std::optional<desktop::MediaPipeline::Output> output() {
    return runOnPlatformThread([] { return desktop::PlayerRegistry::instance().output(); });
}

// Whether a failed check of GLib ends the test, where G_DEBUG asks for it. GStreamer's downloadbuffer, which
// measures its rates with timers, lets a timer run twice if it is flushed while a demuxer waits for bytes.
// Nothing follows from that.
inline gboolean endsTheTest(const gchar*, GLogLevelFlags, const gchar* message, gpointer) {
    return std::strstr(message, "g_timer_continue: assertion 'timer->active == FALSE' failed") == nullptr;
}

class MediaTest : public testing::Test {
protected:
    void SetUp() override {
        g_test_log_set_fatal_handler(endsTheTest, nullptr);
        messages.clear();
        m_player = newPlayer();
    }

    void TearDown() override {
        for (const TELIX_JS_AV_HANDLE player : m_players) {
            TELIX_JS_AV_Stop(player);
            TELIX_JS_AV_DestroyPlayer(player);
            TELIX_JS_AV_UnregisterOnPlayStateChange(onMessage);
        }
        EXPECT_LE(messages.threads().size(), 1U) << "messages come from several threads";
        EXPECT_EQ(messages.threads().count(std::this_thread::get_id()), 0U);
    }

    TELIX_JS_AV_HANDLE newPlayer() {
        TELIX_JS_AV_HANDLE player = 0;
        EXPECT_EQ(TELIX_JS_AV_CreatePlayer(&player, 512, 0, 0), 0);
        EXPECT_EQ(TELIX_JS_AV_RegisterOnPlayStateChange(player, onMessage), 0);
        EXPECT_EQ(TELIX_JS_AV_RegisterOnDRMRightsError(player, onRights), 0);
        m_players.push_back(player);
        return player;
    }

    static TELIX_RETCODE_ENUM_T start(TELIX_JS_AV_HANDLE player, const std::string& url, uint32_t count = 1) {
        return TELIX_JS_AV_Play(player, url.c_str(), count, 6, 512, 0, 0, 0);
    }

    static TELIX_RETCODE_ENUM_T queue(TELIX_JS_AV_HANDLE player, const std::string& url, uint32_t count = 1) {
        return TELIX_JS_AV_Queue(player, url.c_str(), count, 6, 512, 0, 0, 0);
    }

    // All messages so far, of all players.
    static std::vector<TELIX_AV_CB_MSG> received() {
        std::vector<TELIX_AV_CB_MSG> values;
        for (const Message& each : messages.all()) {
            values.push_back(each.message);
        }
        return values;
    }

    // Waits until there are as many messages as expected, which are these.
    static void expectMessages(const std::vector<TELIX_AV_CB_MSG>& expected) {
        waitUntil([&] { return received().size() >= expected.size(); });
        ASSERT_EQ(received(), expected);
    }

    static TELIX_JS_AV_PLAY_INFO info(TELIX_JS_AV_HANDLE player) {
        TELIX_JS_AV_PLAY_INFO* record = nullptr;
        EXPECT_EQ(TELIX_JS_AV_GetPlayInfo(player, &record), 0);
        return record ? *record : TELIX_JS_AV_PLAY_INFO{};
    }
    TELIX_JS_AV_PLAY_INFO info() const { return info(m_player); }

    static desktop::PlayerRegistry::State stateOf(TELIX_JS_AV_HANDLE player) {
        for (const desktop::PlayerRegistry::State& state : desktop::PlayerRegistry::instance().states()) {
            if (state.player == player) {
                return state;
            }
        }
        return {};
    }

    void play(const std::string& url, uint32_t count = 1) {
        const size_t before = received().size();
        ASSERT_EQ(start(m_player, url, count), 0);
        ASSERT_TRUE(waitUntil([&] { return received().size() > before; }));
        ASSERT_EQ(received().back(), kPlayStart);
    }

    // Starts, and pauses before the first frame. Returns after preroll.
    void startPaused(const std::string& url) {
        {
            PlatformThreadBlock block;
            ASSERT_EQ(start(m_player, url), 0);
            ASSERT_EQ(TELIX_JS_AV_Pause(m_player), 0);
        }
        ASSERT_TRUE(waitUntil([&] { return info().state == 2; }));
    }

    // Seeks to 10 seconds, and plays from there at `speed`. The rate of the segment that GStreamer plays says
    // how fast; no clock of the test has to.
    void expectSpeed(bool isForward, int16_t integerPart, uint16_t tenths) const {
        const double speed = (isForward ? 1 : -1) * (integerPart + tenths / 10.0);
        ASSERT_EQ(TELIX_JS_AV_Seek(m_player, 10000), 0);
        ASSERT_EQ(TELIX_JS_AV_SetPlaySpeed(m_player, isForward ? 1 : 0, integerPart, tenths), 0);
        EXPECT_EQ(stateOf(m_player).speed, speed);
        EXPECT_TRUE(waitUntil([&] { return output()->rate == speed; })) << speed;
        EXPECT_EQ(output()->isMuted, speed != 1);
        EXPECT_TRUE(waitUntil([&] {
            const uint32_t position = info().playPosition;
            return isForward ? position > 10300 : position < 9700;
        })) << speed;
    }

    std::vector<TELIX_JS_AVCOMPHANDLE> components(TELIX_JS_AVCOMPTYPE type, bool activeOnly = false) const {
        TELIX_JS_AVCOMPHANDLE* handles = nullptr;
        uint32_t count = 0;
        EXPECT_EQ((activeOnly ? TELIX_JS_AV_GetCurrActiveComponents
                              : TELIX_JS_AV_GetComponents)(m_player, type, &handles, &count),
                  0);
        return handles ? std::vector<TELIX_JS_AVCOMPHANDLE>(handles, handles + count)
                       : std::vector<TELIX_JS_AVCOMPHANDLE>();
    }

    TELIX_JS_AV_HANDLE m_player = 0;
    std::vector<TELIX_JS_AV_HANDLE> m_players;
};

#endif

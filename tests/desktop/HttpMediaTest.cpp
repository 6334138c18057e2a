// What media players request over HTTP, and what becomes of the responses.
#include <json-glib/json-glib.h>

#include <fstream>
#include <map>
#include <random>

#include "desktop/platform/telix_http.h"
#include "tests/desktop/MediaTest.h"
#include "tests/support/TemporaryFolder.h"

using namespace desktop;

namespace {

struct RecordedRequest {
    std::string path;
    std::map<std::string, std::string> headers;

    std::string header(const std::string& name) const {
        const auto found = headers.find(name);
        return found == headers.end() ? "" : found->second;
    }

    // The first byte that it asks for.
    uint64_t begin() const {
        const std::string prefix = "bytes=";
        const std::string range = header("Range");
        return range.compare(0, prefix.size(), prefix) == 0 ? std::stoull(range.substr(prefix.size())) : 0;
    }
};

// A window: answers each request with what the test has set, and keeps what it hears.
class Window {
public:
    struct Asked {
        uint64_t request;
        std::string url;
    };

    Window() {
        const telix_desktop_http_handler handler{onRequest, onCookie, this};
        telix_desktop_set_http_handler(&handler);
    }
    ~Window() { telix_desktop_set_http_handler(nullptr); }
    Window(const Window&) = delete;
    Window& operator=(const Window&) = delete;

    telix_desktop_http_identity identity{};
    bool answersAtOnce = true;
    Received<Asked> asked;
    Received<std::string> cookies; // "URL COOKIE"

private:
    static void onRequest(uint64_t request, const char* url, void* window) {
        auto* self = static_cast<Window*>(window);
        self->asked.add({request, url});
        if (self->answersAtOnce) {
            telix_desktop_answer_http_request(request, &self->identity);
        }
    }
    static void onCookie(const char* url, const char* cookie, void* window) {
        static_cast<Window*>(window)->cookies.add(std::string(url) + " " + cookie);
    }
};

class HttpMediaTest : public MediaTest {
protected:
    void SetUp() override {
        MediaTest::SetUp();
        std::remove(m_log.c_str());
    }
    void TearDown() override {
        MediaTest::TearDown();
        std::remove(m_log.c_str());
    }

    // What the server has been asked for.
    std::vector<RecordedRequest> requests() const {
        std::vector<RecordedRequest> requests;
        std::ifstream in(m_log);
        for (std::string line; std::getline(in, line);) {
            JsonNode* node = json_from_string(line.c_str(), nullptr);
            if (!node) {
                break; // it is being written
            }
            JsonObject* object = json_node_get_object(node);
            RecordedRequest request{json_object_get_string_member(object, "path"), {}};
            json_object_foreach_member(
                json_object_get_object_member(object, "headers"),
                [](JsonObject*, const gchar* name, JsonNode* value, gpointer headers) {
                    (*static_cast<decltype(RecordedRequest::headers)*>(headers))[name] =
                        json_node_get_string(value);
                },
                &request.headers);
            json_node_unref(node);
            requests.push_back(request);
        }
        return requests;
    }

    std::string m_log = testing::TempDir() + "telix-requests-" + std::to_string(getpid());
};

// The server sends the first 600,000 bytes, about 8 seconds, and then next to nothing; ranges after them at
// once.
constexpr uint64_t kSentBytes = 600'000;
constexpr const char* kTricklingClip = "clip.mp4?trickle=600000";

TEST_F(HttpMediaTest, RequestsARangeAtOnceToSeekAheadAndNothingToSeekBack) {
    Server server({"--log", m_log});
    play(server(kTricklingClip));
    EXPECT_EQ(requests().size(), 1U);
    EXPECT_EQ(requests()[0].header("Range"), "");
    EXPECT_TRUE(waitUntil([&] { return info().playPosition > 2000; }));
    ASSERT_EQ(TELIX_JS_AV_Seek(m_player, 15000), 0);
    EXPECT_TRUE(waitUntil([&] { return info().playPosition > 15000; }));
    EXPECT_LT(info().playPosition, 16500U) << "what has been played before counts";
    EXPECT_TRUE(waitUntil([&] { return info().playPosition > 15300; }));
    EXPECT_TRUE(waitUntil([&] { return info().bufferedEnd == 20; })) << "the buffered range is not reported";
    EXPECT_LE(info().buffered, 5U);
    ASSERT_GE(requests().size(), 2U);
    EXPECT_GT(requests()[1].begin(), kSentBytes);
    ASSERT_EQ(TELIX_JS_AV_Seek(m_player, 2000), 0);
    EXPECT_TRUE(waitUntil([&] { return info().playPosition > 2300 && info().playPosition < 9000; }));
    EXPECT_GE(info().bufferedEnd, 5U);
    const auto all = requests();
    for (size_t index = 1; index < all.size(); ++index) {
        EXPECT_GE(all[index].begin(), kSentBytes - 20'000) << "requests again what it has kept";
    }
}

// ---- What requests carry

TEST_F(HttpMediaTest, HasAUserAgentOfItsOwnAndNothingElseWithoutAWindow) {
    Server server({"--log", m_log});
    play(server("tune.mp3"));
    ASSERT_FALSE(requests().empty());
    EXPECT_EQ(requests()[0].header("User-Agent").substr(0, 6), "HbbTV/");
    EXPECT_EQ(requests()[0].header("Cookie"), "");
    EXPECT_EQ(requests()[0].header("Referer"), "");
}

TEST_F(HttpMediaTest, CarriesWhatTheWindowSaysAlsoToAnotherServerAndInLiveStreaming) {
    Window window;
    window.identity = {"Own/1 (browser)", "http://page.example/", "a=1; b=2", nullptr, 0};
    Server server({"--log", m_log});
    Server other;
    const std::string redirected = server("hls/index.m3u8");
    const std::string first = other("anything?redirect=" + redirected);
    play(first);
    EXPECT_TRUE(waitUntil([&] { return info().playPosition > 2500; })) << "the second segment is not played";
    const auto all = requests();
    ASSERT_GE(all.size(), 3U); // the playlist, and two segments
    for (const RecordedRequest& request : all) {
        EXPECT_EQ(request.header("User-Agent"), "Own/1 (browser)") << request.path;
        EXPECT_EQ(request.header("Referer"), "http://page.example/") << request.path;
        EXPECT_EQ(request.header("Cookie"), "a=1; b=2") << request.path;
    }
    const auto asked = window.asked.all();
    ASSERT_GE(asked.size(), all.size() + 1);
    EXPECT_EQ(asked[0].url, first);
    EXPECT_EQ(asked[1].url, redirected);
    EXPECT_EQ(asked[2].url.substr(0, server("hls/").size()), server("hls/")); // relative to the last response
}

TEST_F(HttpMediaTest, TellsTheWindowOfCookies) {
    Window window;
    Server server;
    play(server("tune.mp3?cookie=kind%3Dtasty; Path=/"));
    EXPECT_EQ(window.cookies.all(), std::vector<std::string>{server("tune.mp3?cookie=kind%3Dtasty; Path=/") +
                                                             " kind=tasty; Path=/"});
}

TEST_F(HttpMediaTest, SendsNoHeaderThatWouldBecomeTwo) {
    Window window;
    window.identity = {"Own\r\nX-Evil: 1", "http://page/\n", "a=\x7f", nullptr, 0};
    Server server({"--log", m_log});
    play(server("tune.mp3"));
    ASSERT_FALSE(requests().empty());
    EXPECT_EQ(requests()[0].header("User-Agent").substr(0, 6), "HbbTV/");
    EXPECT_EQ(requests()[0].headers.count("X-Evil"), 0U);
    EXPECT_EQ(requests()[0].headers.count("Referer"), 0U);
    EXPECT_EQ(requests()[0].headers.count("Cookie"), 0U);
}

TEST_F(HttpMediaTest, WaitsForTheWindowUntilItAnswersOrThePlayerStops) {
    Server server({"--log", m_log});
    Window window;
    window.answersAtOnce = false;
    window.identity.cookies = "late=1";
    ASSERT_EQ(start(m_player, server("tune.mp3")), 0);
    ASSERT_TRUE(waitUntil([&] { return window.asked.all().size() == 1; }));
    ASSERT_EQ(TELIX_JS_AV_Stop(m_player), 0);
    flushPlatformThread();
    EXPECT_TRUE(requests().empty());
    telix_desktop_answer_http_request(window.asked.all()[0].request, &window.identity); // too late
    telix_desktop_answer_http_request(4711, nullptr);
    ASSERT_EQ(start(m_player, server("tune.mp3")), 0);
    ASSERT_TRUE(waitUntil([&] { return window.asked.all().size() == 2; }));
    EXPECT_TRUE(requests().empty());
    telix_desktop_answer_http_request(window.asked.all()[1].request, &window.identity);
    expectMessages({kPlayStart});
    EXPECT_EQ(requests()[0].header("Cookie"), "late=1");
}

TEST_F(HttpMediaTest, GoesOnWhenTheWindowGoesOrSaysNothing) {
    Server server({"--log", m_log});
    {
        Window window;
        window.answersAtOnce = false;
        ASSERT_EQ(start(m_player, server("tune.mp3")), 0);
        ASSERT_TRUE(waitUntil([&] { return window.asked.all().size() == 1; }));
        testing::internal::CaptureStderr();
    }
    expectMessages({kPlayStart});
    EXPECT_EQ(testing::internal::GetCapturedStderr().find("has not said"), std::string::npos);
    Window window;
    window.answersAtOnce = false;
    play(server("tune.mp3")); // after its timeout
    EXPECT_EQ(requests().size(), 2U);
}

// ---- HTTPS

// A certificate of 127.0.0.1 that nobody has signed, with its key and without.
class Certificate {
public:
    explicit Certificate(const std::string& name = "own")
        : m_file(testing::TempDir() + "telix-certificate-" + std::to_string(getpid()) + "-" + name),
          m_key(m_file + "-key") {
        const std::string command = "openssl req -x509 -newkey rsa:2048 -nodes -subj /CN=127.0.0.1 -addext "
                                    "subjectAltName=IP:127.0.0.1 "
                                    "-keyout '" +
                                    m_key + "' -out '" + m_file + "' 2>'" + m_key + ".log' && cat '" +
                                    m_file + "' >>'" + m_key + "'";
        EXPECT_EQ(std::system(command.c_str()), 0) << m_key << ".log";
    }
    ~Certificate() {
        for (const std::string& file : {m_key, m_file, m_key + ".log"}) {
            std::remove(file.c_str());
        }
    }
    Certificate(const Certificate&) = delete;
    Certificate& operator=(const Certificate&) = delete;

    const std::string& file() const { return m_file; }
    const std::string& fileWithKey() const { return m_key; }

private:
    std::string m_file;
    std::string m_key;
};

TEST_F(HttpMediaTest, TrustsOverHttpsWhatTheWindowTrusts) {
    const Certificate certificate;
    Server server({"--certificate", certificate.fileWithKey()});
    ASSERT_EQ(server("").substr(0, 8), "https://");
    const Certificate other("other");
    Window window;
    window.identity.certificates = other.file().c_str();
    ASSERT_EQ(start(m_player, server("tune.mp3")), 0);
    expectMessages({TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT});
    window.identity.acceptsAnyCertificate = 1;
    play(server("second.mp4"));
    window.identity.acceptsAnyCertificate = 0;
    window.identity.certificates = certificate.file().c_str();
    play(server("tune.mp3"));
}

// ---- Hostile servers

TEST_F(HttpMediaTest, FollowsNoRedirectionWithoutEndOrToAFile) {
    Server server({"--log", m_log});
    ASSERT_EQ(start(m_player, server("a?redirect=/a%3Fredirect%3D/a")), 0); // to nothing
    ASSERT_TRUE(waitUntil([] { return received().size() == 1; }));
    EXPECT_EQ(received().back(), TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT);
    ASSERT_EQ(start(m_player, server("tune.mp3?redirect=" + file("tune.mp3"))), 0);
    ASSERT_TRUE(waitUntil([] { return received().size() == 3; })); // with a separator
    EXPECT_EQ(received().back(), TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT);
}

TEST_F(HttpMediaTest, DropsTheConnectionAtOnceWhenItStops) {
    ClosedPort port;
    port.listenAndBeSilent();
    ASSERT_EQ(start(m_player, port.url()), 0);
    const int connection = port.acceptRequest();
    ASSERT_GE(connection, 0);
    EXPECT_EQ(stateOf(m_player).state, "connecting");
    char byte = 0;
    ASSERT_LT(recv(connection, &byte, 1, MSG_DONTWAIT), 0);
    const auto before = std::chrono::steady_clock::now();
    ASSERT_EQ(TELIX_JS_AV_Stop(m_player), 0);
    flushPlatformThread();
    EXPECT_TRUE(waitUntil([&] { return recv(connection, &byte, 1, MSG_DONTWAIT) == 0; }));
    EXPECT_LT(std::chrono::steady_clock::now() - before, std::chrono::seconds(10)) << "the request timed out";
    close(connection);
    expectMessages({});
    play(file("tune.wav"));
}

TEST_F(HttpMediaTest, TakesNoResponseWithAnotherRangeThanItsOwn) {
    ClosedPort port;
    port.listenAndBeSilent();
    ASSERT_EQ(start(m_player, port.url()), 0);
    const int connection = port.acceptRequest();
    ASSERT_GE(connection, 0);
    const std::string response = "HTTP/1.1 206 Partial Content\r\nContent-Range: bytes 5-9/10\r\n"
                                 "Content-Length: 5\r\n\r\n12345";
    EXPECT_EQ(send(connection, response.data(), response.size(), MSG_NOSIGNAL),
              static_cast<ssize_t>(response.size()));
    expectMessages({TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT});
    close(connection);
}

TEST_F(HttpMediaTest, TellsOfMissingSegmentsAsOfAMissingFile) {
    const TemporaryFolder folder;
    std::ofstream(folder.file("index.m3u8"))
        << "#EXTM3U\n#EXT-X-TARGETDURATION:2\n#EXTINF:2,\ngone0.ts\n#EXTINF:2,\ngone1.ts\n"
           "#EXT-X-ENDLIST\n";
    Server server({"made=" + folder.path()});
    ASSERT_EQ(start(m_player, server("made/index.m3u8")), 0);
    EXPECT_TRUE(waitUntil([] { return !received().empty(); }));
    ASSERT_FALSE(received().empty());
    EXPECT_TRUE(received().back() == TELIX_AV_CB_MSG_ERR_NET_CANNOT_CONNECT ||
                received().back() == TELIX_AV_CB_MSG_ERR_NET_DISCONNECTED) // both are error 1 of the page
        << std::hex << received().back();
}

// ---- Stops at any moment

// TELIX_STOPS sets how many, TELIX_SEED where the random times begin.
TEST_F(HttpMediaTest, SurvivesStopsAtRandomTimes) {
    const char* count = std::getenv("TELIX_STOPS");
    const char* seed = std::getenv("TELIX_SEED");
    const unsigned long stops = count ? std::strtoul(count, nullptr, 10) : 200;
    std::mt19937 random(seed ? static_cast<unsigned int>(std::strtoul(seed, nullptr, 10)) : 1);
    Server server;
    const std::string urls[] = {server("hls/index.m3u8"), server("clip.mp4"), server("clip.mp4?rate=200000"),
                                server("tune.mp3"), server("nothing.mp4")};
    std::uniform_int_distribution<size_t> anyUrl(0, std::size(urls) + 3); // most of all live streaming
    std::uniform_int_distribution<int> anyTime(0, 60'000);                // microseconds
    std::uniform_int_distribution<int> anyDecision(0, 3);
    for (unsigned long stop = 0; stop < stops; ++stop) {
        const size_t url = anyUrl(random);
        ASSERT_EQ(start(m_player, urls[url < std::size(urls) ? url : 0]), 0);
        std::this_thread::sleep_for(std::chrono::microseconds(anyTime(random)));
        if (anyDecision(random) == 0) {
            TELIX_JS_AV_Seek(m_player, 4000);
        }
        ASSERT_EQ(TELIX_JS_AV_Stop(m_player), 0);
        flushPlatformThread();
        if (stop % 1000 == 999) {
            std::fprintf(stderr, "%lu stops\n", stop + 1);
        }
    }
    messages.clear();
    play(server("second.mp4"));
    EXPECT_TRUE(waitUntil([] { return showsSecondClip(takeShot()); }));
}

// A pipeline that reads a URL into memory.
class MediaReader {
public:
    explicit MediaReader(const std::string& url) {
        PlayerRegistry::instance(); // registers the source
        m_pipeline = gst_pipeline_new(nullptr);
        m_source = gst_element_make_from_uri(GST_URI_SRC, url.c_str(), nullptr, nullptr);
        GstElement* sink = gst_element_factory_make("fakesink", nullptr);
        g_object_set(sink, "signal-handoffs", TRUE, nullptr);
        const auto onHandoff = +[](GstElement*, GstBuffer* buffer, GstPad*, gpointer self) {
            static_cast<MediaReader*>(self)->add(buffer);
        };
        g_signal_connect(sink, "handoff", G_CALLBACK(onHandoff), this);
        gst_bin_add_many(GST_BIN(m_pipeline), m_source, sink, nullptr);
        gst_element_link(m_source, sink);
        gst_element_set_state(m_pipeline, GST_STATE_PAUSED);
        gst_element_get_state(m_pipeline, nullptr, nullptr, GST_CLOCK_TIME_NONE); // has the first buffer
    }
    ~MediaReader() {
        gst_element_set_state(m_pipeline, GST_STATE_NULL);
        gst_object_unref(m_pipeline);
    }
    MediaReader(const MediaReader&) = delete;
    MediaReader& operator=(const MediaReader&) = delete;

    // What is read from now on.
    std::string readToTheEnd() {
        m_bytes.clear();
        gst_element_set_state(m_pipeline, GST_STATE_PLAYING);
        GstBus* bus = gst_element_get_bus(m_pipeline);
        constexpr auto kEnds = static_cast<GstMessageType>(GST_MESSAGE_EOS | GST_MESSAGE_ERROR);
        GstMessage* message = gst_bus_timed_pop_filtered(bus, 60 * GST_SECOND, kEnds);
        EXPECT_TRUE(message && GST_MESSAGE_TYPE(message) == GST_MESSAGE_EOS);
        gst_clear_message(&message);
        gst_object_unref(bus);
        gst_element_set_state(m_pipeline, GST_STATE_PAUSED); // what is read next waits for the next call
        return m_bytes;
    }
    bool seek(int64_t start, int64_t stop) {
        return gst_element_seek(m_pipeline, 1, GST_FORMAT_BYTES, GST_SEEK_FLAG_FLUSH, GST_SEEK_TYPE_SET,
                                start, GST_SEEK_TYPE_SET, stop) != FALSE;
    }
    int64_t size() const {
        gint64 size = -1;
        gst_element_query_duration(m_source, GST_FORMAT_BYTES, &size);
        return size;
    }

private:
    void add(GstBuffer* buffer) {
        GstMapInfo map;
        if (gst_buffer_map(buffer, &map, GST_MAP_READ)) {
            m_bytes.append(reinterpret_cast<const char*>(map.data), map.size);
            gst_buffer_unmap(buffer, &map);
        }
    }

    GstElement* m_pipeline = nullptr;
    GstElement* m_source = nullptr;
    std::string m_bytes; // by the streaming thread, between the beginning of playback and its end
};

TEST(HttpMediaSourceTest, ReadsRangesInOrder) {
    Server server;
    gchar* content = nullptr;
    gsize length = 0;
    ASSERT_TRUE(g_file_get_contents((folderOfClips() + "/clip.mp4").c_str(), &content, &length, nullptr));
    const std::string clip(content, length);
    g_free(content);
    MediaReader reader(server("clip.mp4"));
    EXPECT_EQ(reader.size(), static_cast<int64_t>(clip.size()));
    ASSERT_TRUE(reader.seek(1000, 50000));
    EXPECT_EQ(reader.readToTheEnd(), clip.substr(1000, 49000));
    for (int round = 0; round < 2; ++round) {
        ASSERT_TRUE(reader.seek(0, -1));
        EXPECT_EQ(reader.readToTheEnd(), clip);
    }
}

TEST(HttpMediaSourceTest, EndsARangeAlthoughTheServerGoesOn) {
    ClosedPort port;
    port.listenAndBeSilent();
    std::vector<int> connections;
    std::thread server([&] {
        const std::string partial =
            "HTTP/1.1 206 Partial Content\r\nConnection: close\r\nContent-Range: bytes ";
        for (const char* response : {"0-9/10\r\nContent-Length: 10\r\n\r\n0123456789",
                                     "2-9/10\r\nContent-Length: 8\r\n\r\n23456"}) { // not all of it
            connections.push_back(port.acceptRequest());
            const std::string all = partial + response;
            send(connections.back(), all.data(), all.size(), MSG_NOSIGNAL);
        }
    });
    {
        MediaReader reader(port.url());
        ASSERT_TRUE(reader.seek(2, 5));
        EXPECT_EQ(reader.readToTheEnd(), "234");
    }
    server.join();
    for (const int connection : connections) {
        close(connection);
    }
}

} // namespace

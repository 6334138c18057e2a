// The fixture of the A/V control tests.
#include "tests/unit/avcontrol/AVControlTest.h"

#include <sstream>
#include <thread>

#include "src/avcontrol/AVControl.h"
#include "src/avcontrol/Asx.h"

namespace avcontrol {

namespace {

// Blanks stand for everything that a browser escapes.
std::string encoded(const std::string& url) {
    std::string result;
    for (const char c : url) {
        result += c == ' ' ? std::string("%20") : std::string(1, c);
    }
    return result;
}

// A thread of its own each time: a test whose log is captured runs in a copy of this process, which has none
// of its other threads.
void onForeignThread(const std::function<void()>& function) {
    std::thread(function).join();
}

// Between the first double quote after `before` and the next.
std::string quotedAfter(const std::string& text, const std::string& before) {
    const size_t first = text.find(before) + before.size();
    return text.substr(first, text.find('"', first) - first);
}

} // namespace

std::string playOf(const std::string& url, int player, int playCount, int source, int container, int codec) {
    std::ostringstream call;
    call << "TELIX_JS_AV_Play(" << player << ", \"" << url << "\", " << playCount << ", " << source << ", "
         << container << ", " << codec << ", 0, 0)";
    return call.str();
}

AVControlTest::AVControlTest() {
    clock.reset();
    // What one page leaves to the next.
    g_lastPlayedInstance = nullptr;
    g_lastReceivedMessage = 0;
    asxClear();
    unsetenv("PLUGIN_BUFFERING_LOWER_LIMIT");
    unsetenv("PLUGIN_BUFFERING_UPPER_LIMIT");
    unsetenv("PLUGIN_PLAYER_URL");

    platform.TELIX_JS_AV_CreatePlayer = [this](TELIX_JS_AV_HANDLE* player, int32_t, int32_t, uint32_t) {
        *player = nextPlayer++;
        return 0;
    };
    platform.TELIX_JS_AV_RegisterOnPlayStateChange = [this](TELIX_JS_AV_HANDLE,
                                                            TELIX_JS_AV_PLAYSTATE_CB callback) {
        m_stateCallback = callback;
        return 0;
    };
    platform.TELIX_JS_AV_RegisterOnDRMRightsError = [this](TELIX_JS_AV_HANDLE,
                                                           TELIX_JS_AV_DRM_RIGHTS_CB callback) {
        m_rightsCallback = callback;
        return 0;
    };
    platform.TELIX_JS_AV_GetPlayInfo = [](TELIX_JS_AV_HANDLE, TELIX_JS_AV_PLAY_INFO**) { return 1; };

    browser.whenEvaluatingTextFrom("window.getEncodedURL = ").does([this](const Evaluation& evaluation) {
        const std::string url = encoded(quotedAfter(evaluation.text, "encodeURI(\""));
        browser.window().method("getEncodedURL", [url](const Values&) { return Value(url); });
        return undefined;
    });
}

void AVControlTest::TearDown() {
    BorderTest::TearDown();
    clock.await(0); // no monitor is left
    if (!HasFailure()) {
        EXPECT_EQ(m_callbackHeap.left(), m_blocksLeftBehind) << "blocks of the platform's callbacks left";
    }
}

EmbeddedObject AVControlTest::element(const std::string& mimeType, const Attributes& attributes) {
    return browser.embed(mimeType, attributes);
}

EmbeddedObject AVControlTest::video(const std::string& url, const Attributes& more) {
    Attributes attributes{{"id", "video"}, {"data", url}};
    attributes.insert(attributes.end(), more.begin(), more.end());
    EmbeddedObject object = element("video/mp4", attributes);
    browser.pump();
    log.clear();
    return object;
}

EmbeddedObject AVControlTest::playingVideo(const std::string& url, const Attributes& more) {
    EmbeddedObject object = video(url, more);
    EXPECT_EQ(object.call("play", 1), true);
    send(TELIX_AV_CB_MSG_PLAYSTART);
    EXPECT_EQ(state(object), Playing);
    log.clear();
    return object;
}

EmbeddedObject AVControlTest::playlist(const std::string& text, const Attributes& more) {
    Attributes attributes{{"id", "video"}, {"src", "http://media.example/list.asx"}};
    attributes.insert(attributes.end(), more.begin(), more.end());
    EmbeddedObject object = element("video/mp4", attributes);
    browser.pump();
    BrowserStream& stream = object.newStream("http://media.example/list.asx");
    stream.write(text);
    log.clear();
    stream.destroy();
    browser.pump();
    return object;
}

void AVControlTest::post(TELIX_AV_CB_MSG message) {
    ASSERT_NE(m_stateCallback, nullptr) << "no player was ever registered";
    onForeignThread([&] { m_callbackHeap.during([&] { m_stateCallback(7, message); }); });
}

void AVControlTest::send(TELIX_AV_CB_MSG message) {
    post(message);
    browser.pump();
}

void AVControlTest::sendRightsError(int errorState, const std::string& contentId, const std::string& system,
                                    const std::string& url, unsigned copies) {
    ASSERT_NE(m_rightsCallback, nullptr) << "no player was ever registered";
    onForeignThread([&] {
        // Gone when the callback returns, like the platform's own.
        std::string texts[] = {contentId, system, url};
        const auto bytes = [](std::string& text) { return reinterpret_cast<unsigned char*>(text.data()); };
        m_callbackHeap.during([&] {
            const MemoryShortage shortage(copies < 3 ? 1 : 0, copies);
            m_rightsCallback(7, errorState, bytes(texts[0]), bytes(texts[1]), bytes(texts[2]));
        });
    });
    browser.pump();
}

void AVControlTest::report(const TELIX_JS_AV_PLAY_INFO& reported) {
    platform.TELIX_JS_AV_GetPlayInfo = [record = reported](TELIX_JS_AV_HANDLE,
                                                           TELIX_JS_AV_PLAY_INFO** out) mutable {
        *out = &record;
        return 0;
    };
}

TELIX_JS_AV_PLAY_INFO AVControlTest::info(uint32_t buffered, uint32_t position, uint32_t duration,
                                          uint32_t bufferedEnd, uint32_t playerState) {
    TELIX_JS_AV_PLAY_INFO record{};
    record.state = playerState;
    record.playPosition = position;
    record.duration = duration;
    record.bufferedEnd = bufferedEnd;
    record.buffered = buffered;
    return record;
}

void AVControlTest::destroy(const EmbeddedObject& object) {
    object.destroy();
    browser.pump();
}

std::string entry(const std::string& url, const std::string& more) {
    return "<Entry>" + more + "<Ref HREF=\"" + url + "\"/></Entry>";
}

std::string asx(const std::vector<std::string>& entries) {
    std::string text = "<ASX Version=\"3.0\">";
    for (const std::string& one : entries) {
        text += one;
    }
    return text + "</ASX>";
}

} // namespace avcontrol

// What the keys do that no page gets.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "desktop/window/shared/Television.h"

using namespace desktop;

namespace {

using Strings = std::vector<std::string>;

class TelevisionTest : public testing::Test {
protected:
    Television::Library library() {
        Television::Library library;
        library.tune = [this](uint32_t number, const Television::OnChannel& done) {
            m_calls.push_back("tune " + std::to_string(number));
            done(number, "Name");
        };
        library.step = [this](int positions, const Television::OnChannel& done) {
            m_calls.push_back("step " + std::to_string(positions));
            done(0, "");
        };
        library.setVolume = [this](uint32_t volume) {
            m_calls.push_back("volume " + std::to_string(volume));
        };
        return library;
    }

    SignalledApplications::Window window() {
        SignalledApplications::Window window;
        window.hasApplication = [this] { return m_hasApplication; };
        window.open = [this](const std::string& url) -> SignalledApplications::Application {
            m_calls.push_back("open " + url);
            m_hasApplication = true;
            return this;
        };
        window.end = [](SignalledApplications::Application) {};
        window.endAll = [this] { m_calls.emplace_back("end all"); };
        return window;
    }

    void press(const std::string& key) { m_television.onKey(*remoteKeyByName(key)); }

    void signalAutostart() {
        Signalling signalling;
        signalling.state = TELIX_DESKTOP_SIGNALLING_KNOWN;
        signalling.serial = 1;
        SignalledApplication application;
        application.url = "http://example/";
        signalling.applications.push_back(application);
        m_television.applications().update(signalling);
    }

    bool m_hasApplication = false;
    Strings m_calls;
    Strings m_shown;
    Television m_television{library(), window(),
                            [this](const std::string& text) { m_shown.push_back(text); }};
};

TEST_F(TelevisionTest, ADigitSelectsAChannelAndItsNameIsShown) {
    press("2");
    EXPECT_EQ(m_calls, Strings{"tune 2"});
    EXPECT_EQ(m_shown, Strings{"2   Name"});
}

TEST_F(TelevisionTest, ChannelKeysStepThroughTheChannels) {
    press("channel-up");
    press("channel-down");
    EXPECT_EQ(m_calls, (Strings{"step 1", "step -1"}));
}

TEST_F(TelevisionTest, WithoutAChannelNothingIsShown) {
    press("channel-up");
    EXPECT_EQ(m_shown, Strings{});
}

TEST_F(TelevisionTest, VolumeStaysWithinItsBounds) {
    press("volume-up");
    press("volume-down");
    EXPECT_EQ(m_calls, (Strings{"volume 100", "volume 95"}));
    EXPECT_EQ(m_shown, (Strings{"Volume 100", "Volume 95"}));
    for (int count = 0; count < 30; ++count) {
        press("volume-down");
    }
    EXPECT_EQ(m_television.volume(), 0U);
    EXPECT_EQ(m_shown.back(), "Mute");
}

TEST_F(TelevisionTest, MuteIsUndoneByItselfAndByTheVolumeKeys) {
    press("volume-down");
    press("mute");
    EXPECT_EQ(m_television.volume(), 0U);
    press("mute");
    EXPECT_EQ(m_television.volume(), 95U);
    press("mute");
    press("volume-up");
    EXPECT_EQ(m_television.volume(), 100U);
    press("mute");
    press("volume-down");
    EXPECT_EQ(m_television.volume(), 95U);
}

TEST_F(TelevisionTest, TextStartsWhatTheChannelSignals) {
    m_hasApplication = true;
    signalAutostart(); // a page of its own runs
    EXPECT_EQ(m_calls, Strings{});
    press("text");
    EXPECT_EQ(m_calls, (Strings{"end all", "open http://example/"}));
}

TEST_F(TelevisionTest, RedStartsItOnlyIfNothingRuns) {
    m_hasApplication = true;
    signalAutostart();
    press("red");
    EXPECT_EQ(m_calls, Strings{});
    m_hasApplication = false;
    press("red");
    EXPECT_EQ(m_calls, Strings{"open http://example/"});
}

TEST_F(TelevisionTest, ExitEndsWhatRuns) {
    m_hasApplication = true;
    press("exit");
    EXPECT_EQ(m_calls, Strings{"end all"});
}

TEST_F(TelevisionTest, OtherKeysDoNothing) {
    for (const char* key : {"ok", "left", "green", "play", "info"}) {
        press(key);
    }
    EXPECT_EQ(m_calls, Strings{});
}

} // namespace

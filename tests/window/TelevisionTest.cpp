// What the keys do that no page gets.
#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <utility>
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

    Television::Timer timer() {
        return {[this](unsigned milliseconds, std::function<void()> onEnd) {
                    m_timerEnd = m_now + milliseconds;
                    m_onTimerEnd = std::move(onEnd);
                },
                [this] { m_onTimerEnd = nullptr; }};
    }

    void pass(unsigned milliseconds) {
        m_now += milliseconds;
        if (m_onTimerEnd && m_now >= m_timerEnd) {
            std::exchange(m_onTimerEnd, nullptr)();
        }
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
    unsigned m_now = 0;
    unsigned m_timerEnd = 0;
    std::function<void()> m_onTimerEnd; // null: the timer does not run
    Television m_television{library(), window(), [this](const std::string& text) { m_shown.push_back(text); },
                            timer()};
};

TEST_F(TelevisionTest, ADigitSelectsAChannelAndItsNameIsShown) {
    press("2");
    EXPECT_EQ(m_shown, Strings{"2"});
    pass(Television::kDigitMilliseconds - 1);
    EXPECT_EQ(m_calls, Strings{});
    pass(1);
    EXPECT_EQ(m_calls, Strings{"tune 2"});
    EXPECT_EQ(m_shown, (Strings{"2", "2   Name"}));
}

TEST_F(TelevisionTest, DigitsThatFollowInTimeAreOneNumberThatIsShownAsItIsTyped) {
    for (const char* digit : {"1", "0", "7"}) {
        press(digit);
        EXPECT_EQ(m_calls, Strings{});
        pass(Television::kDigitMilliseconds - 1);
    }
    pass(1);
    EXPECT_EQ(m_calls, Strings{"tune 107"});
    EXPECT_EQ(m_shown, (Strings{"1", "10", "107", "107   Name"}));
    press("3");
    pass(Television::kDigitMilliseconds);
    EXPECT_EQ(m_calls, (Strings{"tune 107", "tune 3"}));
}

TEST_F(TelevisionTest, FourDigitsAreAWholeNumber) {
    for (const char* digit : {"0", "0", "1", "2"}) {
        press(digit);
    }
    EXPECT_EQ(m_calls, Strings{"tune 12"});
    pass(2 * Television::kDigitMilliseconds);
    EXPECT_EQ(m_calls, Strings{"tune 12"});
}

TEST_F(TelevisionTest, OkSelectsTheTypedChannelAtOnce) {
    press("1");
    press("2");
    press("ok");
    EXPECT_EQ(m_calls, Strings{"tune 12"});
    press("ok");
    pass(2 * Television::kDigitMilliseconds);
    EXPECT_EQ(m_calls, Strings{"tune 12"});
}

TEST_F(TelevisionTest, AnotherKeyDiscardsTheTypedNumber) {
    for (const char* key : {"channel-up", "info"}) {
        press("1");
        press(key);
        pass(2 * Television::kDigitMilliseconds);
    }
    EXPECT_EQ(m_calls, Strings{"step 1"});
}

TEST_F(TelevisionTest, APageIsToldOfItsKeysOutsideOfTheKeySet) {
    const int application = 0;
    const auto linesOf = [&](const char* key, const Warnings::Page& page) {
        testing::internal::CaptureStderr();
        m_television.onKey(*remoteKeyByName(key), page);
        return testing::internal::GetCapturedStderr();
    };
    EXPECT_NE(linesOf("2", {&application, "http://example/"}).find("telix: "), std::string::npos);
    EXPECT_EQ(linesOf("volume-up", {&application, "http://example/"}), "");
    EXPECT_EQ(linesOf("2", {}), "");
    m_television.onEnded(&application);
    EXPECT_NE(linesOf("2", {&application, "http://example/"}), "");
}

TEST_F(TelevisionTest, WhatTheSignallingSkipsIsPrintedOnce) {
    Signalling signalling;
    signalling.channel = 3;
    signalling.skipped = {"section: malformed"};
    testing::internal::CaptureStderr();
    m_television.onSignalling(signalling);
    m_television.onSignalling(signalling);
    EXPECT_EQ(testing::internal::GetCapturedStderr(),
              "telix: skipped in the AIT of channel 3: section: malformed\n");
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

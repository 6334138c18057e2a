// The commands of telixctl on a window that the test answers for.
#include "desktop/window/control/WindowCommands.h"

#include <glib.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "desktop/window/shared/ScriptedWindow.h"

using namespace desktop;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

const char kDone[] = R"({"ok":true})";

// What has been asked of the window, and what it answers. `held`: answers are kept until the test calls them.
class FakeWindow : public ScriptedWindow {
public:
    bool hasApplication() const override { return applicationCount > 0; }
    bool isTopLoaded() const override { return isLoaded && hasApplication(); }
    void press(const RemoteKey& key, std::function<void()> done) override {
        calls.push_back(std::string("press ") + key.name);
        answer(std::move(done));
    }
    void evaluate(const std::string& expression, std::function<void(Evaluation)> done) override {
        calls.push_back("evaluate " + expression);
        answer([this, done = std::move(done)] { done(evaluation); });
    }
    bool hasPicture() const override { return false; }
    void writeScreenshot(const std::string& file,
                         std::function<void(const std::string& error)> done) override {
        calls.push_back("screenshot " + file);
        answer([this, done = std::move(done)] { done(error); });
    }
    void paint(uint8_t*, int) override {}
    void open(const std::string& url, std::function<void(const std::string& error)> done) override {
        calls.push_back("open " + url);
        isLoaded = false;
        answer([this, done = std::move(done)] { done(error); });
    }
    void reload(std::function<void(const std::string& error)> done) override {
        calls.push_back("reload");
        answer([this, done = std::move(done)] { done(error); });
    }
    bool isIdle() const override { return false; }
    std::vector<RunningApplication> applications() const override {
        return {{"http://b.example/", "1.2", true}, {"http://a.example/", "", false}};
    }

    std::vector<std::string> calls;
    int applicationCount = 1;
    bool isLoaded = true;
    Evaluation evaluation;
    std::string error;
    bool isHolding = false;
    std::function<void()> held;

private:
    void answer(std::function<void()> done) {
        if (isHolding) {
            held = std::move(done);
        } else {
            done();
        }
    }
};

class WindowCommandsTest : public testing::Test {
protected:
    // Sends a request; `m_response` gets the response.
    void send(const std::string& line) {
        m_response.clear();
        m_commands->handle(line, [this](const std::string& response) {
            EXPECT_EQ(m_response, "") << "a second response: " << response;
            m_response = response;
        });
    }

    // Runs the main loop until there is a response.
    const std::string& response() {
        while (m_response.empty()) {
            g_main_context_iteration(nullptr, TRUE);
        }
        return m_response;
    }

    // Runs the main loop for some steps, which the commands make all the time.
    void makeSteps() {
        int left = 10;
        g_timeout_add(
            25, [](gpointer data) -> gboolean { return --*static_cast<int*>(data) > 0; }, &left);
        while (left > 0) {
            g_main_context_iteration(nullptr, TRUE);
        }
    }

    FakeWindow m_window;
    std::unique_ptr<WindowCommands> m_commands = std::make_unique<WindowCommands>(m_window);
    std::string m_response;
};

TEST_F(WindowCommandsTest, PressesKeysOneAfterTheOther) {
    send(R"({"command":"key","names":["ok","5","exit"]})");
    EXPECT_EQ(response(), kDone);
    EXPECT_THAT(m_window.calls, ElementsAre("press ok", "press 5", "press exit"));
}

TEST_F(WindowCommandsTest, PressesAKeyWhenThePageIsLoadedAndTheKeyBeforeIsHandled) {
    m_window.isHolding = true;
    m_window.isLoaded = false;
    send(R"({"command":"key","names":["ok","down"]})");
    makeSteps();
    EXPECT_THAT(m_window.calls, IsEmpty());
    m_window.isLoaded = true;
    makeSteps();
    EXPECT_THAT(m_window.calls, ElementsAre("press ok"));
    m_window.held();
    makeSteps();
    EXPECT_THAT(m_window.calls, ElementsAre("press ok", "press down"));
    EXPECT_EQ(m_response, "");
    m_window.held();
    EXPECT_EQ(m_response, kDone);
}

TEST_F(WindowCommandsTest, PressesKeysAlsoWithoutAnApplication) {
    m_window.applicationCount = 0;
    send(R"({"command":"key","names":["channel-up"]})");
    EXPECT_EQ(response(), kDone);
}

TEST_F(WindowCommandsTest, PressesNothingIfAKeyIsUnknown) {
    send(R"({"command":"key","names":["ok","purple"]})");
    EXPECT_EQ(response(), R"({"ok":false,"error":"unknown key \"purple\""})");
    EXPECT_THAT(m_window.calls, IsEmpty());
}

TEST_F(WindowCommandsTest, SaysWhichKeyCouldNotBePressedInTime) {
    m_window.isLoaded = false;
    send(R"({"command":"key","names":["ok"],"timeout":1})");
    EXPECT_EQ(response(), R"({"ok":false,"error":"ok: the page before it is not loaded within 1 s"})");
}

TEST_F(WindowCommandsTest, WritesAScreenshotOrSaysWhyNot) {
    send(R"({"command":"screenshot","file":"/tmp/a.png"})");
    EXPECT_EQ(response(), kDone);
    m_window.error = "No space left on device";
    send(R"({"command":"screenshot","file":"/tmp/a.png"})");
    EXPECT_EQ(response(), R"({"ok":false,"error":"/tmp/a.png: No space left on device"})");
    EXPECT_THAT(m_window.calls, ElementsAre("screenshot /tmp/a.png", "screenshot /tmp/a.png"));
}

TEST_F(WindowCommandsTest, IsDoneWithAPageWhenItIsLoaded) {
    send(R"({"command":"open","url":"http://c.example/"})");
    makeSteps();
    EXPECT_EQ(m_response, "");
    m_window.isLoaded = true;
    EXPECT_EQ(response(), kDone);
    send(R"({"command":"reload"})");
    EXPECT_EQ(response(), kDone);
    EXPECT_THAT(m_window.calls, ElementsAre("open http://c.example/", "reload"));
}

TEST_F(WindowCommandsTest, SaysWhyAPageIsNotThere) {
    m_window.error = "HTTP status 404";
    send(R"({"command":"open","url":"http://c.example/"})");
    EXPECT_EQ(response(), R"({"ok":false,"error":"the page cannot be loaded: HTTP status 404"})");
    m_window.error.clear();
    m_window.isLoaded = false;
    send(R"({"command":"open","url":"http://c.example/","timeout":1})");
    EXPECT_THAT(response(), HasSubstr("not loaded within 1 s"));
    m_window.applicationCount = 0; // the engine has given it up
    send(R"({"command":"open","url":"http://c.example/"})");
    EXPECT_EQ(response(), R"({"ok":false,"error":"the page cannot be loaded"})");
    send(R"({"command":"reload"})");
    EXPECT_EQ(response(), R"({"ok":false,"error":"no application runs"})");
}

TEST_F(WindowCommandsTest, WaitsUntilAnExpressionIsTrue) {
    send(R"({"command":"wait","expression":"a > 1"})");
    makeSteps();
    EXPECT_EQ(m_response, "");
    m_window.evaluation.truth = true;
    EXPECT_EQ(response(), kDone);
    EXPECT_EQ(m_window.calls.front(), "evaluate a > 1");
}

TEST_F(WindowCommandsTest, SaysWhatHasNotBecomeTrueAndWhy) {
    send(R"({"command":"wait","expression":"a","timeout":1})");
    EXPECT_EQ(response(), R"({"ok":false,"error":"not true within 1 s"})");
    m_window.evaluation.error = "ReferenceError: a";
    send(R"({"command":"wait","expression":"a","timeout":1})");
    EXPECT_EQ(response(), R"({"ok":false,"error":"not true (ReferenceError: a) within 1 s"})");
    m_window.isHolding = true; // a script that does not end
    send(R"({"command":"wait","expression":"a","timeout":1})");
    EXPECT_EQ(response(), R"({"ok":false,"error":"not true within 1 s"})");
    m_window.held(); // later than anybody waits
}

TEST_F(WindowCommandsTest, CarriesRequestsOutSideBySide) {
    m_window.isHolding = true;
    send(R"({"command":"wait","expression":"a"})");
    std::string other;
    m_commands->handle(R"({"command":"applications"})",
                       [&](const std::string& response) { other = response; });
    EXPECT_EQ(other, R"({"running":[{"url":"http://b.example/","id":"1.2","visible":true},)"
                     R"({"url":"http://a.example/","id":"","visible":false}],"ok":true})");
    EXPECT_EQ(m_response, "");
}

TEST_F(WindowCommandsTest, RefusesWhatTheWindowDoesNotDo) {
    for (const char* line :
         {"", "hello", R"({"command":"state"})", R"({"command":"list"})", R"({"command":"key"})",
          R"({"command":"key","names":[]})", R"({"command":"key","names":"ok"})",
          R"({"command":"key","names":["ok",5]})", R"({"command":"screenshot","file":"a.png"})",
          R"({"command":"open","url":"a.html"})", R"({"command":"wait","expression":"1","timeout":0})"}) {
        send(line);
        EXPECT_THAT(response(), HasSubstr(R"("ok":false)")) << line;
    }
    EXPECT_THAT(m_window.calls, IsEmpty());
}

TEST_F(WindowCommandsTest, RespondsNoLongerAfterItsEnd) {
    m_window.isHolding = true;
    send(R"({"command":"wait","expression":"a"})");
    m_commands.reset();
    m_window.evaluation.truth = true;
    m_window.held();
    EXPECT_EQ(m_response, "");
}

} // namespace

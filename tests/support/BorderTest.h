// The fixture of every test that goes through the plug-in's border: a fresh scripted browser with the plug-in
// started in it, the recording platform library reset and writing into the same log, and a check at the end
// that nothing is left but what the test says is left behind on purpose.
#ifndef TELIX_TESTS_SUPPORT_BORDERTEST_H
#define TELIX_TESTS_SUPPORT_BORDERTEST_H

#include <functional>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/RecordingPlatform.h"
#include "tests/support/ScriptedBrowser.h"

class BorderTest : public ::testing::Test {
protected:
    BorderTest();
    ~BorderTest() override;
    // Ends what the test left running, then checks what is left. An overriding fixture calls it last.
    void TearDown() override;

    // What the plug-in keeps on purpose after all instances are gone: `references` to one object or to all
    // objects of one class together ("JSChannel"). The test fails if it isn't exactly that.
    void leftBehind(const ObjectRef& object, int references = 1);
    void leftBehind(const std::string& className, int references = 1);
    // The same for blocks of the browser's memory.
    void memoryLeftBehind(size_t blocks = 1) { m_memoryLeftBehind = blocks; }
    // No check of what is left; only where the test can't know.
    void anythingMayBeLeft() { m_checksLeftovers = false; }

    // What `body` prints on standard output with LOG_MODULE set to `level`. Runs in a process of its own that
    // starts as a copy of this one, so nothing that it does lasts, and the levels that the source files cache
    // stay 0 here.
    std::string logOf(int level, const std::function<void()>& body);
    // The same with LOG_MODULE unset: what is printed all the same.
    std::string outputOf(const std::function<void()>& body);

    ScriptedBrowser browser;
    BorderLog& log = browser.log();
    RecordingPlatform& platform = recordingPlatform();

private:
    struct Declaration {
        NPObject* object; // or null for the class
        std::string className;
        int references;
    };

    void checkLeftovers();

    std::vector<Declaration> m_leftBehind;
    size_t m_memoryLeftBehind = 0;
    bool m_checksLeftovers = true;
};

// The line of one log statement, as in "PLUGIN >>> COMMON :: NPN_Status ::  is called".
std::string logLine(const std::string& module, const std::string& function, const std::string& text);

#endif

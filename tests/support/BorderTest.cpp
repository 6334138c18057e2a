// The fixture: start, end and what is left over.
#include "tests/support/BorderTest.h"

#include <cstdio>
#include <cstdlib>
#include <map>
#include <sys/wait.h>
#include <unistd.h>

#include <gtest/gtest-spi.h>

namespace {

// Runs the body in a child process and returns what that printed.
std::string printedBy(const char* level, const std::function<void()>& body) {
    FILE* file = std::tmpfile();
    if (!file) {
        ADD_FAILURE() << "No temporary file.";
        return "";
    }
    std::fflush(nullptr);
    const pid_t child = fork();
    if (child == 0) {
        dup2(fileno(file), STDOUT_FILENO);
        if (level) {
            setenv("LOG_MODULE", level, 1);
        }
        ::testing::TestPartResultArray failures;
        {
            using Reporter = ::testing::ScopedFakeTestPartResultReporter;
            const Reporter ofOtherThreads(Reporter::INTERCEPT_ALL_THREADS, &failures);
            const Reporter ofThisThread(Reporter::INTERCEPT_ONLY_CURRENT_THREAD, &failures);
            body();
        }
        for (int i = 0; i < failures.size(); ++i) {
            std::printf("%s\n", failures.GetTestPartResult(i).message());
        }
        std::fflush(nullptr);
        _exit(failures.size() > 0 ? 1 : 0);
    }
    int status = -1;
    waitpid(child, &status, 0);
    std::rewind(file);
    std::string text;
    char buffer[4096];
    for (size_t count = 0; (count = std::fread(buffer, 1, sizeof buffer, file)) > 0;) {
        text.append(buffer, count);
    }
    std::fclose(file);
    if (!WIFEXITED(status) || WEXITSTATUS(status) != 0) {
        ADD_FAILURE() << "The logged body failed (status " << status << "):\n" << text;
    }
    return text;
}

} // namespace

BorderTest::BorderTest() {
    unsetenv("LOG_MODULE");
    platform.reset();
    platform.onCall = [this](const std::string& call) { log.add(call); };
    EXPECT_EQ(browser.initialize(), NPERR_NO_ERROR);
    log.clear();
}

BorderTest::~BorderTest() {
    platform.reset();
    platform.onCall = nullptr;
}

void BorderTest::TearDown() {
    browser.closePage();
    // A test that failed already may have left anything.
    if (m_checksLeftovers && !HasFailure()) {
        checkLeftovers();
    }
}

void BorderTest::leftBehind(const ObjectRef& object, int references) {
    m_leftBehind.push_back({object.object(), object.name(), references});
}

void BorderTest::leftBehind(const std::string& className, int references) {
    m_leftBehind.push_back({nullptr, className, references});
}

void BorderTest::checkLeftovers() {
    std::map<std::string, int> byClass;
    std::map<NPObject*, int> byObject;
    for (const LiveObject& live : browser.liveObjects()) {
        // Every model keeps its reference to the window on purpose.
        if (live.object != browser.window().object() && live.pluginReferences != 0) {
            byObject[live.object] = live.pluginReferences;
            byClass[live.className] += live.pluginReferences;
        }
    }
    for (const Declaration& declaration : m_leftBehind) {
        if (declaration.object) {
            const int found = byObject[declaration.object];
            EXPECT_EQ(found, declaration.references) << "references left to " << declaration.className;
            byClass[browser.classNameOf(declaration.object)] -= found;
        } else {
            EXPECT_EQ(byClass[declaration.className], declaration.references)
                << "references left to objects of the class " << declaration.className;
            byClass[declaration.className] = 0;
        }
    }
    for (const auto& [className, references] : byClass) {
        EXPECT_EQ(references, 0) << "references left to " << className << "\n" << browser.report();
    }
    EXPECT_EQ(browser.memoryBlocks(), m_memoryLeftBehind) << "blocks of the browser's memory left";
}

std::string BorderTest::logOf(int level, const std::function<void()>& body) {
    return printedBy(std::to_string(level).c_str(), body);
}

std::string BorderTest::outputOf(const std::function<void()>& body) {
    return printedBy(nullptr, body);
}

std::string logLine(const std::string& module, const std::string& function, const std::string& text) {
    return " PLUGIN >>> " + module + " :: " + function + " :: " + text;
}

// The fixture: start, end and what is left over.
#include "tests/support/BorderTest.h"

#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <map>
#include <sys/wait.h>
#include <unistd.h>

#include <gtest/gtest-spi.h>

namespace {

// A copy of this process has only this thread, and a lock that another held at that moment is held for good:
// the copy may then stand still. Its limit, and how often another copy is tried.
constexpr unsigned kCopySeconds = 15;
constexpr int kCopies = 3;

// Runs the body in a copy of this process that prints to the file. The copy's status as waitpid() gives it.
int runInCopy(FILE* file, const char* level, const std::function<void()>& body) {
    std::fflush(nullptr);
    const pid_t child = fork();
    if (child == 0) {
        alarm(kCopySeconds);
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
    return status;
}

std::string contentsOf(FILE* file) {
    std::rewind(file);
    std::string text;
    char buffer[4096];
    for (size_t count = 0; (count = std::fread(buffer, 1, sizeof buffer, file)) > 0;) {
        text.append(buffer, count);
    }
    return text;
}

// Runs the body in a child process and returns what that printed.
std::string printedBy(const char* level, const std::function<void()>& body) {
    int status = -1;
    std::string text;
    for (int copy = 0; copy < kCopies; ++copy) {
        FILE* file = std::tmpfile();
        if (!file) {
            ADD_FAILURE() << "No temporary file.";
            return "";
        }
        status = runInCopy(file, level, body);
        text = contentsOf(file);
        std::fclose(file);
        if (!WIFSIGNALED(status) || WTERMSIG(status) != SIGALRM) {
            break;
        }
    }
    if (!WIFEXITED(status) || WEXITSTATUS(status) != 0) {
        ADD_FAILURE() << "The logged body failed (status " << status << "):\n" << text;
    }
    return text;
}

} // namespace

BorderTest::BorderTest() {
    unsetenv("LOG_MODULE");
    unsetenv("PLUGIN_ESCAPE_EVENTS");
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

// TELIX_MUTANTS_MAP: the file that gets a line for each test of a GoogleTest program: its name, its
// milliseconds, the numbers of the mutants that it reaches. The first line is that of all tests: what is
// reached before the first one.
#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>

#include "tests/mutation/Mutant.h"

namespace {

class ReachedByTests : public testing::EmptyTestEventListener {
public:
    explicit ReachedByTests(const char* file) : m_file(file) {}

private:
    void OnTestProgramStart(const testing::UnitTest&) override { write("*", 0); }

    void OnTestStart(const testing::TestInfo&) override { telix_mutation::forgetReached(); }

    void OnTestEnd(const testing::TestInfo& test) override {
        if (test.result()->Passed()) {
            write(std::string(test.test_suite_name()) + '.' + test.name(), test.result()->elapsed_time());
        }
    }

    void write(const std::string& test, testing::TimeInMillis duration) {
        m_file << test << ' ' << duration;
        for (size_t number = 0; number < telix_mutation::kMaxMutants; ++number) {
            if (telix_mutation::reached()[number] != 0) {
                m_file << ' ' << number;
            }
        }
        m_file << std::endl; // a later test may end the process
    }

    std::ofstream m_file;
};

[[maybe_unused]] const bool isListening = [] {
    const char* file = getenv("TELIX_MUTANTS_MAP");
    if (file) {
        testing::UnitTest::GetInstance()->listeners().Append(new ReachedByTests(file));
    }
    return file != nullptr;
}();

} // namespace

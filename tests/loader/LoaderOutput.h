// What the loader leaves on standard output and in GLib's log while a test runs.
#ifndef TELIX_TESTS_LOADER_LOADEROUTPUT_H
#define TELIX_TESTS_LOADER_LOADEROUTPUT_H

#include <glib.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

inline constexpr const char* kLoadLine = "libtelix.so library will load for first time now.\n";

class LoaderOutput {
public:
    LoaderOutput() {
        testing::internal::CaptureStdout();
        g_log_set_default_handler(onMessage, this);
    }
    ~LoaderOutput() {
        g_log_set_default_handler(g_log_default_handler, nullptr);
        if (m_capturing) {
            testing::internal::GetCapturedStdout();
        }
    }
    LoaderOutput(const LoaderOutput&) = delete;
    LoaderOutput& operator=(const LoaderOutput&) = delete;

    // What was printed since the last call of this function.
    std::string printed() {
        std::string text = testing::internal::GetCapturedStdout();
        m_capturing = false;
        testing::internal::CaptureStdout();
        m_capturing = true;
        return text;
    }

    // The warnings without a log domain since the last call of this function; anything else in GLib's log
    // stands among them with its domain and level in front.
    std::vector<std::string> warnings() { return std::move(m_warnings); }

private:
    static void onMessage(const char* domain, GLogLevelFlags level, const char* message, void* self) {
        std::string text = message;
        if (domain != nullptr || level != G_LOG_LEVEL_WARNING) {
            text = std::string(domain != nullptr ? domain : "") + '/' + std::to_string(level) + ": " + text;
        }
        static_cast<LoaderOutput*>(self)->m_warnings.push_back(text);
    }

    std::vector<std::string> m_warnings;
    bool m_capturing = true;
};

#endif

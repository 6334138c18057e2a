#include "desktop/conformance/Summary.h"

#include <cstdio>

namespace desktop {

void Summary::handle(CheckEvent event, const std::string& message) {
    m_running.clear();
    switch (event) {
    case CheckEvent::Started:
        m_running = message;
        break;
    case CheckEvent::NoLibrary:
        m_noLibraryReason = message;
        break;
    case CheckEvent::Passed:
        print("ok", message, m_passed);
        break;
    case CheckEvent::Failed:
        print("FAIL", message, m_failed);
        break;
    case CheckEvent::Skipped:
        print("skip", message, m_skipped);
        break;
    }
}

void Summary::endGroup(const CheckGroup& group, const std::string& reason) {
    if (!reason.empty()) {
        print("FAIL",
              (m_running.empty() ? group.name : m_running) + ": " + reason + "; further checks of " +
                  group.name + " are left out",
              m_failed);
    }
    m_running.clear();
}

void Summary::printTotal() const {
    std::printf("%u ok, %u failed, %u skipped\n", m_passed, m_failed, m_skipped);
}

void Summary::print(const char* word, const std::string& message, unsigned int& count) {
    std::printf("%-4s  %s\n", word, message.c_str());
    std::fflush(stdout);
    ++count;
}

} // namespace desktop

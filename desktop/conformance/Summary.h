// The output of telix-conformance: one line per check, and their numbers.
#ifndef TELIX_DESKTOP_CONFORMANCE_SUMMARY_H
#define TELIX_DESKTOP_CONFORMANCE_SUMMARY_H

#include <string>

#include "desktop/conformance/CheckGroup.h"

namespace desktop {

class Summary {
public:
    // Receives what the process of a group reports.
    void handle(CheckEvent event, const std::string& message);

    // The process of a group has ended. An unexpected end, given as a reason, fails the check that was
    // running.
    void endGroup(const CheckGroup& group, const std::string& reason);

    void printTotal() const;
    bool hasFailures() const { return m_failed > 0; }

    // Why nothing can be checked; empty if the file is a library.
    const std::string& noLibraryReason() const { return m_noLibraryReason; }

private:
    static void print(const char* word, const std::string& message, unsigned int& count);

    unsigned int m_passed = 0;
    unsigned int m_failed = 0;
    unsigned int m_skipped = 0;
    std::string m_running; // claim of the check that is running; empty between checks
    std::string m_noLibraryReason;
};

} // namespace desktop

#endif

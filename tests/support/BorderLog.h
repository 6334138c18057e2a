// What crossed the plug-in's border during a test, in order: calls of the browser table, calls of the
// platform library and the DOM events of the page, each as one short readable text.
#ifndef TELIX_TESTS_SUPPORT_BORDERLOG_H
#define TELIX_TESTS_SUPPORT_BORDERLOG_H

#include <mutex>
#include <string>
#include <vector>

// Any thread may add; reading is for the test.
class BorderLog {
public:
    using Entries = std::vector<std::string>;

    // Returns the entry's place, for amend().
    size_t add(const std::string& text);
    // Completes an entry with what is known only after the call. Does nothing if the log was cleared
    // meanwhile.
    void amend(size_t place, const std::string& text);
    void clear();

    // Every entry.
    Entries everything() const;
    size_t size() const;
    // The entries without the browser's bookkeeping (identifiers, references, memory).
    Entries calls() const;
    // The entries that begin with `prefix`, bookkeeping included.
    Entries startingWith(const std::string& prefix) const;
    size_t count(const std::string& prefix) const { return startingWith(prefix).size(); }
    bool contains(const std::string& entry) const;

    // Each expected entry stands in the log after the one before it; others may stand between. Fails the
    // test with the whole log if not.
    void expectInOrder(const Entries& expected) const;

    // One entry a line.
    std::string text() const;

private:
    mutable std::mutex m_mutex;
    Entries m_entries;
};

#endif

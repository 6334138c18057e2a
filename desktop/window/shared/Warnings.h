// What fails without a sign that the author of a page would see: one line on the console at the first time.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_WARNINGS_H
#define TELIX_DESKTOP_WINDOW_SHARED_WARNINGS_H

#include <map>
#include <optional>
#include <set>
#include <string>
#include <utility>

namespace desktop {

enum class Warning {
    NoId,         // an object without an id gets no events; the subject is its type
    UnknownType,  // no plug-in and no engine has objects of that type; the subject is the type
    RefusedCall,  // a method has refused its arguments; the subject is the call with their types
    FailedScript, // an event is lost, because the script that dispatches it has failed; the subject is its
                  // source
    KeyNotInSet,  // the page has not got a key; the subject is the key's name
    NotCreated,   // an application has not been created; the subject is its URL and the reason
    SkippedEntry // an entry of an AIT has been left out; the subject is whose AIT, which entry and the reason
};

// The warning that scripts name so.
std::optional<Warning> warningNamed(const std::string& name);

// Main thread.
class Warnings {
public:
    struct Page {
        const void* application = nullptr; // null: what is the television's
        std::string url;
    };

    // Prints a line, unless the document has got the same one. A document gets a hundred at most. Not all
    // objects need an id, and not all types are the plug-in's: for those there is no line.
    void print(const Page& page, Warning warning, const std::string& subject);
    // The application has another document, or has ended.
    void forget(const void* application) { m_printed.erase(application); }

private:
    std::map<const void*, std::set<std::string>> m_printed; // lines by application
};

} // namespace desktop

#endif

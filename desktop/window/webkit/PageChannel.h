// The calls of pages in the web process that wait for the window: functions that create, destroy, show and
// hide applications, and keys of a WebDriver session that are the television's.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_PAGECHANNEL_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_PAGECHANNEL_H

#include <cstdint>
#include <functional>
#include <string>

namespace desktop {

// A socket pair, because the engine has no call from the web process that waits for a reply. Each call is one
// message of three lines: the id of the page, the name of the function and its argument. The reply is `1` or
// `0`. Main thread.
class PageChannel {
public:
    // Must be called once, at any time.
    using Reply = std::function<void(bool)>;
    using Handler = std::function<void(uint64_t page, const std::string& function,
                                       const std::string& argument, const Reply& reply)>;

    PageChannel();
    ~PageChannel();
    PageChannel(const PageChannel&) = delete;
    PageChannel& operator=(const PageChannel&) = delete;

    void setHandler(Handler handler) { m_handler = std::move(handler); }

    // Uses the connection that the web process which has just been started has inherited, in place of the one
    // of the process before. Returns its descriptor in that process, -1 if there is none.
    int useProcess();

private:
    struct Pair {
        int own = -1;
        int inherited = -1;
    };

    static Pair makePair();
    static void closePair(const Pair& pair);
    bool onReadable();

    Handler m_handler;
    Pair m_current;
    // For the next web process: a process inherits what there is before its start.
    Pair m_prepared;
    unsigned m_watch = 0;
    // Identifies the connection that a reply belongs to.
    unsigned m_generation = 0;
};

} // namespace desktop

#endif

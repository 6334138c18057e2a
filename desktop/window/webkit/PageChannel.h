// The calls of pages in the web process that wait for the window: functions that create, destroy, show and
// hide applications.
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

    PageChannel() = default;
    ~PageChannel();
    PageChannel(const PageChannel&) = delete;
    PageChannel& operator=(const PageChannel&) = delete;

    void setHandler(Handler handler) { m_handler = std::move(handler); }

    // Makes a connection for the web process that is started next, which takes the place of the one before.
    // Returns the descriptor that the process inherits, which stays with this object; -1 if there is none
    // left.
    int startProcess();

private:
    bool onReadable();
    void stopProcess();

    Handler m_handler;
    int m_own = -1;
    int m_inherited = -1;
    unsigned m_watch = 0;
    // Identifies the connection that a reply belongs to.
    unsigned m_generation = 0;
};

} // namespace desktop

#endif

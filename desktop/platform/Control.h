// Control of the television from outside: a Unix socket that only its user can connect to. The protocol is
// described in ControlProtocol.h.
#ifndef TELIX_DESKTOP_PLATFORM_CONTROL_H
#define TELIX_DESKTOP_PLATFORM_CONTROL_H

#include <functional>
#include <glib.h>
#include <list>
#include <memory>
#include <string>

namespace desktop {

// Handles one request. `respond` gets the response once, in this call or, if the window handles the request,
// later; both are without the end of the line. Platform thread.
using Respond = std::function<void(const std::string& response)>;
void handleControlRequest(const std::string& line, const Respond& respond);

// The listening socket and its connections. Platform thread.
class Control {
public:
    // Opens the socket of this process at the first call; it stays open until the process ends. Errors go to
    // standard error, and the television then works without a control socket.
    static void start();

    Control(const Control&) = delete;
    Control& operator=(const Control&) = delete;

private:
    class Connection;

    Control() = default;
    bool open(std::string& error);
    void listen();
    void accept();
    void remove(const Connection* connection);

    int m_socket = -1;
    std::list<std::shared_ptr<Connection>> m_connections;
};

} // namespace desktop

#endif

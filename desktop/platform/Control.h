// Control of the television from outside: a Unix socket of its user alone, at which programs ask for its
// state and provoke events. The requests stand in ControlProtocol.h.
#ifndef TELIX_DESKTOP_CONTROL_H
#define TELIX_DESKTOP_CONTROL_H

#include <glib.h>
#include <list>
#include <memory>
#include <string>

namespace desktop {

// The answer to one request, without the end of the line. Platform thread.
std::string answerControlRequest(const std::string& line);

// Platform thread.
class Control {
public:
    // Opens the socket of this process, once; lives as long as the process. What is wrong goes to standard
    // error, and the television works without.
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
    std::list<std::unique_ptr<Connection>> m_connections;
};

} // namespace desktop

#endif

// What the web process prints: passed on, with console messages in the form of the window's.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_WEBPROCESSOUTPUT_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_WEBPROCESSOUTPUT_H

#include <functional>
#include <string>

namespace desktop {

// Two pipes that the web process inherits; its extension makes them its standard output and standard error.
// Main thread.
class WebProcessOutput {
public:
    WebProcessOutput();
    ~WebProcessOutput();
    WebProcessOutput(const WebProcessOutput&) = delete;
    WebProcessOutput& operator=(const WebProcessOutput&) = delete;

    // Forgets the failure of the process before. Returns the descriptor for standard output, which stays with
    // this object, as the following one does.
    int startProcess();
    int errorDescriptor() const { return m_errors.writeEnd; }

    // Passes on what has been printed by now.
    void drain();

    // The failed assertion that the process has printed; empty if there is none. It is not passed on, because
    // it becomes part of the window's own message.
    const std::string& failure() const { return m_failure; }

private:
    struct Pipe {
        int readEnd = -1;
        int writeEnd = -1;
        unsigned watch = 0;
        std::string rest; // of a line that is not complete
        void (WebProcessOutput::*onLine)(const std::string& line) = nullptr;
    };

    void open(Pipe& pipe);
    void read(Pipe& pipe);
    void close(Pipe& pipe);
    void onOutputLine(const std::string& line);
    void onErrorLine(const std::string& line);

    Pipe m_output;
    Pipe m_errors;
    std::string m_failure;
};

} // namespace desktop

#endif

// What the web process prints: passed on, with console messages in the form of the window's.
#include "desktop/window/webkit/WebProcessOutput.h"

#include <fcntl.h>
#include <glib-unix.h>
#include <unistd.h>

#include <cstdio>

#include "desktop/window/shared/Diagnostics.h"
#include "desktop/window/shared/Pattern.h"

namespace desktop {

namespace {

// Prints a console message of the engine, URL:LINE:COLUMN: CONSOLE KIND TEXT, if the line is one. The engine
// knows no place for what a script logs outside of its functions: the message then comes from "page".
bool printAsConsoleMessage(const std::string& line) {
    static const Pattern kMessage(
        "(?:(.*?):([0-9]+):[0-9]+|\\[native code\\]): CONSOLE "
        "(?:(?:JS|SECURITY|NETWORK|CSS|DEBUG|INFO|LOG|WARN|ERROR|TRACE|DIR|TABLE) )*(.*)");
    if (line.find(": CONSOLE ") == std::string::npos) {
        return false;
    }
    const auto parts = kMessage.match(line);
    if (!parts) {
        return false;
    }
    const std::string& lineNumber = (*parts)[2]; // empty if the message has no place
    printConsoleMessage(lineNumber.empty() ? "page" : (*parts)[1], std::atoi(lineNumber.c_str()),
                        (*parts)[3]);
    return true;
}

bool isFailedAssertion(const std::string& line) {
    return line.find(": Assertion ") != std::string::npos && line.find(" failed.") != std::string::npos;
}

} // namespace

WebProcessOutput::WebProcessOutput() {
    m_output.onLine = &WebProcessOutput::onOutputLine;
    m_errors.onLine = &WebProcessOutput::onErrorLine;
    open(m_output);
    open(m_errors);
}

WebProcessOutput::~WebProcessOutput() {
    drain();
    close(m_output);
    close(m_errors);
}

void WebProcessOutput::open(Pipe& pipe) {
    int ends[2];
    if (pipe2(ends, O_NONBLOCK) != 0) {
        return;
    }
    pipe.readEnd = ends[0];
    pipe.writeEnd = ends[1];
    fcntl(pipe.readEnd, F_SETFD, FD_CLOEXEC);
    // Each end has its own flags; the web process waits when the pipe is full.
    fcntl(pipe.writeEnd, F_SETFL, 0);
    pipe.watch = g_unix_fd_add(
        pipe.readEnd, G_IO_IN,
        [](gint descriptor, GIOCondition, gpointer data) -> gboolean {
            auto* self = static_cast<WebProcessOutput*>(data);
            self->read(descriptor == self->m_output.readEnd ? self->m_output : self->m_errors);
            return G_SOURCE_CONTINUE;
        },
        this);
}

void WebProcessOutput::close(Pipe& pipe) {
    if (pipe.readEnd < 0) {
        return;
    }
    if (!pipe.rest.empty()) {
        (this->*pipe.onLine)(pipe.rest);
    }
    g_source_remove(pipe.watch);
    ::close(pipe.readEnd);
    ::close(pipe.writeEnd);
}

int WebProcessOutput::startProcess() {
    drain();
    m_failure.clear();
    return m_output.writeEnd;
}

void WebProcessOutput::drain() {
    read(m_output);
    read(m_errors);
}

void WebProcessOutput::read(Pipe& pipe) {
    char buffer[4096];
    ssize_t size = 0;
    while ((size = ::read(pipe.readEnd, buffer, sizeof buffer)) > 0) {
        pipe.rest.append(buffer, static_cast<std::size_t>(size));
    }
    std::size_t start = 0;
    for (std::size_t end = 0; (end = pipe.rest.find('\n', start)) != std::string::npos; start = end + 1) {
        (this->*pipe.onLine)(pipe.rest.substr(start, end - start));
    }
    pipe.rest.erase(0, start);
}

void WebProcessOutput::onOutputLine(const std::string& line) {
    std::printf("%s\n", line.c_str());
    std::fflush(stdout);
}

void WebProcessOutput::onErrorLine(const std::string& line) {
    if (isFailedAssertion(line)) {
        m_failure = line;
    } else if (!printAsConsoleMessage(line)) {
        std::fprintf(stderr, "%s\n", line.c_str());
    }
}

} // namespace desktop

// Paths of control sockets, and which of them a process listens on.
#include "desktop/platform/ControlSocket.h"

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <glib.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

namespace desktop {

namespace {

// The process id in the file name of a socket; 0 for any other file name.
pid_t pidOf(const std::string& name) {
    const std::string prefix = "telix-";
    const std::string suffix = ".sock";
    if (name.size() <= prefix.size() + suffix.size() || !g_str_has_prefix(name.c_str(), prefix.c_str()) ||
        !g_str_has_suffix(name.c_str(), suffix.c_str())) {
        return 0;
    }
    const std::string digits = name.substr(prefix.size(), name.size() - prefix.size() - suffix.size());
    guint64 pid = 0;
    return g_ascii_string_to_unsigned(digits.c_str(), 10, 1, G_MAXINT32, &pid, nullptr)
               ? static_cast<pid_t>(pid)
               : 0;
}

} // namespace

// A full backlog counts.
bool isListening(const std::string& path) {
    const auto address = socketAddress(path);
    const int socket = address ? ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0) : -1;
    if (socket < 0) {
        return false;
    }
    const bool isConnected =
        ::connect(socket, reinterpret_cast<const sockaddr*>(&*address), sizeof(*address)) == 0 ||
        errno == EAGAIN || errno == EINPROGRESS;
    ::close(socket);
    return isConnected;
}

std::optional<sockaddr_un> socketAddress(const std::string& path) {
    sockaddr_un address{};
    if (path.size() >= sizeof(address.sun_path)) {
        return std::nullopt;
    }
    address.sun_family = AF_UNIX;
    std::memcpy(address.sun_path, path.c_str(), path.size() + 1);
    return address;
}

std::string controlFolder(std::string& error) {
    if (const char* folder = g_getenv("XDG_RUNTIME_DIR"); folder && *folder) {
        if (!g_file_test(folder, G_FILE_TEST_IS_DIR)) {
            error = std::string(folder) + ": XDG_RUNTIME_DIR is not a folder";
            return "";
        }
        return folder;
    }
    std::string folder = std::string(g_get_tmp_dir()) + "/telix-" + std::to_string(geteuid());
    if (mkdir(folder.c_str(), 0700) != 0 && errno != EEXIST) {
        error = folder + ": " + g_strerror(errno);
        return "";
    }
    // Another user may have created it before.
    struct stat status {};
    if (lstat(folder.c_str(), &status) != 0 || !S_ISDIR(status.st_mode) || status.st_uid != geteuid() ||
        (status.st_mode & 077) != 0) {
        error = folder + ": other users have access to the folder";
        return "";
    }
    return folder;
}

std::string controlSocketPath(const std::string& folder, pid_t pid) {
    return folder + "/telix-" + std::to_string(pid) + ".sock";
}

std::vector<ControlSocket> runningTelevisions(const std::string& folder) {
    std::vector<ControlSocket> running;
    GDir* dir = g_dir_open(folder.c_str(), 0, nullptr);
    while (const char* name = dir ? g_dir_read_name(dir) : nullptr) {
        const pid_t pid = pidOf(name);
        const ControlSocket found{pid, folder + "/" + name};
        if (pid == 0) {
            continue;
        }
        if (isListening(found.path)) {
            running.push_back(found);
        } else if (kill(pid, 0) != 0 && errno == ESRCH) {
            unlink(found.path.c_str());
        }
    }
    if (dir) {
        g_dir_close(dir);
    }
    std::sort(running.begin(), running.end(),
              [](const ControlSocket& left, const ControlSocket& right) { return left.pid < right.pid; });
    return running;
}

} // namespace desktop

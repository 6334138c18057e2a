// The folder with what a television keeps for itself: cookies, storage and cache of the engine, configuration
// and control socket.
#include "desktop/window/webkit/Profile.h"

#include <fcntl.h>
#include <glib.h>
#include <sys/file.h>
#include <sys/un.h>
#include <unistd.h>

#include <cerrno>
#include <filesystem>
#include <system_error>

namespace desktop {

namespace {

constexpr char kConfiguration[] = "tv.conf";
constexpr char kSocket[] = "control.sock";
constexpr char kNewConfiguration[] =
    "# Configuration of this television. Without settings the defaults apply.\n";
constexpr int kFolderMode = 0700;

std::string fileIn(const std::string& folder, const char* name) {
    g_autofree char* path = g_canonicalize_filename((folder + "/" + name).c_str(), nullptr);
    return path;
}

} // namespace

void useProfileOfLibrary(const std::string& folder) {
    g_setenv("TELIX_CONFIG", fileIn(folder, kConfiguration).c_str(), TRUE);
    g_setenv("TELIX_SOCKET", fileIn(folder, kSocket).c_str(), TRUE);
}

Profile::Profile(const std::string& folder) : m_isTemporary(folder.empty()) {
    if (m_isTemporary) {
        openTemporary();
    } else {
        open(folder);
    }
}

void Profile::openTemporary() {
    g_autoptr(GError) error = nullptr;
    g_autofree char* folder = g_dir_make_tmp("telix-tv-XXXXXX", &error);
    if (folder) {
        m_folder = folder;
    } else {
        m_failure = std::string("cannot create a profile: ") + error->message;
    }
}

void Profile::open(const std::string& folder) {
    const std::string what = "--profile " + folder + ": ";
    if (fileIn(folder, kSocket).size() >= sizeof(sockaddr_un::sun_path)) {
        m_failure = what + "the path is too long for a socket";
        return;
    }
    if (g_mkdir_with_parents(folder.c_str(), kFolderMode) != 0) {
        m_failure = what + g_strerror(errno);
        return;
    }
    m_folder = fileIn(folder, "");
    m_lock = ::open(fileIn(folder, "lock").c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600);
    if (m_lock < 0) {
        m_failure = what + g_strerror(errno);
        return;
    }
    if (flock(m_lock, LOCK_EX | LOCK_NB) != 0) {
        m_failure = what + (errno == EWOULDBLOCK ? "in use by another television" : g_strerror(errno));
        return;
    }
    // With a file of its own the television does not read the user's.
    const std::string configuration = fileIn(folder, kConfiguration);
    g_autoptr(GError) error = nullptr;
    if (!g_file_test(configuration.c_str(), G_FILE_TEST_EXISTS) &&
        !g_file_set_contents(configuration.c_str(), kNewConfiguration, -1, &error)) {
        m_failure = what + error->message;
    }
}

Profile::~Profile() {
    if (m_isTemporary && !m_folder.empty()) {
        std::error_code ignored;
        std::filesystem::remove_all(m_folder, ignored);
    }
    if (m_lock >= 0) {
        close(m_lock);
    }
}

} // namespace desktop

// The folder with what a television keeps for itself: cookies, storage and cache of the engine, configuration
// and control socket.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_PROFILE_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_PROFILE_H

#include <string>

namespace desktop {

// Makes the platform library use the configuration and the control socket in the folder of a profile. Before
// the first thread: it changes the environment, which the web process inherits.
void useProfileOfLibrary(const std::string& folder);

// A folder that the user has given belongs to one television at a time and stays. A temporary one has the
// engine's data alone and is removed with this object; the engine's own temporary session would do, but it
// prints no console messages.
class Profile {
public:
    // Creates the folder if it does not exist. `folder` is empty for a temporary one.
    explicit Profile(const std::string& folder);
    ~Profile();
    Profile(const Profile&) = delete;
    Profile& operator=(const Profile&) = delete;

    // The reason why the folder cannot be used; empty if it can.
    const std::string& failure() const { return m_failure; }
    std::string dataFolder() const { return m_folder + "/data"; }
    std::string cacheFolder() const { return m_folder + "/cache"; }
    // File of the cookies that stay; empty if none do.
    std::string cookieFile() const { return m_isTemporary ? "" : m_folder + "/cookies.sqlite"; }

private:
    void openTemporary();
    void open(const std::string& folder);

    std::string m_folder;
    std::string m_failure;
    bool m_isTemporary;
    // Of the file that is locked as long as the profile is in use; -1 if there is none.
    int m_lock = -1;
};

} // namespace desktop

#endif

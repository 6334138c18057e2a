// The folder with the engine's cookies, cache and storage.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_PROFILE_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_PROFILE_H

#include <string>

namespace desktop {

// A temporary folder, removed with this object. The engine's own temporary session would do, but it prints no
// console messages.
class Profile {
public:
    Profile();
    ~Profile();
    Profile(const Profile&) = delete;
    Profile& operator=(const Profile&) = delete;

    // The reason why there is no folder; empty if there is one.
    const std::string& failure() const { return m_failure; }
    const std::string& folder() const { return m_folder; }

private:
    std::string m_folder;
    std::string m_failure;
};

} // namespace desktop

#endif

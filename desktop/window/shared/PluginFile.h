// The plug-in's file: whether it is one, and which MIME types it handles.
#ifndef TELIX_DESKTOP_WINDOW_SHARED_PLUGINFILE_H
#define TELIX_DESKTOP_WINDOW_SHARED_PLUGINFILE_H

#include <string>
#include <vector>

namespace desktop {

class PluginFile {
public:
    // Loads the plug-in `file`, which stays loaded until the process exits, and checks its entry points.
    explicit PluginFile(const std::string& file);

    // The reason why the plug-in cannot be used; empty if it can.
    const std::string& failure() const { return m_failure; }
    // Absolute file name.
    const std::string& path() const { return m_path; }
    // The MIME types of NP_GetMIMEDescription().
    const std::vector<std::string>& mimeTypes() const { return m_mimeTypes; }
    // A style sheet with declarations for the elements of these types. It is to keep transparent what engines
    // paint of windowless plug-ins or fallback content, which would hide the video plane, and to leave the
    // elements in the layout, because their position is the display area of the video.
    std::string styleSheet(const std::string& declarations) const;

private:
    void load();

    std::string m_path;
    std::string m_failure;
    std::vector<std::string> m_mimeTypes;
};

} // namespace desktop

#endif

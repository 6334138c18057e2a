// The browser engine of the window: its context, settings and what it adds to every page.
#ifndef TELIX_DESKTOP_WINDOW_WEBKIT_ENGINE_H
#define TELIX_DESKTOP_WINDOW_WEBKIT_ENGINE_H

#include <webkit2/webkit2.h>

#include <functional>
#include <string>
#include <utility>

#include "desktop/window/shared/TelevisionLibrary.h"

namespace desktop {

class PageChannel;
class PluginFile;
class Profile;
class WebProcessOutput;
struct CommandLine;
struct EngineInformation;

// The window's own page without anything.
constexpr char kEmptyPage[] = "about:blank";

// The engine's versions and user agent. Needs no display.
EngineInformation engineInformation();

class Engine {
public:
    // The references must outlive the object.
    Engine(const CommandLine& commandLine, const PluginFile& plugin, const Profile& profile,
           WebProcessOutput& output, PageChannel& channel);
    ~Engine();
    Engine(const Engine&) = delete;
    Engine& operator=(const Engine&) = delete;

    // The descriptor that web processes which are started from now on send sound to.
    void setSoundDescriptor(int descriptor) { m_soundDescriptor = descriptor; }
    // What the television starts with in each web process; asked before its start.
    void setTelevisionStart(std::function<TelevisionStart()> start) { m_start = std::move(start); }

    WebKitWebContext* context() const { return m_context; }
    // Returns a new view with a floating reference. `related`: a view whose web process the new one shares,
    // or null. One process for all applications of a window: the platform library is in it.
    WebKitWebView* newView(WebKitWebView* related) const;

    // Called when a page that lets the video plane be seen is visible, see scripts/transparentpage.js.
    void setOnTransparentPage(std::function<void()> onTransparentPage) {
        m_onTransparentPage = std::move(onTransparentPage);
    }
    // Uses OpenGL from now on, which a view without a GPU begins without: without it the engine leaves in the
    // window what a page has drawn where it becomes transparent. The engine starts to use OpenGL at any time,
    // but does not cease to.
    void useOpenGl(WebKitWebView* view) const;

private:
    void onInitializeExtensions(WebKitWebContext* context);
    void watchBackgrounds();

    const PluginFile& m_plugin;
    WebProcessOutput& m_output;
    PageChannel& m_channel;
    const bool m_isAutomated;
    const bool m_isStrict;
    std::function<TelevisionStart()> m_start;
    std::function<void()> m_onTransparentPage;
    int m_soundDescriptor = -1;
    WebKitWebContext* m_context;
    WebKitSettings* m_settings;
    WebKitUserContentManager* m_content;
};

} // namespace desktop

#endif

// The browser engine of the window: its context, settings and what it adds to every page.
#include "desktop/window/webkit/Engine.h"

#include "desktop/window/shared/CommandLine.h"
#include "desktop/window/shared/ElementId.h"
#include "desktop/window/shared/PageScript.h"
#include "desktop/window/shared/PluginFile.h"
#include "desktop/window/shared/ProgramFolder.h"
#include "desktop/window/webkit/GpuDevice.h"
#include "desktop/window/webkit/PageChannel.h"
#include "desktop/window/webkit/Profile.h"
#include "desktop/window/webkit/WebProcessOutput.h"

namespace desktop {

namespace {

// A television has no scroll bars.
constexpr char kWindowStyle[] = "::-webkit-scrollbar { display: none !important; }\n";

constexpr GdkRGBA kTransparent{0, 0, 0, 0};
// Looks the same. The engine begins with OpenGL when it draws a page again, as for another background.
constexpr GdkRGBA kTransparentWhite{1, 1, 1, 0};
// The script world of scripts/transparentpage.js.
constexpr char kBackgroundWorld[] = "telix-tv-background";

// Of an object of the plug-in: nothing of its content, and as background nothing but the video when the page
// paints it, see scripts/videoplacement.js.
constexpr char kObjectStyle[] =
    "content-visibility: hidden !important; color: transparent !important; "
    "background: var(--telix-video, none) !important; "
    "background-origin: border-box !important; background-clip: border-box !important;";

// Features of the engine that a hidden application cannot do with: its timers run as fast as those of a
// visible one, because it may show itself again.
const char* const kDisabledFeatures[] = {"HiddenPageDOMTimerThrottlingEnabled",
                                         "HiddenPageDOMTimerThrottlingAutoIncreases",
                                         "PageVisibilityBasedProcessSuppressionEnabled"};

void disableFeatures(WebKitSettings* settings) {
    g_autoptr(WebKitFeatureList) features = webkit_settings_get_all_features();
    for (gsize index = 0; index < webkit_feature_list_get_length(features); ++index) {
        WebKitFeature* feature = webkit_feature_list_get(features, index);
        for (const char* name : kDisabledFeatures) {
            if (g_strcmp0(webkit_feature_get_identifier(feature), name) == 0) {
                webkit_settings_set_feature_enabled(settings, feature, FALSE);
            }
        }
    }
}

WebKitSettings* newSettings(const CommandLine& commandLine) {
    const gboolean isInspected = commandLine.inspect || !commandLine.inspectorServer.empty();
    WebKitSettings* settings = WEBKIT_SETTINGS(g_object_new(
        WEBKIT_TYPE_SETTINGS, "user-agent", commandLine.userAgent.c_str(), "enable-developer-extras",
        isInspected,
        // Otherwise the engine would bring back pages whose plug-in objects have ended.
        "enable-page-cache", FALSE,
        // Applications may be files of an author's folder, with scripts and data beside them.
        "allow-file-access-from-file-urls", TRUE, "allow-universal-access-from-file-urls", TRUE,
        // Console messages, see WebProcessOutput.
        "enable-write-console-messages-to-stdout", TRUE,
        // A set shows what its platform library plays, and pages start sound without a click.
        "media-playback-requires-user-gesture", FALSE, "enable-smooth-scrolling", FALSE, nullptr));
    // In software, OpenGL takes several times as long as the engine without it, most of all for video in the
    // page. A WebDriver session waits for ever for a screenshot without OpenGL.
    if (!hasGpuDevice() && !commandLine.automation) {
        webkit_settings_set_hardware_acceleration_policy(settings, WEBKIT_HARDWARE_ACCELERATION_POLICY_NEVER);
    }
    disableFeatures(settings);
    return settings;
}

WebKitWebContext* newContext(const CommandLine& commandLine, const Profile& profile) {
    g_autoptr(WebKitWebsiteDataManager) data =
        webkit_website_data_manager_new("base-data-directory", profile.dataFolder().c_str(),
                                        "base-cache-directory", profile.cacheFolder().c_str(), nullptr);
    if (commandLine.ignoresCertificateErrors) {
        webkit_website_data_manager_set_tls_errors_policy(data, WEBKIT_TLS_ERRORS_POLICY_IGNORE);
    }
    // Without process swapping the platform library, which is in the web process, outlives a navigation.
    WebKitWebContext* context =
        WEBKIT_WEB_CONTEXT(g_object_new(WEBKIT_TYPE_WEB_CONTEXT, "website-data-manager", data,
                                        "process-swap-on-cross-site-navigation-enabled", FALSE, nullptr));
    if (const std::string cookies = profile.cookieFile(); !cookies.empty()) {
        webkit_cookie_manager_set_persistent_storage(webkit_web_context_get_cookie_manager(context),
                                                     cookies.c_str(),
                                                     WEBKIT_COOKIE_PERSISTENT_STORAGE_SQLITE);
    }
    webkit_web_context_set_automation_allowed(context, commandLine.automation);
    return context;
}

} // namespace

EngineInformation engineInformation() {
    const auto version = [](unsigned major, unsigned minor, unsigned micro) {
        return std::to_string(major) + '.' + std::to_string(minor) + '.' + std::to_string(micro);
    };
    return {"WebKitGTK " +
                version(webkit_get_major_version(), webkit_get_minor_version(), webkit_get_micro_version()) +
                ", GTK " + version(gtk_get_major_version(), gtk_get_minor_version(), gtk_get_micro_version()),
            [] {
                if (!gtk_init_check(nullptr, nullptr)) {
                    return std::string();
                }
                g_autoptr(WebKitSettings) settings = webkit_settings_new();
                return std::string(webkit_settings_get_user_agent(settings));
            },
            true};
}

Engine::Engine(const CommandLine& commandLine, const PluginFile& plugin, const Profile& profile,
               WebProcessOutput& output, PageChannel& channel)
    : m_plugin(plugin), m_output(output), m_channel(channel), m_isAutomated(commandLine.automation),
      m_isStrict(commandLine.isStrict), m_context(newContext(commandLine, profile)),
      m_settings(newSettings(commandLine)), m_content(webkit_user_content_manager_new()) {
    g_signal_connect(m_context, "initialize-web-extensions",
                     G_CALLBACK(+[](WebKitWebContext* context, gpointer engine) {
                         static_cast<Engine*>(engine)->onInitializeExtensions(context);
                     }),
                     this);
    const std::string style = kWindowStyle + plugin.styleSheet(kObjectStyle);
    WebKitUserStyleSheet* sheet = webkit_user_style_sheet_new(
        style.c_str(), WEBKIT_USER_CONTENT_INJECT_ALL_FRAMES, WEBKIT_USER_STYLE_LEVEL_USER, nullptr, nullptr);
    webkit_user_content_manager_add_style_sheet(m_content, sheet);
    webkit_user_style_sheet_unref(sheet);
    watchBackgrounds();
}

Engine::~Engine() {
    g_signal_handlers_disconnect_by_data(m_content, this);
    g_signal_handlers_disconnect_by_data(m_context, this);
    g_object_unref(m_content);
    g_object_unref(m_settings);
    g_object_unref(m_context);
}

WebKitWebView* Engine::newView(WebKitWebView* related) const {
    // A related view has the context of the other, and is controlled by its session.
    auto* view =
        WEBKIT_WEB_VIEW(related ? g_object_new(WEBKIT_TYPE_WEB_VIEW, "related-view", related, "settings",
                                               m_settings, "user-content-manager", m_content, nullptr)
                                : g_object_new(WEBKIT_TYPE_WEB_VIEW, "web-context", m_context, "settings",
                                               m_settings, "user-content-manager", m_content,
                                               "is-controlled-by-automation", m_isAutomated, nullptr));
    // Where a page has no background, the video plane shows through.
    webkit_web_view_set_background_color(view, &kTransparent);
    return view;
}

void Engine::watchBackgrounds() {
    const auto onMessage = +[](WebKitUserContentManager*, WebKitJavascriptResult*, gpointer engine) {
        if (const auto& onTransparentPage = static_cast<Engine*>(engine)->m_onTransparentPage) {
            onTransparentPage();
        }
    };
    g_signal_connect(m_content, "script-message-received::transparentPage", G_CALLBACK(onMessage), this);
    webkit_user_content_manager_register_script_message_handler_in_world(m_content, "transparentPage",
                                                                         kBackgroundWorld);
    WebKitUserScript* script = webkit_user_script_new_for_world(
        pageScriptCall("transparentpage", {kEmptyPage}).c_str(), WEBKIT_USER_CONTENT_INJECT_TOP_FRAME,
        WEBKIT_USER_SCRIPT_INJECT_AT_DOCUMENT_END, kBackgroundWorld, nullptr, nullptr);
    webkit_user_content_manager_add_script(m_content, script);
    webkit_user_script_unref(script);
}

void Engine::useOpenGl(WebKitWebView* view) const {
    webkit_settings_set_hardware_acceleration_policy(m_settings, WEBKIT_HARDWARE_ACCELERATION_POLICY_ALWAYS);
    webkit_web_view_set_background_color(view, &kTransparentWhite);
}

// Emitted after each start of a web process, which waits for the data.
void Engine::onInitializeExtensions(WebKitWebContext* context) {
    webkit_web_context_set_web_extensions_directory(context, besideProgram("extensions").c_str());
    GVariantDict data;
    g_variant_dict_init(&data, nullptr);
    g_variant_dict_insert(&data, "plugin", "s", m_plugin.path().c_str());
    g_variant_dict_insert(&data, "output", "i", m_output.startProcess());
    g_variant_dict_insert(&data, "errors", "i", m_output.errorDescriptor());
    g_variant_dict_insert(&data, "channel", "i", m_channel.useProcess());
    g_variant_dict_insert(&data, "automation", "b", m_isAutomated);
    g_variant_dict_insert(&data, "sound", "i", m_soundDescriptor);
    if (!m_isStrict) {
        g_variant_dict_insert(&data, "ids", "s", kElementIdPrefix);
    }
    const TelevisionStart start = m_start ? m_start() : TelevisionStart();
    g_variant_dict_insert(&data, "tune", "u", start.channel);
    g_variant_dict_insert(&data, "signal", "s", start.signalUrl.c_str());
    g_variant_dict_insert(&data, "signal-channel", "u", start.signalChannel);
    g_variant_dict_insert(&data, "volume", "u", start.volume);
    webkit_web_context_set_web_extensions_initialization_user_data(context, g_variant_dict_end(&data));
}

} // namespace desktop

// Shows a page in WebKitGTK with the bridge, for the tests: the same options and output as telix-tv as far as
// pages are concerned, so that one list of pages runs on both engines.
//
// webkit_page_runner --extensions DIR [--plugin FILE] [--engine gobject] [--wait-for EXPR] [--eval EXPR]
//                    [--screenshot FILE] [--timeout SECONDS] [--size WxH] [--user-agent TEXT] [--cors] PAGE
//
// Waits until --wait-for is true, prints the value of --eval as JSON in the last line of standard output,
// writes the screenshot, and ends with 0; with 1 when what was waited for never came, --eval threw or the web
// process ended; with 2 for a bad option or a page that cannot be loaded.
#include <unistd.h>

#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <string>

#include <glib-unix.h>
#include <gtk/gtk.h>
#include <webkit2/webkit2.h>

namespace {

constexpr int kSuccess = 0;
constexpr int kNeverCame = 1;
constexpr int kUnusable = 2;
constexpr int kSignalled = 128;
constexpr guint kPollInterval = 20; // milliseconds
constexpr guint kLastTurns = 10;

// As in the television's window: what lies beneath the page shows through, and pages have no say in that.
constexpr char kStyle[] = "object, embed { opacity: 0 !important; } html { background: transparent; }";

// What the television's window adds to the window of each page; an application that can be read opens.
constexpr char kPageFunctions[] =
    "window.createHbbTVApplication = function (uri) {"
    "    var request = new XMLHttpRequest();"
    "    try { request.open('GET', uri, false); request.send(); } catch (error) { return false; }"
    "    return request.status === 200 || (request.status === 0 && request.responseText !== '');"
    "};"
    "window.destroyHbbTVApplication = window.showHbbTVApplication = window.hideHbbTVApplication = function "
    "() {};";

// The engine's own log of the console may be the system's journal.
constexpr char kConsole[] = "console";
constexpr char kConsoleFunctions[] = "(function () {"
                                     "    var log = console.log, page = webkit.messageHandlers.console;"
                                     "    console.log = function () {"
                                     "        log.apply(console, arguments);"
                                     "        page.postMessage(Array.prototype.join.call(arguments, ' '));"
                                     "    };"
                                     "}());";

struct Options {
    char* extensions = nullptr;
    char* plugin = nullptr;
    char* engine = nullptr;
    char* waitFor = nullptr;
    char* eval = nullptr;
    char* screenshot = nullptr;
    char* size = nullptr;
    char* userAgent = nullptr;
    double timeout = 30;
    gboolean fullscreen = false;
    gboolean cors = false;
    char** pages = nullptr;
};

struct Run {
    Options options;
    GtkWidget* window = nullptr;
    WebKitWebView* view = nullptr;
    std::string value;
    int status = kSuccess;
    bool isEnding = false;
};

// Without steps the page is shown until a signal ends the program.
bool hasSteps(const Options& options) {
    return options.waitFor || options.eval || options.screenshot;
}

void complain(const std::string& text) {
    std::fprintf(stderr, "webkit_page_runner: %s\n", text.c_str());
}

void end(Run& run, int status) {
    if (!run.isEnding) {
        run.isEnding = true;
        run.status = status;
        // The page ends before the program, as in a browser whose window is closed.
        webkit_web_view_load_uri(run.view, "about:blank");
    }
}

// Plug-ins end some of their objects on later turns of the web process's main loop; each answer is one.
void onTurn(GObject* view, GAsyncResult* result, gpointer turnsLeft) {
    GError* error = nullptr;
    JSCValue* const value = webkit_web_view_evaluate_javascript_finish(WEBKIT_WEB_VIEW(view), result, &error);
    g_clear_object(const_cast<JSCValue**>(&value));
    const guint left = GPOINTER_TO_UINT(turnsLeft);
    if (error || left == 0) {
        g_clear_error(&error);
        gtk_main_quit();
        return;
    }
    webkit_web_view_evaluate_javascript(WEBKIT_WEB_VIEW(view), "0", -1, nullptr, nullptr, nullptr, onTurn,
                                        GUINT_TO_POINTER(left - 1));
}

void onSnapshot(GObject* view, GAsyncResult* result, gpointer data) {
    auto& run = *static_cast<Run*>(data);
    cairo_surface_t* const surface =
        webkit_web_view_get_snapshot_finish(WEBKIT_WEB_VIEW(view), result, nullptr);
    const bool isWritten =
        surface && cairo_surface_write_to_png(surface, run.options.screenshot) == CAIRO_STATUS_SUCCESS;
    if (surface) {
        cairo_surface_destroy(surface);
    }
    if (!isWritten) {
        complain(std::string(run.options.screenshot) + ": cannot be written");
    }
    end(run, isWritten ? run.status : kUnusable);
}

void finish(Run& run, int status) {
    if (!run.options.screenshot) {
        end(run, status);
        return;
    }
    run.status = status;
    webkit_web_view_get_snapshot(run.view, WEBKIT_SNAPSHOT_REGION_VISIBLE, WEBKIT_SNAPSHOT_OPTIONS_NONE,
                                 nullptr, onSnapshot, &run);
}

void evaluate(Run& run, const char* expression, GAsyncReadyCallback callback) {
    const std::string script = std::string("(") + expression + "\n)";
    webkit_web_view_evaluate_javascript(run.view, script.c_str(), -1, nullptr, nullptr, nullptr, callback,
                                        &run);
}

JSCValue* valueOf(GObject* view, GAsyncResult* result, std::string& error) {
    GError* failure = nullptr;
    JSCValue* const value =
        webkit_web_view_evaluate_javascript_finish(WEBKIT_WEB_VIEW(view), result, &failure);
    if (failure) {
        error = failure->message;
        g_error_free(failure);
    }
    return value;
}

void onEvaluated(GObject* view, GAsyncResult* result, gpointer data) {
    auto& run = *static_cast<Run*>(data);
    std::string error;
    JSCValue* const value = valueOf(view, result, error);
    if (!value) {
        complain("--eval: " + error);
        finish(run, kNeverCame);
        return;
    }
    char* const json = jsc_value_to_json(value, 0);
    run.value = json ? json : "null";
    g_free(json);
    g_object_unref(value);
    finish(run, kSuccess);
}

void evaluateLast(Run& run) {
    if (run.options.eval) {
        evaluate(run, run.options.eval, onEvaluated);
    } else if (hasSteps(run.options)) {
        finish(run, kSuccess);
    }
}

gboolean poll(gpointer data);

void onPolled(GObject* view, GAsyncResult* result, gpointer data) {
    auto& run = *static_cast<Run*>(data);
    std::string error;
    JSCValue* const value = valueOf(view, result, error);
    const bool isTrue = value && jsc_value_to_boolean(value);
    g_clear_object(const_cast<JSCValue**>(&value));
    if (isTrue) {
        evaluateLast(run);
    } else {
        g_timeout_add(kPollInterval, poll, &run);
    }
}

gboolean poll(gpointer data) {
    auto& run = *static_cast<Run*>(data);
    if (!run.isEnding) {
        evaluate(run, run.options.waitFor, onPolled);
    }
    return G_SOURCE_REMOVE;
}

void onLoadChanged(WebKitWebView*, WebKitLoadEvent event, Run* run) {
    static bool isStarted = false;
    if (event == WEBKIT_LOAD_FINISHED && run->isEnding) {
        webkit_web_view_evaluate_javascript(run->view, "0", -1, nullptr, nullptr, nullptr, onTurn,
                                            GUINT_TO_POINTER(kLastTurns));
    } else if (event == WEBKIT_LOAD_FINISHED && !isStarted) {
        isStarted = true;
        if (run->options.waitFor) {
            poll(run);
        } else {
            evaluateLast(*run);
        }
    }
}

gboolean onLoadFailed(WebKitWebView*, WebKitLoadEvent, char* uri, GError* error, Run* run) {
    if (!g_error_matches(error, WEBKIT_NETWORK_ERROR, WEBKIT_NETWORK_ERROR_CANCELLED)) {
        complain(std::string(uri) + ": " + error->message);
        run->status = kUnusable;
        run->isEnding = true;
        gtk_main_quit();
    }
    return TRUE;
}

void onTerminated(WebKitWebView*, WebKitWebProcessTerminationReason reason, Run* run) {
    if (!run->isEnding) {
        complain(reason == WEBKIT_WEB_PROCESS_CRASHED ? "the web process has crashed"
                                                      : "the web process has ended");
        end(*run, kNeverCame);
    }
}

void onConsoleMessage(WebKitUserContentManager*, WebKitJavascriptResult* message, gpointer) {
    char* const text = jsc_value_to_string(webkit_javascript_result_get_js_value(message));
    std::fprintf(stderr, "%s\n", text);
    g_free(text);
}

gboolean onTimeout(gpointer data) {
    auto& run = *static_cast<Run*>(data);
    complain("given up after the timeout");
    finish(run, kNeverCame);
    return G_SOURCE_REMOVE;
}

gboolean onTerminationSignal(gpointer run) {
    end(*static_cast<Run*>(run), kSignalled + SIGTERM);
    return G_SOURCE_CONTINUE;
}

void onInitializeExtensions(WebKitWebContext* context, Run* run) {
    webkit_web_context_set_web_extensions_directory(context, run->options.extensions);
    GVariantDict data;
    g_variant_dict_init(&data, nullptr);
    if (run->options.plugin) {
        g_variant_dict_insert(&data, "plugin", "s", run->options.plugin);
    }
    if (run->options.engine) {
        g_variant_dict_insert(&data, "engine", "s", run->options.engine);
    }
    webkit_web_context_set_web_extensions_initialization_user_data(context, g_variant_dict_end(&data));
}

WebKitSettings* makeSettings(const Options& options) {
    WebKitSettings* const settings = webkit_settings_new();
    webkit_settings_set_hardware_acceleration_policy(settings, WEBKIT_HARDWARE_ACCELERATION_POLICY_NEVER);
    webkit_settings_set_allow_file_access_from_file_urls(settings, TRUE);
    webkit_settings_set_allow_universal_access_from_file_urls(settings, TRUE);
    webkit_settings_set_enable_page_cache(settings, FALSE);
    if (options.userAgent) {
        webkit_settings_set_user_agent(settings, options.userAgent);
    }
    return settings;
}

void addScript(WebKitUserContentManager* content, const char* source) {
    WebKitUserScript* const script =
        webkit_user_script_new(source, WEBKIT_USER_CONTENT_INJECT_ALL_FRAMES,
                               WEBKIT_USER_SCRIPT_INJECT_AT_DOCUMENT_START, nullptr, nullptr);
    webkit_user_content_manager_add_script(content, script);
    webkit_user_script_unref(script);
}

WebKitUserContentManager* makeContentManager() {
    WebKitUserContentManager* const content = webkit_user_content_manager_new();
    WebKitUserStyleSheet* const style = webkit_user_style_sheet_new(
        kStyle, WEBKIT_USER_CONTENT_INJECT_ALL_FRAMES, WEBKIT_USER_STYLE_LEVEL_USER, nullptr, nullptr);
    webkit_user_content_manager_add_style_sheet(content, style);
    webkit_user_style_sheet_unref(style);
    addScript(content, kPageFunctions);
    g_signal_connect(content, "script-message-received::console", G_CALLBACK(onConsoleMessage), nullptr);
    webkit_user_content_manager_register_script_message_handler(content, kConsole);
    addScript(content, kConsoleFunctions);
    return content;
}

void makeView(Run& run) {
    static const gchar* const everywhere[] = {"*://*/*", nullptr};
    WebKitWebContext* const context = webkit_web_context_new_ephemeral();
    g_signal_connect(context, "initialize-web-extensions", G_CALLBACK(onInitializeExtensions), &run);
    run.view = WEBKIT_WEB_VIEW(g_object_new(WEBKIT_TYPE_WEB_VIEW, "web-context", context, "settings",
                                            makeSettings(run.options), "user-content-manager",
                                            makeContentManager(), nullptr));
    if (run.options.cors) {
        webkit_web_view_set_cors_allowlist(run.view, everywhere);
    }
    g_signal_connect(run.view, "load-changed", G_CALLBACK(onLoadChanged), &run);
    g_signal_connect(run.view, "load-failed", G_CALLBACK(onLoadFailed), &run);
    g_signal_connect(run.view, "web-process-terminated", G_CALLBACK(onTerminated), &run);
    int width = 1280;
    int height = 720;
    if (run.options.size) {
        std::sscanf(run.options.size, "%dx%d", &width, &height);
    }
    run.window = gtk_window_new(GTK_WINDOW_TOPLEVEL);
    gtk_window_set_default_size(GTK_WINDOW(run.window), width, height);
    gtk_container_add(GTK_CONTAINER(run.window), GTK_WIDGET(run.view));
    if (run.options.fullscreen) {
        gtk_window_fullscreen(GTK_WINDOW(run.window));
    }
    gtk_widget_show_all(run.window);
}

bool readOptions(int* argc, char*** argv, Options& options) {
    const GOptionEntry entries[] = {
        {"extensions", 0, 0, G_OPTION_ARG_FILENAME, &options.extensions, "Folder of the bridge", "DIR"},
        {"plugin", 0, 0, G_OPTION_ARG_FILENAME, &options.plugin, "The plug-in", "FILE"},
        {"engine", 0, 0, G_OPTION_ARG_STRING, &options.engine, "The bridge's script engine", "gobject"},
        {"wait-for", 0, 0, G_OPTION_ARG_STRING, &options.waitFor, "Wait until it is true", "EXPR"},
        {"eval", 0, 0, G_OPTION_ARG_STRING, &options.eval, "Print its value as JSON", "EXPR"},
        {"screenshot", 0, 0, G_OPTION_ARG_FILENAME, &options.screenshot, "Write a picture", "FILE"},
        {"timeout", 0, 0, G_OPTION_ARG_DOUBLE, &options.timeout, "Give up (30)", "SECONDS"},
        {"size", 0, 0, G_OPTION_ARG_STRING, &options.size, "Size of the page (1280x720)", "WxH"},
        {"fullscreen", 0, 0, G_OPTION_ARG_NONE, &options.fullscreen, "Fill the screen", nullptr},
        {"user-agent", 0, 0, G_OPTION_ARG_STRING, &options.userAgent, "What servers are told", "TEXT"},
        {"cors", 0, 0, G_OPTION_ARG_NONE, &options.cors, "Let pages read other origins", nullptr},
        {G_OPTION_REMAINING, 0, 0, G_OPTION_ARG_FILENAME_ARRAY, &options.pages, nullptr, "PAGE"},
        {nullptr, 0, 0, G_OPTION_ARG_NONE, nullptr, nullptr, nullptr}};
    GError* error = nullptr;
    if (!gtk_init_with_args(argc, argv, "PAGE", entries, nullptr, &error)) {
        complain(error ? error->message : "no display");
        return false;
    }
    if (!options.extensions || !options.pages || options.pages[1]) {
        complain("--extensions and one page are needed");
        return false;
    }
    return true;
}

std::string urlOf(const char* page) {
    if (g_uri_peek_scheme(page)) {
        return page;
    }
    GFile* const file = g_file_new_for_commandline_arg(page);
    char* const uri = g_file_get_uri(file);
    const std::string url = uri;
    g_free(uri);
    g_object_unref(file);
    return url;
}

} // namespace

int main(int argc, char** argv) {
    Run run;
    if (!readOptions(&argc, &argv, run.options)) {
        return kUnusable;
    }
    makeView(run);
    webkit_web_view_load_uri(run.view, urlOf(run.options.pages[0]).c_str());
    g_unix_signal_add(SIGTERM, onTerminationSignal, &run);
    if (hasSteps(run.options) && run.options.timeout > 0) {
        g_timeout_add(static_cast<guint>(run.options.timeout * 1000), onTimeout, &run);
    }
    gtk_main();
    // What the plug-in prints comes before the value.
    g_signal_handlers_disconnect_by_data(run.view, &run);
    webkit_web_view_terminate_web_process(run.view);
    if (!run.value.empty()) {
        std::printf("%s\n", run.value.c_str());
        std::fflush(stdout);
    }
    _exit(run.status); // nothing of the page is of interest any more
}

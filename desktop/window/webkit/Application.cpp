// One application of the WebKit window: the view of its page, its state, its keys and its scripts.
#include "desktop/window/webkit/Application.h"

#include <memory>
#include <utility>

#include "desktop/window/shared/Diagnostics.h"
#include "desktop/window/shared/DocumentTypes.h"
#include "desktop/window/shared/PageScript.h"
#include "desktop/window/webkit/Engine.h"
#include "desktop/window/webkit/Messages.h"
#include "desktop/window/webkit/ScaledBin.h"

namespace desktop {

namespace {

// A plug-in ends some of its objects on later turns of the web process's main loop.
constexpr int kTurnsOfTeardown = 10;
// After that the web process is taken as one that hangs.
constexpr guint kUnloadTimeoutMs = 5000;
// A navigation that a key starts begins on a later turn of the page's event loop.
constexpr char kNextTurn[] = "await new Promise(function (done) { setTimeout(done, 0); });";

using Finish = JSCValue* (*)(WebKitWebView*, GAsyncResult*, GError**);
// The value is null if there is an error.
using OnValue = std::function<void(JSCValue*, const GError*)>;

// Takes the result of a call with the function `finish`. `data` is an OnValue that this call owns.
void onResult(Finish finish, GObject* view, GAsyncResult* result, gpointer data) {
    const std::unique_ptr<OnValue> onValue(static_cast<OnValue*>(data));
    g_autoptr(GError) error = nullptr;
    g_autoptr(JSCValue) value = finish(WEBKIT_WEB_VIEW(view), result, &error);
    // Cancelled by the destructor.
    if (!g_error_matches(error, G_IO_ERROR, G_IO_ERROR_CANCELLED)) {
        (*onValue)(value, error);
    }
}

void evaluateScript(WebKitWebView* view, GCancellable* calls, const std::string& script, OnValue onValue) {
    webkit_web_view_evaluate_javascript(
        view, script.c_str(), static_cast<gssize>(script.size()), nullptr, nullptr, calls,
        [](GObject* object, GAsyncResult* result, gpointer data) {
            onResult(webkit_web_view_evaluate_javascript_finish, object, result, data);
        },
        new OnValue(std::move(onValue)));
}

// `script` is the body of an asynchronous function.
void runScript(WebKitWebView* view, GCancellable* calls, const char* script, OnValue onValue) {
    webkit_web_view_call_async_javascript_function(
        view, script, -1, nullptr, nullptr, nullptr, calls,
        [](GObject* object, GAsyncResult* result, gpointer data) {
            onResult(webkit_web_view_call_async_javascript_function_finish, object, result, data);
        },
        new OnValue(std::move(onValue)));
}

std::string stringProperty(JSCValue* object, const char* name) {
    g_autoptr(JSCValue) value = jsc_value_object_get_property(object, name);
    g_autofree char* text = jsc_value_to_string(value);
    return text ? text : "";
}

// The result of scripts/evaluate.js.
ScriptedWindow::Evaluation evaluationOf(JSCValue* value, const GError* error) {
    ScriptedWindow::Evaluation evaluation;
    if (!value || !jsc_value_is_object(value)) {
        evaluation.error = error ? error->message : "no value";
    } else if (jsc_value_object_has_property(value, "error")) {
        evaluation.error = stringProperty(value, "error");
    } else {
        g_autoptr(JSCValue) truth = jsc_value_object_get_property(value, "truth");
        evaluation.truth = jsc_value_to_boolean(truth);
        evaluation.json = stringProperty(value, "json");
    }
    return evaluation;
}

// Takes a response with a document of a television, whose content type the engine does not know, as a
// document of XML, to which scripts/hbbtvdocument.js adds what XHTML has. Returns whether it is one.
bool useTelevisionDocument(WebKitPolicyDecision& decision) {
    WebKitURIResponse* response =
        webkit_response_policy_decision_get_response(WEBKIT_RESPONSE_POLICY_DECISION(&decision));
    const char* type = webkit_uri_response_get_mime_type(response);
    if (!type || !isTelevisionType(type)) {
        return false;
    }
    webkit_policy_decision_use(&decision);
    return true;
}

GdkDevice* keyboard() {
    return gdk_seat_get_keyboard(gdk_display_get_default_seat(gdk_display_get_default()));
}

} // namespace

Application::Application(const Engine& engine, const Application* related, Listener& listener)
    : m_listener(listener), m_bin(newScaledBin()),
      m_view(engine.newView(related ? related->m_view : nullptr)), m_calls(g_cancellable_new()) {
    g_object_ref_sink(m_bin);
    gtk_container_add(GTK_CONTAINER(m_bin), GTK_WIDGET(m_view));
    gtk_widget_show(GTK_WIDGET(m_view));
    connectSignals();
}

Application::~Application() {
    if (m_unloadTimeout) {
        g_source_remove(m_unloadTimeout);
    }
    g_cancellable_cancel(m_calls);
    g_object_unref(m_calls);
    for (const auto& onGone : m_onGone) {
        onGone();
    }
    g_signal_handlers_disconnect_by_data(m_view, this);
    gtk_widget_destroy(m_bin);
    g_object_unref(m_bin);
}

void Application::connectSignals() {
    g_signal_connect(m_view, "load-changed",
                     G_CALLBACK(+[](WebKitWebView*, WebKitLoadEvent event, gpointer application) {
                         static_cast<Application*>(application)->onLoadChanged(event);
                     }),
                     this);
    g_signal_connect(m_view, "load-failed",
                     G_CALLBACK(+[](WebKitWebView*, WebKitLoadEvent, char* url, GError* error,
                                    gpointer application) -> gboolean {
                         return static_cast<Application*>(application)->onLoadFailed(url, *error);
                     }),
                     this);
    g_signal_connect(
        m_view, "script-dialog",
        G_CALLBACK(+[](WebKitWebView*, WebKitScriptDialog* dialog, gpointer application) -> gboolean {
            return static_cast<Application*>(application)->onScriptDialog(*dialog);
        }),
        this);
    g_signal_connect(
        m_view, "web-process-terminated",
        G_CALLBACK(+[](WebKitWebView*, WebKitWebProcessTerminationReason reason, gpointer application) {
            auto* self = static_cast<Application*>(application);
            self->m_isLoaded = false;
            self->m_listener.onCrashed(*self, reason);
        }),
        this);
    // The session closes the window of an application. Otherwise nothing but its page ends an application.
    if (isAutomated()) {
        g_signal_connect(m_view, "close", G_CALLBACK(+[](WebKitWebView*, gpointer application) {
                             auto* self = static_cast<Application*>(application);
                             self->m_listener.onClosed(*self);
                         }),
                         this);
    }
    g_signal_connect(m_view, "decide-policy",
                     G_CALLBACK(+[](WebKitWebView*, WebKitPolicyDecision* decision,
                                    WebKitPolicyDecisionType type) -> gboolean {
                         return type == WEBKIT_POLICY_DECISION_TYPE_RESPONSE &&
                                useTelevisionDocument(*decision);
                     }),
                     nullptr);
    // A television has no menus.
    g_signal_connect(
        m_view, "context-menu",
        G_CALLBACK(+[](WebKitWebView* view, WebKitContextMenu*, GdkEvent*, WebKitHitTestResult*) -> gboolean {
            return !webkit_settings_get_enable_developer_extras(webkit_web_view_get_settings(view));
        }),
        this);
}

void Application::onLoadChanged(WebKitLoadEvent event) {
    switch (event) {
    case WEBKIT_LOAD_STARTED:
        m_isLoaded = false;
        break;
    case WEBKIT_LOAD_COMMITTED:
        m_hasDocument = true;
        m_listener.onCommitted(*this);
        break;
    case WEBKIT_LOAD_FINISHED:
        m_isLoaded = m_hasDocument;
        if (!m_onUnloaded.empty() && g_strcmp0(webkit_web_view_get_uri(m_view), kEmptyPage) == 0) {
            passTurns(kTurnsOfTeardown, [this] { onUnloaded(); });
        }
        break;
    case WEBKIT_LOAD_REDIRECTED:
        break;
    }
}

// Returns true: the engine shows no page of its own.
bool Application::onLoadFailed(const char* url, const GError& error) {
    // Another load has taken its place.
    if (!g_error_matches(&error, WEBKIT_NETWORK_ERROR, WEBKIT_NETWORK_ERROR_CANCELLED)) {
        m_listener.onLoadFailed(*this, url, error.message);
    }
    return true;
}

// A television has no dialogs: alert(), confirm() and prompt() print their message, and the last two return
// as if cancelled.
bool Application::onScriptDialog(WebKitScriptDialog& dialog) {
    const std::string message = webkit_script_dialog_get_message(&dialog);
    switch (webkit_script_dialog_get_dialog_type(&dialog)) {
    case WEBKIT_SCRIPT_DIALOG_ALERT:
        printError("alert: " + message);
        break;
    case WEBKIT_SCRIPT_DIALOG_CONFIRM:
        webkit_script_dialog_confirm_set_confirmed(&dialog, FALSE);
        printError("confirm, answered with cancel: " + message);
        break;
    case WEBKIT_SCRIPT_DIALOG_PROMPT:
        printError("prompt, answered with cancel: " + message);
        break;
    case WEBKIT_SCRIPT_DIALOG_BEFORE_UNLOAD_CONFIRM:
        webkit_script_dialog_confirm_set_confirmed(&dialog, TRUE);
        break;
    }
    return true;
}

void Application::setOnTop(bool isOnTop) {
    m_isOnTop = isOnTop;
    updateVisibility();
}

void Application::setShown(bool isShown) {
    m_isShown = isShown;
    updateVisibility();
}

void Application::updateVisibility() {
    gtk_widget_set_visible(m_bin, isVisible());
    if (isVisible()) {
        gtk_widget_grab_focus(GTK_WIDGET(m_view));
    }
}

void Application::sendPress(const RemoteKey& key, bool isRepeat) {
    if (key.hasEngineCode) {
        sendKeyEvent(GDK_KEY_PRESS, key);
    } else {
        dispatchKeyEvent("keydown", key, isRepeat);
    }
}

void Application::sendRelease(const RemoteKey& key) {
    if (key.hasEngineCode) {
        sendKeyEvent(GDK_KEY_RELEASE, key);
    } else {
        dispatchKeyEvent("keyup", key, false);
    }
}

void Application::dispatchKeyEvent(const char* type, const RemoteKey& key, bool isRepeat) {
    evaluateScript(m_view, m_calls, dispatchKeyScript(type, key, isRepeat), [](JSCValue*, const GError*) {});
}

// A repeated press is one that no release precedes.
void Application::sendKeyEvent(GdkEventType type, const RemoteKey& key) {
    GdkWindow* window = gtk_widget_get_window(GTK_WIDGET(m_view));
    if (!window) {
        return;
    }
    GdkEvent* event = gdk_event_new(type);
    event->key.window = GDK_WINDOW(g_object_ref(window));
    event->key.send_event = TRUE;
    event->key.time = GDK_CURRENT_TIME;
    event->key.keyval = key.keyboardKeys.front();
    GdkKeymapKey* codes = nullptr;
    int count = 0;
    GdkKeymap* keymap = gdk_keymap_get_for_display(gdk_display_get_default());
    if (gdk_keymap_get_entries_for_keyval(keymap, event->key.keyval, &codes, &count) && count > 0) {
        event->key.hardware_keycode = static_cast<guint16>(codes[0].keycode);
    }
    g_free(codes);
    gdk_event_set_device(event, keyboard());
    gtk_widget_event(GTK_WIDGET(m_view), event);
    gdk_event_free(event);
}

void Application::askPage(const char* name, GVariant* parameters, std::function<void(GVariant*)> done) {
    using Done = std::function<void(GVariant*)>;
    webkit_web_view_send_message_to_page(
        m_view, webkit_user_message_new(name, parameters), m_calls,
        [](GObject* view, GAsyncResult* result, gpointer data) {
            const std::unique_ptr<Done> done(static_cast<Done*>(data));
            g_autoptr(GError) error = nullptr;
            WebKitUserMessage* reply =
                webkit_web_view_send_message_to_page_finish(WEBKIT_WEB_VIEW(view), result, &error);
            if (!g_error_matches(error, G_IO_ERROR, G_IO_ERROR_CANCELLED)) {
                (*done)(reply ? webkit_user_message_get_parameters(reply) : nullptr);
            }
            g_clear_object(&reply);
        },
        new Done(std::move(done)));
}

void Application::readKeySet(std::function<void(Application*, uint32_t)> done) {
    const auto call = m_onGone.insert(m_onGone.end(), [done] { done(nullptr, 0); });
    askPage(kKeySetMessage, nullptr, [this, call, done = std::move(done)](GVariant* keySet) {
        m_onGone.erase(call);
        done(this, keySet ? g_variant_get_uint32(keySet) : kAllPageKeys);
    });
}

void Application::tune(uint32_t number, const Television::OnChannel& done) {
    changeChannel(kTuneMessage, g_variant_new_uint32(number), done);
}

void Application::stepChannel(int positions, const Television::OnChannel& done) {
    changeChannel(kStepMessage, g_variant_new_int32(positions), done);
}

void Application::changeChannel(const char* message, GVariant* parameters,
                                const Television::OnChannel& done) {
    askPage(message, parameters, [done](GVariant* channel) {
        if (channel) {
            guint32 number = 0;
            const char* name = nullptr;
            g_variant_get(channel, "(u&s)", &number, &name);
            done(number, name);
        }
    });
}

void Application::setVolume(uint32_t volume) {
    webkit_web_view_send_message_to_page(
        m_view, webkit_user_message_new(kVolumeMessage, g_variant_new_uint32(volume)), nullptr, nullptr,
        nullptr);
}

// The engine sends a key to the page when the page has handled the one before. The first turn comes after the
// press and the second after the release; the last exchange comes after the start of a navigation.
void Application::waitForKeys(std::function<void()> done) {
    const auto call = m_onGone.insert(m_onGone.end(), done);
    const auto onHandled = [this, call, done = std::move(done)] {
        m_onGone.erase(call);
        done();
    };
    runScript(m_view, m_calls, kNextTurn, [this, onHandled](JSCValue*, const GError*) {
        runScript(m_view, m_calls, kNextTurn,
                  [this, onHandled](JSCValue*, const GError*) { passTurns(1, onHandled); });
    });
}

void Application::passTurns(int count, std::function<void()> done) {
    if (count == 0) {
        done();
        return;
    }
    evaluateScript(m_view, m_calls, "0", [this, count, done = std::move(done)](JSCValue*, const GError*) {
        passTurns(count - 1, done);
    });
}

void Application::evaluate(const std::string& expression,
                           std::function<void(ScriptedWindow::Evaluation)> done) {
    const auto call = m_onGone.insert(m_onGone.end(), [done] {
        ScriptedWindow::Evaluation evaluation;
        evaluation.error = "the application has ended";
        done(evaluation);
    });
    evaluateScript(m_view, m_calls, pageScriptCall("evaluate", {expression}),
                   [this, call, done = std::move(done)](JSCValue* value, const GError* error) {
                       m_onGone.erase(call);
                       done(evaluationOf(value, error));
                   });
}

// The page may have been told of a picture that has not been painted yet.
void Application::takeSnapshot(std::function<void(cairo_surface_t*)> done) {
    askPage(kNewestFrameMessage, nullptr,
            [this, done = std::move(done)](GVariant*) { takePageSnapshot(done); });
}

void Application::takePageSnapshot(std::function<void(cairo_surface_t*)> done) {
    using Done = std::function<void(cairo_surface_t*)>;
    webkit_web_view_get_snapshot(
        m_view, WEBKIT_SNAPSHOT_REGION_VISIBLE, WEBKIT_SNAPSHOT_OPTIONS_TRANSPARENT_BACKGROUND, m_calls,
        [](GObject* view, GAsyncResult* result, gpointer data) {
            const std::unique_ptr<Done> done(static_cast<Done*>(data));
            g_autoptr(GError) error = nullptr;
            cairo_surface_t* image =
                webkit_web_view_get_snapshot_finish(WEBKIT_WEB_VIEW(view), result, &error);
            if (!g_error_matches(error, G_IO_ERROR, G_IO_ERROR_CANCELLED)) {
                (*done)(image);
            } else if (image) {
                cairo_surface_destroy(image);
            }
        },
        new Done(std::move(done)));
}

void Application::showNotice(const std::string& html) {
    g_autofree char* url = g_strdup(webkit_web_view_get_uri(m_view));
    webkit_web_view_load_alternate_html(m_view, html.c_str(), url ? url : kEmptyPage, nullptr);
}

void Application::reload() {
    m_isLoaded = false; // before the engine says so
    webkit_web_view_reload(m_view);
}

void Application::unload(std::function<void()> done) {
    if (m_isUnloaded) {
        done();
        return;
    }
    m_onUnloaded.push_back(std::move(done));
    if (m_onUnloaded.size() > 1) {
        return;
    }
    m_unloadTimeout = g_timeout_add(
        kUnloadTimeoutMs,
        [](gpointer application) -> gboolean {
            auto* self = static_cast<Application*>(application);
            self->m_unloadTimeout = 0;
            self->onUnloaded();
            return G_SOURCE_REMOVE;
        },
        this);
    load(kEmptyPage);
}

// The calls may destroy the application.
void Application::onUnloaded() {
    m_isUnloaded = true;
    if (m_unloadTimeout) {
        g_source_remove(std::exchange(m_unloadTimeout, 0));
    }
    const auto calls = std::exchange(m_onUnloaded, {});
    for (const auto& call : calls) {
        call();
    }
}

} // namespace desktop

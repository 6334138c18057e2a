// The WebKit window: the video plane and, above it, a stack of applications.
#include "desktop/window/webkit/TvWindow.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <utility>

#include "desktop/window/shared/CommandLine.h"
#include "desktop/window/shared/Diagnostics.h"
#include "desktop/window/shared/MainLoopTimer.h"
#include "desktop/window/shared/Notice.h"
#include "desktop/window/shared/PageGeometry.h"
#include "desktop/window/webkit/Engine.h"
#include "desktop/window/webkit/MainLoop.h"
#include "desktop/window/webkit/Messages.h"
#include "desktop/window/webkit/SignallingMessage.h"

namespace desktop {

namespace {

constexpr char kTitle[] = "telix-tv";
constexpr int kOkKeyCode = 13;
// How long a WebDriver session waits for the end of a page; longer than the time limit of
// Application::unload().
constexpr unsigned kCloseTimeoutMs = 10000;
// The one that is on at first.
constexpr uint32_t kFirstChannel = 1;

GtkWidget* newBlackArea() {
    GtkWidget* area = gtk_drawing_area_new();
    g_signal_connect(area, "draw", G_CALLBACK(+[](GtkWidget*, cairo_t* context, gpointer) -> gboolean {
                         cairo_set_source_rgb(context, 0, 0, 0);
                         cairo_paint(context);
                         return TRUE;
                     }),
                     nullptr);
    return area;
}

// Returns the reason why the file cannot be written; empty if it has been.
std::string writePng(cairo_surface_t* image, const std::string& file) {
    g_autoptr(GByteArray) png = g_byte_array_new();
    const auto append = [](void* bytes, const unsigned char* data, unsigned size) {
        g_byte_array_append(static_cast<GByteArray*>(bytes), data, size);
        return CAIRO_STATUS_SUCCESS;
    };
    const cairo_status_t status = cairo_surface_write_to_png_stream(image, append, png);
    if (status != CAIRO_STATUS_SUCCESS) {
        return cairo_status_to_string(status);
    }
    std::FILE* stream = std::fopen(file.c_str(), "wb");
    const bool isWritten = stream && std::fwrite(png->data, 1, png->len, stream) == png->len;
    const bool isClosed = stream && std::fclose(stream) == 0;
    return isWritten && isClosed ? "" : g_strerror(errno);
}

// The search for what a URL leads to, whose server may take some seconds to respond, on a thread of its own.
struct TargetSearch {
    std::string url;
    RequestOptions options;
    std::vector<SignalledApplication> signalled;
    ApplicationTarget target;
    std::function<void(const ApplicationTarget& target)> done;
};

void deleteTargetSearch(gpointer search) {
    delete static_cast<TargetSearch*>(search);
}

void findTarget(TargetSearch search, GCancellable* calls) {
    g_autoptr(GTask) task = g_task_new(
        nullptr, calls,
        [](GObject*, GAsyncResult* result, gpointer) {
            auto* search = static_cast<TargetSearch*>(g_task_get_task_data(G_TASK(result)));
            if (g_task_propagate_boolean(G_TASK(result), nullptr)) {
                search->done(search->target);
            }
        },
        nullptr);
    g_task_set_task_data(task, new TargetSearch(std::move(search)), deleteTargetSearch);
    g_task_run_in_thread(task, [](GTask* task, gpointer, gpointer data, GCancellable*) {
        auto* search = static_cast<TargetSearch*>(data);
        search->target = findApplication(search->url, search->options, search->signalled);
        g_task_return_boolean(task, TRUE);
    });
}

// Null for none.
Warnings::Page pageOf(const Application* application) {
    const char* url = application ? webkit_web_view_get_uri(application->view()) : nullptr;
    return {application, url ? url : ""};
}

} // namespace

TvWindow::TvWindow(Engine& engine, PageChannel& channel, const CommandLine& commandLine)
    : m_engine(engine), m_channel(channel), m_requestOptions(commandLine.requestOptions()),
      m_window(gtk_window_new(GTK_WINDOW_TOPLEVEL)), m_overlay(gtk_overlay_new()),
      m_keys({[this] { return m_stack.top(); },
              [this](const RemoteKey& key, Application* top) { m_television.onKey(key, pageOf(top)); }}),
      m_television(
          libraryCalls(), stackCalls(), [this](const std::string& text) { m_display.show(text); },
          mainLoopTimer()),
      m_start{commandLine.channel, commandLine.signalUrl, std::max(commandLine.channel, kFirstChannel)},
      m_calls(g_cancellable_new()) {
    engine.setTelevisionStart([this] { return televisionStart(); });
    m_channel.setHandler(
        [this](uint64_t page, const std::string& function, const std::string& argument,
               const PageChannel::Reply& reply) { onPageCall(page, function, argument, reply); });
    gtk_window_set_title(GTK_WINDOW(m_window), kTitle);
    gtk_container_add(GTK_CONTAINER(m_window), m_overlay);
    gtk_container_add(GTK_CONTAINER(m_overlay), newBlackArea());
    engine.setOnTransparentPage([this] {
        for (const auto& application : m_applications) {
            m_engine.useOpenGl(application->view());
        }
    });
    m_video.showFramesOf(engine.context());
    gtk_overlay_add_overlay(GTK_OVERLAY(m_overlay), m_video.widget());
    gtk_overlay_add_overlay(GTK_OVERLAY(m_overlay), m_display.widget());
    gtk_overlay_set_overlay_pass_through(GTK_OVERLAY(m_overlay), m_display.widget(), TRUE);
    g_signal_connect(
        m_overlay, "get-child-position",
        G_CALLBACK(+[](GtkOverlay*, GtkWidget*, GdkRectangle* area, gpointer window) -> gboolean {
            static_cast<TvWindow*>(window)->place(*area);
            return TRUE;
        }),
        this);
    const auto onKeyEvent = +[](GtkWidget*, GdkEventKey* event, gpointer window) -> gboolean {
        return static_cast<TvWindow*>(window)->onKey(*event);
    };
    g_signal_connect(m_window, "key-press-event", G_CALLBACK(onKeyEvent), this);
    g_signal_connect(m_window, "key-release-event", G_CALLBACK(onKeyEvent), this);
    g_signal_connect(m_window, "delete-event",
                     G_CALLBACK(+[](GtkWidget*, GdkEvent*, gpointer window) -> gboolean {
                         auto* self = static_cast<TvWindow*>(window);
                         if (self->m_reports.closed) {
                             self->m_reports.closed();
                         }
                         return TRUE;
                     }),
                     this);
    g_signal_connect(
        engine.context(), "user-message-received",
        G_CALLBACK(+[](WebKitWebContext*, WebKitUserMessage* message, gpointer window) -> gboolean {
            return static_cast<TvWindow*>(window)->onMessage(*message);
        }),
        this);
    show(commandLine);
}

TvWindow::~TvWindow() {
    g_cancellable_cancel(m_calls);
    g_object_unref(m_calls);
    m_channel.setHandler(nullptr);
    m_engine.setTelevisionStart(nullptr);
    m_engine.setOnTransparentPage(nullptr);
    m_stack.clear();
    for (const auto& application : m_applications) {
        application->forgetCalls();
    }
    m_applications.clear();
    g_signal_handlers_disconnect_by_data(m_engine.context(), this);
    g_signal_handlers_disconnect_by_data(m_overlay, this);
    g_signal_handlers_disconnect_by_data(m_window, this);
    gtk_widget_destroy(m_window);
}

// Returns whether the message is the window's.
bool TvWindow::onMessage(WebKitUserMessage& message) {
    GVariant* parameters = webkit_user_message_get_parameters(&message);
    const char* kind = webkit_user_message_get_name(&message);
    if (g_strcmp0(kind, kWarningMessage) == 0 && g_variant_is_of_type(parameters, G_VARIANT_TYPE("(tss)"))) {
        guint64 page = 0;
        const char* name = nullptr;
        const char* subject = nullptr;
        g_variant_get(parameters, "(t&s&s)", &page, &name, &subject);
        onWarning(page, name, subject);
        return true;
    }
    if (g_strcmp0(kind, kSignallingMessage) != 0) {
        return false;
    }
    Signalling signalling = signallingOf(parameters);
    if (signalling.channel != 0) {
        m_start.channel = signalling.channel;
    }
    m_television.onSignalling(std::move(signalling));
    return true;
}

void TvWindow::onWarning(uint64_t page, const std::string& name, const std::string& subject) {
    const Application* application = applicationOf(page);
    const std::optional<Warning> warning = warningNamed(name);
    if (application && warning) {
        m_television.warnings().print(pageOf(application), *warning, subject);
    }
}

void TvWindow::show(const CommandLine& commandLine) {
    if (commandLine.fullscreen) {
        // Without a window manager nothing else sets the size.
        GdkRectangle screen;
        GdkDisplay* display = gtk_widget_get_display(m_window);
        GdkMonitor* monitor = gdk_display_get_primary_monitor(display);
        gdk_monitor_get_geometry(monitor ? monitor : gdk_display_get_monitor(display, 0), &screen);
        gtk_window_set_default_size(GTK_WINDOW(m_window), screen.width, screen.height);
        gtk_window_fullscreen(GTK_WINDOW(m_window));
    } else {
        gtk_window_set_default_size(GTK_WINDOW(m_window), commandLine.width, commandLine.height);
    }
    gtk_widget_show_all(m_window);
    // Without a window manager nothing else gives it the keyboard.
    gtk_window_present(GTK_WINDOW(m_window));
}

// Sets `area` to the place of the page in the window.
void TvWindow::place(GtkAllocation& area) const {
    const PixelRect page =
        pageRectIn(gtk_widget_get_allocated_width(m_overlay), gtk_widget_get_allocated_height(m_overlay));
    area = {page.x, page.y, page.width, page.height};
}

Application& TvWindow::addApplication() {
    const Application* related = m_applications.empty() ? nullptr : m_applications.back().get();
    m_applications.push_back(std::make_unique<Application>(m_engine, related, *this));
    Application& application = *m_applications.back();
    gtk_overlay_add_overlay(GTK_OVERLAY(m_overlay), application.widget());
    gtk_overlay_reorder_overlay(GTK_OVERLAY(m_overlay), m_display.widget(), -1);
    return application;
}

Application& TvWindow::pushApplication() {
    Application& application = addApplication();
    m_stack.push(application);
    updateInspector();
    return application;
}

void TvWindow::openApplication(const std::string& url) {
    pushApplication().load(url);
}

// The platform library is in a web process, which needs a page.
void TvWindow::showChannel() {
    addApplication().load(kEmptyPage);
}

// The engine would show the page with which a server reports an error.
Application* TvWindow::openSignalled(const std::string& url) {
    Application& application = pushApplication();
    findTarget({url,
                m_requestOptions,
                {},
                {},
                [this, page = application.pageId()](const ApplicationTarget& target) {
                    Application* opened = applicationOf(page);
                    if (opened && target.error.empty()) {
                        opened->load(target.url);
                    } else if (opened) {
                        onLoadFailed(*opened, target.url, target.error);
                    }
                }},
               m_calls);
    return &application;
}

// ---- The television

Television::Library TvWindow::libraryCalls() {
    // The library can be reached as long as there is a page, also of an application that has ended.
    Television::Library calls;
    calls.tune = [this](uint32_t number, const Television::OnChannel& done) {
        m_applications.back()->tune(number, done);
    };
    calls.step = [this](int positions, const Television::OnChannel& done) {
        m_applications.back()->stepChannel(positions, done);
    };
    calls.setVolume = [this](uint32_t volume) { m_applications.back()->setVolume(volume); };
    return calls;
}

SignalledApplications::Window TvWindow::stackCalls() {
    SignalledApplications::Window calls;
    calls.hasApplication = [this] { return hasApplication(); };
    calls.open = [this](const std::string& url) { return openSignalled(url); };
    calls.end = [this](SignalledApplications::Application application) {
        removeFrom(*static_cast<const Application*>(application));
    };
    calls.endAll = [this] {
        if (!m_stack.all().empty()) {
            removeFrom(*m_stack.all().front());
        }
    };
    return calls;
}

TelevisionStart TvWindow::televisionStart() const {
    TelevisionStart start = m_start;
    start.volume = m_television.volume();
    return start;
}

bool TvWindow::isIdle() const {
    return !m_stack.top() && m_television.applications().signalling().state == TELIX_DESKTOP_SIGNALLING_KNOWN;
}

// ---- The stack

Application* TvWindow::applicationOf(uint64_t page) const {
    const auto& all = m_stack.all();
    const auto found = std::find_if(all.begin(), all.end(), [page](const Application* application) {
        return application->pageId() == page;
    });
    return found == all.end() ? nullptr : *found;
}

// A page that is no longer in the stack keeps running until it has ended; its calls do nothing.
void TvWindow::onPageCall(uint64_t page, const std::string& function, const std::string& argument,
                          const PageChannel::Reply& reply) {
    Application* caller = applicationOf(page);
    if (!caller) {
        reply(false);
        return;
    }
    if (function == "create") {
        createApplication(page, argument, reply);
        return;
    }
    if (function == "destroy") {
        remove(*caller);
    } else if (function == "show" || function == "hide") {
        caller->setShown(function == "show");
    } else if (const RemoteKey* key = function == "key" ? remoteKeyByName(argument) : nullptr) {
        m_television.onKey(*key, pageOf(caller));
    }
    reply(true);
}

void TvWindow::createApplication(uint64_t caller, const std::string& url, const PageChannel::Reply& reply) {
    const auto report = [&url](const std::string& reason) {
        printError("cannot load " + url + ": " + reason);
    };
    if (!m_stack.hasSpace(report)) {
        reply(false);
        return;
    }
    findTarget({url,
                m_requestOptions,
                m_television.applications().signalling().applications,
                {},
                [this, caller, url, reply](const ApplicationTarget& target) {
                    const Application* creator = applicationOf(caller);
                    const bool isCreated = target.error.empty() && creator;
                    warnOfSkipped(target, url, m_television.warnings());
                    if (isCreated) {
                        openTarget(target);
                    } else if (creator) {
                        m_television.warnings().print(pageOf(creator), Warning::NotCreated,
                                                      url + ": " + target.error);
                    }
                    reply(isCreated);
                }},
               m_calls);
}

void TvWindow::openTarget(const ApplicationTarget& target) {
    Application& application = pushApplication();
    if (target.signalled) {
        m_television.applications().onOpened(&application, *target.signalled);
    }
    application.load(target.url);
}

// The application and those above it.
void TvWindow::removeFrom(const Application& lowest) {
    while (m_stack.has(lowest)) {
        remove(*m_stack.top());
    }
}

void TvWindow::remove(Application& application) {
    m_stack.remove(application);
    m_television.onEnded(&application);
    updateInspector();
    application.unload([this, &application] { erase(application); });
}

// The last one stays, because the web process with the platform library ends with its last page.
void TvWindow::erase(const Application& application) {
    const auto found = std::find_if(m_applications.begin(), m_applications.end(),
                                    [&application](const auto& each) { return each.get() == &application; });
    if (m_applications.size() > 1 && found != m_applications.end()) {
        m_applications.erase(found);
    }
}

void TvWindow::removeAll(const std::function<void()>& done) {
    const std::vector<Application*> all = m_stack.all();
    if (all.empty()) {
        done();
    }
    const auto left = std::make_shared<std::size_t>(all.size());
    for (Application* application : all) {
        remove(*application);
        application->unload([left, done] {
            if (--*left == 0) {
                done();
            }
        });
    }
}

void TvWindow::onLoadFailed(Application& application, const std::string& url, const std::string& reason) {
    if (!m_stack.has(application)) {
        return;
    }
    // A WebDriver session loads another document.
    if (!application.hasDocument() && !application.isAutomated()) {
        if (m_television.applications().onLoadFailed(&application)) {
            printError("cannot load " + url + ": " + reason);
            return;
        }
        remove(application);
    }
    if (m_reports.loadFailed) {
        m_reports.loadFailed(url, reason);
    }
}

void TvWindow::onCommitted(Application& application) {
    m_television.warnings().forget(&application);
}

void TvWindow::onCrashed(Application& application, WebKitWebProcessTerminationReason reason) {
    m_video.dropFrames();
    m_television.applications().onLibraryEnded();
    // Each application reports it.
    if (!m_stack.top() && m_applications.back().get() == &application) {
        printError("the web process has ended, starting it again");
        application.load(kEmptyPage);
    } else if (m_stack.top() == &application && m_reports.crashed) {
        m_hasCrashed = true;
        m_reports.crashed(reason);
    }
}

// The driver kills the television when this returns and no application is left.
void TvWindow::onClosed(Application& application) {
    m_stack.remove(application);
    m_television.onEnded(&application);
    updateInspector();
    runUntilDone([&application](std::function<void()> done) { application.unload(std::move(done)); },
                 kCloseTimeoutMs);
    if (m_applications.size() > 1) {
        erase(application);
    } else if (m_reports.closed) {
        m_reports.closed();
    }
}

void TvWindow::showNotice(const std::string& reason) {
    m_stack.top()->showNotice(noticePage(reason));
}

void TvWindow::restart() {
    m_hasCrashed = false;
    for (Application* application : m_stack.all()) {
        application->reload();
    }
}

void TvWindow::inspect() {
    m_isInspected = true;
    updateInspector();
}

void TvWindow::updateInspector() {
    Application* top = m_stack.top();
    if (!m_isInspected || top == m_inspected) {
        return;
    }
    if (m_inspected) {
        webkit_web_inspector_close(webkit_web_view_get_inspector(m_inspected->view()));
    }
    m_inspected = top;
    if (top) {
        WebKitWebInspector* inspector = webkit_web_view_get_inspector(top->view());
        // In a window of its own.
        g_signal_connect(inspector, "attach",
                         G_CALLBACK(+[](WebKitWebInspector*, gpointer) -> gboolean { return TRUE; }),
                         nullptr);
        webkit_web_inspector_show(inspector);
    }
}

void TvWindow::unload(const std::function<void()>& done) {
    // What the channel signals starts nothing any more.
    g_signal_handlers_disconnect_by_data(m_engine.context(), this);
    m_stack.clear();
    if (m_hasCrashed) {
        done();
        return;
    }
    const auto left = std::make_shared<std::size_t>(m_applications.size());
    if (*left == 0) {
        done();
    }
    for (const auto& application : m_applications) {
        application->unload([left, done] {
            if (--*left == 0) {
                done();
            }
        });
    }
}

bool TvWindow::isTopLoaded() const {
    return m_stack.top() && m_stack.top()->isLoaded();
}

void TvWindow::press(const RemoteKey& key, std::function<void()> done) {
    if (m_hasCrashed && key.keyCode == kOkKeyCode) {
        restart();
        done();
        return;
    }
    m_keys.route(key, KeyRouter::Stroke::Press, nullptr);
    m_keys.route(key, KeyRouter::Stroke::Release, std::move(done));
}

// Returns whether the event is handled: a key of the remote control goes to the topmost application, all
// others to the widget with the focus.
bool TvWindow::onKey(const GdkEventKey& event) {
    constexpr guint kShortcutModifiers = GDK_CONTROL_MASK | GDK_MOD1_MASK | GDK_SUPER_MASK | GDK_META_MASK;
    const RemoteKey* key = remoteKeyByKeyboardKey(event.keyval);
    // An event that an application has sent itself comes here if its page does not handle it.
    if (!key || m_applications.empty() || event.send_event || (event.state & kShortcutModifiers)) {
        return false;
    }
    if (event.type == GDK_KEY_PRESS) {
        if (m_hasCrashed && key->keyCode == kOkKeyCode) {
            restart();
            return true;
        }
        m_keys.route(*key, m_heldKey == key ? KeyRouter::Stroke::Repeat : KeyRouter::Stroke::Press, nullptr);
        m_heldKey = key;
    } else {
        m_heldKey = nullptr;
        m_keys.route(*key, KeyRouter::Stroke::Release, nullptr);
    }
    return true;
}

void TvWindow::evaluate(const std::string& expression, std::function<void(Evaluation)> done) {
    Application* top = m_stack.top();
    if (!top) {
        Evaluation evaluation;
        evaluation.error = "no application";
        done(evaluation);
        return;
    }
    top->evaluate(expression, std::move(done));
}

bool TvWindow::hasPicture() const {
    return m_video.hasFrame();
}

void TvWindow::paint(uint8_t* pixels, int stride) {
    cairo_surface_t* image =
        cairo_image_surface_create_for_data(pixels, CAIRO_FORMAT_RGB24, kPageWidth, kPageHeight, stride);
    cairo_t* context = cairo_create(image);
    const PixelRect area =
        pageRectIn(gtk_widget_get_allocated_width(m_overlay), gtk_widget_get_allocated_height(m_overlay));
    cairo_scale(context, static_cast<double>(kPageWidth) / area.width,
                static_cast<double>(kPageHeight) / area.height);
    cairo_translate(context, -area.x, -area.y);
    gtk_container_check_resize(GTK_CONTAINER(m_window)); // what is not laid out cannot be drawn
    gtk_widget_draw(m_overlay, context);
    cairo_destroy(context);
    cairo_surface_destroy(image);
}

void TvWindow::open(const std::string& url, std::function<void(const std::string& error)> done) {
    findTarget({url,
                m_requestOptions,
                m_television.applications().signalling().applications,
                {},
                [this, url, done = std::move(done)](const ApplicationTarget& target) {
                    warnOfSkipped(target, url, m_television.warnings());
                    if (!target.error.empty()) {
                        done(target.error);
                        return;
                    }
                    m_hasCrashed = false;
                    removeAll([this, target, done] {
                        openTarget(target);
                        done({});
                    });
                }},
               m_calls);
}

void TvWindow::reload(std::function<void(const std::string& error)> done) {
    const char* url = m_stack.top() ? webkit_web_view_get_uri(m_stack.top()->view()) : nullptr;
    findTarget({url ? url : "",
                m_requestOptions,
                {},
                {},
                [this, done = std::move(done)](const ApplicationTarget& target) {
                    if (target.error.empty()) {
                        restart();
                    }
                    done(target.error);
                }},
               m_calls);
}

std::vector<ScriptedWindow::RunningApplication> TvWindow::applications() const {
    std::vector<RunningApplication> running;
    for (const Application* each : m_stack.all()) {
        const char* url = webkit_web_view_get_uri(each->view());
        running.insert(running.begin(),
                       {url ? url : "", m_television.applications().idOf(each), each->isVisible()});
    }
    return running;
}

// The page's part comes from the page itself, because what has been drawn in the window may be older than
// what a script has done to the page.
void TvWindow::writeScreenshot(const std::string& file, std::function<void(const std::string& error)> done) {
    Application* top = m_stack.top();
    if (!top || !top->isVisible()) {
        done(paintScreenshot(file, nullptr));
        return;
    }
    top->takeSnapshot([this, file, done = std::move(done)](cairo_surface_t* page) {
        done(paintScreenshot(file, page));
        if (page) {
            cairo_surface_destroy(page);
        }
    });
}

// Returns the reason why the file cannot be written; empty if it has been.
std::string TvWindow::paintScreenshot(const std::string& file, cairo_surface_t* page) const {
    const int width = gtk_widget_get_allocated_width(m_overlay);
    const int height = gtk_widget_get_allocated_height(m_overlay);
    cairo_surface_t* image = cairo_image_surface_create(CAIRO_FORMAT_RGB24, width, height);
    cairo_t* context = cairo_create(image);
    const PixelRect area = pageRectIn(width, height);
    cairo_translate(context, area.x, area.y);
    m_video.paint(context, area.width, area.height);
    if (page) {
        cairo_scale(context, static_cast<double>(area.width) / kPageWidth,
                    static_cast<double>(area.height) / kPageHeight);
        cairo_set_source_surface(context, page, 0, 0);
        cairo_pattern_set_extend(cairo_get_source(context), CAIRO_EXTEND_PAD);
        cairo_rectangle(context, 0, 0, kPageWidth, kPageHeight);
        cairo_fill(context);
    }
    cairo_identity_matrix(context);
    cairo_translate(context, area.x, area.y);
    m_display.paint(context, area.width, area.height);
    cairo_destroy(context);
    std::string error = writePng(image, file);
    cairo_surface_destroy(image);
    return error;
}

} // namespace desktop

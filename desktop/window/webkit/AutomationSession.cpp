// The WebDriver session that opens and controls the applications of the window.
#include "desktop/window/webkit/AutomationSession.h"

#include <utility>

namespace desktop {

namespace {

// What clients ask for as `browserName`.
constexpr char kBrowserName[] = "telix-tv";

} // namespace

AutomationSession::AutomationSession(WebKitWebContext* context, Window window)
    : m_context(context), m_window(std::move(window)) {
    g_signal_connect(m_context, "automation-started",
                     G_CALLBACK(+[](WebKitWebContext*, WebKitAutomationSession* session, gpointer self) {
                         static_cast<AutomationSession*>(self)->onStarted(session);
                     }),
                     this);
}

AutomationSession::~AutomationSession() {
    g_signal_handlers_disconnect_by_data(m_context, this);
    if (m_session) {
        g_signal_handlers_disconnect_by_data(m_session, this);
        g_object_unref(m_session);
    }
}

void AutomationSession::onStarted(WebKitAutomationSession* session) {
    g_set_object(&m_session, session);
    WebKitApplicationInfo* information = webkit_application_info_new();
    webkit_application_info_set_name(information, kBrowserName);
    webkit_application_info_set_version(information, TELIX_VERSION_MAJOR, TELIX_VERSION_MINOR, 0);
    webkit_automation_session_set_application_info(session, information);
    webkit_application_info_unref(information);
    g_signal_connect(session, "create-web-view", G_CALLBACK(+[](WebKitAutomationSession*, gpointer self) {
                         return static_cast<AutomationSession*>(self)->m_window.openApplication();
                     }),
                     this);
    g_signal_connect(session, "will-close", G_CALLBACK(+[](WebKitAutomationSession*, gpointer self) {
                         static_cast<AutomationSession*>(self)->m_window.onEnded();
                     }),
                     this);
}

} // namespace desktop

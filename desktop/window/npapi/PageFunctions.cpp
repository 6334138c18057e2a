// What the browser adds to the window object of every page: the functions that create, destroy, show and hide
// applications, and the key codes of the remote control.
#include "desktop/window/npapi/PageFunctions.h"

#include <QWebFrame>

#include "desktop/window/npapi/ApplicationView.h"
#include "desktop/window/npapi/TvWindow.h"
#include "desktop/window/shared/PageScript.h"

namespace desktop {

PageFunctions::PageFunctions(QWebFrame& frame, ApplicationView& application, TvWindow& window)
    : QObject(&frame), m_frame(frame), m_application(application), m_window(window) {
    // Emitted for every new window object, before any script of its page runs.
    connect(&frame, &QWebFrame::javaScriptWindowObjectCleared, this, &PageFunctions::install);
}

void PageFunctions::install() {
    m_frame.addToJavaScriptWindowObject(QStringLiteral("telixTvBrowser"), this);
    for (const auto& script :
         {pageScriptCall("watchobjects", {}), pageFunctionsScript() + "," + keyNamesScript()}) {
        m_frame.evaluateJavaScript(QString::fromStdString(script));
    }
}

bool PageFunctions::createApplication(const QString& url) {
    return m_window.createApplication(m_application, m_frame.baseUrl().resolved(QUrl(url)));
}

void PageFunctions::warn(const QString& name, const QString& subject) {
    if (const auto warning = warningNamed(name.toStdString())) {
        m_window.warn(m_application, *warning, subject.toStdString());
    }
}

void PageFunctions::destroyApplication() {
    m_window.destroyApplication(m_application);
}

void PageFunctions::showApplication() {
    m_application.setShown(true);
}

void PageFunctions::hideApplication() {
    m_application.setShown(false);
}

} // namespace desktop

// What the browser adds to the window object of every page: the functions that create, destroy, show and hide
// applications, and the key codes of the remote control.
#include "desktop/browser/PageFunctions.h"

#include <QJsonObject>
#include <QWebFrame>

#include "desktop/browser/ApplicationView.h"
#include "desktop/browser/PageScript.h"
#include "desktop/browser/RemoteControl.h"
#include "desktop/browser/TvWindow.h"

namespace desktop {

namespace {

QJsonObject keyCodesByConstant() {
    QJsonObject codes;
    for (const auto& key : remoteKeys()) {
        codes.insert(QLatin1String(key.constant), key.keyCode);
    }
    return codes;
}

} // namespace

PageFunctions::PageFunctions(QWebFrame& frame, ApplicationView& application, TvWindow& window)
    : QObject(&frame), m_frame(frame), m_application(application), m_window(window) {
    // Emitted for every new window object, before any script of its page runs.
    connect(&frame, &QWebFrame::javaScriptWindowObjectCleared, this, &PageFunctions::install);
}

void PageFunctions::install() {
    m_frame.addToJavaScriptWindowObject(QStringLiteral("telixTvBrowser"), this);
    callPageScript(m_frame, QStringLiteral("pagefunctions"), {keyCodesByConstant()});
}

bool PageFunctions::createApplication(const QString& url) {
    return m_window.createApplication(m_application, m_frame.baseUrl().resolved(QUrl(url)));
}

void PageFunctions::destroyApplication() {
    m_window.destroyTopApplication(m_application);
}

void PageFunctions::showApplication() {
    m_application.setShown(true);
}

void PageFunctions::hideApplication() {
    m_application.setShown(false);
}

} // namespace desktop

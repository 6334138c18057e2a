// The engine's page of one application: its settings, its messages and why it could not be loaded.
#include "desktop/window/npapi/ApplicationPage.h"

#include <QWebFrame>

#include <utility>

#include "desktop/window/shared/Diagnostics.h"

namespace desktop {

ApplicationPage::ApplicationPage(QString userAgent, QObject* parent)
    : QWebPage(parent), m_userAgent(std::move(userAgent)) {
    mainFrame()->setScrollBarPolicy(Qt::Horizontal, Qt::ScrollBarAlwaysOff);
    mainFrame()->setScrollBarPolicy(Qt::Vertical, Qt::ScrollBarAlwaysOff);
    connect(this, &QWebPage::loadStarted, this, [this] { m_loadFailure.clear(); });
}

bool ApplicationPage::supportsExtension(Extension extension) const {
    return extension == ErrorPageExtension;
}

// The engine asks for an error page when a load fails. None is given; only the reason is kept.
bool ApplicationPage::extension(Extension extension, const ExtensionOption* option, ExtensionReturn*) {
    if (extension != ErrorPageExtension) {
        return false;
    }
    const auto* error = static_cast<const ErrorPageExtensionOption*>(option);
    if (error->frame == mainFrame()) {
        m_loadFailure = error->errorString;
        m_failedUrl = error->url;
    } else {
        printError(QStringLiteral("cannot load %1: %2")
                       .arg(error->url.toDisplayString(), error->errorString)
                       .toStdString());
    }
    return false;
}

void ApplicationPage::javaScriptConsoleMessage(const QString& message, int line, const QString& source) {
    // The engine does not always name the script of a message.
    printConsoleMessage((source.isEmpty() ? mainFrame()->url().toString() : source).toStdString(), line,
                        message.toStdString());
}

void ApplicationPage::javaScriptAlert(QWebFrame*, const QString& message) {
    printError("alert: " + message.toStdString());
}

bool ApplicationPage::javaScriptConfirm(QWebFrame*, const QString& message) {
    printError("confirm, answered with cancel: " + message.toStdString());
    return false;
}

bool ApplicationPage::javaScriptPrompt(QWebFrame*, const QString& message, const QString&, QString*) {
    printError("prompt, answered with cancel: " + message.toStdString());
    return false;
}

} // namespace desktop

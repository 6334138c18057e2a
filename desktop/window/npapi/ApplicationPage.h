// The engine's page of one application: its settings, its messages and why it could not be loaded.
#ifndef TELIX_DESKTOP_WINDOW_NPAPI_APPLICATIONPAGE_H
#define TELIX_DESKTOP_WINDOW_NPAPI_APPLICATIONPAGE_H

#include <QUrl>
#include <QWebPage>

namespace desktop {

class ApplicationPage : public QWebPage {
    Q_OBJECT

public:
    // `userAgent`: the User-Agent header of requests, and navigator.userAgent.
    ApplicationPage(QString userAgent, QObject* parent);

    // Why the last document could not be loaded; empty when it could.
    QString loadFailure() const { return m_loadFailure; }
    QUrl failedUrl() const { return m_failedUrl; }

    bool supportsExtension(Extension extension) const override;
    bool extension(Extension extension, const ExtensionOption* option, ExtensionReturn* output) override;
    bool shouldInterruptJavaScript() override { return false; }

protected:
    QString userAgentForUrl(const QUrl&) const override { return m_userAgent; }
    void javaScriptConsoleMessage(const QString& message, int line, const QString& source) override;
    // A television has no dialogs: alert(), confirm() and prompt() print their message, and the last two
    // return as if cancelled.
    void javaScriptAlert(QWebFrame* frame, const QString& message) override;
    bool javaScriptConfirm(QWebFrame* frame, const QString& message) override;
    bool javaScriptPrompt(QWebFrame* frame, const QString& message, const QString& proposal,
                          QString* answer) override;
    QString chooseFile(QWebFrame*, const QString&) override { return {}; }

private:
    QString m_userAgent;
    QString m_loadFailure;
    QUrl m_failedUrl;
};

} // namespace desktop

#endif

// A page as the engine runs it for one application: settings, messages and failures.
#ifndef TELIX_DESKTOP_BROWSER_APPLICATIONPAGE_H
#define TELIX_DESKTOP_BROWSER_APPLICATIONPAGE_H

#include <QUrl>
#include <QWebPage>

class ApplicationPage : public QWebPage {
    Q_OBJECT

public:
    // `userAgent`: what servers and scripts are told that this is.
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
    // A television has no dialogs: a page's questions are printed and answered with no.
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

#endif

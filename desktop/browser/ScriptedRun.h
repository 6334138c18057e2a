// Carries out what the command line asks to be done with the page: keys, waiting, evaluation, screenshot.
#ifndef TELIX_DESKTOP_BROWSER_SCRIPTEDRUN_H
#define TELIX_DESKTOP_BROWSER_SCRIPTEDRUN_H

#include <QElapsedTimer>
#include <QObject>
#include <QString>
#include <QTimer>

struct CommandLine;
class QUrl;
class TvWindow;

// Ends the program's event loop with the exit status when everything is done or can't be. Nothing ends it
// when the command line only shows a page.
class ScriptedRun : public QObject {
    Q_OBJECT

public:
    // Starts with the event loop. Both must outlive the run.
    ScriptedRun(TvWindow& window, const CommandLine& commandLine);

    // The value of --eval as JSON; null when there is none.
    QString evaluated() const { return m_evaluated; }

private:
    struct Evaluation;

    void step();
    // Each gives true when its part is done.
    bool pressKeys();
    bool waitForExpression();
    bool waitForPicture() const;
    void finish();
    void giveUp();
    void onWindowClosed();
    void onLoadFailed(const QUrl& url, const QString& reason);
    Evaluation evaluate(const QString& expression) const;
    bool topIsLoaded() const;
    bool writeScreenshot() const;
    void end(int exitStatus);

    TvWindow& m_window;
    const CommandLine& m_commandLine;
    QTimer m_timer;
    QElapsedTimer m_sinceStart;
    bool m_pageLoaded = false;
    int m_keysPressed = 0;
    // How --wait-for was found last.
    bool m_expressionTrue = false;
    QString m_lastError;
    QString m_evaluated;
};

#endif

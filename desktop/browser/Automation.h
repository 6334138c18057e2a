// Performs the automation steps of the command line: keys, conditions, evaluation, screenshot.
#ifndef TELIX_DESKTOP_BROWSER_AUTOMATION_H
#define TELIX_DESKTOP_BROWSER_AUTOMATION_H

#include <QElapsedTimer>
#include <QObject>
#include <QString>
#include <QTimer>

class QUrl;

namespace desktop {

struct CommandLine;
class TvWindow;

// Exits the event loop with the exit status when all steps are done or one fails. If the command line only
// shows a page, nothing but closing the window exits it.
class Automation : public QObject {
    Q_OBJECT

public:
    // Starts with the event loop. Both arguments must outlive the object.
    Automation(TvWindow& window, const CommandLine& commandLine);

    // The value of --eval as JSON; null if there is none.
    QString evaluated() const { return m_evaluated; }

private:
    struct Evaluation;

    void step();
    // Each returns true when its step is done.
    bool pressKeys();
    bool waitForExpression();
    bool waitForPicture() const;
    void finish();
    void onTimeout();
    void onWindowClosed();
    void onLoadFailed(const QUrl& url, const QString& reason);
    Evaluation evaluate(const QString& expression) const;
    bool isTopLoaded() const;
    bool writeScreenshot() const;
    void end(int exitStatus);

    TvWindow& m_window;
    const CommandLine& m_commandLine;
    QTimer m_timer;
    QElapsedTimer m_sinceStart;
    bool m_pageLoaded = false;
    int m_keysPressed = 0;
    // The result of the last evaluation of --wait-for.
    bool m_expressionTrue = false;
    QString m_lastError;
    QString m_evaluated;
};

} // namespace desktop

#endif

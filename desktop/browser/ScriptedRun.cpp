// Carries out what the command line asks to be done with the page: keys, waiting, evaluation, screenshot.
#include "desktop/browser/ScriptedRun.h"

#include "desktop/browser/ApplicationPage.h"
#include "desktop/browser/ApplicationView.h"
#include "desktop/browser/CommandLine.h"
#include "desktop/browser/Diagnostics.h"
#include "desktop/browser/PageScript.h"
#include "desktop/browser/TvWindow.h"

#include <QGuiApplication>
#include <QPixmap>
#include <QWebFrame>

namespace {

const int stepMilliseconds = 20;

} // namespace

struct ScriptedRun::Evaluation {
    bool truth;
    QString json;
    // Null when the expression has a value.
    QString error;
};

ScriptedRun::ScriptedRun(TvWindow& window, const CommandLine& commandLine)
    : m_window(window), m_commandLine(commandLine) {
    connect(&window, &TvWindow::loadFailed, this, &ScriptedRun::onLoadFailed);
    connect(qGuiApp, &QGuiApplication::lastWindowClosed, this, &ScriptedRun::onWindowClosed);
    // A page that is only looked at may take its time.
    if (commandLine.keys.isEmpty() && !commandLine.quitsWhenDone())
        return;
    connect(&m_timer, &QTimer::timeout, this, &ScriptedRun::step);
    m_timer.start(stepMilliseconds);
    m_sinceStart.start();
}

void ScriptedRun::step() {
    m_pageLoaded = m_pageLoaded || topIsLoaded();
    const bool settled = topIsLoaded() || !m_window.topApplication();
    if (m_pageLoaded && settled && pressKeys() && waitForExpression() && waitForPicture()) {
        finish();
    } else if (m_sinceStart.elapsed() > m_commandLine.timeoutSeconds * 1000) {
        giveUp();
    }
}

// One key at a step and nothing else, so that what a key sets off gets its turn before what comes next.
bool ScriptedRun::pressKeys() {
    if (m_keysPressed == m_commandLine.keys.size())
        return true;
    if (ApplicationView* top = m_window.topApplication())
        top->press(*m_commandLine.keys[m_keysPressed++]);
    return false;
}

bool ScriptedRun::waitForExpression() {
    if (m_commandLine.waitFor.isNull())
        return true;
    const Evaluation evaluation = evaluate(m_commandLine.waitFor);
    m_lastError = evaluation.error;
    m_expressionTrue = evaluation.truth;
    return evaluation.truth;
}

bool ScriptedRun::waitForPicture() const {
    return !m_commandLine.waitForPicture || m_window.hasPicture();
}

void ScriptedRun::finish() {
    if (!m_commandLine.quitsWhenDone()) {
        m_timer.stop();
        return;
    }
    if (!m_commandLine.eval.isNull()) {
        const Evaluation evaluation = evaluate(m_commandLine.eval);
        if (!evaluation.error.isNull()) {
            printError(QStringLiteral("can't evaluate %1: %2").arg(m_commandLine.eval, evaluation.error));
            end(exitNotReached);
            return;
        }
        m_evaluated = evaluation.json;
    }
    end(writeScreenshot() ? exitSuccess : exitUnusable);
}

void ScriptedRun::giveUp() {
    const QString limit = QStringLiteral("within %1 s").arg(m_commandLine.timeoutSeconds);
    if (!m_pageLoaded) {
        printError(QStringLiteral("can't load %1 %2").arg(m_commandLine.page.toDisplayString(), limit));
        end(exitUnusable);
        return;
    }
    if (m_keysPressed < m_commandLine.keys.size()) {
        printError(
            QStringLiteral("can't press the keys from number %1 on %2").arg(m_keysPressed + 1).arg(limit));
    } else if (m_commandLine.waitFor.isNull() || m_expressionTrue) {
        printError(QStringLiteral("there is no picture %1").arg(limit));
    } else {
        const QString error = m_lastError.isNull() ? QString() : QStringLiteral(" (%1)").arg(m_lastError);
        printError(QStringLiteral("not true %1: %2%3").arg(limit, m_commandLine.waitFor, error));
    }
    writeScreenshot();
    end(exitNotReached);
}

void ScriptedRun::onWindowClosed() {
    end(m_commandLine.quitsWhenDone() ? exitNotReached : exitSuccess);
}

void ScriptedRun::onLoadFailed(const QUrl& url, const QString& reason) {
    printError(QStringLiteral("can't load %1: %2").arg(url.toDisplayString(), reason));
    if (!m_window.topApplication())
        end(exitUnusable);
}

ScriptedRun::Evaluation ScriptedRun::evaluate(const QString& expression) const {
    ApplicationView* application = m_window.topApplication();
    if (!application)
        return {false, QString(), QStringLiteral("there is no application")};
    const auto value =
        callPageScript(*application->applicationPage().mainFrame(), QStringLiteral("evaluate"), {expression})
            .toMap();
    return {value.value(QStringLiteral("truth")).toBool(), value.value(QStringLiteral("json")).toString(),
            value.value(QStringLiteral("error")).toString()};
}

bool ScriptedRun::topIsLoaded() const {
    const ApplicationView* top = m_window.topApplication();
    return top && top->isLoaded();
}

bool ScriptedRun::writeScreenshot() const {
    if (m_commandLine.screenshot.isNull() || m_window.grab().save(m_commandLine.screenshot, "PNG"))
        return true;
    printError(QStringLiteral("can't write %1").arg(m_commandLine.screenshot));
    return false;
}

void ScriptedRun::end(int exitStatus) {
    m_timer.stop();
    QCoreApplication::exit(exitStatus);
}

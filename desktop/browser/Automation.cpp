// Performs the automation steps of the command line: keys, conditions, evaluation, screenshot.
#include "desktop/browser/Automation.h"

#include <QGuiApplication>
#include <QPixmap>
#include <QWebFrame>

#include "desktop/browser/ApplicationPage.h"
#include "desktop/browser/ApplicationView.h"
#include "desktop/browser/CommandLine.h"
#include "desktop/browser/Diagnostics.h"
#include "desktop/browser/PageScript.h"
#include "desktop/browser/TvWindow.h"

namespace desktop {

namespace {

constexpr int kStepMs = 20;

} // namespace

struct Automation::Evaluation {
    bool truth;
    QString json;
    // Null if the expression has a value.
    QString error;
};

Automation::Automation(TvWindow& window, const CommandLine& commandLine)
    : m_window(window), m_commandLine(commandLine) {
    connect(&window, &TvWindow::loadFailed, this, &Automation::onLoadFailed);
    connect(qGuiApp, &QGuiApplication::lastWindowClosed, this, &Automation::onWindowClosed);
    // Without automation there is no timeout.
    if (commandLine.keys.isEmpty() && !commandLine.quitsWhenDone()) {
        return;
    }
    connect(&m_timer, &QTimer::timeout, this, &Automation::step);
    m_timer.start(kStepMs);
    m_sinceStart.start();
}

void Automation::step() {
    m_pageLoaded = m_pageLoaded || isTopLoaded();
    const bool ready = isTopLoaded() || !m_window.topApplication();
    if (m_pageLoaded && ready && pressKeys() && waitForExpression() && waitForPicture()) {
        finish();
    } else if (m_sinceStart.elapsed() > m_commandLine.timeoutSeconds * 1000) {
        onTimeout();
    }
}

// One key per step, so that the event loop handles its effects before the next key or condition.
bool Automation::pressKeys() {
    if (m_keysPressed == m_commandLine.keys.size()) {
        return true;
    }
    if (ApplicationView* top = m_window.topApplication()) {
        top->press(*m_commandLine.keys[m_keysPressed++]);
    }
    return false;
}

bool Automation::waitForExpression() {
    if (m_commandLine.waitFor.isNull()) {
        return true;
    }
    const Evaluation evaluation = evaluate(m_commandLine.waitFor);
    m_lastError = evaluation.error;
    m_expressionTrue = evaluation.truth;
    return evaluation.truth;
}

bool Automation::waitForPicture() const {
    return !m_commandLine.waitForPicture || m_window.hasPicture();
}

void Automation::finish() {
    if (!m_commandLine.quitsWhenDone()) {
        m_timer.stop();
        return;
    }
    if (!m_commandLine.eval.isNull()) {
        const Evaluation evaluation = evaluate(m_commandLine.eval);
        if (!evaluation.error.isNull()) {
            printError(QStringLiteral("cannot evaluate %1: %2").arg(m_commandLine.eval, evaluation.error));
            end(kExitNotMet);
            return;
        }
        m_evaluated = evaluation.json;
    }
    end(writeScreenshot() ? kExitSuccess : kExitBadInput);
}

void Automation::onTimeout() {
    const QString timeout = QStringLiteral("within %1 s").arg(m_commandLine.timeoutSeconds);
    if (!m_pageLoaded) {
        printError(QStringLiteral("cannot load %1: not loaded %2")
                       .arg(m_commandLine.page.toDisplayString(), timeout));
        end(kExitBadInput);
        return;
    }
    if (m_keysPressed < m_commandLine.keys.size()) {
        printError(
            QStringLiteral("--keys: key number %1 not pressed %2").arg(m_keysPressed + 1).arg(timeout));
    } else if (m_commandLine.waitFor.isNull() || m_expressionTrue) {
        printError(QStringLiteral("--wait-for-picture: no picture %1").arg(timeout));
    } else {
        const QString error = m_lastError.isNull() ? QString() : QStringLiteral(" (%1)").arg(m_lastError);
        printError(QStringLiteral("--wait-for %1: not true %2%3").arg(m_commandLine.waitFor, timeout, error));
    }
    writeScreenshot();
    end(kExitNotMet);
}

void Automation::onWindowClosed() {
    end(m_commandLine.quitsWhenDone() ? kExitNotMet : kExitSuccess);
}

void Automation::onLoadFailed(const QUrl& url, const QString& reason) {
    printError(QStringLiteral("cannot load %1: %2").arg(url.toDisplayString(), reason));
    if (!m_window.topApplication()) {
        end(kExitBadInput);
    }
}

Automation::Evaluation Automation::evaluate(const QString& expression) const {
    ApplicationView* application = m_window.topApplication();
    if (!application) {
        return {false, QString(), QStringLiteral("no application")};
    }
    const auto value =
        callPageScript(*application->applicationPage().mainFrame(), QStringLiteral("evaluate"), {expression})
            .toMap();
    return {value.value(QStringLiteral("truth")).toBool(), value.value(QStringLiteral("json")).toString(),
            value.value(QStringLiteral("error")).toString()};
}

bool Automation::isTopLoaded() const {
    const ApplicationView* top = m_window.topApplication();
    return top && top->isLoaded();
}

bool Automation::writeScreenshot() const {
    if (m_commandLine.screenshot.isNull() || m_window.grab().save(m_commandLine.screenshot, "PNG")) {
        return true;
    }
    printError(QStringLiteral("cannot write %1").arg(m_commandLine.screenshot));
    return false;
}

void Automation::end(int exitStatus) {
    m_timer.stop();
    QCoreApplication::exit(exitStatus);
}

} // namespace desktop

// Performs the automation steps of the command line: keys, conditions, evaluation, screenshot.
#include "desktop/window/shared/Automation.h"

#include <glib.h>

#include <utility>

#include "desktop/window/shared/CommandLine.h"
#include "desktop/window/shared/Diagnostics.h"

namespace desktop {

namespace {

constexpr guint kStepMs = 20;

} // namespace

Automation::Automation(ScriptedWindow& window, const CommandLine& commandLine, std::function<void(int)> end)
    : m_window(window), m_commandLine(commandLine), m_end(std::move(end)) {
    // Without automation there is no timeout.
    if (!commandLine.hasSteps()) {
        return;
    }
    m_start = g_get_monotonic_time();
    m_timer = g_timeout_add(
        kStepMs,
        [](gpointer automation) -> gboolean {
            static_cast<Automation*>(automation)->step();
            return G_SOURCE_CONTINUE;
        },
        this);
}

Automation::~Automation() {
    if (m_timer) {
        g_source_remove(m_timer);
    }
}

void Automation::step() {
    m_pageLoaded =
        m_pageLoaded || m_window.isTopLoaded() || (m_commandLine.page.empty() && m_window.isIdle());
    if (g_get_monotonic_time() - m_start > m_commandLine.timeoutSeconds * G_USEC_PER_SEC) {
        onTimeout();
        return;
    }
    const bool isReady = m_window.isTopLoaded() || !m_window.hasApplication();
    if (m_isBusy || !m_pageLoaded || !isReady) {
        return;
    }
    if (m_keysPressed < m_commandLine.keys.size()) {
        pressNextKey();
    } else if (m_commandLine.waitFor && !m_expressionTrue) {
        waitForExpression();
    } else if (!m_commandLine.waitForPicture || m_window.hasPicture()) {
        finish();
    }
}

// One key per step, so that the event loop handles its effects before the next key or condition.
void Automation::pressNextKey() {
    m_isBusy = true;
    m_window.press(*m_commandLine.keys[m_keysPressed++], [this] { m_isBusy = false; });
}

void Automation::waitForExpression() {
    m_isBusy = true;
    m_window.evaluate(*m_commandLine.waitFor, [this](const ScriptedWindow::Evaluation& evaluation) {
        m_isBusy = false;
        m_lastError = evaluation.error;
        m_expressionTrue = evaluation.truth;
        if (m_expressionTrue && !m_hasEnded) {
            step();
        }
    });
}

void Automation::finish() {
    if (!m_commandLine.quitsWhenDone()) {
        g_source_remove(std::exchange(m_timer, 0));
    } else if (m_commandLine.eval) {
        evaluateLast();
    } else {
        writeScreenshotAndEnd(kExitSuccess);
    }
}

void Automation::evaluateLast() {
    m_isBusy = true;
    m_window.evaluate(*m_commandLine.eval, [this](const ScriptedWindow::Evaluation& evaluation) {
        if (m_hasEnded) {
            return;
        }
        if (evaluation.error) {
            printError("cannot evaluate " + *m_commandLine.eval + ": " + *evaluation.error);
            end(kExitNotMet);
            return;
        }
        m_evaluated = evaluation.json;
        writeScreenshotAndEnd(kExitSuccess);
    });
}

void Automation::onTimeout() {
    g_autofree char* timeout = g_strdup_printf("within %g s", m_commandLine.timeoutSeconds);
    if (!m_pageLoaded) {
        printError(m_commandLine.page.empty()
                       ? std::string("no channel ") + timeout
                       : "cannot load " + m_commandLine.page + ": not loaded " + timeout);
        end(kExitBadInput);
        return;
    }
    reportUnmet(timeout);
    writeScreenshotAndEnd(kExitNotMet);
}

void Automation::reportUnmet(const std::string& timeout) const {
    if (m_keysPressed < m_commandLine.keys.size()) {
        printError("--keys: key number " + std::to_string(m_keysPressed + 1) + " not pressed " + timeout);
    } else if (!m_commandLine.waitFor || m_expressionTrue) {
        printError("--wait-for-picture: no picture " + timeout);
    } else {
        printError("--wait-for " + *m_commandLine.waitFor + ": not true " + timeout +
                   (m_lastError ? " (" + *m_lastError + ")" : ""));
    }
}

void Automation::onWindowClosed() {
    end(m_commandLine.quitsWhenDone() ? kExitNotMet : kExitSuccess);
}

void Automation::onLoadFailed(const std::string& url, const std::string& reason) {
    printError("cannot load " + url + ": " + reason);
    if (!m_window.hasApplication()) {
        end(kExitBadInput);
    }
}

bool Automation::onPageCrashed(const std::string& reason) {
    printError(reason);
    if (m_commandLine.quitsWhenDone()) {
        end(kExitPageCrashed);
    }
    return m_commandLine.quitsWhenDone();
}

void Automation::writeScreenshotAndEnd(int exitStatus) {
    if (!m_commandLine.screenshot) {
        end(exitStatus);
        return;
    }
    if (m_timer) {
        g_source_remove(std::exchange(m_timer, 0));
    }
    m_window.writeScreenshot(*m_commandLine.screenshot, [this, exitStatus](const std::string& error) {
        if (!error.empty()) {
            printError("cannot write " + *m_commandLine.screenshot + ": " + error);
        }
        end(error.empty() || exitStatus != kExitSuccess ? exitStatus : kExitBadInput);
    });
}

void Automation::end(int exitStatus) {
    if (m_timer) {
        g_source_remove(std::exchange(m_timer, 0));
    }
    if (!std::exchange(m_hasEnded, true)) {
        m_end(exitStatus);
    }
}

} // namespace desktop

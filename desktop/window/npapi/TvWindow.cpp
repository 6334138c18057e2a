// The main window: the video plane and, above it, a stack of applications.
#include "desktop/window/npapi/TvWindow.h"

#include <QFile>
#include <QImage>
#include <QPainter>
#include <QPalette>
#include <QPixmap>
#include <QWebFrame>
#include <QWebInspector>

#include "desktop/window/npapi/ApplicationPage.h"
#include "desktop/window/npapi/ApplicationView.h"
#include "desktop/window/npapi/PageFunctions.h"
#include "desktop/window/npapi/PageGeometry.h"
#include "desktop/window/npapi/PageScript.h"
#include "desktop/window/npapi/VideoPlane.h"
#include "desktop/window/shared/LoadCheck.h"

namespace desktop {

TvWindow::TvWindow(const QString& userAgent) : m_userAgent(userAgent), m_videoPlane(new VideoPlane(this)) {
    QPalette black = palette();
    black.setColor(QPalette::Window, Qt::black);
    setPalette(black);
    setWindowTitle(QStringLiteral("telix-tv"));
    resize(kPageSize);
    place(*m_videoPlane);
}

TvWindow::~TvWindow() {
    delete m_inspector;
    // Calls of pages during their teardown are ignored, because their applications are not in the stack.
    m_stack.clear();
    // Pages are destroyed before the members that they use, also those that wait for deleteLater().
    qDeleteAll(findChildren<ApplicationView*>());
}

void TvWindow::openApplication(const QUrl& url) {
    auto* application = new ApplicationView(m_userAgent, this);
    auto* page = &application->applicationPage();
    page->setNetworkAccessManager(&m_network);
    const auto addFunctions = [this, application](QWebFrame* frame) {
        new PageFunctions(*frame, *application, *this);
    };
    addFunctions(page->mainFrame());
    connect(page, &QWebPage::frameCreated, this, addFunctions);
    connect(application, &ApplicationView::loadFailed, this, [this, application](const QString& reason) {
        if (!application->hasDocument()) {
            remove(application);
        }
        emit loadFailed(application->applicationPage().failedUrl(), reason);
    });
    m_stack.push(*application);
    updateTop();
    application->load(url);
}

bool TvWindow::createApplication(const ApplicationView& caller, const QUrl& url) {
    if (!m_stack.has(caller) ||
        !loadError(url.toString(QUrl::FullyEncoded).toStdString(), m_userAgent.toStdString()).empty()) {
        return false;
    }
    openApplication(url);
    return true;
}

void TvWindow::destroyTopApplication(const ApplicationView& caller) {
    // The script of an application keeps running after its removal.
    if (m_stack.has(caller)) {
        remove(m_stack.top());
    }
}

void TvWindow::inspect() {
    m_inspector = new QWebInspector;
    m_inspector->setAttribute(Qt::WA_QuitOnClose, false);
    m_inspector->setWindowTitle(QStringLiteral("telix-tv inspector"));
    m_inspector->resize(kPageSize);
    // An inspector that is shown before it has a page stays empty.
    updateTop();
    m_inspector->show();
}

void TvWindow::resizeEvent(QResizeEvent*) {
    place(*m_videoPlane);
    for (auto* application : m_stack.all()) {
        place(*application);
    }
}

bool TvWindow::isTopLoaded() const {
    return m_stack.top() && m_stack.top()->isLoaded();
}

void TvWindow::press(const RemoteKey& key, std::function<void()> done) {
    if (ApplicationView* top = m_stack.top()) {
        top->press(key);
    }
    done();
}

void TvWindow::evaluate(const std::string& expression, std::function<void(Evaluation)> done) {
    Evaluation evaluation;
    if (ApplicationView* top = m_stack.top()) {
        const auto value =
            callPageScript(*top->applicationPage().mainFrame(), "evaluate", {expression}).toMap();
        evaluation.truth = value.value(QStringLiteral("truth")).toBool();
        evaluation.json = value.value(QStringLiteral("json")).toString().toStdString();
        if (value.contains(QStringLiteral("error"))) {
            evaluation.error = value.value(QStringLiteral("error")).toString().toStdString();
        }
    } else {
        evaluation.error = "no application";
    }
    done(evaluation);
}

void TvWindow::writeScreenshot(const std::string& file, std::function<void(const std::string& error)> done) {
    QFile png(QFile::decodeName(file.c_str()));
    const bool isWritten =
        png.open(QIODevice::WriteOnly | QIODevice::Truncate) && grab().save(&png, "PNG") && png.flush();
    done(isWritten ? "" : png.errorString().toStdString());
}

void TvWindow::paint(uint8_t* pixels, int stride) {
    QImage image(pixels, kPageWidth, kPageHeight, stride, QImage::Format_RGB32);
    QPainter painter(&image);
    const QRect area = pageRectIn(size());
    painter.setRenderHint(QPainter::SmoothPixmapTransform);
    painter.scale(qreal(kPageWidth) / area.width(), qreal(kPageHeight) / area.height());
    render(&painter, -area.topLeft());
}

void TvWindow::open(const std::string& url, std::function<void(const std::string& error)> done) {
    const std::string error = loadError(url, m_userAgent.toStdString());
    if (error.empty()) {
        while (m_stack.top()) {
            remove(m_stack.top());
        }
        openApplication(QUrl(QString::fromStdString(url)));
    }
    done(error);
}

void TvWindow::reload(std::function<void(const std::string& error)> done) {
    ApplicationView* top = m_stack.top();
    const std::string error = loadError(top ? top->url().toString(QUrl::FullyEncoded).toStdString() : "",
                                        m_userAgent.toStdString());
    if (error.empty()) {
        for (ApplicationView* application : m_stack.all()) {
            application->reload();
        }
    }
    done(error);
}

std::vector<ScriptedWindow::RunningApplication> TvWindow::applications() const {
    std::vector<RunningApplication> running;
    for (const ApplicationView* application : m_stack.all()) {
        running.insert(running.begin(), {application->url().toString(QUrl::FullyEncoded).toStdString(),
                                         application->isShown() && application == m_stack.top()});
    }
    return running;
}

bool TvWindow::hasPicture() const {
    return m_videoPlane->hasFrame();
}

void TvWindow::remove(ApplicationView* application) {
    m_stack.remove(*application);
    // Deferred, because the call may come from a script of the application.
    application->deleteLater();
    updateTop();
}

void TvWindow::updateTop() {
    ApplicationView* top = m_stack.top();
    if (m_inspector) {
        m_inspector->setPage(top ? top->page() : nullptr);
    }
    if (!top) {
        return;
    }
    place(*top);
    top->setFocus();
}

void TvWindow::place(QWidget& view) const {
    view.setGeometry(pageRectIn(size()));
}

} // namespace desktop

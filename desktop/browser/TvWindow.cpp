// The main window: the video plane and, above it, a stack of applications.
#include "desktop/browser/TvWindow.h"

#include <QPalette>
#include <QWebFrame>
#include <QWebInspector>

#include <algorithm>

#include "desktop/browser/ApplicationPage.h"
#include "desktop/browser/ApplicationView.h"
#include "desktop/browser/LoadCheck.h"
#include "desktop/browser/PageFunctions.h"
#include "desktop/browser/PageGeometry.h"
#include "desktop/browser/VideoPlane.h"

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
    m_applications.clear();
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
    m_applications.append(application);
    updateTop();
    application->load(url);
}

bool TvWindow::createApplication(const ApplicationView& caller, const QUrl& url) {
    if (!has(caller) || !loadError(url, m_userAgent).isEmpty()) {
        return false;
    }
    openApplication(url);
    return true;
}

void TvWindow::destroyTopApplication(const ApplicationView& caller) {
    // The script of an application keeps running after its removal.
    if (has(caller)) {
        remove(m_applications.last());
    }
}

ApplicationView* TvWindow::topApplication() const {
    return m_applications.isEmpty() ? nullptr : m_applications.last();
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
    for (auto* application : m_applications) {
        place(*application);
    }
}

bool TvWindow::hasPicture() const {
    return m_videoPlane->hasFrame();
}

bool TvWindow::has(const ApplicationView& application) const {
    return std::find(m_applications.begin(), m_applications.end(), &application) != m_applications.end();
}

void TvWindow::remove(ApplicationView* application) {
    m_applications.removeOne(application);
    application->hide();
    // Deferred, because the call may come from a script of the application.
    application->deleteLater();
    updateTop();
}

void TvWindow::updateTop() {
    const int last = m_applications.size() - 1;
    for (int index = 0; index <= last; ++index) {
        m_applications[index]->setVisible(index == last);
    }
    ApplicationView* top = topApplication();
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

// The window: a stack of applications, the topmost on the screen.
#include "desktop/browser/TvWindow.h"

#include "desktop/browser/ApplicationPage.h"
#include "desktop/browser/ApplicationView.h"
#include "desktop/browser/LoadCheck.h"
#include "desktop/browser/PageFunctions.h"
#include "desktop/browser/PageGeometry.h"
#include "desktop/browser/PictureView.h"

#include <QPalette>
#include <QWebFrame>
#include <QWebInspector>

#include <algorithm>

TvWindow::TvWindow(const QString& userAgent) : m_userAgent(userAgent), m_picture(new PictureView(this)) {
    QPalette black = palette();
    black.setColor(QPalette::Window, Qt::black);
    setPalette(black);
    setWindowTitle(QStringLiteral("telix-tv"));
    resize(pageSize);
    place(*m_picture);
}

TvWindow::~TvWindow() {
    delete m_inspector;
    // What pages ask for while they end is no longer done.
    m_applications.clear();
    // Before the members that the pages use; those that have left the stack and wait for their end as well.
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
        if (!application->hasDocument())
            remove(application);
        emit loadFailed(application->applicationPage().failedUrl(), reason);
    });
    m_applications.append(application);
    bringUpTop();
    application->load(url);
}

bool TvWindow::createApplication(const ApplicationView& caller, const QUrl& url) {
    if (!has(caller) || !loadObstacle(url, m_userAgent).isEmpty())
        return false;
    openApplication(url);
    return true;
}

void TvWindow::destroyTopApplication(const ApplicationView& caller) {
    // An application that has left the stack may run to the end of its script.
    if (has(caller))
        remove(m_applications.last());
}

ApplicationView* TvWindow::topApplication() const {
    return m_applications.isEmpty() ? nullptr : m_applications.last();
}

void TvWindow::inspect() {
    m_inspector = new QWebInspector;
    m_inspector->setAttribute(Qt::WA_QuitOnClose, false);
    m_inspector->setWindowTitle(QStringLiteral("telix-tv inspector"));
    m_inspector->resize(pageSize);
    // It stays empty when it is shown before it has a page.
    bringUpTop();
    m_inspector->show();
}

void TvWindow::resizeEvent(QResizeEvent*) {
    place(*m_picture);
    for (auto* application : m_applications)
        place(*application);
}

bool TvWindow::hasPicture() const {
    return m_picture->hasPicture();
}

bool TvWindow::has(const ApplicationView& application) const {
    return std::find(m_applications.begin(), m_applications.end(), &application) != m_applications.end();
}

void TvWindow::remove(ApplicationView* application) {
    m_applications.removeOne(application);
    application->hide();
    // Later: a script of its own may be what asks for it.
    application->deleteLater();
    bringUpTop();
}

void TvWindow::bringUpTop() {
    const int last = m_applications.size() - 1;
    for (int index = 0; index <= last; ++index)
        m_applications[index]->setVisible(index == last);
    ApplicationView* top = topApplication();
    if (m_inspector)
        m_inspector->setPage(top ? top->page() : nullptr);
    if (!top)
        return;
    place(*top);
    top->setFocus();
}

void TvWindow::place(QWidget& view) const {
    view.setGeometry(pageAreaIn(size()));
}

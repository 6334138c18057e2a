// The main window: the video plane and, above it, a stack of applications.
#include "desktop/window/npapi/TvWindow.h"

#include <QAbstractEventDispatcher>
#include <QCoreApplication>
#include <QEvent>
#include <QFile>
#include <QImage>
#include <QKeyEvent>
#include <QPainter>
#include <QPalette>
#include <QPixmap>
#include <QTimer>
#include <QWebFrame>
#include <QWebInspector>

#include <algorithm>

#include "desktop/window/npapi/ApplicationPage.h"
#include "desktop/window/npapi/ApplicationView.h"
#include "desktop/window/npapi/OnScreenDisplay.h"
#include "desktop/window/npapi/PageFunctions.h"
#include "desktop/window/npapi/PageGeometry.h"
#include "desktop/window/npapi/PageScript.h"
#include "desktop/window/npapi/VideoPlane.h"
#include "desktop/window/shared/CommandLine.h"
#include "desktop/window/shared/Diagnostics.h"
#include "desktop/window/shared/LoadCheck.h"
#include "desktop/window/shared/MainLoopTimer.h"
#include "desktop/window/shared/Referer.h"

namespace desktop {

namespace {

// The one that is on at first.
constexpr uint32_t kFirstChannel = 1;

QEvent::Type signallingEvent() {
    static const auto kType = static_cast<QEvent::Type>(QEvent::registerEventType());
    return kType;
}

Warnings::Page pageOf(const ApplicationView& application) {
    return {&application, application.url().toString(QUrl::FullyEncoded).toStdString()};
}

QUrl urlOf(const std::string& url) {
    return QUrl(QString::fromStdString(url));
}

} // namespace

TvWindow::TvWindow(const CommandLine& commandLine)
    : m_requestOptions(commandLine.requestOptions()),
      m_isStrict(commandLine.isStrict), m_start{commandLine.channel, commandLine.signalUrl,
                                                std::max(commandLine.channel, kFirstChannel)},
      m_videoPlane(new VideoPlane(this)), m_display(new OnScreenDisplay(this)),
      m_television(
          libraryCalls(), stackCalls(),
          [this](const std::string& text) { m_display->show(QString::fromStdString(text)); },
          mainLoopTimer()),
      m_network(commandLine.ignoresCertificateErrors), m_mediaRequests(mediaBrowser()) {
    signallingEvent();
    m_library.loadBeside(commandLine.plugin);
    // The plug-in loads another library during a call of a page on this thread, so the event loop runs after
    // it.
    m_searchConnection = connect(QAbstractEventDispatcher::instance(),
                                 &QAbstractEventDispatcher::aboutToBlock, this, &TvWindow::startTelevision);
    QPalette black = palette();
    black.setColor(QPalette::Window, Qt::black);
    setPalette(black);
    setWindowTitle(QStringLiteral("telix-tv"));
    resize(kPageSize);
    place(*m_videoPlane);
    place(*m_display);
    startTelevision();
}

TvWindow::~TvWindow() {
    m_library.stop();
    delete m_inspector;
    // Calls of pages during their teardown are ignored, because their applications are not in the stack.
    m_stack.clear();
    // Pages are destroyed before the members that they use, also those that wait for deleteLater().
    qDeleteAll(findChildren<ApplicationView*>());
}

ApplicationView& TvWindow::openApplication(const QUrl& url) {
    ApplicationView& application = push();
    application.load(url);
    return application;
}

ApplicationView& TvWindow::push() {
    auto* application = new ApplicationView(
        QString::fromStdString(m_requestOptions.userAgent),
        [this] { return m_library.find() ? m_library.keySet() : kAllPageKeys; }, this);
    auto* page = &application->applicationPage();
    page->setNetworkAccessManager(&m_network);
    const auto addFunctions = [this, application](QWebFrame* frame) {
        new PageFunctions(*frame, *application, *this);
    };
    // Emitted for every new window object, and before its scripts run.
    connect(page->mainFrame(), &QWebFrame::javaScriptWindowObjectCleared, this,
            [this, application] { m_television.warnings().forget(application); });
    addFunctions(page->mainFrame());
    connect(page, &QWebPage::frameCreated, this, addFunctions);
    connect(application, &ApplicationView::loadFailed, this, [this, application](const QString& reason) {
        onLoadFailed(*application, application->applicationPage().failedUrl(), reason);
    });
    connect(application, &ApplicationView::televisionKey, this,
            [this, application](const RemoteKey& key) { m_television.onKey(key, pageOf(*application)); });
    m_stack.push(*application);
    updateTop();
    return *application;
}

void TvWindow::onLoadFailed(ApplicationView& application, const QUrl& url, const QString& reason) {
    if (!application.hasDocument()) {
        if (m_television.applications().onLoadFailed(&application)) {
            printError("cannot load " + url.toDisplayString().toStdString() + ": " + reason.toStdString());
            return;
        }
        remove(&application);
    }
    emit loadFailed(url, reason);
}

// Checked on a later turn of the event loop, because the engine would show the page with which a server
// reports an error.
ApplicationView& TvWindow::openSignalled(const std::string& url) {
    ApplicationView& application = push();
    auto* later = new QTimer(&application);
    later->setSingleShot(true);
    connect(later, &QTimer::timeout, this, [this, &application, url] {
        const std::string error = loadError(url, m_requestOptions);
        if (!m_stack.has(application)) {
            return;
        }
        if (error.empty()) {
            application.load(urlOf(url));
        } else {
            onLoadFailed(application, urlOf(url), QString::fromStdString(error));
        }
    });
    later->start(0);
    return application;
}

bool TvWindow::createApplication(const ApplicationView& caller, const QUrl& url) {
    const std::string address = url.toString(QUrl::FullyEncoded).toStdString();
    const auto report = [&address](const std::string& reason) {
        printError("cannot load " + address + ": " + reason);
    };
    if (!m_stack.has(caller) || !m_stack.hasSpace(report)) {
        return false;
    }
    const ApplicationTarget target = findTarget(address);
    if (!target.error.empty()) {
        warn(caller, Warning::NotCreated, address + ": " + target.error);
        return false;
    }
    openTarget(target);
    return true;
}

ApplicationTarget TvWindow::findTarget(const std::string& url) {
    ApplicationTarget target =
        findApplication(url, m_requestOptions, m_television.applications().signalling().applications);
    warnOfSkipped(target, url, m_television.warnings());
    return target;
}

void TvWindow::warn(const ApplicationView& application, Warning warning, const std::string& subject) {
    // Without strictness the adapter of the plug-in gives each element an id.
    const bool isCured = warning == Warning::NoId && !m_isStrict;
    if (!isCured && m_stack.has(application)) {
        m_television.warnings().print(pageOf(application), warning, subject);
    }
}

void TvWindow::warn(const std::string& page, Warning warning, const std::string& subject) {
    for (const ApplicationView* each : m_stack.all()) {
        if (pageOf(*each).url == page) {
            m_television.warnings().print(pageOf(*each), warning, subject);
            return;
        }
    }
}

void TvWindow::openTarget(const ApplicationTarget& target) {
    const ApplicationView& opened = openApplication(urlOf(target.url));
    if (target.signalled) {
        m_television.applications().onOpened(&opened, *target.signalled);
    }
}

void TvWindow::destroyApplication(ApplicationView& caller) {
    // The script of an application keeps running after its removal.
    if (m_stack.has(caller)) {
        remove(&caller);
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
    place(*m_display);
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
    } else {
        m_television.onKey(key);
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
    const ApplicationTarget target = findTarget(url);
    if (target.error.empty()) {
        while (m_stack.top()) {
            remove(m_stack.top());
        }
        openTarget(target);
    }
    done(target.error);
}

void TvWindow::reload(std::function<void(const std::string& error)> done) {
    ApplicationView* top = m_stack.top();
    const std::string error =
        loadError(top ? top->url().toString(QUrl::FullyEncoded).toStdString() : "", m_requestOptions);
    if (error.empty()) {
        for (ApplicationView* application : m_stack.all()) {
            application->reload();
        }
    }
    done(error);
}

std::vector<ScriptedWindow::RunningApplication> TvWindow::applications() const {
    std::vector<RunningApplication> running;
    for (const ApplicationView* each : m_stack.all()) {
        running.insert(running.begin(),
                       {each->url().toString(QUrl::FullyEncoded).toStdString(),
                        m_television.applications().idOf(each), each->isVisible() && each->isShown()});
    }
    return running;
}

bool TvWindow::hasPicture() const {
    return m_videoPlane->hasFrame();
}

void TvWindow::remove(ApplicationView* application) {
    m_stack.remove(*application);
    m_television.onEnded(application);
    // Deferred, because the call may come from a script of the application.
    application->deleteLater();
    updateTop();
}

// The application and those above it.
void TvWindow::removeFrom(const ApplicationView& lowest) {
    while (m_stack.has(lowest)) {
        remove(m_stack.top());
    }
}

// ---- The television

void TvWindow::startTelevision() {
    if (!m_library.find()) {
        return;
    }
    disconnect(m_searchConnection);
    const std::string error = m_library.start(m_start, onWakeup, this);
    if (!error.empty()) {
        printError(error);
    }
}

// Called on threads of the platform library.
void TvWindow::onWakeup(void* window) {
    auto* self = static_cast<TvWindow*>(window);
    if (!self->m_wakeupPosted.exchange(true)) {
        QCoreApplication::postEvent(self, new QEvent(signallingEvent()));
    }
}

bool TvWindow::event(QEvent* event) {
    if (event->type() != signallingEvent()) {
        return QWidget::event(event);
    }
    // Reset before the signalling is read, so that a change meanwhile posts another event.
    m_wakeupPosted = false;
    m_television.onSignalling(m_library.signalling());
    return true;
}

// Without an application the window has the focus.
void TvWindow::keyPressEvent(QKeyEvent* event) {
    if (const RemoteKey* key = remoteKeyOf(*event)) {
        m_television.onKey(*key);
    }
}

bool TvWindow::isIdle() const {
    return !m_stack.top() && m_television.applications().signalling().state == TELIX_DESKTOP_SIGNALLING_KNOWN;
}

Television::Library TvWindow::libraryCalls() {
    const auto report = [this](const Television::OnChannel& done) {
        const TelevisionLibrary::Channel channel = m_library.channel();
        done(channel.number, channel.name);
    };
    Television::Library calls;
    calls.tune = [this, report](uint32_t number, const Television::OnChannel& done) {
        if (m_library.find()) {
            m_library.tune(number);
            report(done);
        }
    };
    calls.step = [this, report](int positions, const Television::OnChannel& done) {
        if (m_library.find()) {
            m_library.step(positions);
            report(done);
        }
    };
    calls.setVolume = [this](uint32_t volume) {
        if (m_library.find()) {
            m_library.setVolume(volume);
        }
    };
    return calls;
}

SignalledApplications::Window TvWindow::stackCalls() {
    SignalledApplications::Window calls;
    calls.hasApplication = [this] { return hasApplication(); };
    calls.open = [this](const std::string& url) { return &openSignalled(url); };
    calls.end = [this](SignalledApplications::Application application) {
        removeFrom(*static_cast<const ApplicationView*>(application));
    };
    calls.endAll = [this] {
        if (!m_stack.all().empty()) {
            removeFrom(*m_stack.all().front());
        }
    };
    return calls;
}

// Media is played for the topmost application, with the engine's rules for what a page embeds.
MediaRequests::Browser TvWindow::mediaBrowser() {
    MediaRequests::Browser browser;
    browser.onRequest = [this](const std::string& url, const MediaRequests::Identify& identify) {
        const ApplicationView* top = m_stack.top();
        const std::string page = top ? top->url().toString(QUrl::FullyEncoded).toStdString() : "";
        identify({m_requestOptions.userAgent, refererOf(page, url, ReferrerPolicy::NoReferrerWhenDowngrade),
                  m_network.cookiesFor(url), m_requestOptions.ignoresCertificateErrors});
    };
    browser.onCookie = [this](const std::string& url, const std::string& cookie) {
        m_network.storeCookie(url, cookie);
    };
    return browser;
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

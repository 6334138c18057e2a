// Checks whether a page can be loaded before the engine loads it.
#include "desktop/browser/LoadCheck.h"

#include <QEventLoop>
#include <QFileInfo>
#include <QNetworkAccessManager>
#include <QNetworkReply>
#include <QThread>
#include <QTimer>

#include <memory>

namespace desktop {

namespace {

const int kServerTimeoutMs = 5000;
const int kFirstHttpError = 400;

int httpStatus(const QNetworkReply& reply) {
    return reply.attribute(QNetworkRequest::HttpStatusCodeAttribute).toInt();
}

// Sends a GET and aborts it after the response headers, because many servers reject HEAD.
QString requestPage(const QUrl& url, const QString& userAgent) {
    QNetworkAccessManager network;
    QNetworkRequest request(url);
    request.setHeader(QNetworkRequest::UserAgentHeader, userAgent);
    request.setAttribute(QNetworkRequest::RedirectPolicyAttribute, QNetworkRequest::NoLessSafeRedirectPolicy);
    const std::unique_ptr<QNetworkReply> reply(network.get(request));

    QEventLoop loop;
    QObject::connect(reply.get(), &QNetworkReply::finished, &loop, &QEventLoop::quit);
    QObject::connect(reply.get(), &QNetworkReply::readyRead, &loop, &QEventLoop::quit);
    QTimer timeout;
    QObject::connect(&timeout, &QTimer::timeout, &loop, &QEventLoop::quit);
    timeout.start(kServerTimeoutMs);
    loop.exec();

    if (httpStatus(*reply) >= kFirstHttpError) {
        return QStringLiteral("HTTP status %1").arg(httpStatus(*reply));
    }
    if (reply->error() != QNetworkReply::NoError) {
        return reply->errorString();
    }
    if (httpStatus(*reply) == 0) {
        return QStringLiteral("the server does not respond");
    }
    return {};
}

} // namespace

QString loadError(const QUrl& url, const QString& userAgent) {
    if (!url.isValid()) {
        return QStringLiteral("malformed URL");
    }
    if (url.isLocalFile()) {
        const QFileInfo file(url.toLocalFile());
        if (!file.exists()) {
            return QStringLiteral("No such file");
        }
        if (!file.isFile()) {
            return QStringLiteral("not a file");
        }
        return file.isReadable() ? QString() : QStringLiteral("not readable");
    }
    if (url.scheme() == QLatin1String("data") || url.scheme() == QLatin1String("about")) {
        return {};
    }
    if (url.scheme() != QLatin1String("http") && url.scheme() != QLatin1String("https")) {
        return QStringLiteral("unsupported URL scheme");
    }

    // On another thread, because an event loop on this one would also run events of the page: a page that is
    // in the middle of a call must not be reentered or destroyed.
    QString error;
    const std::unique_ptr<QThread> thread(QThread::create([&] { error = requestPage(url, userAgent); }));
    thread->start();
    thread->wait();
    return error;
}

} // namespace desktop

// Whether a page can be loaded, found out before it is asked for.
#include "desktop/browser/LoadCheck.h"

#include <QEventLoop>
#include <QFileInfo>
#include <QNetworkAccessManager>
#include <QNetworkReply>
#include <QThread>
#include <QTimer>

#include <memory>

namespace {

const int serverLimitMilliseconds = 5000;
const int firstHttpError = 400;

int httpStatus(const QNetworkReply& reply) {
    return reply.attribute(QNetworkRequest::HttpStatusCodeAttribute).toInt();
}

// Asks for the page itself and leaves after the head of the answer, since many a server refuses to give only
// a head.
QString askServer(const QUrl& url, const QString& userAgent) {
    QNetworkAccessManager network;
    QNetworkRequest request(url);
    request.setHeader(QNetworkRequest::UserAgentHeader, userAgent);
    request.setAttribute(QNetworkRequest::RedirectPolicyAttribute, QNetworkRequest::NoLessSafeRedirectPolicy);
    const std::unique_ptr<QNetworkReply> reply(network.get(request));

    QEventLoop loop;
    QObject::connect(reply.get(), &QNetworkReply::finished, &loop, &QEventLoop::quit);
    QObject::connect(reply.get(), &QNetworkReply::readyRead, &loop, &QEventLoop::quit);
    QTimer limit;
    QObject::connect(&limit, &QTimer::timeout, &loop, &QEventLoop::quit);
    limit.start(serverLimitMilliseconds);
    loop.exec();

    if (httpStatus(*reply) >= firstHttpError)
        return QStringLiteral("the server answers %1").arg(httpStatus(*reply));
    if (reply->error() != QNetworkReply::NoError)
        return reply->errorString();
    if (httpStatus(*reply) == 0)
        return QStringLiteral("the server does not answer");
    return {};
}

} // namespace

QString loadObstacle(const QUrl& url, const QString& userAgent) {
    if (!url.isValid())
        return QStringLiteral("the address is malformed");
    if (url.isLocalFile()) {
        const QFileInfo file(url.toLocalFile());
        if (!file.exists())
            return QStringLiteral("there is no such file");
        return file.isFile() && file.isReadable() ? QString() : QStringLiteral("the file can't be read");
    }
    if (url.scheme() == QLatin1String("data") || url.scheme() == QLatin1String("about"))
        return {};
    if (url.scheme() != QLatin1String("http") && url.scheme() != QLatin1String("https"))
        return QStringLiteral("addresses of this kind are unknown");

    // On a thread of its own, so that waiting for the answer runs nothing else on this one: a page that is in
    // the middle of a call must not be entered again or destroyed meanwhile.
    QString obstacle;
    const std::unique_ptr<QThread> thread(QThread::create([&] { obstacle = askServer(url, userAgent); }));
    thread->start();
    thread->wait();
    return obstacle;
}

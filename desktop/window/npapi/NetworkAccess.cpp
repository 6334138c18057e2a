// The network access of pages: the engine's, with support for the documents of televisions, and with its
// cookies for what is requested elsewhere.
#include "desktop/window/npapi/NetworkAccess.h"

#include <QNetworkCookie>
#include <QNetworkCookieJar>

#include "desktop/window/npapi/DocumentReply.h"

namespace desktop {

namespace {

QUrl urlFrom(const std::string& url) {
    return QUrl::fromEncoded(QByteArray::fromStdString(url));
}

} // namespace

std::string NetworkAccess::cookiesFor(const std::string& url) const {
    QByteArrayList cookies;
    for (const QNetworkCookie& each : cookieJar()->cookiesForUrl(urlFrom(url))) {
        cookies.append(each.toRawForm(QNetworkCookie::NameAndValueOnly));
    }
    return cookies.join("; ").toStdString();
}

void NetworkAccess::storeCookie(const std::string& url, const std::string& cookie) {
    cookieJar()->setCookiesFromUrl(QNetworkCookie::parseCookies(QByteArray::fromStdString(cookie)),
                                   urlFrom(url));
}

QNetworkReply* NetworkAccess::createRequest(Operation operation, const QNetworkRequest& request,
                                            QIODevice* outgoingData) {
    QNetworkReply* reply = QNetworkAccessManager::createRequest(operation, request, outgoingData);
    if (m_ignoresCertificateErrors) {
        reply->ignoreSslErrors();
    }
    return DocumentReply::mayBeDocument(request) ? new DocumentReply(reply, this) : reply;
}

} // namespace desktop

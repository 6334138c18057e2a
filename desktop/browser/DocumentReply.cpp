// The answer to a request for a document, with the type of television documents changed to the one that the
// engine knows.
#include "desktop/browser/DocumentReply.h"

#include <QFileInfo>

namespace {

const char televisionType[] = "application/vnd.hbbtv.xhtml+xml";
const char knownType[] = "application/xhtml+xml";

// The value of the header with the type changed; what follows the type, as the character set, stays.
QByteArray inKnownTerms(const QByteArray& contentType) {
    const int separator = contentType.indexOf(';');
    const int end = separator < 0 ? contentType.size() : separator;
    if (contentType.left(end).trimmed().toLower() != televisionType)
        return contentType;
    return knownType + contentType.mid(end);
}

// Files have no type but their names.
bool isTelevisionFile(const QUrl& url) {
    return url.isLocalFile() &&
           QFileInfo(url.toLocalFile()).suffix().compare(QLatin1String("hbbtv"), Qt::CaseInsensitive) == 0;
}

} // namespace

bool DocumentReply::isNeededFor(const QNetworkRequest& request) {
    // The engine asks a server so for what goes into a window or a frame, and for nothing else.
    return request.rawHeader("Accept").contains(knownType) || isTelevisionFile(request.url());
}

DocumentReply::DocumentReply(QNetworkReply* reply, QObject* parent) : QNetworkReply(parent), m_reply(reply) {
    // The manager ends all replies among its descendants, one by one: it must not meet this one twice.
    reply->setParent(nullptr);
    setOperation(reply->operation());
    setRequest(reply->request());
    setUrl(reply->url());
    takeHead();

    connect(reply, &QNetworkReply::metaDataChanged, this, [this] {
        takeHead();
        emit metaDataChanged();
    });
    connect(reply, &QIODevice::readyRead, this, &QIODevice::readyRead);
    connect(reply, &QIODevice::readChannelFinished, this, &QIODevice::readChannelFinished);
    connect(reply, &QNetworkReply::uploadProgress, this, &QNetworkReply::uploadProgress);
    connect(reply, &QNetworkReply::downloadProgress, this, &QNetworkReply::downloadProgress);
    connect(reply, &QNetworkReply::encrypted, this, &QNetworkReply::encrypted);
    connect(reply, &QNetworkReply::sslErrors, this, &QNetworkReply::sslErrors);
    connect(reply, &QNetworkReply::errorOccurred, this, [this](NetworkError code) {
        setError(code, m_reply->errorString());
        emit errorOccurred(code);
    });
    connect(reply, &QNetworkReply::finished, this, &DocumentReply::onFinished);
    open(QIODevice::ReadOnly | QIODevice::Unbuffered);
}

void DocumentReply::close() {
    QNetworkReply::close();
    m_reply->close();
}

qint64 DocumentReply::bytesAvailable() const {
    return QNetworkReply::bytesAvailable() + m_reply->bytesAvailable();
}

void DocumentReply::setReadBufferSize(qint64 size) {
    QNetworkReply::setReadBufferSize(size);
    m_reply->setReadBufferSize(size);
}

qint64 DocumentReply::readData(char* data, qint64 maxSize) {
    return m_reply->read(data, maxSize);
}

void DocumentReply::takeHead() {
    setUrl(m_reply->url());
    for (const auto attribute :
         {QNetworkRequest::HttpStatusCodeAttribute, QNetworkRequest::HttpReasonPhraseAttribute,
          QNetworkRequest::RedirectionTargetAttribute, QNetworkRequest::ConnectionEncryptedAttribute,
          QNetworkRequest::SourceIsFromCacheAttribute, QNetworkRequest::OriginalContentLengthAttribute})
        setAttribute(attribute, m_reply->attribute(attribute));
    for (const auto& header : m_reply->rawHeaderPairs()) {
        const bool isType = header.first.compare("content-type", Qt::CaseInsensitive) == 0;
        setRawHeader(header.first, isType ? inKnownTerms(header.second) : header.second);
    }
    if (isTelevisionFile(url()))
        setRawHeader("Content-Type", knownType);
}

void DocumentReply::onFinished() {
    takeHead();
    setFinished(true);
    emit finished();
}

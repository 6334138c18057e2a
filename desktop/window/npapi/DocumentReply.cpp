// The response to a request for a document, with the content types of televisions replaced by the XHTML type,
// which the engine supports.
#include "desktop/window/npapi/DocumentReply.h"

#include <algorithm>
#include <iterator>

#include "desktop/window/shared/DocumentTypes.h"

namespace desktop {

namespace {

const char kXhtmlType[] = "application/xhtml+xml";

// The header's value with the type replaced; parameters such as the charset stay.
QByteArray withEngineType(const QByteArray& contentType) {
    const int separator = contentType.indexOf(';');
    const int end = separator < 0 ? contentType.size() : separator;
    if (!isTelevisionType(contentType.left(end).trimmed().constData())) {
        return contentType;
    }
    return kXhtmlType + contentType.mid(end);
}

// A file has no content type; its name decides.
bool isTelevisionFile(const QUrl& url) {
    const QString file = url.isLocalFile() ? url.toLocalFile() : QString();
    return std::any_of(std::begin(kDocumentTypes), std::end(kDocumentTypes),
                       [&file](const DocumentType& type) {
                           return file.endsWith(QLatin1String(type.suffix), Qt::CaseInsensitive);
                       });
}

} // namespace

bool DocumentReply::mayBeDocument(const QNetworkRequest& request) {
    // The engine sends this type in Accept only when it loads a document into a window or frame.
    return request.rawHeader("Accept").contains(kXhtmlType) || isTelevisionFile(request.url());
}

DocumentReply::DocumentReply(QNetworkReply* reply, QObject* parent) : QNetworkReply(parent), m_reply(reply) {
    // The manager destroys all replies among its children; the wrapped one is destroyed by this one only.
    reply->setParent(nullptr);
    setOperation(reply->operation());
    setRequest(reply->request());
    setUrl(reply->url());
    copyHeaders();

    connect(reply, &QNetworkReply::metaDataChanged, this, [this] {
        copyHeaders();
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

void DocumentReply::copyHeaders() {
    setUrl(m_reply->url());
    for (const auto attribute :
         {QNetworkRequest::HttpStatusCodeAttribute, QNetworkRequest::HttpReasonPhraseAttribute,
          QNetworkRequest::RedirectionTargetAttribute, QNetworkRequest::ConnectionEncryptedAttribute,
          QNetworkRequest::SourceIsFromCacheAttribute, QNetworkRequest::OriginalContentLengthAttribute}) {
        setAttribute(attribute, m_reply->attribute(attribute));
    }
    for (const auto& header : m_reply->rawHeaderPairs()) {
        const bool isType = header.first.compare("content-type", Qt::CaseInsensitive) == 0;
        setRawHeader(header.first, isType ? withEngineType(header.second) : header.second);
    }
    if (isTelevisionFile(url())) {
        setRawHeader("Content-Type", kXhtmlType);
    }
}

void DocumentReply::onFinished() {
    copyHeaders();
    setFinished(true);
    emit finished();
}

} // namespace desktop

// The network access of pages: the engine's, with support for the documents of televisions.
#include "desktop/window/npapi/NetworkAccess.h"

#include "desktop/window/npapi/DocumentReply.h"

namespace desktop {

QNetworkReply* NetworkAccess::createRequest(Operation operation, const QNetworkRequest& request,
                                            QIODevice* outgoingData) {
    QNetworkReply* reply = QNetworkAccessManager::createRequest(operation, request, outgoingData);
    if (m_ignoresCertificateErrors) {
        reply->ignoreSslErrors();
    }
    return DocumentReply::mayBeDocument(request) ? new DocumentReply(reply, this) : reply;
}

} // namespace desktop

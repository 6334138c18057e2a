// The network access of pages: the engine's, with support for the content type of HbbTV documents.
#include "desktop/browser/NetworkAccess.h"

#include "desktop/browser/DocumentReply.h"

namespace desktop {

QNetworkReply* NetworkAccess::createRequest(Operation operation, const QNetworkRequest& request,
                                            QIODevice* outgoingData) {
    QNetworkReply* reply = QNetworkAccessManager::createRequest(operation, request, outgoingData);
    return DocumentReply::mayBeDocument(request) ? new DocumentReply(reply, this) : reply;
}

} // namespace desktop

// How pages reach servers and files: as the engine does it, with the document type of television added.
#include "desktop/browser/NetworkAccess.h"

#include "desktop/browser/DocumentReply.h"

QNetworkReply* NetworkAccess::createRequest(Operation operation, const QNetworkRequest& request,
                                            QIODevice* outgoingData) {
    QNetworkReply* reply = QNetworkAccessManager::createRequest(operation, request, outgoingData);
    return DocumentReply::isNeededFor(request) ? new DocumentReply(reply, this) : reply;
}

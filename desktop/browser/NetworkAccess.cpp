// How pages reach servers and files: as the engine does it, with the document type of television added.
#include "desktop/browser/NetworkAccess.h"

#include "desktop/browser/DocumentReply.h"

namespace {

// The engine asks so for what goes into a window or a frame, and for nothing else.
bool asksForDocument(const QNetworkRequest& request) {
    return request.rawHeader("Accept").contains("application/xhtml+xml");
}

} // namespace

QNetworkReply* NetworkAccess::createRequest(Operation operation, const QNetworkRequest& request,
                                            QIODevice* outgoingData) {
    QNetworkReply* reply = QNetworkAccessManager::createRequest(operation, request, outgoingData);
    return asksForDocument(request) ? new DocumentReply(reply, this) : reply;
}

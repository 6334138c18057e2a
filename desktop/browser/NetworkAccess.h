// How pages reach servers and files: as the engine does it, with the document type of television added.
#ifndef TELIX_DESKTOP_BROWSER_NETWORKACCESS_H
#define TELIX_DESKTOP_BROWSER_NETWORKACCESS_H

#include <QNetworkAccessManager>

// The engine does not know `application/vnd.hbbtv.xhtml+xml` and would not show it. Documents of that type,
// and local files named *.hbbtv, are given to it as `application/xhtml+xml`; everything else is left as it
// is.
class NetworkAccess : public QNetworkAccessManager {
    Q_OBJECT

public:
    using QNetworkAccessManager::QNetworkAccessManager;

protected:
    QNetworkReply* createRequest(Operation operation, const QNetworkRequest& request,
                                 QIODevice* outgoingData) override;
};

#endif

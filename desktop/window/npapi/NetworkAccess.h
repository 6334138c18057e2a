// The network access of pages: the engine's, with support for the documents of televisions.
#ifndef TELIX_DESKTOP_WINDOW_NPAPI_NETWORKACCESS_H
#define TELIX_DESKTOP_WINDOW_NPAPI_NETWORKACCESS_H

#include <QNetworkAccessManager>

namespace desktop {

// The engine does not support the types of DocumentTypes.h. Documents of these types, and local files named
// like them, reach it as `application/xhtml+xml`; everything else is unchanged.
class NetworkAccess : public QNetworkAccessManager {
    Q_OBJECT

public:
    // `ignoresCertificateErrors`: whether servers may have any certificate.
    explicit NetworkAccess(bool ignoresCertificateErrors)
        : m_ignoresCertificateErrors(ignoresCertificateErrors) {}

protected:
    QNetworkReply* createRequest(Operation operation, const QNetworkRequest& request,
                                 QIODevice* outgoingData) override;

private:
    const bool m_ignoresCertificateErrors;
};

} // namespace desktop

#endif

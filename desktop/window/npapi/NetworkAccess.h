// The network access of pages: the engine's, with support for the documents of televisions, and with its
// cookies for what is requested elsewhere.
#ifndef TELIX_DESKTOP_WINDOW_NPAPI_NETWORKACCESS_H
#define TELIX_DESKTOP_WINDOW_NPAPI_NETWORKACCESS_H

#include <QNetworkAccessManager>

#include <string>

namespace desktop {

// The engine does not support the types of DocumentTypes.h. Documents of these types, and local files named
// like them, reach it as `application/xhtml+xml`; everything else is unchanged.
class NetworkAccess : public QNetworkAccessManager {
    Q_OBJECT

public:
    // `ignoresCertificateErrors`: whether servers may have any certificate.
    explicit NetworkAccess(bool ignoresCertificateErrors)
        : m_ignoresCertificateErrors(ignoresCertificateErrors) {}

    // The value of the header Cookie of a request, HttpOnly cookies included; empty for none.
    std::string cookiesFor(const std::string& url) const;
    // Stores the cookies that a response sets with the value of a header Set-Cookie, if it may.
    void storeCookie(const std::string& url, const std::string& cookie);

protected:
    QNetworkReply* createRequest(Operation operation, const QNetworkRequest& request,
                                 QIODevice* outgoingData) override;

private:
    const bool m_ignoresCertificateErrors;
};

} // namespace desktop

#endif

// The response to a request for a document, with the content types of televisions replaced by the XHTML type,
// which the engine supports.
#ifndef TELIX_DESKTOP_WINDOW_NPAPI_DOCUMENTREPLY_H
#define TELIX_DESKTOP_WINDOW_NPAPI_DOCUMENTREPLY_H

#include <QNetworkReply>

#include <memory>

namespace desktop {

// Forwards everything else of the wrapped reply unchanged.
class DocumentReply : public QNetworkReply {
    Q_OBJECT

public:
    // Whether the response to the request may be a document.
    static bool mayBeDocument(const QNetworkRequest& request);

    // Takes ownership of `reply`.
    DocumentReply(QNetworkReply* reply, QObject* parent);

    void abort() override { m_reply->abort(); }
    void close() override;
    bool isSequential() const override { return true; }
    qint64 bytesAvailable() const override;
    void setReadBufferSize(qint64 size) override;
    void ignoreSslErrors() override { m_reply->ignoreSslErrors(); }

protected:
    qint64 readData(char* data, qint64 maxSize) override;

private:
    void copyHeaders();
    void onFinished();

    std::unique_ptr<QNetworkReply> m_reply;
};

} // namespace desktop

#endif

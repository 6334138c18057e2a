// The answer to a request for a document, with the type of television documents changed to the one that the
// engine knows.
#ifndef TELIX_DESKTOP_BROWSER_DOCUMENTREPLY_H
#define TELIX_DESKTOP_BROWSER_DOCUMENTREPLY_H

#include <QNetworkReply>

#include <memory>

// Passes on everything that the reply within gives.
class DocumentReply : public QNetworkReply {
    Q_OBJECT

public:
    // Whether the reply to the request may be a document.
    static bool isNeededFor(const QNetworkRequest& request);

    // Owns `reply`.
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
    void takeHead();
    void onFinished();

    std::unique_ptr<QNetworkReply> m_reply;
};

#endif

// One HTTP request after another with libcurl, whose response is read in pieces.
#ifndef TELIX_DESKTOP_PLATFORM_HTTPCLIENT_H
#define TELIX_DESKTOP_PLATFORM_HTTPCLIENT_H

#include <curl/curl.h>

#include <atomic>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "desktop/platform/HttpIdentity.h"

namespace desktop {

// One thread at a time, but for interrupt() and resume(). A transfer runs inside of the calls alone, on the
// thread of the caller: nothing is left to run when the client is closed or deleted.
class HttpClient {
public:
    struct Request {
        std::string url;
        uint64_t begin = 0;          // of the bytes; requests a range if it is not 0 or if there is an end
        std::optional<uint64_t> end; // exclusive
        HttpIdentity identity;
    };

    struct Response {
        long status = 0;
        std::optional<uint64_t> size; // of the whole resource, in bytes
        bool acceptsByteRanges = false;
        std::string location;             // of a redirection: absolute URL
        std::vector<std::string> cookies; // values of Set-Cookie
    };

    enum class Result {
        Ok,
        End,         // the body has been read completely
        Interrupted, // nothing is lost: the call can be repeated
        Failed,      // with the reason in error()
    };

    HttpClient();
    ~HttpClient();
    HttpClient(const HttpClient&) = delete;
    HttpClient& operator=(const HttpClient&) = delete;

    // Begins a request, in the place of the former one. False if the URL or the system does not allow it.
    bool begin(const Request& request);

    // Blocks until the headers are there. The body of a response other than 2xx is not read. Timeout: 10
    // seconds without progress.
    Result readHeaders();
    const Response& response() const { return m_response; } // after readHeaders()

    // Appends the next bytes of the body, from Request::begin on, to `data`. Blocks until there are some,
    // with the same timeout.
    Result readBody(std::vector<uint8_t>& data);

    // Ends the request.
    void close();
    bool isOpen() const { return m_transfer != nullptr; }

    const std::string& error() const { return m_error; }

    // Makes calls that block return, and those to come, until resume(). Any thread.
    void interrupt();
    void resume() { m_isInterrupted = false; }
    bool isInterrupted() const { return m_isInterrupted; }

private:
    struct MultiCleanup {
        void operator()(CURLM* multi) const { curl_multi_cleanup(multi); }
    };
    struct Transfer;

    static size_t onData(char* data, size_t size, size_t count, void* client);
    template <typename Condition>
    Result runUntil(const Condition& isDone);
    void takeMessages();
    void readResponse();
    bool readContentRange(const std::string& value);
    std::string headerOf(const char* name) const;

    const std::unique_ptr<CURLM, MultiCleanup> m_multi; // keeps idle connections
    std::unique_ptr<Transfer> m_transfer;               // null: no request
    Request m_request;
    Response m_response;
    std::string m_error;
    std::vector<uint8_t> m_body; // received and not read yet
    uint64_t m_skipped = 0;      // bytes still to be dropped: the server has ignored the range
    bool m_hasHeaders = false;
    bool m_isPaused = false; // m_body is full
    bool m_isComplete = false;
    std::atomic<bool> m_isInterrupted{false};
};

} // namespace desktop

#endif

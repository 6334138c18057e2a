// HTTP with libcurl.
#include "desktop/platform/HttpClient.h"

#include <glib.h>

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <utility>

namespace desktop {

namespace {

constexpr size_t kMaxBody = size_t{256} << 10;      // bytes received and not read
constexpr long kBufferSize = 64 << 10;              // bytes that libcurl receives at once
constexpr auto kTimeout = std::chrono::seconds(10); // without progress
constexpr auto kMaxWait =
    std::chrono::milliseconds(500); // libcurl wakes up earlier if there is something to do
constexpr const char* kDefaultUserAgent = "HbbTV/1.2.1 (;;;;;) libtelix";

constexpr long kStatusPartialContent = 206;

bool isSuccess(long status) {
    return status >= 200 && status < 300;
}

// Pages may write characters into URLs that have to be encoded.
std::string encodedUrl(const std::string& url) {
    const std::unique_ptr<CURLU, void (*)(CURLU*)> parsed(curl_url(), curl_url_cleanup);
    char* encoded = nullptr;
    if (!parsed || curl_url_set(parsed.get(), CURLUPART_URL, url.c_str(), CURLU_URLENCODE) != CURLUE_OK ||
        curl_url_get(parsed.get(), CURLUPART_URL, &encoded, 0) != CURLUE_OK) {
        return "";
    }
    std::string result = encoded;
    curl_free(encoded);
    return result;
}

// Reads the digits at `text` and moves it after them.
std::optional<uint64_t> readNumber(const char*& text) {
    if (!g_ascii_isdigit(*text)) {
        return std::nullopt;
    }
    gchar* end = nullptr;
    const uint64_t number = g_ascii_strtoull(text, &end, 10);
    text = end;
    return number;
}

} // namespace

// The handle of a request, in the multi handle as long as it exists.
struct HttpClient::Transfer {
    explicit Transfer(CURLM* multi) : multi(multi), easy(curl_easy_init()) {}
    ~Transfer() {
        curl_multi_remove_handle(multi, easy);
        curl_easy_cleanup(easy);
    }
    Transfer(const Transfer&) = delete;
    Transfer& operator=(const Transfer&) = delete;

    template <typename Value>
    void set(CURLoption option, Value value) {
        isValid = isValid && curl_easy_setopt(easy, option, value) == CURLE_OK;
    }
    // An empty string leaves libcurl's default.
    void setString(CURLoption option, const std::string& value) {
        if (!value.empty()) {
            set(option, value.c_str()); // libcurl copies it
        }
    }

    CURLM* multi;
    CURL* easy;
    bool isValid = true;
    char errorText[CURL_ERROR_SIZE] = "";
};

HttpClient::HttpClient() : m_multi(curl_multi_init()) {}

HttpClient::~HttpClient() {
    close();
}

bool HttpClient::begin(const Request& request) {
    close();
    m_request = request;
    m_transfer = std::make_unique<Transfer>(m_multi.get());
    Transfer& transfer = *m_transfer;
    const HttpIdentity& identity = request.identity;
    transfer.set(CURLOPT_URL, encodedUrl(request.url).c_str());
    transfer.set(CURLOPT_PROTOCOLS_STR, "http,https");
    transfer.set(CURLOPT_NOSIGNAL, 1L);
    transfer.set(CURLOPT_QUICK_EXIT, 1L); // does not wait for a name that is being resolved
    transfer.set(CURLOPT_CONNECTTIMEOUT_MS, static_cast<long>(std::chrono::milliseconds(kTimeout).count()));
    transfer.set(CURLOPT_BUFFERSIZE, kBufferSize);
    transfer.set(CURLOPT_ERRORBUFFER, transfer.errorText);
    transfer.set(CURLOPT_WRITEFUNCTION, onData);
    transfer.set(CURLOPT_WRITEDATA, this);
    transfer.setString(CURLOPT_USERAGENT,
                       identity.userAgent.empty() ? kDefaultUserAgent : identity.userAgent);
    transfer.setString(CURLOPT_REFERER, identity.referer);
    transfer.setString(CURLOPT_COOKIE, identity.cookies);
    transfer.setString(CURLOPT_CAINFO, identity.certificates);
    if (!identity.certificates.empty() || identity.acceptsAnyCertificate) {
        transfer.set(CURLOPT_CAPATH, static_cast<const char*>(nullptr)); // not the system's as well
    }
    transfer.set(CURLOPT_SSL_VERIFYPEER, identity.acceptsAnyCertificate ? 0L : 1L);
    transfer.set(CURLOPT_SSL_VERIFYHOST, identity.acceptsAnyCertificate ? 0L : 2L);
    if (request.begin > 0 || request.end) {
        const std::string last = request.end ? std::to_string(*request.end - 1) : "";
        transfer.setString(CURLOPT_RANGE, std::to_string(request.begin) + "-" + last);
    }
    if (!transfer.isValid || curl_multi_add_handle(m_multi.get(), transfer.easy) != CURLM_OK) {
        m_error = "invalid URL";
        m_transfer.reset();
        return false;
    }
    return true;
}

void HttpClient::close() {
    m_transfer.reset();
    m_response = {};
    m_error.clear();
    m_body.clear();
    m_skipped = 0;
    m_hasHeaders = false;
    m_isPaused = false;
    m_isComplete = false;
}

HttpClient::Result HttpClient::readHeaders() {
    return runUntil([this] { return m_hasHeaders; });
}

HttpClient::Result HttpClient::readBody(std::vector<uint8_t>& data) {
    const Result result = runUntil([this] { return !m_body.empty() || m_isComplete; });
    if (result != Result::Ok) {
        return result;
    }
    if (m_body.empty()) {
        return Result::End;
    }
    data.insert(data.end(), m_body.begin(), m_body.end());
    m_body.clear();
    return Result::Ok;
}

// Lets libcurl work until the condition holds.
template <typename Condition>
HttpClient::Result HttpClient::runUntil(const Condition& isDone) {
    using Clock = std::chrono::steady_clock;
    auto end = Clock::now() + kTimeout;
    curl_off_t progress = 0;
    while (true) {
        if (m_isInterrupted) {
            return Result::Interrupted;
        }
        if (isDone()) {
            return Result::Ok;
        }
        if (!m_transfer || !m_error.empty()) {
            return Result::Failed;
        }
        if (std::exchange(m_isPaused, false)) {
            curl_easy_pause(m_transfer->easy, CURLPAUSE_CONT);
        }
        int running = 0;
        curl_multi_perform(m_multi.get(), &running);
        takeMessages();
        if (isDone() || !m_error.empty()) {
            continue;
        }
        curl_off_t received = 0;
        curl_easy_getinfo(m_transfer->easy, CURLINFO_SIZE_DOWNLOAD_T, &received);
        if (std::exchange(progress, received) != received) {
            end = Clock::now() + kTimeout;
        } else if (Clock::now() > end) {
            m_error = "timeout";
            continue;
        }
        curl_multi_poll(m_multi.get(), nullptr, 0, static_cast<int>(kMaxWait.count()), nullptr);
    }
}

// Looks whether the transfer has ended.
void HttpClient::takeMessages() {
    int left = 0;
    while (const CURLMsg* message = curl_multi_info_read(m_multi.get(), &left)) {
        if (message->msg != CURLMSG_DONE) {
            continue;
        }
        const CURLcode code = message->data.result;
        if (!m_hasHeaders && code == CURLE_OK) {
            readResponse(); // without a body
        }
        const bool isRefused = m_hasHeaders && !isSuccess(m_response.status); // onData() has ended it
        if (code == CURLE_OK || (isRefused && code == CURLE_WRITE_ERROR)) {
            m_isComplete = true;
        } else if (m_error.empty()) {
            m_error = m_transfer->errorText[0] ? m_transfer->errorText : curl_easy_strerror(code);
        }
    }
}

size_t HttpClient::onData(char* data, size_t size, size_t count, void* client) {
    (void)size; // 1
    auto* self = static_cast<HttpClient*>(client);
    if (!self->m_hasHeaders) {
        self->readResponse();
    }
    if (!isSuccess(self->m_response.status) || !self->m_error.empty()) {
        return CURL_WRITEFUNC_ERROR; // ends the transfer
    }
    if (self->m_body.size() >= kMaxBody) {
        self->m_isPaused = true;
        return CURL_WRITEFUNC_PAUSE;
    }
    const size_t dropped = std::min<uint64_t>(self->m_skipped, count);
    self->m_skipped -= dropped;
    self->m_body.insert(self->m_body.end(), data + dropped, data + count);
    return count;
}

void HttpClient::readResponse() {
    m_hasHeaders = true;
    CURL* easy = m_transfer->easy;
    curl_easy_getinfo(easy, CURLINFO_RESPONSE_CODE, &m_response.status);
    m_response.acceptsByteRanges = g_ascii_strcasecmp(headerOf("Accept-Ranges").c_str(), "bytes") == 0 ||
                                   m_response.status == kStatusPartialContent;
    const char* location = nullptr;
    curl_easy_getinfo(easy, CURLINFO_REDIRECT_URL, &location);
    m_response.location = location ? location : "";
    curl_header* header = nullptr;
    for (size_t index = 0;
         curl_easy_header(easy, "Set-Cookie", index, CURLH_HEADER, -1, &header) == CURLHE_OK; ++index) {
        m_response.cookies.emplace_back(header->value);
    }
    if (m_response.status == kStatusPartialContent) {
        if (!readContentRange(headerOf("Content-Range"))) {
            m_error = "the server has sent another range";
        }
        return;
    }
    curl_off_t length = -1;
    curl_easy_getinfo(easy, CURLINFO_CONTENT_LENGTH_DOWNLOAD_T, &length);
    if (length >= 0) {
        m_response.size = static_cast<uint64_t>(length);
    }
    m_skipped = m_request.begin;
}

// "bytes FIRST-LAST/SIZE", with * for an unknown size (RFC 9110, section 14.4). False if it is not the range
// that was requested.
bool HttpClient::readContentRange(const std::string& value) {
    const char* text = value.c_str();
    if (g_ascii_strncasecmp(text, "bytes ", std::strlen("bytes ")) != 0) {
        return false;
    }
    text += std::strlen("bytes ");
    const auto first = readNumber(text);
    const bool hasLast = *text == '-' && readNumber(++text);
    if (first != m_request.begin || !hasLast || *text != '/') {
        return false;
    }
    m_response.size = readNumber(++text);
    return true;
}

// Of the last response; empty if it has no such header.
std::string HttpClient::headerOf(const char* name) const {
    curl_header* header = nullptr;
    return curl_easy_header(m_transfer->easy, name, 0, CURLH_HEADER, -1, &header) == CURLHE_OK ? header->value
                                                                                               : "";
}

void HttpClient::interrupt() {
    m_isInterrupted = true;
    curl_multi_wakeup(m_multi.get());
}

} // namespace desktop

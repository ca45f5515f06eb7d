// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/HTTPClient.h>

#include <curl/curl.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <chrono>
#include <condition_variable>
#include <cstdlib>
#include <mutex>
#include <optional>
#include <utility>

#include <Varnel/Platform/Generic/Curl/Module.h>
#include <Varnel/Platform/Generic/Curl/ThisMachine.h>
#include <Varnel/Platform/Values/SystemText.h>
#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform {
namespace {

using Answer = Result<HTTPResponse, HTTPFailure>;

constexpr long maxConnectingSeconds = 10;
constexpr long maxTransferSeconds = 30;
constexpr int pollingInMilliseconds = 1000;
// Waiting for the content lets the connection be used again. More than this is not worth it.
constexpr auto maxContentTime = std::chrono::seconds(1);
constexpr std::size_t maxContentBytes = 64UL * 1024;
constexpr int firstFinalStatus = 200;
constexpr int lastStatus = 999;

using Easy = UniqueHandle<CURL*, curl_easy_cleanup>;
using Headers = UniqueHandle<curl_slist*, curl_slist_free_all>;
using URLParts = UniqueHandle<CURLU*, curl_url_cleanup>;

// Content is read and forgotten; a server that never ends ends the transfer.
std::size_t ignoreContent(char*, std::size_t size, std::size_t count, void* received) {
  auto& total = *static_cast<std::size_t*>(received);
  total += size * count;
  return total <= maxContentBytes ? size * count : 0;
}

HTTPFailure failure(CURLcode code, CURL* easy = nullptr) {
  long reason = 0;
  if (easy) curl_easy_getinfo(easy, CURLINFO_OS_ERRNO, &reason);
  const bool isWayMissing = reason == ENETUNREACH || reason == ENETDOWN || reason == EHOSTUNREACH;
  return {.message = curl_easy_strerror(code),
          .isOffline = code == CURLE_COULDNT_RESOLVE_HOST || code == CURLE_COULDNT_RESOLVE_PROXY ||
                       (code == CURLE_COULDNT_CONNECT && isWayMissing)};
}

// The server's answer so far; absent until its final status has come. A proxy's answer to a request
// for a tunnel does not count.
std::optional<HTTPResponse> responseOf(CURL* easy) {
  long status = 0;
  curl_off_t retryAfter = 0;
  curl_easy_getinfo(easy, CURLINFO_RESPONSE_CODE, &status);
  if (status < firstFinalStatus || status > lastStatus) return std::nullopt;
  curl_easy_getinfo(easy, CURLINFO_RETRY_AFTER, &retryAfter);
  HTTPResponse response{.status = static_cast<int>(status), .retryAfter = {}};
  if (retryAfter > 0) response.retryAfter = std::chrono::seconds(retryAfter);
  return response;
}

URLParts parse(const std::string& url) {
  URLParts parts(curl_url());
  if (!parts || isCutShort(url) ||
      curl_url_set(parts.get(), CURLUPART_URL, url.c_str(), 0) != CURLUE_OK)
    return {};
  return parts;
}

// Transfers run on the callers' threads, one after another over the same connections. At exit they
// end before the libraries beneath are torn down.
class CurlHTTPClient final : public HTTPClient {
 public:
  CurlHTTPClient() : multi_(curl_multi_init()) {}

  [[nodiscard]] bool isUsable() const { return multi_ != nullptr; }

  Answer post(const HTTPPost& request, std::stop_token stop) override {
    const Turn turn(*this, stop);
    if (stop.stop_requested() || isClosing_) return HTTPFailure{"cancelled"};
    const Easy easy(curl_easy_init());
    const Headers headers = headersOf(request);
    if (!easy || !headers) return failure(CURLE_OUT_OF_MEMORY);
    const URLParts url = parse(request.url);
    if (!url) return failure(CURLE_URL_MALFORMAT);
    std::size_t received = 0;
    if (const CURLcode code = setUp(easy.get(), url.get(), headers.get(), request, received);
        code != CURLE_OK)
      return failure(code);
    if (curl_multi_add_handle(multi_, easy.get()) != CURLM_OK) return failure(CURLE_FAILED_INIT);
    const CURLcode code = transfer(easy.get(), stop);
    curl_multi_remove_handle(multi_, easy.get());
    // The final status is the answer, whatever became of the content.
    if (const auto response = responseOf(easy.get())) return *response;
    if (code == CURLE_ABORTED_BY_CALLBACK) return HTTPFailure{"cancelled"};
    return failure(code == CURLE_OK ? CURLE_GOT_NOTHING : code, easy.get());
  }

  void close() {
    isClosing_ = true;
    curl_multi_wakeup(multi_);
    const Turn turn(*this, {});
    curl_multi_cleanup(std::exchange(multi_, nullptr));
  }

 private:
  // The right to use what all transfers share; none if `stop` came first.
  class Turn final {
   public:
    Turn(CurlHTTPClient& client, const std::stop_token& stop) : client_(client) {
      std::unique_lock lock(client_.mutex_);
      isTaken_ = client_.free_.wait(lock, stop, [&] { return !client_.isBusy_; });
      if (isTaken_) client_.isBusy_ = true;
    }
    ~Turn() {
      if (!isTaken_) return;
      const std::lock_guard lock(client_.mutex_);
      client_.isBusy_ = false;
      client_.free_.notify_one();
    }
    Turn(const Turn&) = delete;
    Turn& operator=(const Turn&) = delete;

   private:
    CurlHTTPClient& client_;
    bool isTaken_ = false;
  };

  static Headers headersOf(const HTTPPost& request) {
    curl_slist* list = curl_slist_append(nullptr, ("Content-Type: " + request.contentType).c_str());
    // Servers that do not understand this header would delay every batch by a second.
    curl_slist* longer = list ? curl_slist_append(list, "Expect:") : nullptr;
    return Headers(longer ? longer : list);
  }

  static CURLcode setUp(CURL* easy, CURLU* url, curl_slist* headers, const HTTPPost& request,
                        std::size_t& received) {
    CURLcode result = CURLE_OK;
    const auto set = [&](CURLoption option, auto value) {
      if (result == CURLE_OK) result = curl_easy_setopt(easy, option, value);
    };
    set(CURLOPT_CURLU, url);
    set(CURLOPT_PROTOCOLS_STR, request.allowsPlainHTTP ? "http,https" : "https");
    set(CURLOPT_SSL_VERIFYPEER, 1L);
    set(CURLOPT_SSL_VERIFYHOST, 2L);
    set(CURLOPT_FOLLOWLOCATION, 0L);
    // Otherwise the environment's proxies would see what is meant for this machine alone.
    if (isOnThisMachine(url)) set(CURLOPT_PROXY, "");
    set(CURLOPT_NOSIGNAL, 1L);
    // A name server that is silent would hold up the end of an interrupted transfer.
    set(CURLOPT_QUICK_EXIT, 1L);
    set(CURLOPT_CONNECTTIMEOUT, maxConnectingSeconds);
    set(CURLOPT_TIMEOUT, maxTransferSeconds);
    set(CURLOPT_POSTFIELDSIZE_LARGE, static_cast<curl_off_t>(request.body.size()));
    set(CURLOPT_POSTFIELDS, request.body.data());
    set(CURLOPT_HTTPHEADER, headers);
    set(CURLOPT_USERAGENT, "Tallyhouse/1");
    set(CURLOPT_WRITEFUNCTION, ignoreContent);
    set(CURLOPT_WRITEDATA, &received);
    return result;
  }

  CURLcode transfer(CURL* easy, const std::stop_token& stop) {
    using Clock = std::chrono::steady_clock;
    std::optional<Clock::time_point> endOfContent;
    const std::stop_callback wake(stop, [this] { curl_multi_wakeup(multi_); });
    for (;;) {
      int running = 0;
      if (curl_multi_perform(multi_, &running) != CURLM_OK) return CURLE_FAILED_INIT;
      int left = 0;
      if (const CURLMsg* message = curl_multi_info_read(multi_, &left)) return message->data.result;
      if (stop.stop_requested() || isClosing_) return CURLE_ABORTED_BY_CALLBACK;
      if (!endOfContent && responseOf(easy)) endOfContent = Clock::now() + maxContentTime;
      if (endOfContent && Clock::now() >= *endOfContent) return CURLE_OPERATION_TIMEDOUT;
      curl_multi_poll(multi_, nullptr, 0, pollingInMilliseconds, nullptr);
    }
  }

  std::mutex mutex_;  // Owns `isBusy_`.
  std::condition_variable_any free_;
  bool isBusy_ = false;
  std::atomic<bool> isClosing_ = false;
  CURLM* multi_;  // Belongs to the thread that is busy. Any thread may wake it.
};

CurlHTTPClient* madeClient = nullptr;
::pid_t makersProcess = 0;

CurlHTTPClient* makeClient() {
  if (curl_global_init(CURL_GLOBAL_DEFAULT) != CURLE_OK) return nullptr;
  auto* client = new CurlHTTPClient();
  if (!client->isUsable()) return nullptr;
  madeClient = client;
  makersProcess = ::getpid();
  // Registered after the exit handlers of the TLS library, and so called before them. In a forked
  // child no thread would end a transfer that was under way.
  std::atexit([] {
    if (::getpid() == makersProcess) madeClient->close();
  });
  return client;
}

}  // namespace
}  // namespace Varnel::Platform

Varnel::Platform::HTTPClient* varnelHTTPClient() {
  static Varnel::Platform::HTTPClient* const client = Varnel::Platform::makeClient();
  return client;
}

#include <vorelix/upnp/dmagent.h>

#include <array>
#include <atomic>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <memory>
#include <new>
#include <utility>

#include "curl_internal.h"

using vorelix::upnp::Curl;
using vorelix::upnp::curl;

const char *szSOAPAction[4] = {"Browse", "GetSearchCapabilities", "GetSortCapabilities",
                               "GetSystemUpdateID"};

namespace {

constexpr const char *kUserAgent = "Vorelix/2.0 UPnP/1.0 DLNADOC/1.50";
constexpr const char *kActionHeader = "\"urn:schemas-upnp-org:service:ContentDirectory:1#%s\"";
constexpr const char *kEnvelope =
    "<?xml version=\"1.0\"?>\r\n"
    "<s:Envelope xmlns:s=\"http://schemas.xmlsoap.org/soap/envelope/\" \r\n"
    "\t\ts:encodingStyle=\"http://schemas.xmlsoap.org/soap/encoding/\">\r\n"
    "\t<s:Body>\r\n"
    "\t\t<u:%s xmlns:u=\"urn:schemas-upnp-org:service:ContentDirectory:1\">\r\n"
    "%s"
    "\t\t</u:%s>\r\n"
    "\t</s:Body>\r\n"
    "</s:Envelope>";

constexpr std::size_t kActionHeaderSize = 128;
constexpr std::size_t kEnvelopeSize = 4096;
constexpr std::size_t kLengthSize = 10;

struct Cleanup {
    void operator()(CURL *handle) const { curl()->easyCleanup(handle); }
};
using Handle = std::unique_ptr<CURL, Cleanup>;

/* The global state of libcurl while it lives. */
class GlobalState {
  public:
    GlobalState() { curl()->globalInit(CURL_GLOBAL_ALL); }
    ~GlobalState() { curl()->globalCleanup(); }
    GlobalState(const GlobalState &) = delete;
    GlobalState &operator=(const GlobalState &) = delete;
};

/* The buffer with room for `size` bytes. Null, with nothing left of it, when there is no memory for
 * them or their number has no room in the agent; a buffer that begins anew is empty as a text,
 * since the bytes in front of what comes next are lost. */
char *grown(char *buffer, std::size_t size) {
    void *larger = nullptr;
    if (size <= std::numeric_limits<unsigned int>::max()) {
        larger = buffer != nullptr ? std::realloc(buffer, size) : std::calloc(size, 1);
    }
    if (larger == nullptr) {
        std::free(buffer);
    }
    return static_cast<char *>(larger);
}

std::size_t receive(char *data, std::size_t size, std::size_t count, void *target) {
    auto &agent = *static_cast<DMAgent *>(target);
    const std::size_t length = size * count;
    // A handler of signals that looks at the answer meanwhile must not see a buffer that is given
    // back.
    char *const former = std::exchange(agent.response, nullptr);
    std::atomic_signal_fence(std::memory_order_seq_cst);
    agent.response = grown(former, agent.responseSize + length + 1);
    if (agent.response != nullptr) {
        std::memcpy(agent.response + agent.responseSize, data, length);
        agent.responseSize += static_cast<unsigned int>(length);
        agent.response[agent.responseSize] = '\0';
    }
    return length;
}

}  // namespace

DMAgent::DMAgent(DMAGENT_ACTION theAction, std::string theUrl)
    : action(theAction),
      url(std::move(theUrl)),
      response(nullptr),
      responseSize(0),
      headers(nullptr) {
    std::array<char, kActionHeaderSize> value;
    std::snprintf(value.data(), value.size(), kActionHeader, szSOAPAction[action]);
    addHeader("Content-Type", "text/xml; charset=\"utf-8\"");
    addHeader("SOAPACTION", value.data());
}

DMAgent::~DMAgent() {
    if (headers != nullptr) {
        curl()->slistFreeAll(headers);
    }
}

// NOLINTNEXTLINE(performance-unnecessary-value-param): the signature is given
void DMAgent::addHeader(std::string name, std::string value) {
    if (curl() == nullptr) {
        return;
    }
    curl_slist *const former = headers;
    headers = nullptr;
    try {
        const std::string line = value.empty() ? name : name + ": " + value;
        headers = curl()->slistAppend(former, line.c_str());
    } catch (const std::bad_alloc &) {
        // As when the list itself finds no memory.
    }
    if (headers == nullptr) {
        curl()->slistFreeAll(former);
    }
}

int DMAgent::Send(const char *arguments) {
    const Curl *const library = curl();
    Handle handle(library != nullptr ? library->easyInit() : nullptr);
    if (handle == nullptr) {
        return -1;
    }
    responseSize = 0;
    response = nullptr;
    // Intended and kept: behind the handle, and again for every transfer.
    const GlobalState state;
    const Handle transfer = std::move(handle);  // goes before the global state does
    const auto set = library->easySetopt;
    set(transfer.get(), CURLOPT_URL, url.c_str());
    set(transfer.get(), CURLOPT_USERAGENT, kUserAgent);

    std::array<char, kEnvelopeSize> envelope;
    const char *const name = szSOAPAction[action];
    std::snprintf(envelope.data(), envelope.size(), kEnvelope, name,
                  arguments != nullptr ? arguments : "", name);
    const std::size_t length = std::strlen(envelope.data());
    set(transfer.get(), CURLOPT_POSTFIELDS, envelope.data());
    set(transfer.get(), CURLOPT_POSTFIELDSIZE, static_cast<long>(length));
    std::array<char, kLengthSize> lengthText;
    std::snprintf(lengthText.data(), lengthText.size(), "%d", static_cast<int>(length));
    // Intended and kept: one more of these lines with every Send.
    addHeader("Content-Length", lengthText.data());
    set(transfer.get(), CURLOPT_HTTPHEADER, headers);

    set(transfer.get(), CURLOPT_WRITEFUNCTION, &receive);
    set(transfer.get(), CURLOPT_WRITEDATA, static_cast<void *>(this));
    const CURLcode result = library->easyPerform(transfer.get());
    DecodeRDataHTML();
    return static_cast<int>(result);
}

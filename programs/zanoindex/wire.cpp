#include "wire.h"

#include <array>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <type_traits>

#include "text.h"

namespace zano::index {
namespace {

using Length = std::uint32_t;

/* Six texts of the longest kind, and room for the rest. */
constexpr std::size_t kMaxFrameBytes = 8 * kMaxTextBytes;

/* A century; what claims to be longer has a damaged header. */
constexpr double kMaxDuration = 100.0 * 365 * 24 * 3600;

constexpr std::array kTexts = {&Tags::title, &Tags::album, &Tags::artist, &Tags::albumArtist,
                               &Tags::genre};
constexpr std::array kNumbers = {&Tags::year, &Tags::track, &Tags::disc, &Tags::bitrate,
                                 &Tags::frequency};

template <typename T>
void appendValue(std::string &out, T value) {
    static_assert(std::is_trivially_copyable_v<T>);
    std::array<char, sizeof value> bytes{};
    std::memcpy(bytes.data(), &value, sizeof value);
    out.append(bytes.data(), bytes.size());
}

/* Reads values from the front; after the first one that is not there all is refused. */
class Unpacker {
  public:
    explicit Unpacker(std::string_view content) : rest_(content) {}

    template <typename T>
    T value() {
        T result{};
        const auto bytes = take(sizeof result);
        if (isGood_) {
            std::memcpy(&result, bytes.data(), sizeof result);
        }
        return result;
    }

    std::string text() {
        std::string result(take(value<Length>()));
        isGood_ = isGood_ && result.size() <= kMaxTextBytes && isUtf8(result) &&
                  result.find('\0') == std::string::npos;
        return result;
    }

    bool isDone() const { return isGood_ && rest_.empty(); }

  private:
    std::string_view take(std::size_t count) {
        isGood_ = isGood_ && count <= rest_.size();
        if (!isGood_) {
            return {};
        }
        const auto front = rest_.substr(0, count);
        rest_.remove_prefix(count);
        return front;
    }

    std::string_view rest_;
    bool isGood_ = true;
};

bool isSane(const Tags &tags) {
    for (const auto number : kNumbers) {
        if (tags.*number < 0) {
            return false;
        }
    }
    return std::isfinite(tags.duration) && tags.duration >= 0;
}

}  // namespace

void appendFrame(std::string &out, std::string_view content) {
    appendValue(out, static_cast<Length>(content.size()));
    out.append(content);
}

std::string encodeAnswer(const ReadAnswer &answer) {
    std::string out;
    appendValue(out, answer.status);
    appendFrame(out, answer.detail);
    for (const auto text : kTexts) {
        appendFrame(out, answer.tags.*text);
    }
    for (const auto number : kNumbers) {
        appendValue(out, answer.tags.*number);
    }
    appendValue(out, answer.tags.duration > kMaxDuration ? 0.0 : answer.tags.duration);
    return out;
}

std::optional<ReadAnswer> decodeAnswer(std::string_view content) {
    Unpacker unpacker(content);
    ReadAnswer answer;
    answer.status = unpacker.value<ReadStatus>();
    answer.detail = unpacker.text();
    for (const auto text : kTexts) {
        answer.tags.*text = unpacker.text();
    }
    for (const auto number : kNumbers) {
        answer.tags.*number = unpacker.value<int>();
    }
    answer.tags.duration = unpacker.value<double>();
    const bool isKnown = answer.status <= ReadStatus::kCrashed;
    if (!unpacker.isDone() || !isKnown || !isSane(answer.tags)) {
        return std::nullopt;
    }
    return answer;
}

void FrameReader::add(const char *bytes, std::size_t count) {
    buffer_.erase(0, taken_);
    taken_ = 0;
    buffer_.append(bytes, count);
}

std::optional<std::string_view> FrameReader::next() {
    const auto rest = std::string_view(buffer_).substr(taken_);
    Length length = 0;
    if (rest.size() < sizeof length) {
        return std::nullopt;
    }
    std::memcpy(&length, rest.data(), sizeof length);
    isBroken_ = length > kMaxFrameBytes;
    if (isBroken_ || rest.size() - sizeof length < length) {
        return std::nullopt;
    }
    taken_ += sizeof length + length;
    return rest.substr(sizeof length, length);
}

}  // namespace zano::index

#include "formats.h"

#include <algorithm>
#include <array>
#include <iterator>

namespace zano::index {
namespace {

struct Suffix {
    std::string_view text;
    Format format;
};

constexpr std::size_t kLongestSuffix = 4;

constexpr Suffix kSuffixes[] = {
    {"aif", Format::kAiff},      {"aifc", Format::kAiff}, {"aiff", Format::kAiff},
    {"ape", Format::kApe},       {"asf", Format::kAsf},   {"flac", Format::kFlac},
    {"m4a", Format::kMp4},       {"m4b", Format::kMp4},   {"m4p", Format::kMp4},
    {"m4r", Format::kMp4},       {"mp2", Format::kMpeg},  {"mp3", Format::kMpeg},
    {"mp4", Format::kMp4},       {"mpc", Format::kMpc},   {"oga", Format::kOgg},
    {"ogg", Format::kOgg},       {"opus", Format::kOpus}, {"spx", Format::kSpeex},
    {"tta", Format::kTrueAudio}, {"wav", Format::kWav},   {"wma", Format::kAsf},
    {"wv", Format::kWavPack},
};

constexpr std::uint32_t lowered(char c) {
    return static_cast<unsigned char>(c >= 'A' && c <= 'Z' ? c - 'A' + 'a' : c);
}

/* The characters of a suffix as one number, which this is asked for every name on the disk. */
constexpr std::uint32_t packed(std::string_view suffix) {
    std::uint32_t number = 0;
    for (const char c : suffix) {
        number = number << 8U | lowered(c);
    }
    return number;
}

struct Row {
    std::uint32_t suffix;
    Format format;
};

constexpr auto sortedRows() {
    std::array<Row, std::size(kSuffixes)> rows{};
    std::transform(std::begin(kSuffixes), std::end(kSuffixes), rows.begin(), [](const Suffix &row) {
        return Row{packed(row.text), row.format};
    });
    std::sort(rows.begin(), rows.end(),
              [](const Row &a, const Row &b) { return a.suffix < b.suffix; });
    return rows;
}

constexpr auto kRows = sortedRows();

constexpr std::array kPlaylistSuffixes = {packed("m3u"), packed("m3u8"), packed("pls"),
                                          packed("wpl")};

/* 0: none. A dot in front hides a file; it begins no suffix. */
std::uint32_t suffixOf(std::string_view name) {
    const auto dot = name.rfind('.');
    const bool isNone =
        dot == std::string_view::npos || dot == 0 || name.size() - dot - 1 > kLongestSuffix;
    return isNone ? 0 : packed(name.substr(dot + 1));
}

}  // namespace

Format formatOfName(std::string_view name) {
    const std::uint32_t suffix = suffixOf(name);
    const auto *row = std::lower_bound(kRows.begin(), kRows.end(), suffix,
                                       [](const Row &a, std::uint32_t b) { return a.suffix < b; });
    return row != kRows.end() && row->suffix == suffix ? row->format : Format::kNone;
}

bool isPlaylistName(std::string_view name) {
    return std::find(kPlaylistSuffixes.begin(), kPlaylistSuffixes.end(), suffixOf(name)) !=
           kPlaylistSuffixes.end();
}

}  // namespace zano::index

/* The kinds of audio file, and playlists, told by the suffix of the name. */
#pragma once

#include <cstdint>
#include <string_view>

namespace zano::index {

enum class Format : std::uint8_t {
    kAiff,
    kApe,
    kAsf,
    kFlac,
    kMp4,
    kMpc,
    kMpeg,
    kOgg,  // Vorbis, Opus, Speex or FLAC inside: the content tells
    kOpus,
    kSpeex,
    kTrueAudio,
    kWav,
    kWavPack,
    kNone,
};

/* The format by the text behind the last dot of a file name, in any case; kNone for names that
 * are not indexed. */
Format formatOfName(std::string_view name);

/* Whether it is the name of a playlist: m3u, m3u8, pls or wpl in any case. */
bool isPlaylistName(std::string_view name);

}  // namespace zano::index

/* The system's knowledge of file name extensions and their mime types. */
#pragma once

#include <functional>
#include <istream>
#include <map>
#include <string>

namespace zano::mime {

struct Type {
    int weight;
    std::string name;
};

struct Extension {
    Type type;
    bool isAudio;  // also when a better type is none of audio
};

/* By their text, without the dot and as it is written. */
using Extensions = std::map<std::string, Extension, std::less<>>;

/* Adds what a file knows. Lines are those of globs2 of the package shared-mime-info, weight, type
 * and pattern,
 *
 *     50:audio/mpeg:*.mp3
 *
 * or those of mime.types of media-types, which have the weight 0:
 *
 *     audio/mpeg    mpga mp2 mp3
 *
 * Of several types for one extension that of the greatest weight counts, and of those the one with
 * the shortest name, which is the general one: audio/ogg and not audio/x-vorbis+ogg. Comments,
 * patterns that are no plain extension, and lines that are neither are passed over. */
void addExtensions(std::istream &file, Extensions &extensions);

}  // namespace zano::mime

/* Answers as JSON documents. */
#pragma once

#include <json/value.h>
#include <vorelix/records.h>
#include <string>
#include <string_view>

#include "songs.h"

namespace vorelix {

/* One document, UTF-8, with a line end. Fractions have at most three decimals. */
std::string documentOf(const Json::Value &value);

/* A song as an object: id, title, artist, album, genre, year, track, disc, duration (seconds),
 * bitrate (bits per second), frequency (hertz), path; 0 and "" where unknown. What is not UTF-8
 * is shown with U+FFFD; a path that is not has its exact bytes in "pathBytes", in base64. */
Json::Value songObject(const ZANO_MEDIA_INFO &song);

/* All songs of a list (null: none) as an array. */
Json::Value songArray(const ZANO_PLAYLIST_REC *list);

/* The answer with the members offset, limit and total added. */
Json::Value withSpan(Json::Value answer, const Span &span, int total);

/* RFC 4648, with padding. */
std::string base64(std::string_view bytes);

}  // namespace vorelix

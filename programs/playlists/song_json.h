/* Songs in the answers of programs. */
#pragma once

#include <json/value.h>
#include <vorelix/records.h>

namespace vorelix {

/* id, title, artist, album, genre, year, track, disc; 0 and "" where unknown. Bytes that are not
 * UTF-8 become U+FFFD. */
Json::Value tagsObject(const ZANO_MEDIA_INFO &song);

/* What objectOf gives for each song of a list (null: none). */
Json::Value songArrayOf(const ZANO_PLAYLIST_REC *list,
                        Json::Value (*objectOf)(const ZANO_MEDIA_INFO &song));

}  // namespace vorelix

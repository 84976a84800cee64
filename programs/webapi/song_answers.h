/* Songs and entries of playlists as the answers have them. */
#pragma once

#include <json/value.h>
#include <vorelix/records.h>
#include <string>

namespace webapi {

/* With "stream", the id by which the song is played. */
Json::Value songObject(const ZANO_MEDIA_INFO &song);

/* A song; or what the library does not know, by the tags of the file, with "path" or "url". */
Json::Value entryObject(const ZANO_MEDIA_INFO &entry);

/* All songs of a list; null for none. */
Json::Value songArray(const ZANO_PLAYLIST_REC *list);

/* The id of a song in addresses. */
std::string streamIdOf(int song);

/* The song of such an id; -1 for any other text. */
int songOfStreamId(const std::string &text);

}  // namespace webapi

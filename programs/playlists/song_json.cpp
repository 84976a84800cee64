#include "song_json.h"

#include "text.h"

namespace vorelix {

Json::Value tagsObject(const ZANO_MEDIA_INFO &song) {
    Json::Value object(Json::objectValue);
    object["id"] = song.id;
    object["title"] = validUtf8(song.title);
    object["artist"] = validUtf8(song.artist);
    object["album"] = validUtf8(song.album);
    object["genre"] = validUtf8(song.genre);
    object["year"] = song.year;
    object["track"] = song.track;
    object["disc"] = song.disc;
    return object;
}

Json::Value songArrayOf(const ZANO_PLAYLIST_REC *list,
                        Json::Value (*objectOf)(const ZANO_MEDIA_INFO &song)) {
    Json::Value array(Json::arrayValue);
    for (; list != nullptr; list = list->next) {
        array.append(objectOf(list->info));
    }
    return array;
}

}  // namespace vorelix

#include "song_answers.h"

#include <vorelix/misc/misc.h>
#include <cmath>
#include <cstdlib>
#include <memory>
#include <new>
#include <string_view>

#include "song_json.h"

namespace webapi {

namespace {

struct FreeText {
    void operator()(char *text) const { std::free(text); }
};

/* A tenth is more than is ever shown. */
double seconds(float duration) {
    constexpr double kTenths = 10;
    return std::isfinite(duration) && duration > 0 ? std::round(duration * kTenths) / kTenths : 0;
}

Json::Value tagsOf(const ZANO_MEDIA_INFO &info) {
    Json::Value object = vorelix::tagsObject(info);
    object["duration"] = seconds(info.duration);
    return object;
}

}  // namespace

Json::Value songObject(const ZANO_MEDIA_INFO &song) {
    Json::Value object = tagsOf(song);
    object["stream"] = streamIdOf(song.id);
    return object;
}

Json::Value entryObject(const ZANO_MEDIA_INFO &entry) {
    if (entry.id != 0) {
        return songObject(entry);
    }
    Json::Value object = tagsOf(entry);
    const bool isAddress =
        entry.path[0] != '/' && std::string_view(entry.path).find("://") != std::string_view::npos;
    object[isAddress ? "url" : "path"] = entry.path;
    return object;
}

Json::Value songArray(const ZANO_PLAYLIST_REC *list) {
    return vorelix::songArrayOf(list, songObject);
}

std::string streamIdOf(int song) {
    const std::unique_ptr<char, FreeText> text(MediaIDEncryption(static_cast<unsigned>(song)));
    if (text == nullptr) {
        throw std::bad_alloc();
    }
    return text.get();
}

int songOfStreamId(const std::string &text) {
    const int song = MediaIDDecryption(text.c_str());
    // Other texts give a number too: one character more, or capitals.
    return song > 0 && streamIdOf(song) == text ? song : -1;
}

}  // namespace webapi

#include "json.h"

#include <json/writer.h>

#include "song_json.h"
#include "text.h"

namespace vorelix {

std::string documentOf(const Json::Value &value) {
    Json::StreamWriterBuilder builder;
    builder["emitUTF8"] = true;
    builder["indentation"] = "  ";
    builder["precision"] = 3;
    builder["precisionType"] = "decimal";
    return Json::writeString(builder, value) + "\n";
}

Json::Value songObject(const ZANO_MEDIA_INFO &song) {
    Json::Value object = tagsObject(song);
    object["duration"] = song.duration;
    object["bitrate"] = song.bitrate;
    object["frequency"] = song.frequency;
    const std::string path = validUtf8(song.path);
    object["path"] = path;
    if (path != song.path) {
        object["pathBytes"] = base64(song.path);
    }
    return object;
}

Json::Value songArray(const ZANO_PLAYLIST_REC *list) {
    return songArrayOf(list, songObject);
}

Json::Value withSpan(Json::Value answer, const Span &span, int total) {
    answer["offset"] = span.offset;
    answer["limit"] = span.limit;
    answer["total"] = total;
    return answer;
}

std::string base64(std::string_view bytes) {
    constexpr std::string_view kDigits =
        "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
    constexpr size_t kGroup = 3;
    std::string out;
    for (size_t start = 0; start < bytes.size(); start += kGroup) {
        const std::string_view group = bytes.substr(start, kGroup);
        unsigned bits = 0;
        for (size_t i = 0; i < kGroup; ++i) {
            bits = bits << 8 | (i < group.size() ? static_cast<unsigned char>(group[i]) : 0U);
        }
        for (size_t i = 0; i <= kGroup; ++i) {
            out += i <= group.size() ? kDigits[bits >> (18 - 6 * i) & 63U] : '=';
        }
    }
    return out;
}

}  // namespace vorelix

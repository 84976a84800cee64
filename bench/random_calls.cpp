#include "random_calls.h"

#include <zanoplatform/error.h>
#include <zanoplatform/media_database.h>

#include <memory>
#include <random>
#include <vector>

namespace zano::bench {
namespace {

class Chance {
  public:
    explicit Chance(unsigned seed) : random_(seed) {}
    int below(int bound) { return std::uniform_int_distribution(0, bound - 1)(random_); }
    const char *of(const std::vector<const char *> &values) {
        return values[static_cast<size_t>(below(static_cast<int>(values.size())))];
    }

  private:
    std::mt19937 random_;
};

const std::vector<const char *> kColumns = {"title", "artist", "album", "genre"};

std::string termOf(Chance &chance) {
    const std::string column = chance.of(kColumns);
    const std::string number = std::to_string(chance.below(1000));
    switch (chance.below(12)) {
        case 0:
            return "year between 1960 and " + std::to_string(1960 + chance.below(60));
        case 1:
            return "track in (1, 3, " + number + ")";
        case 2:
            return "path like '/volume1/music/" + std::string(chance.of({"b", "Т", "", "愛"})) +
                   "%'";
        case 3:
            return "not " + column + " ilike '%" + chance.of({"a", "te", "夜", "light"}) + "%'";
        case 4:
            return column + " like '%" + chance.of({"é", "Ä", "ночь", "o"}) + "%'";
        case 5:
            return "lower(" + column + ") >= '" + chance.of({"m", "п", "愛", "été"}) + "'";
        case 6:
            return "duration > " + number + " or length(title) < 12";
        case 7:
            return "genre = '" + std::string(chance.of({"Pop", "R&B", "Enka", "pop"})) + "'";
        default:
            return column + " ilike '%" +
                   chance.of({"träume",   "TRAUME",   "cafe",    "ангстрем", "ночь",     "НОЧЬ",
                              "ドライフ", "ドライブ", "μουσικη", "τραγούδι", "愛",       "夜の",
                              "北",       "j",        "jj",      "zyz",      "zyzzyvas", "q",
                              "qui",      "quixotic", "w",       "wa",       "wavelike", "1_2",
                              "e%t",      "\\%",      "7",       "58"}) +
                   "%'";
    }
}

std::string conditionOf(Chance &chance) {
    std::string condition;
    for (int terms = chance.below(4); terms > 0; --terms) {
        const std::string term = "(" + termOf(chance) + ")";
        condition += (condition.empty() ? "" : chance.of({" and ", " or "})) + term;
    }
    return condition;
}

std::string orderOf(Chance &chance) {
    const std::string leading =
        chance.of({"lower(title)", "title", "lower(artist)", "artist", "album", "lower(genre)",
                   "year", "duration", "path", "id", "track", "bitrate"});
    const std::string direction = chance.of({"", " desc"});
    switch (chance.below(4)) {
        case 0:
            return leading + direction;
        case 1:
            return leading + direction + ", year desc, path";
        default:
            return leading + direction +
                   ", album, disc, track, title, artist, genre, year, path, duration";
    }
}

}  // namespace

std::string Call::text() const {
    return "select " + select + " where " + condition + " distinct " + distinct + " order by " +
           order + " offset " + std::to_string(offset) + " limit " + std::to_string(limit);
}

Call randomCall(unsigned number, int songs) {
    Chance chance(number);
    Call call;
    call.select = "*";
    call.condition = conditionOf(chance);
    call.order = orderOf(chance);
    if (chance.below(5) == 0) {
        call.distinct = chance.of(kColumns);
        call.select = " " + call.distinct + " as title ";
        call.order = "lower(" + call.distinct + ")" + chance.of({"", " desc"});
    }
    call.offset = chance.below(3) == 0 ? 0 : chance.below(songs);
    call.limit = chance.below(20) == 0 ? 0 : 1 + chance.below(120);
    return call;
}

std::string answerOf(const Call &call) {
    const auto orNull = [](const std::string &text) {
        return text.empty() ? nullptr : text.c_str();
    };
    MEDIA_DB_RESULT *result =
        MediaInfoDBOpen(MEDIA_TABLE_SONGS, call.select.c_str(), orNull(call.condition),
                        orNull(call.distinct), call.order.c_str(), call.offset, call.limit, 0);
    if (result == nullptr) {
        return std::string("failed: ") + KLIBCErrTextGet();
    }
    std::string answer = "rows " + std::to_string(result->rowCount) + "\n";
    const auto row = std::make_unique<ZANO_MEDIA_INFO>();
    while (MediaInfoDBGet(result, row.get()) == 0) {
        for (const char *text : {row->path, row->title, row->album, row->artist, row->genre}) {
            answer.append(text).append("|");
        }
        for (const int value : {row->id, row->track, row->disc, row->year, row->bitrate,
                                row->frequency, static_cast<int>(row->duration)}) {
            answer.append(std::to_string(value)).append("|");
        }
        answer.append("\n");
    }
    if (KLIBCErrGet() != KLIB_ERR_NONE) {
        answer.append("failed: ").append(KLIBCErrTextGet());
    }
    MediaInfoDBClose(result);
    return answer;
}

}  // namespace zano::bench

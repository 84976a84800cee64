/* Whole media databases: their check, their schema, their copy. */
#include <zanoplatform/error.h>
#include <zanoplatform/media_database_upkeep.h>
#include <array>

#include "commands.h"
#include "db_options.h"
#include "failure.h"
#include "json.h"
#include "text.h"
#include "zanoindex/progress.h"

namespace vorelix {

namespace {

namespace index = zano::index;

/* Null: the one of the setting. */
const char *argumentOf(const std::string &location) {
    return location.empty() ? nullptr : location.c_str();
}

/* Right after a call. */
void requireDone(int result, const std::string &hint = "") {
    if (result != 0) {
        throw Failure(printable(KLIBCErrTextGet()) + hint, FailureKind::kDatabase);
    }
}

std::string shownLocation(const std::string &location) {
    std::array<char, 4096> shown{};
    requireDone(MediaInfoDBLocationGet(argumentOf(location), shown.data(), shown.size()));
    return printable(shown.data());
}

std::string counted(std::int64_t count, const std::string &what) {
    return std::to_string(count) + " " + what + (count == 1 ? "" : "s");
}

std::string contentsText(const MEDIA_DB_CONTENTS &contents) {
    return counted(contents.songs, "song") + ", " + counted(contents.playlists, "playlist");
}

void putContents(Json::Value &answer, const MEDIA_DB_CONTENTS &contents) {
    answer["songs"] = Json::Int64{contents.songs};
    answer["playlists"] = Json::Int64{contents.playlists};
    answer["notices"] = Json::Int64{contents.notices};
}

/* A line on a terminal that is written over; nothing elsewhere. */
class ProgressLine {
  public:
    explicit ProgressLine(bool isSilent)
        : progress_(isSilent || index::styleForStandardError() != index::ProgressStyle::kBar
                        ? index::ProgressStyle::kNone
                        : index::ProgressStyle::kBar) {}

    static void show(void *self, int phase, long long done, long long total) {
        static_cast<ProgressLine *>(self)->progress_.show(
            phase == MEDIA_DB_COPYING ? index::Phase::kCopying : index::Phase::kIndexing, done,
            total);
    }

  private:
    index::Progress progress_;
};

}  // namespace

Outcome dbCheckCommand(const Request &request, const Terminal &) {
    const std::string &location = request.database.location;
    const std::string shown = shownLocation(location);
    MEDIA_DB_CHECKED checked{};
    requireDone(MediaInfoDBCheck(argumentOf(location), &checked));
    if (request.json) {
        Json::Value answer(Json::objectValue);
        answer["location"] = shown;
        putContents(answer, checked.contents);
        answer["isIndexed"] = checked.isIndexed != 0;
        return {documentOf(answer), ""};
    }
    const std::string undone =
        checked.isIndexed != 0
            ? ""
            : "; orders and search index are not made yet: zanoindex or vorelix db migrate";
    return {shown + ": " + contentsText(checked.contents) + ", no damage" + undone + "\n", ""};
}

Outcome dbMigrateCommand(const Request &request, const Terminal &) {
    const std::string &location = request.database.location;
    const std::string shown = shownLocation(location);
    MEDIA_DB_MIGRATED migrated{};
    {
        ProgressLine line(request.json);
        requireDone(MediaInfoDBMigrate(argumentOf(location), &migrated, ProgressLine::show, &line));
    }
    const bool isNewer = migrated.after != migrated.before;
    if (request.json) {
        Json::Value answer(Json::objectValue);
        answer["location"] = shown;
        answer["schemaBefore"] = Json::Int64{migrated.before};
        answer["schema"] = Json::Int64{migrated.after};
        answer["changed"] = isNewer || migrated.isIndexed != 0;
        return {documentOf(answer), ""};
    }
    const std::string schema = isNewer
                                   ? "schema " + std::to_string(migrated.before) +
                                         " is now schema " + std::to_string(migrated.after)
                                   : "schema " + std::to_string(migrated.after) + " is up to date";
    const std::string made =
        migrated.isIndexed != 0 ? "; orders and search index brought up to date" : "";
    return {shown + ": " + schema + made + "\n", ""};
}

Outcome dbCopyCommand(const Request &request, const Terminal &) {
    const DatabaseRequest &asked = request.database;
    const std::string from = shownLocation(asked.from);
    const std::string to = shownLocation(asked.to);
    MEDIA_DB_CONTENTS copied{};
    {
        ProgressLine line(request.json);
        const int result = MediaInfoDBCopy(asked.from.c_str(), asked.to.c_str(),
                                           asked.force ? 1 : 0, &copied, ProgressLine::show, &line);
        const bool isFilled = KLIBCErrGet() == KLIB_ERR_DATABASE_FILLED;
        requireDone(result, isFilled ? "; --force replaces it" : "");
    }
    if (request.json) {
        Json::Value answer(Json::objectValue);
        answer["from"] = from;
        answer["to"] = to;
        putContents(answer, copied);
        return {documentOf(answer), ""};
    }
    return {to + ": " + contentsText(copied) + ", copied from " + from + "\n", ""};
}

}  // namespace vorelix

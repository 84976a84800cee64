#include "reader.h"

#include <zanoplatform/error.h>

#include <algorithm>
#include <utility>

#include "schema.h"

namespace zano::mediadb::postgresql {
namespace {

constexpr const char *kState = "SELECT name, value FROM state";
constexpr std::string_view kBegin =
    "BEGIN TRANSACTION ISOLATION LEVEL REPEATABLE READ, READ ONLY; EXECUTE ";

}  // namespace

std::int64_t *State::find(std::string_view name) {
    const std::pair<std::string_view, std::int64_t *> rows[] = {
        {"schema", &schema},     {"songs", &songs},     {"generation", &generation},
        {"anchored", &anchored}, {"artists", &artists}, {"albums", &albums},
        {"genres", &genres}};
    for (const auto &[known, value] : rows) {
        if (known == name) {
            return value;
        }
    }
    return nullptr;
}

void Reader::beginSnapshot() {
    State state;
    try {
        const Result rows = connection_.run(std::string(kBegin) + connection_.nameOf(kState));
        for (int i = 0; i < rows.size(); ++i) {
            if (std::int64_t *value = state.find(rows[i].text(0))) {
                *value = rows[i].integer(1);
            }
        }
    } catch (const ServerError &error) {
        if (error.state() == "42P01") {
            throw ServerError(KLIB_ERR_DATABASE_OPEN,
                              "the PostgreSQL database holds no media database yet; zanoindex "
                              "makes it",
                              error.state());
        }
        throw;
    }
    requireVersion(state.schema);
    if (state.generation != state_.generation) {
        commonPrefix_.reset();
    }
    state_ = state;
}

bool Reader::endSnapshot() noexcept {
    try {
        connection_.runLater("COMMIT");
        return true;
    } catch (const std::exception &) {
        return false;
    }
}

/* Nearly always true of the music root. What all paths begin with is what the first and the last
 * of them have in common. */
bool Reader::allPathsBegin(const std::string &prefix) {
    if (!commonPrefix_) {
        const Result first =
            connection_.run(newSql("SELECT path FROM songs ORDER BY path LIMIT 1"));
        const Result last =
            connection_.run(newSql("SELECT path FROM songs ORDER BY path DESC LIMIT 1"));
        std::string common;
        if (first.size() > 0 && last.size() > 0) {
            const std::string_view a = first[0].text(0);
            const std::string_view b = last[0].text(0);
            common.assign(a.begin(), std::mismatch(a.begin(), a.end(), b.begin(), b.end()).first);
        }
        commonPrefix_ = std::move(common);
    }
    return commonPrefix_->compare(0, prefix.size(), prefix) == 0;
}

/* An idle connection may have lost its server, which shows when it is used; another host may be
 * there in its place. */
ReaderPool::Lease ReaderPool::lease() {
    while (auto reader = idle_.take()) {
        try {
            reader->beginSnapshot();
            return {shared_from_this(), std::move(reader)};
        } catch (const DatabaseError &) {
            if (!reader->connection().isBroken()) {
                throw;
            }
        }
    }
    auto reader = std::make_unique<Reader>(uri_);
    reader->beginSnapshot();
    return {shared_from_this(), std::move(reader)};
}

void ReaderPool::giveBack(std::unique_ptr<Reader> reader) noexcept {
    if (reader->endSnapshot()) {
        idle_.put(std::move(reader));
    }
}

}  // namespace zano::mediadb::postgresql

#include "reader.h"

#include <sys/stat.h>
#include <zanoplatform/error.h>

#include <algorithm>
#include <utility>

#include "../engine.h"
#include "schema.h"

namespace zano::mediadb::sqlite {
namespace {

constexpr size_t kMaxStatements = 64;
constexpr size_t kMaxGramCounts = 1000;
/* Steps of SQLite's machine between two looks at the clock: a few rows, since a step may match a
 * pattern with a long text. */
constexpr int kStepsBetweenLooks = 100;

}  // namespace

Reader::Reader(const std::string &path)
    : connection_(openForReading(path)),
      snapshot_(connection_.prepare("PRAGMA data_version", true)) {
    sqlite3_progress_handler(connection_.get(), kStepsBetweenLooks, checkClock, this);
}

int Reader::checkClock(void *self) {
    auto *reader = static_cast<Reader *>(self);
    const auto now = std::chrono::steady_clock::now();
    if (!reader->isClockRunning_) {
        reader->isClockRunning_ = true;
        reader->deadline_ = now + std::chrono::milliseconds(kQueryLimitMs);
    }
    return now > reader->deadline_ ? 1 : 0;
}

/* A statement that is not reset holds the moment at which it began for all others; that spares the
 * two of a transaction. What was read of the state holds as long as nobody has written since. */
void Reader::beginSnapshot() {
    restartClock();
    snapshot_.step();
    if (snapshot_.integer(0) != dataVersion_) {
        readState();
        commonPrefix_.reset();
        gramCounts_.clear();
        dataVersion_ = snapshot_.integer(0);
    }
}

void Reader::readState() {
    Using rows(statement("SELECT name, value FROM state"));
    while (rows->step()) {
        const std::string_view name = rows->text(0);
        const std::int64_t value = rows->integer(1);
        if (name == "songs") {
            state_.songs = value;
        } else if (name == "generation") {
            state_.generation = value;
        } else if (name == "anchored") {
            state_.anchored = value;
        } else if (name == "ordered") {
            state_.isOrdered = value != 0;
        } else if (const auto known = state_.facetCounts.find(name);
                   known != state_.facetCounts.end()) {
            known->second = value;
        } else {
            state_.facetCounts.emplace(name, value);
        }
    }
}

/* Nearly always true of the music root. What all paths begin with is what the first and the last
 * of them have in common. */
bool Reader::allPathsBegin(const std::string &prefix) {
    if (!commonPrefix_) {
        Using first(statement("SELECT min(path) FROM songs"));
        Using last(statement("SELECT max(path) FROM songs"));
        first->step();
        last->step();
        const std::string_view a = first->text(0);
        const std::string_view b = last->text(0);
        const auto end = std::mismatch(a.begin(), a.end(), b.begin(), b.end()).first;
        commonPrefix_ = a.substr(0, static_cast<size_t>(end - a.begin()));
    }
    return commonPrefix_->compare(0, prefix.size(), prefix) == 0;
}

/* A search is asked for page by page, and its count beside each. */
std::int64_t Reader::gramCount(const std::string &gram) {
    if (const auto known = gramCounts_.find(gram); known != gramCounts_.end()) {
        return known->second;
    }
    Using row(statement("SELECT songs FROM gram_counts WHERE gram=?"));
    row->bind(1, gram);
    const std::int64_t count = row->step() ? row->integer(0) : 0;
    if (gramCounts_.size() >= kMaxGramCounts) {
        gramCounts_.clear();
    }
    gramCounts_.emplace(gram, count);
    return count;
}

void Reader::endSnapshot() noexcept {
    snapshot_.reset();
}

Statement &Reader::statement(const std::string &sql) {
    if (const auto known = bySql_.find(sql); known != bySql_.end()) {
        statements_.splice(statements_.begin(), statements_, known->second);
        return known->second->second;
    }
    statements_.emplace_front(sql, connection_.prepare(sql, true));
    bySql_.emplace(statements_.front().first, statements_.begin());
    if (statements_.size() > kMaxStatements) {
        bySql_.erase(statements_.back().first);
        statements_.pop_back();
    }
    return statements_.front().second;
}

Statement &Reader::statement(const Sql &sql) {
    Statement &prepared = statement(sql.text());
    int index = 0;
    for (const Value &value : sql.values()) {
        prepared.bindValue(++index, value);
    }
    return prepared;
}

std::int64_t Reader::integer(const Sql &sql, std::int64_t fallback) {
    Using row(statement(sql));
    return row->step() && !row->isNull(0) ? row->integer(0) : fallback;
}

/* Another file under the same name: a database that was put back from a copy, say. */
void ReaderPool::followFile() {
    struct stat file {};
    const bool isThere = stat(path_.c_str(), &file) == 0;
    const std::lock_guard lock(mutex_);
    if (!isThere || file.st_dev != device_ || file.st_ino != inode_) {
        idle_.clear();
        device_ = file.st_dev;
        inode_ = file.st_ino;
    }
}

ReaderPool::Lease ReaderPool::lease() {
    if (tick_.isAnother()) {
        followFile();
    }
    auto reader = idle_.take();
    if (!reader) {
        followFile();
        reader = std::make_unique<Reader>(path_);
    }
    reader->beginSnapshot();
    return {shared_from_this(), std::move(reader)};
}

void ReaderPool::giveBack(std::unique_ptr<Reader> reader) noexcept {
    reader->endSnapshot();
    idle_.put(std::move(reader));
}

}  // namespace zano::mediadb::sqlite

#include "reader.h"

#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <utility>

#include "../engine.h"
#include "schema.h"

namespace zano::mediadb::sqlite {
namespace {

constexpr size_t kMaxStatements = 64;
constexpr size_t kMaxIdleReaders = 4;
/* Steps of SQLite's machine between two looks at the clock: a few rows, since a step may match a
 * pattern with a long text. */
constexpr int kStepsBetweenLooks = 100;

}  // namespace

Reader::Reader(const std::string &path) : connection_(openForReading(path)) {
    restartClock();
    sqlite3_progress_handler(connection_.get(), kStepsBetweenLooks, checkClock, this);
}

int Reader::checkClock(void *self) {
    return std::chrono::steady_clock::now() > static_cast<Reader *>(self)->deadline_ ? 1 : 0;
}

void Reader::restartClock() {
    deadline_ = std::chrono::steady_clock::now() + std::chrono::milliseconds(kQueryLimitMs);
}

/* What was read of the state holds as long as nobody has written since. */
void Reader::beginSnapshot() {
    restartClock();
    statement("BEGIN").run();
    Using version(statement("PRAGMA data_version"));
    version->step();
    if (version->integer(0) != dataVersion_) {
        readState();
        commonPrefix_.reset();
        dataVersion_ = version->integer(0);
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

void Reader::endSnapshot() noexcept {
    try {
        statement("ROLLBACK").run();
    } catch (const std::exception &) {
        /* SQLite has ended the transaction already, as it does after some failures. */
    }
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

ReaderPool::ReaderPool(std::string path) : path_(std::move(path)) {
    idle_.reserve(kMaxIdleReaders);
}

ReaderPool::~ReaderPool() {
    forgetOthers();
}

/* Connections must not be used in a process that was forked off, not even to close them. */
void ReaderPool::forgetOthers() {
    if (process_ != 0 && process_ != getpid()) {
        for (auto &reader : idle_) {
            (void)reader.release();
        }
    }
}

ReaderPool::Lease ReaderPool::lease() {
    struct stat file {};
    const bool isThere = stat(path_.c_str(), &file) == 0;
    std::unique_ptr<Reader> reader;
    {
        const std::lock_guard lock(mutex_);
        if (process_ != getpid()) {
            forgetOthers();
            idle_.clear();
            process_ = getpid();
        }
        /* Another file under the same name: a database that was put back from a copy, say. */
        if (!isThere || file.st_dev != device_ || file.st_ino != inode_) {
            idle_.clear();
            device_ = file.st_dev;
            inode_ = file.st_ino;
        }
        if (!idle_.empty()) {
            reader = std::move(idle_.back());
            idle_.pop_back();
        }
    }
    if (!reader) {
        reader = std::make_unique<Reader>(path_);
    }
    Lease lease(reader.release(), GiveBack{shared_from_this()});
    lease->beginSnapshot();
    return lease;
}

void ReaderPool::GiveBack::operator()(Reader *reader) const noexcept {
    pool->giveBack(std::unique_ptr<Reader>(reader), getpid());
}

void ReaderPool::giveBack(std::unique_ptr<Reader> reader, pid_t process) noexcept {
    const std::lock_guard lock(mutex_);
    if (process != process_) {
        (void)reader.release();
        return;
    }
    reader->endSnapshot();
    if (idle_.size() < kMaxIdleReaders) {
        idle_.push_back(std::move(reader));
    }
}

}  // namespace zano::mediadb::sqlite

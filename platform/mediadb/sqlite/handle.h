/* SQLite's handles as objects. The only headers that include sqlite3.h are in this folder. */
#pragma once

#include <sqlite3.h>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

#include "../query/expression.h"

namespace zano::mediadb::sqlite {

/* Throws DatabaseError with SQLite's own words and what was tried. */
[[noreturn]] void fail(sqlite3 *database, int result, std::string_view tried);

class Statement {
  public:
    Statement() = default;
    Statement(sqlite3 *database, std::string_view sql, bool keep);

    /* Parameters count from 1. The text must live until the statement is reset. */
    Statement &bind(int index, int value) { return bind(index, std::int64_t{value}); }
    Statement &bind(int index, std::int64_t value);
    Statement &bind(int index, double value);
    Statement &bind(int index, std::string_view value);
    Statement &bindNull(int index);
    Statement &bindValue(int index, const Value &value);
    /* For interfaces that SQLite hands out through a parameter of a given type. */
    Statement &bindPointer(int index, void *pointer, const char *type);

    /* true: a row is there; false: the statement is done (and reset). */
    bool step();
    /* Steps once, for statements that give no row, and resets. */
    void run();
    void reset() noexcept;

    std::int64_t integer(int column) const;
    double real(int column) const;
    bool isNull(int column) const;
    /* Valid until the next step. */
    std::string_view text(int column) const;

  private:
    struct Finalize {
        void operator()(sqlite3_stmt *statement) const { sqlite3_finalize(statement); }
    };
    std::unique_ptr<sqlite3_stmt, Finalize> statement_;
};

/* Resets a statement that stays prepared, so that it holds no snapshot when the block ends. */
class Using {
  public:
    explicit Using(Statement &statement) : statement_(statement) {}
    ~Using() { statement_.reset(); }
    Using(const Using &) = delete;
    Using &operator=(const Using &) = delete;
    Statement *operator->() { return &statement_; }

  private:
    Statement &statement_;
};

class Connection {
  public:
    enum class Mode { ReadOnly, ReadWrite, Create };
    Connection(const std::string &path, Mode mode);

    sqlite3 *get() const { return database_.get(); }

    /* Runs statements that give no rows. */
    void run(const std::string &sql);
    /* keep: the statement stays prepared for long. */
    Statement prepare(std::string_view sql, bool keep = false);
    /* The first column of the first row; 0 when there is none. */
    std::int64_t integer(std::string_view sql);
    int changes() const { return sqlite3_changes(database_.get()); }
    std::int64_t lastId() const { return sqlite3_last_insert_rowid(database_.get()); }

  private:
    struct Close {
        void operator()(sqlite3 *database) const { sqlite3_close_v2(database); }
    };
    std::unique_ptr<sqlite3, Close> database_;
};

/* Undone at its end unless committed, with the temporary tables that were made meanwhile. */
class Transaction {
  public:
    /* begin: "BEGIN" of one moment to read, or "BEGIN IMMEDIATE" to write. */
    Transaction(Connection &connection, const std::string &begin) : connection_(connection) {
        connection.run(begin);
    }
    ~Transaction() {
        if (isOpen_) {
            sqlite3_exec(connection_.get(), "ROLLBACK", nullptr, nullptr, nullptr);
        }
    }
    Transaction(const Transaction &) = delete;
    Transaction &operator=(const Transaction &) = delete;
    void commit() {
        connection_.run("COMMIT");
        isOpen_ = false;
    }

  private:
    Connection &connection_;
    bool isOpen_ = true;
};

}  // namespace zano::mediadb::sqlite

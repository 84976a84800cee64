/* libpq's handles as objects. Failures throw DatabaseError with the server's own words. */
#pragma once

#include <cstdint>
#include <initializer_list>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "../catalogue.h"
#include "../query/render.h"
#include "libpq.h"

namespace zano::mediadb::postgresql {

const Dialect &dialect();
Sql newSql(std::string_view text);

/* What the server refused, by its SQLSTATE. */
class ServerError : public DatabaseError {
  public:
    ServerError(int code, const std::string &message, std::string state)
        : DatabaseError(code, message), state_(std::move(state)) {}
    const std::string &state() const { return state_; }

  private:
    std::string state_;
};

/* The server is gone, and the connection of no more use. */
class LostConnection : public ServerError {
  public:
    using ServerError::ServerError;
};

/* One row of a result, which must outlive it. */
class Row {
  public:
    Row(const PGresult *result, int row) : result_(result), row_(row) {}

    /* Numbers are 0 where the value is null. */
    std::int64_t integer(int column) const;
    double real(int column) const;
    std::string_view text(int column) const;

  private:
    const PGresult *result_;
    int row_;
};

class Result {
  public:
    explicit Result(PGresult *result) : result_(result) {}

    PGresult *get() const { return result_.get(); }
    PGresult *release() { return result_.release(); }
    int size() const { return libpq().ntuples(result_.get()); }
    Row operator[](int row) const { return {result_.get(), row}; }

  private:
    struct Clear {
        void operator()(PGresult *result) const { libpq().clear(result); }
    };
    std::unique_ptr<PGresult, Clear> result_;
};

/* An array value in text form, for a parameter that is unnested. */
class ArrayText {
  public:
    void add(std::int64_t value) { next().append(std::to_string(value)); }
    void add(int value) { add(std::int64_t{value}); }
    void add(double value);
    void add(std::string_view value) { appendTextElement(next(), value); }
    void addPath(std::string_view value) { appendPathElement(next(), value); }
    std::string take() { return text_.empty() ? "{}" : std::move(text_) + "}"; }

  private:
    std::string &next() { return text_.append(text_.empty() ? "{" : ","); }
    std::string text_;
};

/* The server takes no bytes that are not UTF-8. No stored text has them, so they become a character
 * that none has either and that sorts behind all others, as such bytes do. */
std::string validText(std::string_view text);

/* Rows in text form, as COPY takes them. */
class CopyText {
  public:
    void add(std::int64_t value) { next().append(std::to_string(value)); }
    void add(double value);
    void add(std::string_view value);
    void addPath(std::string_view value);
    void endRow();
    std::string &text() { return text_; }

  private:
    std::string &next() { return text_.append(std::exchange(isFirst_, false) ? "" : "\t"); }
    bool isFirst_ = true;  // of its row
    std::string text_;
};

class Connection {
  public:
    /* For writing, the primary among several hosts. */
    enum class Access { Read, Write };
    Connection(const std::string &uri, Access access);

    /* Texts of ours, several statements perhaps; the last one's result, as text. */
    Result run(const std::string &sql);
    /* One statement of ours that is not kept. */
    Result runOnce(const char *sql);
    /* Whether the server plans a statement for the very values that are bound, or once for all. */
    enum class Plan { ForValues, Kept };
    /* One statement, with its values bound. */
    Result run(const Sql &sql, Plan plan = Plan::ForValues) {
        usePlan(plan);
        return execute(prepare(sql.text()), sql.values());
    }
    /* Statements without values and then one with, in one message to the server; all their results.
     * They are a transaction of their own, unless they begin one that stays. */
    std::vector<Result> runTogether(std::initializer_list<std::string> first, const Sql &sql,
                                    Plan plan);
    /* Without waiting for the end of it, or ever looking at it; the next statement waits. */
    void runLater(const char *sql);
    /* "COPY table(columns) FROM STDIN", any number of rows for it, and their end. What the server
     * refuses fails at the end at the latest, and the transaction with it. Another statement in the
     * place of the end gives the rows up. */
    void beginCopy(const char *sql);
    void sendRows(std::string_view rows);
    void endCopy();
    /* So that a text that the server refuses fails before it is run. */
    void check(const Sql &sql) { prepare(sql.text()); }
    /* PostgreSQL itself, and not an engine that only speaks its protocol. */
    bool knowsPlans() const { return knowsPlans_; }
    /* Under which the server knows a statement from now until the next one is prepared. */
    const std::string &nameOf(const std::string &sql) { return prepare(sql).name; }
    /* The first column of the first row; `fallback` when there is none. */
    std::int64_t integer(const Sql &sql, Plan plan = Plan::ForValues, std::int64_t fallback = 0);

    bool isBroken() const {
        return isOutOfStep_ || libpq().status(connection_.get()) != CONNECTION_OK;
    }

  private:
    struct Finish {
        void operator()(PGconn *connection) const { libpq().finish(connection); }
    };
    /* As the server understood it. */
    struct Prepared {
        std::string name;
        std::vector<Oid> types;
    };

    void makeRoom(size_t statements);
    const Prepared &prepare(const std::string &sql);
    Result execute(const Prepared &statement, const std::vector<Value> &values);
    void send(const Prepared &statement, const std::vector<Value> &values);
    void require(bool isSent);
    void awaitIdle();
    std::vector<Result> takeResults(size_t count);
    static std::string planSetting(Plan plan);
    void usePlan(Plan plan);
    Result checked(PGresult *result);
    [[noreturn]] void throwErrorOf(const PGresult *result);
    void applySettings(Access access);

    std::unique_ptr<PGconn, Finish> connection_;
    std::map<std::string, Prepared> prepared_;  // stay where they are
    std::uint64_t names_ = 0;
    bool isOutOfStep_ = false;
    bool knowsPlans_ = false;   // the server has a setting for them
    std::optional<Plan> plan_;  // of the setting; null: not known
};

}  // namespace zano::mediadb::postgresql

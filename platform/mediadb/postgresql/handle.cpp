#include "handle.h"

#include <endian.h>
#include <zanoplatform/error.h>

#include <array>
#include <bit>
#include <charconv>
#include <cstring>
#include <utility>

#include "../engine.h"
#include "text/fold.h"
#include "text/utf8.h"

namespace zano::mediadb::postgresql {
namespace {

constexpr size_t kMaxStatements = 64;
/* What would end a value or a row, and the letters that stand for it behind a backslash. */
constexpr std::string_view kCopyEscapes = "\\\t\n\r";
constexpr std::string_view kCopyLetters = "\\tnr";
constexpr Oid kBytes = 17;
constexpr Oid kInt8 = 20;
constexpr Oid kInt2 = 21;
constexpr Oid kInt4 = 23;
constexpr Oid kFloat4 = 700;
constexpr Oid kFloat8 = 701;

/* By the beginning of the SQLSTATE, the longest first. */
struct StateCode {
    std::string_view state;
    int code;
};
constexpr std::array kStateCodes = {
    StateCode{"57014", KLIB_ERR_DATABASE_TIMEOUT},  // canceled by the time limit
    StateCode{"42501", KLIB_ERR_DATABASE_OPEN},     // no right
    StateCode{"25006", KLIB_ERR_DATABASE_OPEN},     // not the primary
    StateCode{"3F000", KLIB_ERR_DATABASE_OPEN},     // no schema
    StateCode{"42P01", KLIB_ERR_DATABASE_OPEN},     // no table
    StateCode{"53200", KLIB_ERR_OUT_OF_MEMORY},
    StateCode{"55P03", KLIB_ERR_DATABASE_BUSY},  // waited too long for a lock
    StateCode{"40", KLIB_ERR_DATABASE_BUSY},     // a deadlock, or a conflict on a standby
    StateCode{"22", KLIB_ERR_DATABASE_QUERY},
    StateCode{"42", KLIB_ERR_DATABASE_QUERY},
    StateCode{"54", KLIB_ERR_DATABASE_QUERY},  // too complex
};

int errorCodeOf(std::string_view state) {
    for (const StateCode &row : kStateCodes) {
        if (state.substr(0, row.state.size()) == row.state) {
            return row.code;
        }
    }
    return KLIB_ERR_DATABASE_FAILED;
}

std::string firstLine(const char *message) {
    std::string_view text(message != nullptr ? message : "");
    text = text.substr(0, text.find_last_not_of('\n') + 1);
    return std::string(text);
}

template <typename Integer>
Integer bigEndian(const char *bytes) {
    std::make_unsigned_t<Integer> value = 0;
    for (size_t i = 0; i < sizeof value; ++i) {
        value = static_cast<decltype(value)>((std::uint64_t{value} << 8) |
                                             static_cast<unsigned char>(bytes[i]));
    }
    return static_cast<Integer>(value);
}

std::string textOf(double value) {
    std::array<char, 40> digits{};
    const auto end = std::to_chars(digits.data(), digits.data() + digits.size(), value).ptr;
    return {digits.data(), end};
}

std::string parameterText(const Value &value, Oid type) {
    if (const auto *text = std::get_if<std::string>(&value)) {
        return type == kBytes ? *text : validText(*text);
    }
    if (const auto *integer = std::get_if<std::int64_t>(&value)) {
        return std::to_string(*integer);
    }
    return textOf(std::get<double>(value));
}

/* Values as libpq takes them. */
class Parameters {
  public:
    Parameters(const std::vector<Value> &values, const std::vector<Oid> &types) {
        texts_.reserve(values.size());
        for (size_t i = 0; i < values.size(); ++i) {
            const std::string &text = texts_.emplace_back(parameterText(values[i], types.at(i)));
            pointers_.push_back(text.c_str());
            lengths_.push_back(static_cast<int>(text.size()));
            formats_.push_back(types[i] == kBytes ? 1 : 0);
        }
    }
    int count() const { return static_cast<int>(texts_.size()); }
    const char *const *values() const { return pointers_.data(); }
    const int *lengths() const { return lengths_.data(); }
    const int *formats() const { return formats_.data(); }

  private:
    std::vector<std::string> texts_;
    std::vector<const char *> pointers_;
    std::vector<int> lengths_, formats_;
};

void ignoreNotice(void *, const PGresult *) {}

}  // namespace

const Dialect &dialect() {
    static constexpr Dialect kDialect{'$',      true,        "",           "",         "zano_lower",
                                      "length", "",          "",           "::bigint", "::float8",
                                      "::text", "zano_text", "::bigint[]", true,       "ALL"};
    return kDialect;
}

Sql newSql(std::string_view text) {
    Sql sql(dialect());
    sql.add(text);
    return sql;
}

std::string validText(std::string_view text) {
    if (isUtf8(text)) {
        return std::string(text);
    }
    constexpr std::string_view kLastCharacter = "\xF4\x8F\xBF\xBF";
    std::string valid;
    while (!text.empty()) {
        const std::string_view before = text;
        takeCharacter(text);
        const std::string_view taken = before.substr(0, before.size() - text.size());
        valid.append(isUtf8(taken) ? taken : kLastCharacter);
    }
    return valid;
}

void ArrayText::add(double value) {
    next().append(textOf(value));
}

void CopyText::add(double value) {
    next().append(textOf(value));
}

void CopyText::add(std::string_view value) {
    std::string &text = next();
    for (const char c : validText(value)) {
        const size_t escape = kCopyEscapes.find(c);
        if (escape == std::string_view::npos) {
            text += c;
        } else {
            text.append("\\").append(1, kCopyLetters[escape]);
        }
    }
}

void CopyText::addPath(std::string_view value) {
    constexpr std::string_view kDigits = "0123456789abcdef";
    std::string &text = next().append("\\\\x");
    for (const char c : value) {
        const auto byte = static_cast<unsigned char>(c);
        text.append(1, kDigits[byte >> 4U]).append(1, kDigits[byte & 15U]);
    }
}

void CopyText::endRow() {
    text_ += '\n';
    isFirst_ = true;
}

std::int64_t Row::integer(int column) const {
    const char *value = libpq().getvalue(result_, row_, column);
    if (libpq().getisnull(result_, row_, column) != 0) {
        return 0;
    }
    if (libpq().fformat(result_, column) == 0) {
        std::int64_t number = 0;
        std::from_chars(value, value + libpq().getlength(result_, row_, column), number);
        return number;
    }
    switch (libpq().ftype(result_, column)) {
        case kInt2:
            return bigEndian<std::int16_t>(value);
        case kInt4:
            return bigEndian<std::int32_t>(value);
        case kInt8:
            return bigEndian<std::int64_t>(value);
        default:
            throw DatabaseError(KLIB_ERR_DATABASE_FAILED,
                                "the media database gave something else than an integer");
    }
}

double Row::real(int column) const {
    const char *value = libpq().getvalue(result_, row_, column);
    switch (libpq().getisnull(result_, row_, column) != 0 ? 0 : libpq().ftype(result_, column)) {
        case 0:
            return 0;
        case kFloat4:
            return std::bit_cast<float>(bigEndian<std::int32_t>(value));
        case kFloat8:
            return std::bit_cast<double>(bigEndian<std::int64_t>(value));
        default:
            return static_cast<double>(integer(column));
    }
}

std::string_view Row::text(int column) const {
    return {libpq().getvalue(result_, row_, column),
            static_cast<size_t>(libpq().getlength(result_, row_, column))};
}

/* What stands before dbname is a default that the address may change; what stands behind it holds.
 * A server that vanishes without a word is given up after half a minute. */
Connection::Connection(const std::string &uri, Access access) {
    const bool isWriter = access == Access::Write;
    const std::array<const char *, 9> names = {
        "connect_timeout",  "keepalives_idle",  "keepalives_interval",
        "keepalives_count", "tcp_user_timeout", "fallback_application_name",
        "dbname",           "client_encoding",  isWriter ? "target_session_attrs" : nullptr};
    const std::array<const char *, 9> values = {"5",    "10",        "5",    "3",         "30000",
                                                "zano", uri.c_str(), "UTF8", "read-write"};
    std::array<const char *, 10> keys{};
    std::copy(names.begin(), names.end(), keys.begin());
    std::array<const char *, 10> settings{};
    std::copy(values.begin(), values.end(), settings.begin());
    connection_.reset(libpq().connectdbParams(keys.data(), settings.data(), 1));
    if (!connection_) {
        throw std::bad_alloc();
    }
    libpq().setNoticeReceiver(connection_.get(), ignoreNotice, nullptr);
    if (isBroken()) {
        throw DatabaseError(
            KLIB_ERR_DATABASE_OPEN,
            std::string("could not connect to the media database") +
                (isWriter ? " for writing: " : ": ") +
                withoutPassword(firstLine(libpq().errorMessage(connection_.get())), uri));
    }
    const char *encoding = libpq().parameterStatus(connection_.get(), "server_encoding");
    if (encoding == nullptr || std::string_view(encoding) != "UTF8") {
        throw DatabaseError(KLIB_ERR_DATABASE_OPEN,
                            "the PostgreSQL database of the media database is not in UTF8");
    }
    applySettings(access);
}

/* The plan of a statement depends on the words that are searched for; and a page is wanted whole,
 * so no plan is made for the first tenth of it. The keys stand behind a dozen columns in wide rows,
 * whose reading the planner takes for cheaper than it is; by an index alone they are counted twice
 * as fast. Engines that only speak PostgreSQL's protocol do not know these settings. */
void Connection::applySettings(Access access) {
    std::string needed = "SET search_path=zano, pg_catalog; SET statement_timeout=";
    needed += access == Access::Read
                  ? std::to_string(kQueryLimitMs) +
                        "; SET SESSION CHARACTERISTICS AS TRANSACTION ISOLATION LEVEL REPEATABLE "
                        "READ, READ ONLY"
                  : "0; SET lock_timeout=10000";
    try {
        run(needed +
            "; SET plan_cache_mode=force_custom_plan; SET cursor_tuple_fraction=1; SET jit=off; "
            "SET seq_page_cost=1.25");
        knowsPlans_ = true;
        plan_ = Plan::ForValues;
    } catch (const ServerError &error) {
        if (error.state() != "42704") {
            throw;
        }
        run(needed);
    }
}

Result Connection::checked(PGresult *made) {
    Result result(made);
    const ExecStatusType status = libpq().resultStatus(made);
    if (status == PGRES_COMMAND_OK || status == PGRES_TUPLES_OK) {
        return result;
    }
    throwErrorOf(made);
}

void Connection::throwErrorOf(const PGresult *made) {
    plan_.reset();  // a transaction that fails takes settings back
    const char *state =
        made != nullptr ? libpq().resultErrorField(made, PG_DIAG_SQLSTATE) : nullptr;
    const char *words =
        state != nullptr ? libpq().resultErrorField(made, PG_DIAG_MESSAGE_PRIMARY) : nullptr;
    const int code = errorCodeOf(state != nullptr ? state : "");
    const std::string message =
        "the media database could not answer: " +
        firstLine(words != nullptr ? words : libpq().errorMessage(connection_.get()));
    if (isBroken()) {
        throw LostConnection(code, message, state != nullptr ? state : "");
    }
    throw ServerError(code, message, state != nullptr ? state : "");
}

std::string Connection::planSetting(Plan plan) {
    return plan == Plan::Kept ? "SET plan_cache_mode=force_generic_plan"
                              : "SET plan_cache_mode=force_custom_plan";
}

void Connection::usePlan(Plan plan) {
    if (knowsPlans_ && plan_ != plan) {
        run(planSetting(plan));
        plan_ = plan;
    }
}

void Connection::runLater(const char *sql) {
    if (libpq().sendQuery(connection_.get(), sql) == 0) {
        checked(nullptr);
    }
}

void Connection::beginCopy(const char *sql) {
    Result result(libpq().exec(connection_.get(), sql));
    if (libpq().resultStatus(result.get()) != PGRES_COPY_IN) {
        throwErrorOf(result.get());
    }
}

void Connection::sendRows(std::string_view rows) {
    if (libpq().putCopyData(connection_.get(), rows.data(), static_cast<int>(rows.size())) != 1) {
        throwErrorOf(nullptr);
    }
}

/* The connection is of use again only when all results were taken. */
void Connection::endCopy() {
    if (libpq().putCopyEnd(connection_.get(), nullptr) != 1) {
        throwErrorOf(nullptr);
    }
    Result result(libpq().getResult(connection_.get()));
    while (PGresult *more = libpq().getResult(connection_.get())) {
        libpq().clear(more);
    }
    if (libpq().resultStatus(result.get()) != PGRES_COMMAND_OK) {
        throwErrorOf(result.get());
    }
}

Result Connection::run(const std::string &sql) {
    return checked(libpq().exec(connection_.get(), sql.c_str()));
}

Result Connection::runOnce(const char *sql) {
    return checked(
        libpq().execParams(connection_.get(), sql, 0, nullptr, nullptr, nullptr, nullptr, 1));
}

void Connection::makeRoom(size_t statements) {
    if (prepared_.size() + statements > kMaxStatements) {
        run(std::string("DEALLOCATE ALL"));
        prepared_.clear();
    }
}

const Connection::Prepared &Connection::prepare(const std::string &sql) {
    if (const auto known = prepared_.find(sql); known != prepared_.end()) {
        return known->second;
    }
    makeRoom(1);
    Prepared made{"s" + std::to_string(++names_), {}};
    checked(libpq().prepare(connection_.get(), made.name.c_str(), sql.c_str(), 0, nullptr));
    const Result described =
        checked(libpq().describePrepared(connection_.get(), made.name.c_str()));
    for (int i = 0; i < libpq().nparams(described.get()); ++i) {
        made.types.push_back(libpq().paramtype(described.get(), i));
    }
    return prepared_.emplace(sql, std::move(made)).first->second;
}

Result Connection::execute(const Prepared &statement, const std::vector<Value> &values) {
    const Parameters parameters(values, statement.types);
    return checked(libpq().execPrepared(connection_.get(), statement.name.c_str(),
                                        parameters.count(), parameters.values(),
                                        parameters.lengths(), parameters.formats(), 1));
}

void Connection::send(const Prepared &statement, const std::vector<Value> &values) {
    const Parameters parameters(values, statement.types);
    require(libpq().sendQueryPrepared(connection_.get(), statement.name.c_str(), parameters.count(),
                                      parameters.values(), parameters.lengths(),
                                      parameters.formats(), 1) != 0);
}

void Connection::require(bool isSent) {
    if (!isSent) {
        checked(nullptr);
    }
}

/* The end of what was to run later. */
void Connection::awaitIdle() {
    while (PGresult *late = libpq().getResult(connection_.get())) {
        const Result unread(late);
    }
}

/* The results of a pipeline; the first failure in it is thrown when all of them are taken. */
std::vector<Result> Connection::takeResults(size_t count) {
    std::vector<Result> results;
    for (size_t i = 0; i < count; ++i) {
        results.emplace_back(libpq().getResult(connection_.get()));
        libpq().getResult(connection_.get());  // null, which ends the statement
    }
    const Result end(libpq().getResult(connection_.get()));
    isOutOfStep_ = libpq().exitPipelineMode(connection_.get()) == 0;
    for (Result &result : results) {
        Result taken = checked(result.release());
        result = std::move(taken);
    }
    return results;
}

std::vector<Result> Connection::runTogether(std::initializer_list<std::string> first,
                                            const Sql &sql, Plan plan) {
    const bool isPlanNew = knowsPlans_ && plan_ != plan;
    makeRoom(first.size() + 2);
    std::vector<const Prepared *> statements;
    if (isPlanNew) {
        statements.push_back(&prepare(planSetting(plan)));
    }
    for (const std::string &text : first) {
        statements.push_back(&prepare(text));
    }
    const Prepared &last = prepare(sql.text());
    awaitIdle();
    isOutOfStep_ = true;  // until all of it is sent and read, also when memory runs out meanwhile
    require(libpq().enterPipelineMode(connection_.get()) != 0);
    for (const Prepared *statement : statements) {
        send(*statement, {});
    }
    send(last, sql.values());
    require(libpq().pipelineSync(connection_.get()) != 0);
    std::vector<Result> results = takeResults(statements.size() + 1);
    plan_ = plan;
    results.erase(results.begin(), results.begin() + (isPlanNew ? 1 : 0));
    return results;
}

std::int64_t Connection::integer(const Sql &sql, Plan plan, std::int64_t fallback) {
    const Result result = run(sql, plan);
    return result.size() > 0 ? result[0].integer(0) : fallback;
}

}  // namespace zano::mediadb::postgresql

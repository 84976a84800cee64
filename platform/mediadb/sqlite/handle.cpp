#include "handle.h"

#include <zanoplatform/error.h>

#include "../catalogue.h"

namespace zano::mediadb::sqlite {
namespace {

int errorCodeOf(int result) {
    switch (result & 0xFF) {
        case SQLITE_NOMEM:
            return KLIB_ERR_OUT_OF_MEMORY;
        case SQLITE_BUSY:
        case SQLITE_LOCKED:
            return KLIB_ERR_DATABASE_BUSY;
        case SQLITE_CANTOPEN:
        case SQLITE_NOTADB:
        case SQLITE_PERM:
        case SQLITE_READONLY:
            return KLIB_ERR_DATABASE_OPEN;
        case SQLITE_INTERRUPT:
            return KLIB_ERR_DATABASE_TIMEOUT;
        case SQLITE_AUTH:
        case SQLITE_TOOBIG:
            return KLIB_ERR_DATABASE_QUERY;
        default:
            return KLIB_ERR_DATABASE_FAILED;
    }
}

}  // namespace

void fail(sqlite3 *database, int result, std::string_view tried) {
    std::string message("could not ");
    message.append(tried).append(": ");
    message.append(database != nullptr ? sqlite3_errmsg(database) : sqlite3_errstr(result));
    throw DatabaseError(errorCodeOf(result), message);
}

Statement::Statement(sqlite3 *database, std::string_view sql, bool keep) {
    sqlite3_stmt *statement = nullptr;
    const int result =
        sqlite3_prepare_v3(database, sql.data(), static_cast<int>(sql.size()),
                           keep ? SQLITE_PREPARE_PERSISTENT : 0, &statement, nullptr);
    statement_.reset(statement);
    if (result != SQLITE_OK) {
        fail(database, result, "prepare a statement");
    }
}

Statement &Statement::bind(int index, std::int64_t value) {
    if (const int result = sqlite3_bind_int64(statement_.get(), index, value)) {
        fail(sqlite3_db_handle(statement_.get()), result, "bind a value");
    }
    return *this;
}

Statement &Statement::bind(int index, double value) {
    if (const int result = sqlite3_bind_double(statement_.get(), index, value)) {
        fail(sqlite3_db_handle(statement_.get()), result, "bind a value");
    }
    return *this;
}

Statement &Statement::bind(int index, std::string_view value) {
    /* A null pointer would bind NULL. */
    const char *data = value.data() != nullptr ? value.data() : "";
    if (const int result = sqlite3_bind_text64(statement_.get(), index, data, value.size(),
                                               SQLITE_STATIC, SQLITE_UTF8)) {
        fail(sqlite3_db_handle(statement_.get()), result, "bind a value");
    }
    return *this;
}

Statement &Statement::bindNull(int index) {
    sqlite3_bind_null(statement_.get(), index);
    return *this;
}

Statement &Statement::bindValue(int index, const Value &value) {
    std::visit(
        [this, index](const auto &held) {
            if constexpr (std::is_same_v<std::decay_t<decltype(held)>, std::string>) {
                bind(index, std::string_view(held));
            } else {
                bind(index, held);
            }
        },
        value);
    return *this;
}

Statement &Statement::bindPointer(int index, void *pointer, const char *type) {
    sqlite3_bind_pointer(statement_.get(), index, pointer, type, nullptr);
    return *this;
}

bool Statement::step() {
    const int result = sqlite3_step(statement_.get());
    if (result == SQLITE_ROW) {
        return true;
    }
    if (result != SQLITE_DONE) {
        sqlite3 *database = sqlite3_db_handle(statement_.get());
        const std::string words = sqlite3_errmsg(database);
        sqlite3_reset(statement_.get());
        throw DatabaseError(errorCodeOf(result), "could not run a statement: " + words);
    }
    sqlite3_reset(statement_.get());
    return false;
}

void Statement::run() {
    while (step()) {
    }
}

void Statement::reset() noexcept {
    sqlite3_reset(statement_.get());
}

std::int64_t Statement::integer(int column) const {
    return sqlite3_column_int64(statement_.get(), column);
}

double Statement::real(int column) const {
    return sqlite3_column_double(statement_.get(), column);
}

bool Statement::isNull(int column) const {
    return sqlite3_column_type(statement_.get(), column) == SQLITE_NULL;
}

std::string_view Statement::text(int column) const {
    const auto *text =
        reinterpret_cast<const char *>(sqlite3_column_text(statement_.get(), column));
    return text == nullptr
               ? std::string_view()
               : std::string_view(
                     text, static_cast<size_t>(sqlite3_column_bytes(statement_.get(), column)));
}

Connection::Connection(const std::string &path, Mode mode) {
    int flags = SQLITE_OPEN_EXRESCODE;
    switch (mode) {
        case Mode::ReadOnly:
            /* Whoever holds a connection for reading has it to himself. */
            flags |= SQLITE_OPEN_READONLY | SQLITE_OPEN_NOMUTEX;
            break;
        case Mode::ReadWrite:
            flags |= SQLITE_OPEN_READWRITE;
            break;
        case Mode::Create:
            flags |= SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE;
            break;
    }
    sqlite3 *database = nullptr;
    const int result = sqlite3_open_v2(path.c_str(), &database, flags, nullptr);
    database_.reset(database);
    if (result != SQLITE_OK) {
        fail(database, result, "open the media database " + path);
    }
}

void Connection::run(const std::string &sql) {
    if (const int result = sqlite3_exec(get(), sql.c_str(), nullptr, nullptr, nullptr)) {
        fail(get(), result, "run \"" + sql.substr(0, 60) + "\"");
    }
}

Statement Connection::prepare(std::string_view sql, bool keep) {
    return Statement(get(), sql, keep);
}

std::int64_t Connection::integer(std::string_view sql) {
    Statement statement = prepare(sql);
    return statement.step() ? statement.integer(0) : 0;
}

}  // namespace zano::mediadb::sqlite

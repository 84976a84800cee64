/* The best that can be written by hand: prepared statements through SQLite's own interface, each
 * filling the same records as the library and linking them into a list. */
#pragma once

#include <vorelix/records.h>

#include <memory>
#include <string>
#include <vector>

struct sqlite3;
struct sqlite3_stmt;

namespace zano::bench {

class Raw {
  public:
    explicit Raw(const std::string &path);
    ~Raw();
    Raw(const Raw &) = delete;
    Raw &operator=(const Raw &) = delete;

    /* Prepares once; the number names the statement from then on. Columns are written by hand as
     * kColumns. */
    int prepare(const std::string &sql);

    /* Runs a statement with texts and numbers bound, in this order, and frees what it gave;
     * returns the number of rows. */
    int rows(int statement, const std::vector<std::string> &texts,
             const std::vector<long> &numbers);
    /* The same, once for each id, into one list. */
    int rowsById(int statement, const std::vector<long> &ids);
    /* The first column of the first row. */
    long number(int statement, const std::vector<std::string> &texts);

    std::string text(int statement);
    /* Runs a statement of one text column into records' titles. */
    int values(int statement);

    static const std::string kColumns;

  private:
    static ZANO_PLAYLIST_REC *record(sqlite3_stmt *row);
    sqlite3 *database_ = nullptr;
    std::vector<sqlite3_stmt *> statements_;
};

}  // namespace zano::bench

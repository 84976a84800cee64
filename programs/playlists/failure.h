/* What was asked for could not be done. */
#pragma once

#include <stdexcept>
#include <string>

namespace vorelix {

/* What a program can tell its callers apart by. */
enum class FailureKind {
    kOther,
    kDatabase,  // the media database gave no answer
    kNoSong,    // there is no song of an id
    kNoFile,    // the playlist's file is gone
    kTaken,     // there is a file of that name already
    kBusy,      // another program did not end its change in time
};

/* what() is for the user: what was tried, and what to do next. */
class Failure : public std::runtime_error {
  public:
    explicit Failure(const std::string &text, FailureKind kind = FailureKind::kOther)
        : std::runtime_error(text), kind_(kind) {}

    FailureKind kind() const { return kind_; }

  private:
    FailureKind kind_;
};

/* Throws the Failure of a library call that gave no result, right after it: what could not be
 * done, what is wrong and what to do next, and on a second line the platform's own words. */
[[noreturn]] void throwDatabaseFailure(const std::string &what);

}  // namespace vorelix

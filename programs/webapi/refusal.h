/* Why a request is not done, as its envelope tells. */
#pragma once

#include <stdexcept>
#include <string>

namespace webapi {

/* The statuses of docs/web-api.md. */
enum Status {
    kPartialContent = 206,
    kBadRequest = 400,
    kNoUser = 401,
    kForbidden = 403,
    kNotFound = 404,
    kWrongMethod = 405,
    kConflict = 409,
    kTooLarge = 413,
    kNoSuchRange = 416,
    kFailed = 500,
};

class Refusal : public std::runtime_error {
  public:
    /* key: the parameter, or the thing that failed. headers: more lines of the answer's header,
     * each with its line end. line: of the place that refuses; left to the compiler. */
    Refusal(Status status, const std::string &key, std::string headers = {},
            int line = __builtin_LINE())
        : std::runtime_error(key), status_(status), headers_(std::move(headers)), line_(line) {}

    Status status() const { return status_; }
    const char *key() const { return what(); }
    const std::string &headers() const { return headers_; }
    int line() const { return line_; }

  private:
    Status status_;
    std::string headers_;
    int line_;
};

}  // namespace webapi

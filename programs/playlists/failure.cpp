#include "failure.h"

#include <zanoplatform/error.h>

#include <algorithm>
#include <iterator>
#include "text.h"

namespace vorelix {

namespace {

struct Cause {
    int code;
    const char *text;  // what is wrong; what to do next
};

constexpr Cause kCauses[] = {
    {KLIB_ERR_BAD_CONFIGURATION, "the setting mediadb could not be used; correct it in zano.conf"},
    {KLIB_ERR_DATABASE_OPEN,
     "the media database could not be read; index a folder first: zanoindex FOLDER"},
    {KLIB_ERR_DATABASE_VERSION,
     "the media database was written by a newer version; use the vorelix of that version"},
    {KLIB_ERR_DATABASE_TIMEOUT,
     "the media database took too long; try again, or search for a longer text"},
    {KLIB_ERR_DATABASE_BUSY, "the media database is in use; try again when zanoindex has finished"},
};

constexpr const char *kOtherCause =
    "the media database gave no answer; see the library's log with --verbose";

}  // namespace

void throwDatabaseFailure(const std::string &what) {
    const int code = KLIBCErrGet();
    const std::string reason = printable(KLIBCErrTextGet());
    const auto *known = std::find_if(std::begin(kCauses), std::end(kCauses),
                                     [&](const Cause &row) { return row.code == code; });
    const std::string cause = known != std::end(kCauses) ? known->text : kOtherCause;
    throw Failure(
        "could not " + what + ": " + cause + (reason.empty() ? "" : "\nreason: " + reason),
        FailureKind::kDatabase);
}

}  // namespace vorelix

/* The border between the exported functions of the media database and its inside. */
#pragma once

#include <zanoplatform/error.h>

#include <exception>
#include <new>

#include "catalogue.h"
#include "query/parse.h"
#include "strings/error_internal.h"

namespace zano::mediadb {

/* Runs `action`, whose result it gives; what that throws becomes the error of this thread, and -1.
 */
template <typename Action>
int guarded(Action action) noexcept {
    try {
        clearError();
        return action();
    } catch (const DatabaseError &error) {
        setError(error.code(), error.what());
    } catch (const QueryError &error) {
        setError(KLIB_ERR_DATABASE_QUERY, error.what());
    } catch (const std::bad_alloc &) {
        setError(KLIB_ERR_OUT_OF_MEMORY, "out of memory in the media database");
    } catch (const std::exception &error) {
        setError(KLIB_ERR_DATABASE_FAILED, error.what());
    }
    return -1;
}

}  // namespace zano::mediadb

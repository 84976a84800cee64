/* Lets one allocation of the code under test fail.
 *
 * For a program that links the objects under test itself, with
 * -Wl,--wrap=malloc,--wrap=calloc,--wrap=realloc: their calls then arrive here and pass on to the
 * real ones, so that leaks are still seen. */
#pragma once

#include <cstddef>

namespace failing_allocator {

/* One allocation of exactly so many bytes fails, after `after` that do not. */
void failOnSize(std::size_t size, int after = 0);

/* True when that allocation was asked for and failed. */
bool hasFailed();

}  // namespace failing_allocator

#include "support/failing_allocator.h"

#include <cerrno>

namespace {

std::size_t failingSize = 0;
int passesLeft = 0;
bool failed = false;

bool fails(std::size_t size) {
    if (failed || failingSize != size || passesLeft-- > 0) {
        return false;
    }
    errno = ENOMEM;
    return failed = true;
}

}  // namespace

namespace failing_allocator {

void failOnSize(std::size_t size, int after) {
    failingSize = size;
    passesLeft = after;
    failed = false;
}

bool hasFailed() {
    return failed;
}

}  // namespace failing_allocator

// The names that the linker's --wrap gives to caller and callee.
extern "C" {

void *realMalloc(std::size_t size) __asm__("__real_malloc");
void *realCalloc(std::size_t count, std::size_t size) __asm__("__real_calloc");
void *realRealloc(void *block, std::size_t size) __asm__("__real_realloc");
// Visible, for the linker takes the shared libraries' calls for calls of these.
#define EXPORTED __attribute__((visibility("default")))
EXPORTED void *wrappedMalloc(std::size_t size) __asm__("__wrap_malloc");
EXPORTED void *wrappedCalloc(std::size_t count, std::size_t size) __asm__("__wrap_calloc");
EXPORTED void *wrappedRealloc(void *block, std::size_t size) __asm__("__wrap_realloc");

void *wrappedMalloc(std::size_t size) {
    return fails(size) ? nullptr : realMalloc(size);
}

void *wrappedCalloc(std::size_t count, std::size_t size) {
    return fails(count * size) ? nullptr : realCalloc(count, size);
}

void *wrappedRealloc(void *block, std::size_t size) {
    return fails(size) ? nullptr : realRealloc(block, size);
}

}  // extern "C"

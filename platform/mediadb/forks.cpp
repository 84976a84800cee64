#include "forks.h"

#include <pthread.h>

#include <atomic>
#include <new>

namespace zano::mediadb {

/* Counted by the C library at each fork, since asking for the process costs a system call. */
unsigned forksSoFar() {
    static std::atomic<unsigned> forks{0};
    static const int registered = pthread_atfork(nullptr, nullptr, [] { ++forks; });
    if (registered != 0) {
        throw std::bad_alloc();
    }
    return forks;
}

}  // namespace zano::mediadb

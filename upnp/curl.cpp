#include <dlfcn.h>

#include "curl_internal.h"

namespace vorelix::upnp {

namespace {

template <typename Function>
bool find(void *library, const char *name, Function &function) {
    function = reinterpret_cast<Function>(dlsym(library, name));
    return function != nullptr;
}

bool findAll(void *library, Curl &functions) {
    return find(library, "curl_global_init", functions.globalInit) &&
           find(library, "curl_global_cleanup", functions.globalCleanup) &&
           find(library, "curl_easy_init", functions.easyInit) &&
           find(library, "curl_easy_setopt", functions.easySetopt) &&
           find(library, "curl_easy_perform", functions.easyPerform) &&
           find(library, "curl_easy_cleanup", functions.easyCleanup) &&
           find(library, "curl_slist_append", functions.slistAppend) &&
           find(library, "curl_slist_free_all", functions.slistFreeAll);
}

/* A program that has a libcurl keeps to that one. */
struct Loaded {
    Curl functions{};
    bool isWhole = findAll(RTLD_DEFAULT, functions);

    Loaded() {
        void *library = isWhole ? nullptr : dlopen(VORELIX_LIBCURL_SONAME, RTLD_NOW | RTLD_LOCAL);
        isWhole = isWhole || (library != nullptr && findAll(library, functions));
    }
};

}  // namespace

const Curl *curl() {
    static const Loaded loaded;
    return loaded.isWhole ? &loaded.functions : nullptr;
}

}  // namespace vorelix::upnp

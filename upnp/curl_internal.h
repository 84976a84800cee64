/* libcurl, loaded when it is first wanted: most programs that use the library never ask a media
 * server, and loading it would take most of their time. */
#pragma once

#include <curl/curl.h>

namespace vorelix::upnp {

struct Curl {
    decltype(&curl_global_init) globalInit;
    decltype(&curl_global_cleanup) globalCleanup;
    decltype(&curl_easy_init) easyInit;
    decltype(&curl_easy_setopt) easySetopt;
    decltype(&curl_easy_perform) easyPerform;
    decltype(&curl_easy_cleanup) easyCleanup;
    decltype(&curl_slist_append) slistAppend;
    decltype(&curl_slist_free_all) slistFreeAll;
};

/* Null when it is not installed. It stays loaded. */
const Curl *curl();

}  // namespace vorelix::upnp

#pragma once

#include <curl/curl.h>

/// libcurl's functions. The first call of curl() loads and initialises the library, as many users' agents
/// never make a request: libcurl brings some twenty-five libraries along, which cost more than the rest of a
/// start.
///
/// If loading fails, the program ends with a message, as with the dynamic linker.
struct CurlLibrary
{
    decltype(&curl_easy_init) easyInit;
    decltype(&curl_easy_cleanup) easyCleanup;
    decltype(&curl_easy_setopt) easySetopt;
    decltype(&curl_easy_getinfo) easyGetinfo;
    decltype(&curl_easy_strerror) easyStrerror;
    decltype(&curl_multi_init) multiInit;
    decltype(&curl_multi_cleanup) multiCleanup;
    decltype(&curl_multi_add_handle) multiAddHandle;
    decltype(&curl_multi_remove_handle) multiRemoveHandle;
    decltype(&curl_multi_perform) multiPerform;
    decltype(&curl_multi_poll) multiPoll;
    decltype(&curl_multi_info_read) multiInfoRead;
    decltype(&curl_slist_append) slistAppend;
    decltype(&curl_slist_free_all) slistFreeAll;
    decltype(&curl_share_init) shareInit;
    decltype(&curl_share_setopt) shareSetopt;
    decltype(&curl_share_cleanup) shareCleanup;
};

const CurlLibrary& curl();

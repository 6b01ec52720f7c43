#include "curl_library.h"

#include <QLibrary>
#include <QtDebug>

namespace {

template <typename Function> Function resolve(QLibrary& library, const char* name)
{
    const auto function = library.resolve(name);
    if (function == nullptr) {
        qFatal("libcurl: %s", qUtf8Printable(library.errorString()));
    }
    // Exported symbols have no type. NOLINTNEXTLINE(cppcoreguidelines-pro-type-reinterpret-cast)
    return reinterpret_cast<Function>(function);
}

/// Must be the first call of libcurl, and the only one of its kind.
void initialise(QLibrary& library)
{
    const CURLcode result =
        resolve<decltype(&curl_global_init)>(library, "curl_global_init")(CURL_GLOBAL_DEFAULT);
    if (result != CURLE_OK) {
        const auto describe = resolve<decltype(&curl_easy_strerror)>(library, "curl_easy_strerror");
        qFatal("libcurl: %s", describe(result));
    }
}

CurlLibrary load()
{
    constexpr int abi = 4;
    QLibrary library(QStringLiteral("curl"), abi);
    initialise(library);
    return {
        resolve<decltype(&curl_easy_init)>(library, "curl_easy_init"),
        resolve<decltype(&curl_easy_cleanup)>(library, "curl_easy_cleanup"),
        resolve<decltype(&curl_easy_setopt)>(library, "curl_easy_setopt"),
        resolve<decltype(&curl_easy_getinfo)>(library, "curl_easy_getinfo"),
        resolve<decltype(&curl_easy_strerror)>(library, "curl_easy_strerror"),
        resolve<decltype(&curl_multi_init)>(library, "curl_multi_init"),
        resolve<decltype(&curl_multi_cleanup)>(library, "curl_multi_cleanup"),
        resolve<decltype(&curl_multi_add_handle)>(library, "curl_multi_add_handle"),
        resolve<decltype(&curl_multi_remove_handle)>(library, "curl_multi_remove_handle"),
        resolve<decltype(&curl_multi_perform)>(library, "curl_multi_perform"),
        resolve<decltype(&curl_multi_poll)>(library, "curl_multi_poll"),
        resolve<decltype(&curl_multi_info_read)>(library, "curl_multi_info_read"),
        resolve<decltype(&curl_slist_append)>(library, "curl_slist_append"),
        resolve<decltype(&curl_slist_free_all)>(library, "curl_slist_free_all"),
        resolve<decltype(&curl_share_init)>(library, "curl_share_init"),
        resolve<decltype(&curl_share_setopt)>(library, "curl_share_setopt"),
        resolve<decltype(&curl_share_cleanup)>(library, "curl_share_cleanup"),
    };
}

} // namespace

const CurlLibrary& curl()
{
    static const CurlLibrary library = load();
    return library;
}

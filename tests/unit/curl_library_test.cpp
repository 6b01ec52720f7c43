#include <QLibrary>
#include <QtTest>

#include <cstdlib>
#include <cstring>

#include "curl_library.h"

namespace {

int allocations = 0;

void* countedMalloc(size_t size)
{
    ++allocations;
    return std::malloc(size);
}

void* countedCalloc(size_t count, size_t size)
{
    ++allocations;
    return std::calloc(count, size);
}

} // namespace

/// libcurl, loaded by its first use.
class CurlLibraryTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    /// libcurl takes other functions for its memory only as long as it is not initialised.
    void isInitialisedBeforeAnythingElse()
    {
        const CurlLibrary& library = curl();
        QLibrary file(QStringLiteral("curl"), 4);
        const auto initialiseOtherwise =
            reinterpret_cast<decltype(&curl_global_init_mem)>(file.resolve("curl_global_init_mem"));
        QCOMPARE(initialiseOtherwise(CURL_GLOBAL_DEFAULT, countedMalloc, std::free, std::realloc, strdup,
                                     countedCalloc),
                 CURLE_OK);
        library.easyCleanup(library.easyInit());
        QCOMPARE(allocations, 0);
    }
};

QTEST_GUILESS_MAIN(CurlLibraryTest)
#include "curl_library_test.moc"

#include "memory.h"

#include <QAbstractEventDispatcher>

#include <malloc.h>

#include <ctime>

void keepNoLargeBlocks()
{
    constexpr int kLargeBytes = 128 * 1024; // the C library's initial threshold
    mallopt(M_MMAP_THRESHOLD, kLargeBytes);
}

void giveMemoryBackAfterWork()
{
    constexpr std::clock_t kMuchWork = CLOCKS_PER_SEC / 5;
    const std::clock_t begin = std::clock();
    QObject::connect(QAbstractEventDispatcher::instance(), &QAbstractEventDispatcher::aboutToBlock,
                     [last = begin]() mutable {
                         const std::clock_t now = std::clock();
                         if (now - last > kMuchWork) {
                             giveMemoryBack();
                             last = now;
                         }
                     });
}

void giveMemoryBack()
{
    static_cast<void>(malloc_trim(0)); // whether there was any to give
}

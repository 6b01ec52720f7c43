#include <QDir>
#include <QFileInfo>

#include <cstdint>
#include <iostream>

#include "files.h"

extern "C" int LLVMFuzzerInitialize(int* argc, char*** argv);
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

/// Runs a fuzz target on each file of the given folders, and names each first, so that the last name belongs
/// to the input that the target fell over.
int main(int argc, char* argv[])
{
    LLVMFuzzerInitialize(&argc, &argv);
    int replayed = 0;
    for (int i = 1; i < argc; ++i) {
        const auto inputs = QDir(QString::fromLocal8Bit(argv[i])).entryInfoList(QDir::Files, QDir::Name);
        for (const QFileInfo& input : inputs) {
            std::cout << qPrintable(input.fileName()) << '\n' << std::flush;
            const QByteArray content = readBytes(input.filePath());
            LLVMFuzzerTestOneInput(reinterpret_cast<const std::uint8_t*>(content.constData()),
                                   static_cast<std::size_t>(content.size()));
            ++replayed;
        }
    }
    if (replayed == 0) {
        std::cerr << "there is no input to replay\n";
        return 1;
    }
    return 0;
}

#include "log_text.h"

#include <QDebug>

#include <algorithm>
#include <array>

namespace {

// Characters are compared in blocks, which compilers turn into vector instructions.
constexpr std::size_t kBlock = 16;

bool isPrintableAscii(ushort unit)
{
    return unit >= ' ' && unit <= '~';
}

bool isEscaped(ushort unit)
{
    return unit == '"' || unit == '\\';
}

/// Whether all characters of a block stay unescaped.
bool isPlain(const ushort* block)
{
    std::array<ushort, kBlock> isSpecial{};
    for (std::size_t i = 0; i < kBlock; ++i) {
        isSpecial[i] = !isPrintableAscii(block[i]) || isEscaped(block[i]) ? 1 : 0;
    }
    ushort any = 0;
    for (const ushort special : isSpecial) {
        any |= special;
    }
    return any == 0;
}

/// Appends printable ASCII up to the first other character; returns that character's position.
const ushort* appendAscii(QString& result, const ushort* at, const ushort* end)
{
    const int before = result.size();
    result.resize(before + 2 * static_cast<int>(end - at)); // room for a backslash before each
    // A QChar is a ushort but is copied more slowly.
    auto* const begin = reinterpret_cast<ushort*>(result.data());
    ushort* to = begin + before;
    while (at != end && isPrintableAscii(*at)) {
        if (end - at >= static_cast<std::ptrdiff_t>(kBlock) && isPlain(at)) {
            to = std::copy_n(at, kBlock, to);
            at += kBlock;
            continue;
        }
        const ushort* const stop = std::min(at + kBlock, end);
        for (; at != stop && isPrintableAscii(*at); ++at) {
            if (isEscaped(*at)) {
                *to++ = '\\';
            }
            *to++ = *at;
        }
    }
    result.truncate(static_cast<int>(to - begin));
    return at;
}

/// Appends everything up to the next printable ASCII character; returns that character's position. QDebug
/// escapes each of these characters on its own.
const ushort* appendOther(QString& result, const ushort* at, const ushort* end)
{
    const ushort* const ascii = std::find_if(at, end, isPrintableAscii);
    QString escaped;
    QDebug(&escaped).nospace() << QStringView(at, ascii).toString();
    result += escaped.midRef(1, escaped.size() - 2);
    return ascii;
}

} // namespace

QString quoted(const QString& text)
{
    QString result(QLatin1Char('"'));
    const ushort* at = text.utf16();
    const ushort* const end = at + text.size();
    while (at != end) {
        at = isPrintableAscii(*at) ? appendAscii(result, at, end) : appendOther(result, at, end);
    }
    return result + QLatin1Char('"');
}

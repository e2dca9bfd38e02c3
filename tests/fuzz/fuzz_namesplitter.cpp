// libFuzzer target for the splitting of a text file into names. Built and
// run by scripts/fuzz.sh, outside the normal build and test run.
//
// For any bytes: no crash, every name is non-empty, holds no separator,
// apostrophe or NUL, keeps at most MaxNameLength characters, and feeding the
// bytes in two pieces at any point gives the same names as feeding them whole.
#include "names/namesplitter.h"

#include <cstdint>
#include <cstdlib>

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    if (size == 0)
        return 0;
    // The first byte chooses where the rest is cut in two.
    const QByteArrayView bytes(reinterpret_cast<const char*>(data) + 1, qsizetype(size - 1));
    const qsizetype cut = bytes.isEmpty() ? 0 : qsizetype(data[0]) % (bytes.size() + 1);

    const std::vector<NameSplitter::Name> whole = NameSplitter::split(bytes);
    NameSplitter splitter;
    std::vector<NameSplitter::Name> pieces;
    splitter.feed(bytes.first(cut), pieces);
    splitter.feed(bytes.sliced(cut), pieces);
    splitter.finish(pieces);
    if (pieces != whole)
        std::abort();

    for (const NameSplitter::Name& name : whole) {
        if (name.length <= 0 || name.text.isEmpty())
            std::abort();
        if (name.text.size() != std::min(name.length, NameSplitter::MaxNameLength))
            std::abort();
        for (const QChar c : name.text) {
            if (c == u'\r' || c == u'\n' || c == u'\'' || c == u'\0')
                std::abort();
        }
    }
    return 0;
}

// Makes the hover cursor HAND-M.CUR: a white pointing hand with a black
// outline and a soft shadow, hotspot at the tip of the index finger.
//
//     makecursor <output.cur>

#include "base/cursorfile.h"

#include <QImage>
#include <QSaveFile>

#include <array>
#include <cstdio>

namespace {

// X outline, o fill, blank transparent.
constexpr std::array<const char*, 22> Hand{
    "      XX          ", //
    "     XooX         ", //
    "     XooX         ", //
    "     XooX         ", //
    "     XooX         ", //
    "     XooXXX       ", //
    "     XooXooXXX    ", //
    "     XooXooXooXX  ", //
    "     XooXooXooXoX ", //
    " XX  XooXooXooXooX", //
    "XooX XoooooooooooX", //
    "XoooXXoooooooooooX", //
    " XoooXoooooooooooX", //
    "  XooXoooooooooooX", //
    "  XooooooooooooooX", //
    "   XoooooooooooooX", //
    "   XooooooooooooX ", //
    "    XoooooooooooX ", //
    "     XoooooooooX  ", //
    "     XoooooooooX  ", //
    "      XoooooooX   ", //
    "      XXXXXXXXX   ", //
};

constexpr int Side = 32;
constexpr int Left = 1; // where the picture sits in the cursor
constexpr int Top = 1;
constexpr int ShadowAlpha = 72;

char at(int x, int y)
{
    if (y < 0 || y >= int(Hand.size()) || x < 0)
        return ' ';
    const char* row = Hand[std::size_t(y)];
    for (int i = 0; i <= x; ++i) {
        if (row[i] == '\0')
            return ' ';
    }
    return row[x];
}

} // namespace

int main(int argc, char** argv)
{
    if (argc != 2) {
        std::fprintf(stderr, "usage: makecursor <output.cur>\n");
        return 2;
    }

    QImage image(Side, Side, QImage::Format_ARGB32);
    image.fill(Qt::transparent);
    for (int y = 0; y < Side; ++y) {
        for (int x = 0; x < Side; ++x) {
            const char own = at(x - Left, y - Top);
            if (own == 'X')
                image.setPixel(x, y, qRgba(0, 0, 0, 255));
            else if (own == 'o')
                image.setPixel(x, y, qRgba(255, 255, 255, 255));
            else if (at(x - Left - 1, y - Top - 1) != ' ')
                image.setPixel(x, y, qRgba(0, 0, 0, ShadowAlpha));
        }
    }
    // The tip of the index finger.
    const QPoint hotSpot(Left + 6, Top);

    QSaveFile file(QString::fromLocal8Bit(argv[1]));
    if (!file.open(QIODevice::WriteOnly)) {
        std::fprintf(stderr, "makecursor: cannot write %s\n", argv[1]);
        return 1;
    }
    file.write(writeCursorFile(image, hotSpot));
    if (!file.commit()) {
        std::fprintf(stderr, "makecursor: cannot write %s\n", argv[1]);
        return 1;
    }
    return 0;
}

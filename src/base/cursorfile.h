#pragma once

#include <QByteArray>
#include <QImage>
#include <QPoint>

#include <optional>

// A cursor file: the icon container (type 2, cursor) whose directory entry
// carries the hotspot, holding a bitmap with its AND mask or a PNG picture.
struct CursorPicture {
    QImage image; // ARGB32
    QPoint hotSpot;
};

// Reads the first picture of a cursor file with its hotspot. Nothing when the
// bytes are not a well-formed cursor file: wrong header, an entry that points
// outside the file, a bitmap cut short, a hotspot outside the picture.
std::optional<CursorPicture> readCursorFile(const QByteArray& bytes);

// Writes one 32-bit picture (at most 256 by 256) as a cursor file: the alpha
// channel becomes the colour's alpha, and fully transparent pixels are set in
// the AND mask so that older readers see them as transparent too.
QByteArray writeCursorFile(const QImage& image, QPoint hotSpot);

#include "base/cursorfile.h"

#include <QBuffer>
#include <QImageReader>
#include <QtEndian>

namespace {

constexpr qsizetype HeaderSize = 6;
constexpr qsizetype EntrySize = 16;
constexpr quint32 BitmapInfoSize = 40;
constexpr quint16 CursorType = 2;
constexpr int MaxSide = 256;

quint16 u16(const QByteArray& bytes, qsizetype at)
{
    return qFromLittleEndian<quint16>(bytes.constData() + at);
}

quint32 u32(const QByteArray& bytes, qsizetype at)
{
    return qFromLittleEndian<quint32>(bytes.constData() + at);
}

void put16(QByteArray& bytes, quint16 value)
{
    char raw[2];
    qToLittleEndian(value, raw);
    bytes.append(raw, 2);
}

void put32(QByteArray& bytes, quint32 value)
{
    char raw[4];
    qToLittleEndian(value, raw);
    bytes.append(raw, 4);
}

// A 32-bit bitmap with its AND mask, rows from the bottom up. Pictures that
// carry no alpha at all (every alpha byte zero) take their transparency from
// the mask, as older writers expect.
std::optional<QImage> readBitmap32(const QByteArray& payload, int width, int height)
{
    const qsizetype colourRow = qsizetype(width) * 4;
    const qsizetype maskRow = ((qsizetype(width) + 31) / 32) * 4;
    const qsizetype needed = BitmapInfoSize + colourRow * height + maskRow * height;
    if (payload.size() < needed)
        return std::nullopt;

    const auto* colours = reinterpret_cast<const uchar*>(payload.constData()) + BitmapInfoSize;
    const uchar* mask = colours + colourRow * height;
    bool anyAlpha = false;
    for (qsizetype i = 3; i < colourRow * height; i += 4)
        anyAlpha = anyAlpha || colours[i] != 0;

    QImage image(width, height, QImage::Format_ARGB32);
    if (image.isNull())
        return std::nullopt;
    for (int y = 0; y < height; ++y) {
        const uchar* source = colours + colourRow * (height - 1 - y);
        const uchar* maskBits = mask + maskRow * (height - 1 - y);
        auto* target = reinterpret_cast<QRgb*>(image.scanLine(y));
        for (int x = 0; x < width; ++x) {
            const uchar* p = source + 4 * x;
            const bool masked = (maskBits[x / 8] >> (7 - x % 8)) & 1;
            const int alpha = anyAlpha ? p[3] : (masked ? 0 : 255);
            target[x] = qRgba(p[2], p[1], p[0], alpha);
        }
    }
    return image;
}

} // namespace

std::optional<CursorPicture> readCursorFile(const QByteArray& bytes)
{
    if (bytes.size() < HeaderSize + EntrySize)
        return std::nullopt;
    if (u16(bytes, 0) != 0 || u16(bytes, 2) != CursorType || u16(bytes, 4) == 0)
        return std::nullopt;

    const qsizetype entry = HeaderSize;
    const QPoint hotSpot(u16(bytes, entry + 4), u16(bytes, entry + 6));
    const quint32 size = u32(bytes, entry + 8);
    const quint32 offset = u32(bytes, entry + 12);
    if (offset < HeaderSize + EntrySize || offset > quint64(bytes.size())
        || size > quint64(bytes.size()) - offset)
        return std::nullopt;
    const QByteArray payload = bytes.mid(offset, size);

    QImage image;
    if (payload.startsWith("\x89PNG")) {
        if (!image.loadFromData(payload, "PNG"))
            return std::nullopt;
        image = image.convertToFormat(QImage::Format_ARGB32);
    } else {
        if (payload.size() < qsizetype(BitmapInfoSize) || u32(payload, 0) != BitmapInfoSize)
            return std::nullopt;
        const auto width = qint32(u32(payload, 4));
        const auto doubledHeight = qint32(u32(payload, 8));
        const quint16 planes = u16(payload, 12);
        const quint16 bits = u16(payload, 14);
        const quint32 compression = u32(payload, 16);
        // The height covers the colours and the mask, one above the other.
        if (width <= 0 || width > MaxSide || doubledHeight <= 0 || doubledHeight % 2 != 0
            || doubledHeight > 2 * MaxSide || planes != 1 || compression != 0)
            return std::nullopt;
        const int height = doubledHeight / 2;
        if (bits == 32) {
            std::optional<QImage> bitmap = readBitmap32(payload, width, height);
            if (!bitmap)
                return std::nullopt;
            image = *bitmap;
        } else {
            // Palette and 24-bit pictures: the image library's icon reader.
            QBuffer buffer;
            buffer.setData(bytes);
            QImageReader reader(&buffer, "ico");
            if (!reader.read(&image))
                return std::nullopt;
            image = image.convertToFormat(QImage::Format_ARGB32);
        }
    }
    if (image.isNull() || !image.rect().contains(hotSpot))
        return std::nullopt;
    return CursorPicture{image, hotSpot};
}

QByteArray writeCursorFile(const QImage& picture, QPoint hotSpot)
{
    const QImage image = picture.convertToFormat(QImage::Format_ARGB32);
    const int width = image.width();
    const int height = image.height();
    const qsizetype maskRow = ((qsizetype(width) + 31) / 32) * 4;
    const auto payloadSize =
        quint32(BitmapInfoSize + qsizetype(width) * 4 * height + maskRow * height);

    QByteArray bytes;
    put16(bytes, 0);
    put16(bytes, CursorType);
    put16(bytes, 1);
    bytes.append(char(width == MaxSide ? 0 : width));
    bytes.append(char(height == MaxSide ? 0 : height));
    bytes.append(char(0)); // no palette
    bytes.append(char(0));
    put16(bytes, quint16(hotSpot.x()));
    put16(bytes, quint16(hotSpot.y()));
    put32(bytes, payloadSize);
    put32(bytes, quint32(HeaderSize + EntrySize));

    put32(bytes, BitmapInfoSize);
    put32(bytes, quint32(width));
    put32(bytes, quint32(2 * height));
    put16(bytes, 1);  // planes
    put16(bytes, 32); // bits per pixel
    put32(bytes, 0);  // uncompressed
    put32(bytes, quint32(qsizetype(width) * 4 * height + maskRow * height));
    put32(bytes, 0);
    put32(bytes, 0);
    put32(bytes, 0);
    put32(bytes, 0);

    for (int y = height - 1; y >= 0; --y) {
        const auto* row = reinterpret_cast<const QRgb*>(image.constScanLine(y));
        for (int x = 0; x < width; ++x) {
            bytes.append(char(qBlue(row[x])));
            bytes.append(char(qGreen(row[x])));
            bytes.append(char(qRed(row[x])));
            bytes.append(char(qAlpha(row[x])));
        }
    }
    for (int y = height - 1; y >= 0; --y) {
        const auto* row = reinterpret_cast<const QRgb*>(image.constScanLine(y));
        QByteArray bits(maskRow, '\0');
        for (int x = 0; x < width; ++x) {
            if (qAlpha(row[x]) == 0)
                bits[x / 8] = char(uchar(bits[x / 8]) | (0x80 >> (x % 8)));
        }
        bytes.append(bits);
    }
    return bytes;
}

#pragma once

#include <QFont>
#include <QRect>
#include <QtMath>

// The layouts are drawn in twips; on screen 15 twips make one pixel.
inline int twipsToPixels(double twips)
{
    return qRound(twips / 15.0);
}

inline QRect twipsRect(int left, int top, int width, int height)
{
    return {twipsToPixels(left), twipsToPixels(top), twipsToPixels(width), twipsToPixels(height)};
}

// The windows' fonts: Arial bold (or the system's metric-compatible stand-in).
inline QFont arialBold(double points)
{
    QFont font(QStringLiteral("Arial"));
    font.setPointSizeF(points);
    font.setBold(true);
    return font;
}

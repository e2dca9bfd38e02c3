// Draws the program's artwork: the icon in the usual sizes and the picture
// the splash window greets the user with. Everything is drawn here, from
// shapes and the fonts on the build machine, so the build needs no picture
// files from anywhere else.
//
// usage: makeartwork ICON_FOLDER SPLASH_FOLDER
//   ICON_FOLDER gets quillane-<size>.png for each icon size;
//   SPLASH_FOLDER gets quillane-splash.png and nothing else, since the splash
//   window shows the first file it finds there.
#include <QDir>
#include <QFont>
#include <QGuiApplication>
#include <QImage>
#include <QLinearGradient>
#include <QPainter>
#include <QPainterPath>
#include <QRadialGradient>
#include <QSaveFile>

#include <cstdio>

using namespace Qt::StringLiterals;

namespace {

const QColor Ink(0x1d, 0x2f, 0x55);
const QColor Deep(0x16, 0x3a, 0x6b);
const QColor Sea(0x2a, 0x7f, 0x9e);
const QColor Gold(0xe8, 0xb8, 0x4a);
const QColor Paper(0xfb, 0xf8, 0xf1);

// A card of a name list: rounded paper with two ruled name lines.
void drawCard(QPainter& p, const QRectF& card, double angle, const QColor& paper, bool lines)
{
    p.save();
    p.translate(card.center());
    p.rotate(angle);
    const QRectF r(-card.width() / 2, -card.height() / 2, card.width(), card.height());
    p.setPen(Qt::NoPen);
    p.setBrush(QColor(0, 0, 0, 60));
    p.drawRoundedRect(r.translated(0, card.height() * 0.03), card.width() * 0.08,
                      card.width() * 0.08);
    p.setBrush(paper);
    p.drawRoundedRect(r, card.width() * 0.08, card.width() * 0.08);
    if (lines) {
        p.setPen(
            QPen(QColor(0x9a, 0xa7, 0xb8), card.height() * 0.045, Qt::SolidLine, Qt::RoundCap));
        const double left = r.left() + r.width() * 0.14;
        for (const double y : {0.70, 0.84}) {
            const double right = r.left() + r.width() * (y < 0.8 ? 0.86 : 0.66);
            p.drawLine(QPointF(left, r.top() + r.height() * y),
                       QPointF(right, r.top() + r.height() * y));
        }
    }
    p.restore();
}

// A quill feather laid across the mark, nib at the lower left.
void drawQuill(QPainter& p, const QPointF& nib, double length, double angle)
{
    p.save();
    p.translate(nib);
    p.rotate(angle);
    QPainterPath vane;
    vane.moveTo(0, 0);
    vane.cubicTo(length * 0.35, -length * 0.02, length * 0.75, -length * 0.16, length,
                 -length * 0.05);
    vane.cubicTo(length * 0.8, length * 0.08, length * 0.4, length * 0.09, length * 0.12,
                 length * 0.03);
    vane.closeSubpath();
    QLinearGradient shade(0, -length * 0.12, 0, length * 0.08);
    shade.setColorAt(0, Qt::white);
    shade.setColorAt(1, QColor(0xd9, 0xe4, 0xf0));
    p.setPen(QPen(Ink, length * 0.012));
    p.setBrush(shade);
    p.drawPath(vane);
    p.setPen(QPen(Ink, length * 0.018, Qt::SolidLine, Qt::RoundCap));
    p.drawLine(QPointF(0, 0), QPointF(length * 0.92, -length * 0.055));
    p.restore();
}

// The mark: a stack of name cards, a "Q" on the front one, a quill over it.
void drawMark(QPainter& p, const QRectF& box, bool withBackground)
{
    const double s = box.width();
    if (withBackground) {
        QLinearGradient back(box.topLeft(), box.bottomRight());
        back.setColorAt(0, Sea);
        back.setColorAt(1, Deep);
        p.setPen(Qt::NoPen);
        p.setBrush(back);
        p.drawRoundedRect(box.adjusted(s * 0.02, s * 0.02, -s * 0.02, -s * 0.02), s * 0.2, s * 0.2);
    }
    const QRectF card(box.left() + s * 0.2, box.top() + s * 0.22, s * 0.56, s * 0.62);
    drawCard(p, card.translated(s * 0.07, -s * 0.04), 12, QColor(0xc9, 0xd8, 0xe8), false);
    drawCard(p, card.translated(s * 0.03, -s * 0.02), 5, QColor(0xe3, 0xea, 0xf2), false);
    drawCard(p, card, -4, Paper, s >= 40);

    p.save();
    p.translate(card.center());
    p.rotate(-4);
    QFont serif(u"Liberation Serif"_s);
    serif.setBold(true);
    serif.setPixelSize(int(s * (s >= 40 ? 0.40 : 0.50)));
    p.setFont(serif);
    p.setPen(Ink);
    const QRectF letter(-card.width() / 2, -card.height() / 2, card.width(),
                        card.height() * (s >= 40 ? 0.66 : 1.0));
    p.drawText(letter, Qt::AlignCenter, u"Q"_s);
    p.restore();

    if (s >= 40)
        drawQuill(p, QPointF(box.left() + s * 0.50, box.top() + s * 0.80), s * 0.52, -58);
}

QImage icon(int size)
{
    QImage image(size, size, QImage::Format_ARGB32_Premultiplied);
    image.fill(Qt::transparent);
    QPainter p(&image);
    p.setRenderHint(QPainter::Antialiasing);
    p.setRenderHint(QPainter::TextAntialiasing);
    drawMark(p, QRectF(0, 0, size, size), true);
    return image;
}

QImage splashPicture()
{
    const int width = 480;
    const int height = 300;
    QImage image(width, height, QImage::Format_RGB32);
    QPainter p(&image);
    p.setRenderHint(QPainter::Antialiasing);
    p.setRenderHint(QPainter::TextAntialiasing);

    QLinearGradient sky(0, 0, width, height);
    sky.setColorAt(0, QColor(0x1f, 0x5f, 0x8b));
    sky.setColorAt(0.55, Deep);
    sky.setColorAt(1, QColor(0x10, 0x20, 0x3d));
    p.fillRect(image.rect(), sky);
    QRadialGradient glow(QPointF(width * 0.30, height * 0.35), width * 0.55);
    glow.setColorAt(0, QColor(255, 255, 255, 45));
    glow.setColorAt(1, QColor(255, 255, 255, 0));
    p.fillRect(image.rect(), glow);

    // A scatter of names in the background, as from a generated list.
    const struct {
        const char16_t* name;
        double x, y;
        int pixels;
        bool italic;
    } names[] = {
        {u"Tobias Wren", 16, 26, 14, false},     {u"Adela Marsh", 232, 32, 17, true},
        {u"Ines Calloway", 372, 60, 13, false},  {u"Rufus Penhale", 112, 58, 12, true},
        {u"Mira Oakes", 300, 92, 15, true},      {u"Lena Brook", 12, 246, 13, false},
        {u"Edwin Talbot", 150, 228, 15, true},   {u"Sabine Lark", 330, 224, 13, false},
        {u"Henry Ashdown", 124, 266, 12, false}, {u"Clara Voss", 270, 256, 14, true},
        {u"Oswin Hale", 404, 248, 12, true},     {u"Jonah Fairweather", 14, 62, 11, true},
    };
    for (const auto& n : names) {
        QFont font(u"Liberation Serif"_s);
        font.setPixelSize(n.pixels);
        font.setItalic(n.italic);
        p.setFont(font);
        p.setPen(QColor(255, 255, 255, 46));
        p.drawText(QPointF(n.x, n.y), QString::fromUtf16(n.name));
    }

    drawMark(p, QRectF(34, 78, 128, 128), false);

    QFont title(u"Liberation Serif"_s);
    title.setBold(true);
    title.setPixelSize(58);
    title.setLetterSpacing(QFont::PercentageSpacing, 102);
    p.setFont(title);
    p.setPen(QColor(0, 0, 0, 90));
    p.drawText(QPointF(178, 150), u"Quillane"_s);
    p.setPen(Qt::white);
    p.drawText(QPointF(176, 147), u"Quillane"_s);

    p.setPen(QPen(Gold, 2));
    p.drawLine(QPointF(180, 163), QPointF(446, 163));

    QFont tagline(u"Liberation Sans"_s);
    tagline.setPixelSize(16);
    p.setFont(tagline);
    p.setPen(QColor(0xe6, 0xee, 0xf7));
    p.drawText(QPointF(180, 189), u"Random names, as many as you need"_s);

    QFont small(u"Liberation Sans"_s);
    small.setPixelSize(11);
    p.setFont(small);
    p.setPen(QColor(255, 255, 255, 150));
    p.drawText(QRectF(0, height - 26, width - 14, 16), Qt::AlignRight | Qt::AlignVCenter,
               u"Version 1.0"_s);
    return image;
}

bool save(const QImage& image, const QString& path)
{
    QSaveFile file(path);
    if (!file.open(QIODevice::WriteOnly) || !image.save(&file, "PNG") || !file.commit()) {
        std::fprintf(stderr, "makeartwork: cannot write %s\n", qPrintable(path));
        return false;
    }
    return true;
}

} // namespace

int main(int argc, char** argv)
{
    // Drawing text needs the font database, which needs a GUI application;
    // no display is needed.
    qputenv("QT_QPA_PLATFORM", "offscreen");
    QGuiApplication app(argc, argv);
    if (argc != 3) {
        std::fprintf(stderr, "usage: makeartwork ICON_FOLDER SPLASH_FOLDER\n");
        return 2;
    }
    const QDir icons(QString::fromLocal8Bit(argv[1]));
    const QDir splash(QString::fromLocal8Bit(argv[2]));
    if (!icons.mkpath(u"."_s) || !splash.mkpath(u"."_s)) {
        std::fprintf(stderr, "makeartwork: cannot make the output folders\n");
        return 1;
    }
    for (const int size : {16, 24, 32, 48, 64, 128, 256}) {
        if (!save(icon(size), icons.filePath(u"quillane-%1.png"_s.arg(size))))
            return 1;
    }
    return save(splashPicture(), splash.filePath(u"quillane-splash.png"_s)) ? 0 : 1;
}

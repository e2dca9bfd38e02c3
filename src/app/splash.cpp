#include "app/splash.h"

#include "base/clock.h"
#include "base/dialogs.h"
#include "base/settings.h"
#include "app/twips.h"
#include "app/windowroutines.h"

#include <QCheckBox>
#include <QCloseEvent>
#include <QDir>
#include <QDirIterator>
#include <QImageReader>
#include <QLabel>
#include <QPixmap>

using namespace Qt::StringLiterals;

namespace {

constexpr int TwipsPerPixel = 15;
// The white strip under the picture that holds the check box.
constexpr int StripTwips = 300;
constexpr int CheckLeftTwips = 120;
constexpr int CheckWidthTwips = 4215;
constexpr int CheckHeightTwips = 375;
// The box ends this far above the window's bottom edge.
constexpr int CheckGapTwips = 20;
// The edge lines sit this far inside the right and bottom edges, which puts
// them on the last pixel column and row.
constexpr int LineInsetTwips = 10;

constexpr double PauseSeconds = 4.0;
constexpr double DevelopmentPauseSeconds = 0.4;

QWidget* line(QWidget* window, const QString& name)
{
    auto* l = new QWidget(window);
    l->setObjectName(name);
    l->setAutoFillBackground(true);
    l->setBackgroundRole(QPalette::WindowText);
    // Clicks go to whatever lies under the line.
    l->setAttribute(Qt::WA_TransparentForMouseEvents);
    return l;
}

} // namespace

Splash::Splash(Environment& environment, QWidget* parent)
    : QWidget(parent, Qt::SplashScreen | Qt::FramelessWindowHint)
    , m_env(environment)
    , Image1(new QLabel(this))
    , Check1(new QCheckBox(this))
    , Line1(line(this, u"Line1"_s))
    , Line2(line(this, u"Line2"_s))
    , Line3(line(this, u"Line3"_s))
    , Line4(line(this, u"Line4"_s))
{
    setObjectName(u"Splash"_s);
    QPalette white = palette();
    white.setColor(QPalette::Window, Qt::white);
    setPalette(white);
    setAutoFillBackground(true);

    Image1->setObjectName(u"Image1"_s);
    Image1->setAlignment(Qt::AlignLeft | Qt::AlignTop);
    Image1->setScaledContents(false);

    Check1->setObjectName(u"Check1"_s);
    Check1->setText(u"Hide this at next startup"_s);
    Check1->setFont(arialBold(9));
    Check1->setPalette(white);
    // A button fills with the button colour unless told otherwise.
    Check1->setBackgroundRole(QPalette::Window);
    Check1->setAutoFillBackground(true);
    Check1->setChecked(false);
    Check1->setGeometry(twipsRect(CheckLeftTwips, 0, CheckWidthTwips, CheckHeightTwips));

    // The lines lie over the picture, so they frame it on every side.
    for (QWidget* l : {Line1, Line2, Line3, Line4})
        l->raise();

    connect(Check1, &QCheckBox::clicked, this, &Splash::Check1_Click);
}

void Splash::SplashShow()
{
    if (!splashWanted(m_env.settings))
        return;
    const QString path = splashPicturePath(m_env.programFolder);
    if (path.isEmpty() || !FileExists(path))
        return;
    // A file that is no picture we can read is passed over: the program
    // starts without its greeting rather than not at all.
    QImageReader reader(path);
    reader.setAutoTransform(true);
    const QImage picture = reader.read();
    if (picture.isNull())
        return;

    setWindowTitle(ApplicationTitle);

    // Image1 shows the picture at its own size from the top left corner and
    // reaches over the white strip below it.
    Image1->setPixmap(QPixmap::fromImage(picture));
    const int width = picture.width();
    const int height = picture.height() + twipsToPixels(StripTwips);
    Image1->setGeometry(0, 0, width, height);
    setFixedSize(width, height);

    const int heightTwips = height * TwipsPerPixel;
    const int widthTwips = width * TwipsPerPixel;
    Check1->move(Check1->x(), twipsToPixels(heightTwips - CheckHeightTwips - CheckGapTwips));

    // One pixel wide, along the whole of each edge, on its outermost pixels.
    const int right = twipsToPixels(widthTwips - LineInsetTwips);
    const int bottom = twipsToPixels(heightTwips - LineInsetTwips);
    Line1->setGeometry(0, 0, 1, height);
    Line2->setGeometry(0, 0, width, 1);
    Line3->setGeometry(right, 0, 1, height);
    Line4->setGeometry(0, bottom, width, 1);

    show();
    CenterForm(this);
    Pause(InDevelopment() ? DevelopmentPauseSeconds : PauseSeconds);
    hide();
}

void Splash::Pause(double seconds)
{
    waitSeconds(m_env.clock, seconds);
}

void Splash::Check1_Click()
{
    m_env.settings.write(u"ShowAgain"_s, Check1->isChecked() ? u"1"_s : u"0"_s);
}

void Splash::closeEvent(QCloseEvent* event)
{
    // The window has no close box; a close asked for from outside (a window
    // manager's key, say) would only cut the greeting short, so it stays
    // for its pause.
    event->ignore();
}

bool splashWanted(const Settings& settings)
{
    bool isNumber = false;
    const double value = settings.read(u"ShowAgain"_s, u"0"_s).trimmed().toDouble(&isNumber);
    return isNumber && value == 0.0;
}

QString splashPicturePath(const QString& programFolder)
{
    const QString folder = QDir(programFolder).filePath(u"Splash"_s);
    // Without QDir::Hidden and QDir::System hidden files and broken links are
    // left out; the iterator keeps the file system's own order.
    QDirIterator listing(folder, QDir::Files);
    if (!listing.hasNext())
        return {};
    listing.next();
    return QDir(folder).filePath(listing.fileName());
}

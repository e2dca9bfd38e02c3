#include "app/form2.h"

#include "app/layout.h"
#include "app/resultssaver.h"
#include "app/twips.h"
#include "app/windowpointer.h"
#include "app/windowroutines.h"
#include "base/trap.h"
#include "names/database.h"

#include <QApplication>
#include <QCloseEvent>
#include <QGroupBox>
#include <QHeaderView>
#include <QPushButton>
#include <QRadioButton>
#include <QTableView>

using namespace Qt::StringLiterals;

Form2::Form2(Environment& environment, QWidget& mainWindow)
    : QWidget(nullptr, Qt::Window | Qt::WindowTitleHint | Qt::WindowSystemMenuHint
                           | Qt::WindowMinimizeButtonHint | Qt::WindowCloseButtonHint)
    , m_env(environment)
    , m_mainWindow(mainWindow)
    , m_pointer(new WindowPointer(this))
{
    buildLayout();
    connect(PushButton8, &QPushButton::clicked, this, &Form2::PushButton8_Click);
    connect(PushButton2, &QPushButton::clicked, this, &Form2::PushButton2_Click);
}

Form2::~Form2() = default;

PointerOwner& Form2::pointer()
{
    return *m_pointer;
}

void Form2::buildLayout()
{
    setObjectName(u"Form2"_s);
    setWindowTitle(u"Preview"_s);
    setFixedSize(twipsToPixels(6600), twipsToPixels(6585));
    setFont(arialBold(9));
    if (!QApplication::windowIcon().isNull())
        setWindowIcon(QApplication::windowIcon());
    // White until the loading steps give the window its button face.
    Layout::paintWhite(this);

    ListView1 = Layout::reportView(this, u"ListView1"_s, u"Results"_s,
                                   twipsRect(120, 120, 6360, 5040), &m_results);
    // A first name may be retyped in place, as in a report view's label edit.
    ListView1->setEditTriggers(QAbstractItemView::SelectedClicked
                               | QAbstractItemView::EditKeyPressed);

    Frame2 = Layout::frame(this, u"Frame2"_s, u"Output"_s, twipsRect(120, 5250, 6360, 690));
    Option6 = Layout::optionButton(Frame2, u"Option6"_s, u"Excel (1 cell)"_s,
                                   twipsRect(3555, 240, 1695, 375));
    Option4 =
        Layout::optionButton(Frame2, u"Option4"_s, u"Text File"_s, twipsRect(240, 240, 1335, 375));
    Option5 = Layout::optionButton(Frame2, u"Option5"_s, u"Excel (2 cells)"_s,
                                   twipsRect(1575, 240, 1695, 375));
    Option4->setChecked(true);

    PushButton2 = Layout::pushButton(this, u"PushButton2"_s, u"Start Saving Results"_s,
                                     twipsRect(1800, 6070, 4680, 405));
    PushButton8 =
        Layout::pushButton(this, u"PushButton8"_s, u"< Back"_s, twipsRect(120, 6070, 1560, 405));

    const QList<QWidget*> tabOrder{ListView1, Option6, Option4, Option5, PushButton2, PushButton8};
    for (qsizetype i = 1; i < tabOrder.size(); ++i)
        setTabOrder(tabOrder[i - 1], tabOrder[i]);

    // The hover rule: the hand over the two buttons, the default pointer
    // everywhere else.
    for (QWidget* control :
         std::initializer_list<QWidget*>{this, Frame2, ListView1, Option4, Option5, Option6})
        m_pointer->watch(control, MousePointer::Default);
    for (QWidget* control : std::initializer_list<QWidget*>{PushButton2, PushButton8})
        m_pointer->watch(control, MousePointer::Custom);

    CenterForm(this);
}

void Form2::Form_Load()
{
    m_results.addColumn(u"First Names"_s);
    m_results.addColumn(u"Last Names"_s);
    ListView1->setColumnWidth(0, twipsToPixels(3000));
    ListView1->setColumnWidth(1, twipsToPixels(3000));

    const QString cursorFile = cursorFilePath(m_env.programFolder);
    if (FileExists(cursorFile)) {
        if (const std::optional<QCursor> cursor = loadCursorFile(cursorFile))
            m_pointer->setCustomCursor(*cursor);
    }

    SetFormBackColor(this);
}

void Form2::closeEvent(QCloseEvent* event)
{
    // Form_QueryUnload: any close request ends the program, and is never
    // refused. Nothing is left to save.
    event->accept();
    QCoreApplication::quit();
}

void Form2::PushButton8_Click()
{
    Trap trap(m_env.dialogs, u"in Tessmark.Form2.PushButton8_Click "_s, ClosingLine::Long);
    trap(10, [&] { m_mainWindow.show(); });
    trap(20, [&] { hide(); });
}

void Form2::PushButton2_Click()
{
    const OutputChoice choice = Option5->isChecked()   ? OutputChoice::SpreadsheetTwoCells
                                : Option6->isChecked() ? OutputChoice::SpreadsheetOneCell
                                                       : OutputChoice::TextFile;
    ResultsSaver(m_env.dialogs, m_env.shell, QString(), namesDatabasePath(m_env.programFolder))
        .save(choice, m_results);
}

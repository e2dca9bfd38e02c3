#include "app/form1.h"

#include "base/dialogs.h"
#include "app/layout.h"
#include "app/programicon.h"
#include "app/randomvisit.h"
#include "base/settings.h"
#include "app/splash.h"
#include "base/trap.h"
#include "app/twips.h"
#include "app/windowpointer.h"
#include "app/windowroutines.h"
#include "generate/generation.h"
#include "names/database.h"
#include "app/form2.h"

#include <QButtonGroup>
#include <QCloseEvent>
#include <QCoreApplication>
#include <QGroupBox>
#include <QHeaderView>
#include <QKeyEvent>
#include <QLineEdit>
#include <QLocale>
#include <QProgressBar>
#include <QPushButton>
#include <QRadioButton>
#include <QTableView>

using namespace Qt::StringLiterals;

namespace {

const QString PaneToolTip = u"Move bar to right and out of window to reveal full names."_s;

const QString HelpText =
    u"You have two options for generating: \r\r"
    "1. You can generate from Orvell's List which contains my collection of first and last "
    "names.\r\r"
    "2. You can generate using your User List. In this case, names can be loaded from a text "
    "file or added one at a time."_s;

QTableView* pane(QWidget* container, const QString& name, const QString& caption, PaneModel& model)
{
    QTableView* view =
        Layout::reportView(container, name, caption, twipsRect(240, 300, 7320, 1320), &model);
    view->setToolTip(PaneToolTip);
    return view;
}

// The pane's selected row, or -1 when nothing is selected.
int selectedRow(const QTableView* pane)
{
    const QModelIndexList selected = pane->selectionModel()->selectedRows();
    return selected.isEmpty() ? -1 : selected.first().row();
}

} // namespace

Form1::Form1(Environment& environment, QWidget* parent)
    : QWidget(parent)
    , m_env(environment)
    , m_pointer(new WindowPointer(this))
    , m_sourceGroup(new QButtonGroup(this))
    , m_genderGroup(new QButtonGroup(this))
    , m_lists(environment.namesDatabaseFile())
    , m_editor(environment.dialogs, environment.namesDatabaseFile(), m_lists,
               *m_pointer, [this] { return listChoice(); })
{
    buildLayout();
    wireHandlers();
}

Form1::~Form1() = default;

PointerOwner& Form1::pointer()
{
    return *m_pointer;
}

void Form1::buildLayout()
{
    setObjectName(u"Form1"_s);
    setFixedSize(twipsToPixels(8040), twipsToPixels(10185));
    setFont(arialBold(9));
    Layout::paintWhite(this);

    PushButton8 =
        Layout::pushButton(this, u"PushButton8"_s, u"Help"_s, twipsRect(120, 120, 7800, 405));

    Frame4 =
        Layout::frame(this, u"Frame4"_s, u"Generate Options"_s, twipsRect(120, 600, 7800, 1850));
    Option9 = Layout::optionButton(Frame4, u"Option9"_s,
                                   u"Orvell's List - Generate random names from my list of names"_s,
                                   twipsRect(240, 300, 6300, 255));
    Frame1 = Layout::frame(Frame4, u"Frame1"_s, u"Gender Options (Orvell's List)"_s,
                           twipsRect(600, 570, 4320, 735));
    Option1 = Layout::optionButton(Frame1, u"Option1"_s, u"Both"_s, twipsRect(240, 300, 1020, 255));
    Option2 =
        Layout::optionButton(Frame1, u"Option2"_s, u"Male Only"_s, twipsRect(1260, 300, 1335, 255));
    Option3 = Layout::optionButton(Frame1, u"Option3"_s, u"Female Only"_s,
                                   twipsRect(2610, 300, 1455, 255));
    Option8 = Layout::optionButton(Frame4, u"Option8"_s,
                                   u"User List - Generate random names from your list of names"_s,
                                   twipsRect(225, 1440, 6015, 255));
    // Explicit groups: Qt's automatic grouping would reach into Frame1 and
    // take the gender options for members of the source group.
    for (QRadioButton* o : {Option9, Option8})
        m_sourceGroup->addButton(o);
    for (QRadioButton* o : {Option1, Option2, Option3})
        m_genderGroup->addButton(o);
    Option9->setChecked(true);
    Option1->setChecked(true);

    Frame3 = Layout::frame(this, u"Frame3"_s, u"How many names would you like to generate?"_s,
                           twipsRect(120, 2505, 7800, 825));
    Text1 = Layout::place<QLineEdit>(Frame3, u"Text1"_s, twipsRect(240, 300, 7305, 375));
    Text1->setText(u"Text1"_s);
    Text1->setAccessibleName(Frame3->title());

    Frame6 = Layout::frame(this, u"Frame6"_s, u"First Names"_s, twipsRect(120, 3390, 7800, 2775));
    ListView2 = pane(Frame6, u"ListView2"_s, Frame6->title(), m_lists.firstPane());
    PushButton2 = Layout::pushButton(Frame6, u"PushButton2"_s, u"Add First Name"_s,
                                     twipsRect(240, 1695, 3600, 405));
    PushButton6 = Layout::pushButton(Frame6, u"PushButton6"_s, u"Load First Names From File"_s,
                                     twipsRect(3940, 1695, 3600, 405));
    PushButton4 =
        Layout::pushButton(Frame6, u"PushButton4"_s, u"Delete"_s, twipsRect(240, 2190, 7320, 405));

    Frame5 = Layout::frame(this, u"Frame5"_s, u"Last Names"_s, twipsRect(120, 6240, 7800, 2775));
    ListView1 = pane(Frame5, u"ListView1"_s, Frame5->title(), m_lists.lastPane());
    PushButton5 = Layout::pushButton(Frame5, u"PushButton5"_s, u"Add Last Name"_s,
                                     twipsRect(240, 1695, 3600, 400));
    PushButton7 = Layout::pushButton(Frame5, u"PushButton7"_s, u"Load Last Names From File"_s,
                                     twipsRect(3975, 1695, 3600, 405));
    PushButton3 =
        Layout::pushButton(Frame5, u"PushButton3"_s, u"Delete"_s, twipsRect(240, 2190, 7320, 405));

    PushButton1 = Layout::pushButton(this, u"PushButton1"_s, u"Start Generating"_s,
                                     twipsRect(120, 9140, 7800, 405));
    ProgressBar1 =
        Layout::place<QProgressBar>(this, u"ProgressBar1"_s, twipsRect(120, 9660, 7800, 405));
    ProgressBar1->setRange(0, 100);
    ProgressBar1->setValue(0);
    ProgressBar1->setTextVisible(false);
    ProgressBar1->setAccessibleName(u"Progress"_s);

    // Tab order by the layout's tab indexes; frames take no focus.
    const QList<QWidget*> tabOrder{Text1,       ListView2,   PushButton2, PushButton6,
                                   PushButton4, ListView1,   PushButton5, PushButton7,
                                   PushButton3, PushButton1, PushButton8, Option9,
                                   Option1,     Option2,     Option3,     Option8};
    for (qsizetype i = 1; i < tabOrder.size(); ++i)
        setTabOrder(tabOrder[i - 1], tabOrder[i]);
    ProgressBar1->setFocusPolicy(Qt::NoFocus);

    // The hover rule: the hand over the buttons, the default pointer over
    // the window, the frames, the source options and the panes.
    m_pointer->watch(this, MousePointer::Default);
    for (QWidget* control : std::initializer_list<QWidget*>{Frame1, Frame3, Frame4, Frame5, Frame6,
                                                            Option8, Option9, ListView1, ListView2})
        m_pointer->watch(control, MousePointer::Default);
    for (QWidget* control :
         std::initializer_list<QWidget*>{PushButton1, PushButton2, PushButton3, PushButton4,
                                         PushButton5, PushButton6, PushButton7, PushButton8})
        m_pointer->watch(control, MousePointer::Custom);
    for (QWidget* control :
         std::initializer_list<QWidget*>{Option1, Option2, Option3, Text1, ProgressBar1})
        m_pointer->keepPointerOver(control);
}

void Form1::wireHandlers()
{
    connect(Text1, &QLineEdit::textChanged, this, &Form1::Text1_Change);
    Text1->installEventFilter(this);

    // An option's click runs when it becomes selected, by the user or by
    // the restoring of the stored choice.
    const auto onSelected = [this](QRadioButton* o, void (Form1::*handler)()) {
        connect(o, &QRadioButton::toggled, this, [this, handler](bool selected) {
            if (selected)
                (this->*handler)();
        });
    };
    onSelected(Option1, &Form1::Option1_Click);
    onSelected(Option2, &Form1::Option2_Click);
    onSelected(Option3, &Form1::Option3_Click);
    onSelected(Option8, &Form1::Option8_Click);
    onSelected(Option9, &Form1::Option9_Click);

    for (QTableView* view : {ListView1, ListView2}) {
        view->installEventFilter(this);
        connect(view, &QTableView::doubleClicked, this, [this, view] {
            ListView_Remove(view, view == ListView1 ? m_lists.lastPane() : m_lists.firstPane());
        });
    }

    connect(PushButton1, &QPushButton::clicked, this, &Form1::PushButton1_Click);
    connect(PushButton2, &QPushButton::clicked, this, &Form1::PushButton2_Click);
    connect(PushButton3, &QPushButton::clicked, this, &Form1::PushButton3_Click);
    connect(PushButton4, &QPushButton::clicked, this, &Form1::PushButton4_Click);
    connect(PushButton5, &QPushButton::clicked, this, &Form1::PushButton5_Click);
    connect(PushButton6, &QPushButton::clicked, this, &Form1::PushButton6_Click);
    connect(PushButton7, &QPushButton::clicked, this, &Form1::PushButton7_Click);
    connect(PushButton8, &QPushButton::clicked, this, &Form1::PushButton8_Click);
}

void Form1::Form_Load()
{
    ApplySkin(this, m_env.programFolder);
    CenterForm(this);
    const QString cursor = cursorFilePath(m_env.programFolder);
    if (FileExists(cursor)) {
        // A cursor file that cannot be read leaves the arrow for pointer 99.
        if (const std::optional<QCursor> hand = loadCursorFile(cursor))
            m_pointer->setCustomCursor(*hand);
    }
    RandomVisit(m_env.random, m_env.clock, m_env.shell);

    // The splash greets the user before the main window is shown; it waits
    // out its pause here and stays hidden afterwards.
    m_splash = std::make_unique<Splash>(m_env);
    m_splash->SplashShow();

    setWindowTitle(ApplicationTitle);
    setWindowIcon(programIcon());

    m_lists.firstPane().setHeader(u"First Names"_s);
    m_lists.lastPane().setHeader(u"Last Names"_s);
    ListView1->setColumnWidth(0, twipsToPixels(6500));
    ListView2->setColumnWidth(0, twipsToPixels(6500));

    refreshLists(listChoice());

    const ListChoice stored = restoredListChoice(m_env.settings);
    restoreOption(Option9, stored.builtIn);
    restoreOption(Option8, stored.user);
    restoreOption(Option1, stored.both);
    restoreOption(Option2, stored.male);
    restoreOption(Option3, stored.female);

    Text1->setText(m_env.settings.read(u"Text1"_s, u"100"_s));
    Text1->setFocus();
    Text1->selectAll();
}

void Form1::restoreOption(QRadioButton* option, bool selected)
{
    if (selected) {
        // Selecting deselects the rest of the group and runs the click.
        option->setChecked(true);
        return;
    }
    // A stored choice may leave its group with nothing selected, which an
    // exclusive group would refuse.
    QButtonGroup* group = option->group();
    group->setExclusive(false);
    option->setChecked(false);
    group->setExclusive(true);
}

ListChoice Form1::listChoice() const
{
    return {Option9->isChecked(), Option8->isChecked(), Option1->isChecked(), Option2->isChecked(),
            Option3->isChecked()};
}

void Form1::closeEvent(QCloseEvent* event)
{
    // Form_Unload: closing the main window ends the program. Every setting
    // was written when it changed, so nothing is saved here.
    event->accept();
    QCoreApplication::quit();
}

bool Form1::eventFilter(QObject* watched, QEvent* event)
{
    if (watched == Text1 && event->type() == QEvent::FocusIn)
        Text1_GotFocus();
    if (event->type() == QEvent::KeyPress && (watched == ListView1 || watched == ListView2)) {
        if (static_cast<QKeyEvent*>(event)->key() == Qt::Key_Delete) {
            auto* view = static_cast<QTableView*>(watched);
            ListView_Remove(view, view == ListView1 ? m_lists.lastPane() : m_lists.firstPane());
            return true;
        }
    }
    return QWidget::eventFilter(watched, event);
}

void Form1::Text1_Change()
{
    m_env.settings.write(u"Text1"_s, Text1->text());
}

void Form1::Text1_GotFocus()
{
    Text1->selectAll();
}

void Form1::Option1_Click()
{
    storeGenderOptions(m_env.settings, listChoice());
    refreshLists(listChoice());
}

void Form1::Option2_Click()
{
    Option1_Click();
}

void Form1::Option3_Click()
{
    Option1_Click();
}

void Form1::Option8_Click()
{
    sourceOptionClick(false);
}

void Form1::Option9_Click()
{
    sourceOptionClick(true);
}

void Form1::sourceOptionClick(bool gendersEnabled)
{
    // The gender only means something for the built-in list.
    const ListChoice choice = listChoice();
    PushButton4->setText(deleteButtonCaption(choice));
    PushButton3->setText(deleteButtonCaption(choice));
    storeSourceOptions(m_env.settings, choice);
    for (QRadioButton* gender : {Option1, Option2, Option3})
        gender->setEnabled(gendersEnabled);
    refreshLists(choice);
}

void Form1::refreshLists(const ListChoice& choice)
{
    BusyPointer busy(*m_pointer);
    m_lists.RefreshLists(choice);
}

void Form1::ListView_Remove(QTableView* pane, PaneModel& model)
{
    // Pane only: the name is back at the next refresh. Without a selection
    // there is nothing to remove, and nothing is said.
    model.removeName(selectedRow(pane));
}

void Form1::PushButton2_Click()
{
    m_editor.PushButton2_Click();
}

void Form1::PushButton3_Click()
{
    m_editor.PushButton3_Click(selectedRow(ListView1));
}

void Form1::PushButton4_Click()
{
    m_editor.PushButton4_Click(selectedRow(ListView2));
}

void Form1::PushButton5_Click()
{
    m_editor.PushButton5_Click();
}

void Form1::PushButton6_Click()
{
    m_editor.PushButton6_Click();
}

void Form1::PushButton7_Click()
{
    m_editor.PushButton7_Click();
}

void Form1::PushButton8_Click()
{
    Trap trap(m_env.dialogs, u"in Tessmark.Form1.PushButton8_Click "_s, ClosingLine::Long);
    trap(10, [&] { refuse(m_env.dialogs, HelpText); });
}

Form2& Form1::form2()
{
    // Created on first use and then kept: hiding it keeps its rows and its
    // output choice.
    if (!m_form2) {
        auto window = std::make_unique<Form2>(m_env, *this);
        window->Form_Load();
        m_form2 = std::move(window);
    }
    return *m_form2;
}

void Form1::PushButton1_Click()
{
    Trap trap(m_env.dialogs, u"in Tessmark.Form1.PushButton1_Click "_s, ClosingLine::Short);
    // What the user typed or clicked just before counts.
    trap(10, [] { QCoreApplication::processEvents(); });

    const CountText count(Text1->text(), QLocale::system());
    bool refused = false;
    trap(20, [&] {
        const QString refusal =
            refusalBeforeStart(count, m_lists.firstPane().count(), m_lists.lastPane().count());
        if (!refusal.isEmpty()) {
            refuse(m_env.dialogs, refusal);
            refused = true;
        }
    });
    if (refused)
        return;

    // Until the end of the run, whichever way it ends.
    BusyPointer busy(*m_pointer);
    trap(60, [&] {
        if (!count.isNumber()) {
            refuse(m_env.dialogs, GenerationMessages::NotANumber);
            refused = true;
        }
    });
    if (refused)
        return;

    trap(70, [&] { form2().results().clear(); });
    trap(80, [&] {
        // The run does not return to the event loop, so the bar is painted
        // on the spot, and only when the value it shows changes.
        const auto showProgress = [this](int percent) {
            ProgressBar1->setValue(percent);
            ProgressBar1->repaint();
        };
        NameGenerator generator(m_lists.firstPane().names(), m_lists.lastPane().names(),
                                m_env.random);
        GeneratedNames names = generator.generate(count.count(), showProgress);
        form2().results().setRows(std::move(names));
    });
    trap(90, [&] { ProgressBar1->setValue(0); });
    trap(100, [&] { form2().show(); });
    trap(101, [&] { hide(); });
}

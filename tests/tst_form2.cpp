// "Start Generating" and the results window: the refusals as the user sees
// them, the rows, the progress bar, "< Back", and the window itself.
#include "app/form1.h"
#include "generate/generation.h"
#include "results/form2.h"
#include "support/testenvironment.h"

#include <QFile>
#include <QGroupBox>
#include <QHeaderView>
#include <QLineEdit>
#include <QMouseEvent>
#include <QProgressBar>
#include <QPushButton>
#include <QRadioButton>
#include <QTableView>
#include <QTest>
#include <QTimer>

using namespace Qt::StringLiterals;

namespace {

template <typename T> T* control(QWidget& window, const QString& name)
{
    auto* c = window.findChild<T*>(name);
    if (!c)
        qFatal("no control %s", qPrintable(name));
    return c;
}

const QStringList SomeFirstNames{u"ann"_s, u"BOB"_s, u" cy "_s, u"dee"_s};
const QStringList SomeLastNames{u"SMITH"_s, u"o'brien"_s, u"van der berg"_s};

// The main window over an empty database, its panes then filled by hand:
// generation draws from the panes as they stand.
struct Program {
    explicit Program(const QStringList& firsts = SomeFirstNames,
                     const QStringList& lasts = SomeLastNames)
        : env(false)
    {
        createEmptyDatabase(env.databasePath());
        form = std::make_unique<Form1>(env.environment);
        form->Form_Load();
        form->lists().firstPane().setNames(firsts);
        form->lists().lastPane().setNames(lasts);
        form->show();
    }

    void generate(const QString& count)
    {
        control<QLineEdit>(*form, u"Text1"_s)->setText(count);
        control<QPushButton>(*form, u"PushButton1"_s)->click();
    }

    Form2* results() const { return form->resultsWindow(); }
    int rows() const { return results() ? results()->results().rowCount() : -1; }

    TestEnvironment env;
    std::unique_ptr<Form1> form;
};

// The rows a run from this source must make: last name drawn, then first.
QStringList expectedRows(RandomSource random, int count, const QStringList& firsts,
                         const QStringList& lasts)
{
    QStringList rows;
    for (int i = 0; i < count; ++i) {
        const QString last = tidyName(lasts.at(int(RandomIndex(random, int(lasts.size()))) - 1));
        const QString first = tidyName(firsts.at(int(RandomIndex(random, int(firsts.size()))) - 1));
        rows.append(first + u'|' + last);
    }
    return rows;
}

QStringList shownRows(Form2& window)
{
    QAbstractItemModel* model = control<QTableView>(window, u"ListView1"_s)->model();
    QStringList rows;
    for (int row = 0; row < model->rowCount(); ++row)
        rows.append(model->index(row, 0).data().toString() + u'|'
                    + model->index(row, 1).data().toString());
    return rows;
}

// Records the value the bar shows each time it is painted.
class PaintedValues : public QObject {
public:
    explicit PaintedValues(QProgressBar* bar)
        : m_bar(bar)
    {
        bar->installEventFilter(this);
    }
    QList<int> values;

protected:
    bool eventFilter(QObject* watched, QEvent* event) override
    {
        if (watched == m_bar && event->type() == QEvent::Paint)
            values.append(m_bar->value());
        return false;
    }

private:
    QProgressBar* m_bar;
};

} // namespace

class TestForm2 : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void refusalsChangeNothing_data()
    {
        QTest::addColumn<QStringList>("firsts");
        QTest::addColumn<QStringList>("lasts");
        QTest::addColumn<QString>("count");
        QTest::addColumn<QString>("message");

        QTest::newRow("both panes empty")
            << QStringList() << QStringList() << u"5"_s << u"You must add a first name"_s;
        QTest::newRow("last pane empty")
            << SomeFirstNames << QStringList() << u"5"_s << u"You must add a last name"_s;
        QTest::newRow("not a number, a pane empty")
            << SomeFirstNames << QStringList() << u"lots"_s << u"You must add a last name"_s;
        QTest::newRow("not a number") << SomeFirstNames << SomeLastNames << u"lots"_s
                                      << u"How many does not appear to be a number."_s;
        QTest::newRow("empty count") << SomeFirstNames << SomeLastNames << QString()
                                     << u"How many does not appear to be a number."_s;
        QTest::newRow("one million and one")
            << SomeFirstNames << SomeLastNames << u"1000001"_s
            << u"You must select an amount less than one million."_s;
        QTest::newRow("bound before empty panes")
            << QStringList() << QStringList() << u"5000000"_s
            << u"You must select an amount less than one million."_s;
    }

    void refusalsChangeNothing()
    {
        QFETCH(QStringList, firsts);
        QFETCH(QStringList, lasts);
        QFETCH(QString, count);
        QFETCH(QString, message);

        Program program(firsts, lasts);
        program.generate(count);

        QCOMPARE(program.env.dialogs.messages(), QStringList{message});
        const FakeDialogs::Shown& shown = program.env.dialogs.shown.first();
        QCOMPARE(shown.title, u"Quillane"_s);
        QCOMPARE(shown.icon, MessageIcon::None);
        QVERIFY(program.form->isVisible());
        QVERIFY(!program.results());
        QCOMPARE(program.form->pointer().mousePointer(), MousePointer::Default);
    }

    void notANumberLeavesTheLastRunAlone()
    {
        Program program;
        program.generate(u"6"_s);
        const QStringList before = shownRows(*program.results());
        control<QPushButton>(*program.results(), u"PushButton8"_s)->click();

        program.generate(u"six"_s);
        QCOMPARE(program.env.dialogs.messages(),
                 QStringList{u"How many does not appear to be a number."_s});
        QCOMPARE(shownRows(*program.results()), before);
        QVERIFY(program.form->isVisible());
        QVERIFY(!program.results()->isVisible());
    }

    void countsMakeTheirRows_data()
    {
        QTest::addColumn<QString>("count");
        QTest::addColumn<int>("rows");
        QTest::newRow("one million passes") << u"1000000"_s << 1000000;
        QTest::newRow("just below the bound") << u"1000000.6"_s << 1000001;
        QTest::newRow("2.5 makes 2") << u"2.5"_s << 2;
        QTest::newRow("3.5 makes 4") << u"3.5"_s << 4;
        QTest::newRow("blanks around") << u" 250 "_s << 250;
        QTest::newRow("zero") << u"0"_s << 0;
        QTest::newRow("negative") << u"-12"_s << 0;
        QTest::newRow("below 32 bits") << u"-5000000000"_s << 0;
    }

    void countsMakeTheirRows()
    {
        QFETCH(QString, count);
        QFETCH(int, rows);
        Program program;
        program.generate(count);

        QVERIFY(program.env.dialogs.shown.isEmpty());
        QVERIFY(program.results());
        QCOMPARE(program.rows(), rows);
        QVERIFY(program.results()->isVisible());
        QVERIFY(!program.form->isVisible());
        QCOMPARE(control<QProgressBar>(*program.form, u"ProgressBar1"_s)->value(), 0);
        QCOMPARE(program.form->pointer().mousePointer(), MousePointer::Default);
        // The list shows its two columns even without rows.
        auto* view = control<QTableView>(*program.results(), u"ListView1"_s);
        QCOMPARE(view->model()->columnCount(), 2);
        QCOMPARE(view->model()->headerData(0, Qt::Horizontal).toString(), u"First Names"_s);
        QCOMPARE(view->model()->headerData(1, Qt::Horizontal).toString(), u"Last Names"_s);
    }

    void rowsReplayFromTheSeedAndReplaceTheLastRun()
    {
        Program program;
        const RandomSource first = program.env.random;
        program.generate(u"40"_s);
        QCOMPARE(shownRows(*program.results()),
                 expectedRows(first, 40, SomeFirstNames, SomeLastNames));

        control<QPushButton>(*program.results(), u"PushButton8"_s)->click();
        const RandomSource second = program.env.random;
        program.generate(u"7"_s);
        QCOMPARE(shownRows(*program.results()),
                 expectedRows(second, 7, SomeFirstNames, SomeLastNames));
    }

    void oddPanesGiveOddRows_data()
    {
        QTest::addColumn<QStringList>("firsts");
        QTest::addColumn<QStringList>("lasts");
        QTest::addColumn<QString>("row");
        QTest::newRow("one item each")
            << QStringList{u"JOHN"_s} << QStringList{u"mcdonald"_s} << u"John|Mcdonald"_s;
        QTest::newRow("spaces only")
            << QStringList{u"    "_s} << QStringList{u" mary ann "_s} << u"|Maryann"_s;
    }

    void oddPanesGiveOddRows()
    {
        QFETCH(QStringList, firsts);
        QFETCH(QStringList, lasts);
        QFETCH(QString, row);
        Program program(firsts, lasts);
        program.generate(u"5"_s);
        QCOMPARE(shownRows(*program.results()), QStringList(5, row));
    }

    void barMovesDuringTheRunAndEndsAtZero()
    {
        Program program;
        auto* bar = control<QProgressBar>(*program.form, u"ProgressBar1"_s);
        QApplication::processEvents();
        PaintedValues painted(bar);
        program.generate(u"300000"_s);

        QCOMPARE(bar->value(), 0);
        // Painted on the spot while the run held the event loop, once per
        // shown value, 0 to 100 in turn; the window's ordinary paints after
        // the run may add one or two.
        QList<int> everyValue;
        for (int v = 0; v <= 100; ++v)
            everyValue.append(v);
        QCOMPARE(painted.values.mid(0, 101), everyValue);
        QVERIFY2(painted.values.size() <= 104, qPrintable(QString::number(painted.values.size())));
    }

    void backKeepsTheRowsAndTheChoice()
    {
        Program program;
        program.generate(u"12"_s);
        Form2& results = *program.results();
        const QStringList rows = shownRows(results);
        QVERIFY(control<QRadioButton>(results, u"Option4"_s)->isChecked());
        control<QRadioButton>(results, u"Option6"_s)->click();

        control<QPushButton>(results, u"PushButton8"_s)->click();
        QVERIFY(program.form->isVisible());
        QVERIFY(!results.isVisible());
        QCOMPARE(shownRows(results), rows);
        QVERIFY(control<QRadioButton>(results, u"Option6"_s)->isChecked());

        program.generate(u"3"_s);
        QCOMPARE(program.results(), &results);
        QCOMPARE(program.rows(), 3);
        QVERIFY(control<QRadioButton>(results, u"Option6"_s)->isChecked());
        QVERIFY(!control<QRadioButton>(results, u"Option4"_s)->isChecked());
        QVERIFY(program.env.dialogs.shown.isEmpty());
    }

    void savingFollowsTheChosenOutput_data()
    {
        QTest::addColumn<QString>("option");
        QTest::addColumn<bool>("textFile");
        QTest::newRow("Text File") << u"Option4"_s << true;
        QTest::newRow("Excel (2 cells)") << u"Option5"_s << false;
        QTest::newRow("Excel (1 cell)") << u"Option6"_s << false;
    }

    void savingFollowsTheChosenOutput()
    {
        QFETCH(QString, option);
        QFETCH(bool, textFile);
        Program program({u"ann"_s}, {u"LEE"_s});
        program.generate(u"2"_s);
        Form2& results = *program.results();
        control<QRadioButton>(results, option)->click();
        const QString path = program.env.filePath(u"names.txt"_s);
        program.env.dialogs.answerSave(path);

        control<QPushButton>(results, u"PushButton2"_s)->click();

        if (textFile) {
            QFile file(path);
            QVERIFY(file.open(QIODevice::ReadOnly));
            QCOMPARE(file.readAll(), QByteArray("Ann Lee\r\nAnn Lee\r\n"));
            QVERIFY(program.env.shell.documents.isEmpty());
        } else {
            QVERIFY(!QFile::exists(path));
            QCOMPARE(program.env.shell.documents.size(), 1);
            QVERIFY(program.env.shell.documents[0].endsWith(u".xlsx"_s));
        }
        QVERIFY(program.env.dialogs.messages().isEmpty());
    }

    void columnsAreAddedOnce()
    {
        Program program;
        for (int run = 0; run < 4; ++run) {
            program.generate(u"2"_s);
            control<QPushButton>(*program.results(), u"PushButton8"_s)->click();
        }
        auto* view = control<QTableView>(*program.results(), u"ListView1"_s);
        QCOMPARE(view->model()->columnCount(), 2);
        QCOMPARE(view->horizontalHeader()->count(), 2);
        QCOMPARE(view->columnWidth(0), 200);
        QCOMPARE(view->columnWidth(1), 200);
    }

    void windowLooksAsDrawn_data()
    {
        QTest::addColumn<QString>("name");
        QTest::addColumn<QString>("caption");
        QTest::addColumn<QRect>("geometry");
        QTest::newRow("ListView1") << u"ListView1"_s << QString() << QRect(8, 8, 424, 336);
        QTest::newRow("Frame2") << u"Frame2"_s << u"Output"_s << QRect(8, 350, 424, 46);
        QTest::newRow("Option4") << u"Option4"_s << u"Text File"_s << QRect(16, 16, 89, 25);
        QTest::newRow("Option5") << u"Option5"_s << u"Excel (2 cells)"_s << QRect(105, 16, 113, 25);
        QTest::newRow("Option6") << u"Option6"_s << u"Excel (1 cell)"_s << QRect(237, 16, 113, 25);
        QTest::newRow("PushButton2")
            << u"PushButton2"_s << u"Start Saving Results"_s << QRect(120, 405, 312, 27);
        QTest::newRow("PushButton8") << u"PushButton8"_s << u"< Back"_s << QRect(8, 405, 104, 27);
    }

    void windowLooksAsDrawn()
    {
        QFETCH(QString, name);
        QFETCH(QString, caption);
        QFETCH(QRect, geometry);
        Program program;
        program.generate(u"1"_s);
        Form2& window = *program.results();
        QCOMPARE(window.windowTitle(), u"Preview"_s);
        QCOMPARE(window.minimumSize(), QSize(440, 439));
        QCOMPARE(window.maximumSize(), QSize(440, 439));
        QVERIFY(window.windowFlags().testFlag(Qt::WindowMinimizeButtonHint));
        QVERIFY(!window.windowFlags().testFlag(Qt::WindowMaximizeButtonHint));

        auto* widget = control<QWidget>(window, name);
        QCOMPARE(widget->geometry(), geometry);
        if (auto* b = qobject_cast<QAbstractButton*>(widget)) {
            QCOMPARE(b->text(), caption);
            QCOMPARE(b->font().bold(), true);
            QCOMPARE(b->font().pointSizeF(), qobject_cast<QPushButton*>(widget) ? 11.25 : 9.0);
        }
        if (auto* f = qobject_cast<QGroupBox*>(widget))
            QCOMPARE(f->title(), caption);
    }

    void tabOrderFollowsTheLayout()
    {
        Program program;
        program.generate(u"1"_s);
        Form2& window = *program.results();
        QStringList order;
        QWidget* w = control<QWidget>(window, u"ListView1"_s);
        for (int i = 0; i < 6; ++i) {
            order.append(w->objectName());
            w = w->nextInFocusChain();
            while (w->focusPolicy() == Qt::NoFocus || w->objectName().isEmpty())
                w = w->nextInFocusChain();
        }
        QCOMPARE(order, (QStringList{u"ListView1"_s, u"Option6"_s, u"Option4"_s, u"Option5"_s,
                                     u"PushButton2"_s, u"PushButton8"_s}));
    }

    void hoverShowsTheHandOverTheButtonsOnly_data()
    {
        QTest::addColumn<QString>("name");
        QTest::addColumn<int>("pointer");
        QTest::newRow("Start Saving Results") << u"PushButton2"_s << MousePointer::Custom;
        QTest::newRow("< Back") << u"PushButton8"_s << MousePointer::Custom;
        QTest::newRow("Text File") << u"Option4"_s << MousePointer::Default;
        QTest::newRow("Output") << u"Frame2"_s << MousePointer::Default;
    }

    void hoverShowsTheHandOverTheButtonsOnly()
    {
        QFETCH(QString, name);
        QFETCH(int, pointer);
        Program program;
        program.generate(u"1"_s);
        Form2& window = *program.results();
        window.pointer().setMousePointer(pointer == MousePointer::Custom ? MousePointer::Default
                                                                         : MousePointer::Custom);
        QWidget* target = control<QWidget>(window, name);
        QMouseEvent move(QEvent::MouseMove, QPointF(3, 3), target->mapToGlobal(QPointF(3, 3)),
                         Qt::NoButton, Qt::NoButton, Qt::NoModifier);
        QApplication::sendEvent(target, &move);
        QCOMPARE(window.pointer().mousePointer(), pointer);
    }

    void closingTheResultsWindowEndsTheProgram()
    {
        Program program;
        program.generate(u"3"_s);
        QTimer::singleShot(0, program.results(), [&] { program.results()->close(); });
        bool gaveUp = false;
        QTimer::singleShot(10000, qApp, [&] {
            gaveUp = true;
            QCoreApplication::exit(1);
        });
        QCOMPARE(QApplication::exec(), 0);
        QVERIFY(!gaveUp);
    }
};

QTEST_MAIN(TestForm2)
#include "tst_form2.moc"

// Importing names from text files: how a file's bytes become names, what
// the user is told, and that no file, however strange, harms the database.
#include "app/listeditor.h"
#include "names/namelists.h"
#include "names/namesplitter.h"
#include "support/fakepointer.h"
#include "support/testenvironment.h"

#include <QRandomGenerator>
#include <QTemporaryFile>
#include <QTest>

#include <sqlite3.h>

using namespace Qt::StringLiterals;

namespace {

// What an import of the bytes stores: the names the splitter finds in them
// all at once, but for those too long to keep.
QStringList storable(const QByteArray& bytes)
{
    QStringList texts;
    for (const NameSplitter::Name& name : NameSplitter::split(bytes))
        if (!name.overlong())
            texts += name.text;
    return texts;
}

// The editor over a fresh copy of the shipped database, importing first
// names into the user list.
struct Rig {
    QStringList firstNames() const { return tableColumn(db, u"user_firstname"_s, u"*"_s); }

    TestEnvironment env;
    const QString db = env.databasePath();
    FakePointer pointer;
    ListChoice choice{false, true, true, false, false};
    NameLists lists{db};
    ListEditor editor{env.dialogs, db, lists, pointer, [this] { return choice; }};
};

} // namespace

class TestImport : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void importing_data()
    {
        // The files in the dialog's order, a null one missing; the names as stored,
        // joined by '|' (null: see below); the reports; what a second connection
        // to the database does first and holds meanwhile.
        QTest::addColumn<QList<QByteArray>>("files");
        QTest::addColumn<QString>("names");
        QTest::addColumn<QStringList>("reports");
        QTest::addColumn<QByteArray>("other");
        const auto row = [](const char* tag, const QList<QByteArray>& files, const QString& names,
                            const QStringList& reports = {}, const QByteArray& other = {}) {
            QTest::newRow(tag) << files << names << reports << other;
        };
        // In the reports, %1 stands for the test's folder.
        const QString at = u"in Tessmark.Main.FileToListview "_s;
        const QString locked = u"%1/names.mdb: database is locked"_s;
        constexpr ClosingLine Long = ClosingLine::Long;
        const auto refused = [&](const QString& text) {
            return errorReportText(text, at, 50, Long);
        };
        const QStringList notText{errorReportText(
            u"The file %1/0.txt is not text: it holds control characters. Nothing of it was "
            u"stored."_s,
            at, 40, Long)};
        QStringList refusals(ListEditor::MaxReportsPerFile, refused(u"no"_s));
        refusals += errorReportText(u"15 more names of this file were not stored."_s, at, 60, Long);
        row("LF only, no final line end", {"Ann\nBo\nCy"}, u"Ann|Bo|Cy"_s);
        row("CR only", {"Ann\rBo\rCy\r"}, u"Ann|Bo|Cy"_s);
        row("CR LF, final line end", {"Ann\r\nBo\r\nCy\r\n"}, u"Ann|Bo|Cy"_s);
        row("blank lines", {"\r\n\nAnn\n\n\r\rBo\r\n\r\nCy\n\n"}, u"Ann|Bo|Cy"_s);
        row("a line of spaces", {"Ann\n  \nBo"}, u"Ann|  |Bo"_s);
        row("O'Brien", {"O'Brien\n'''\n"}, u"OBrien"_s);
        row("byte-order mark", {"\xEF\xBB\xBFZo\xC3\xAB\nBo"}, u"Zoë|Bo"_s);
        row("UTF-16 with its mark", {QByteArray("\xFF\xFEZ\0o\0\xEB\0\n\0", 10)}, u"Zoë"_s);
        // Not UTF-8: the code page such lists are saved in on Windows.
        row("Windows-1252", {"M\xFCller\n\x80uro\nZo\xEB"}, u"Müller|€uro|Zoë"_s);
        // A file that is not text is refused whole.
        row("a NUL", {QByteArray("A\0nn\nBo", 7)}, u""_s, notText);
        row("UTF-16 without its mark", {QByteArray("Z\0o\0\n\0", 6)}, u""_s, notText);
        row("an escape", {"Ann\n\x1B[2J\nBo"}, u""_s, notText);
        QByteArray noise(2 << 20, Qt::Uninitialized);
        QRandomGenerator(42).fillRange(reinterpret_cast<quint32*>(noise.data()), noise.size() / 4);
        row("random bytes", {noise}, u""_s, notText);
        // A control character in one name, past the start of the file, or a
        // tab: that name is refused, with the character written out.
        const QByteArray start = QByteArray("Ann\n").repeated(17000);
        row("a control character later", {start + "Es\x1B[2Jc\nBo"},
            (QStringList(17000, u"Ann"_s) << u"Bo"_s).join(u'|'),
            {refused(u"The name \"Es\\u001b[2Jc\" holds a control character and was not "
                     u"stored."_s)});
        row("a tab", {"Ann\tLee\nBo"}, u"Bo"_s,
            {refused(u"The name \"Ann\\tLee\" holds a control character and was not stored."_s)});
        row("cancel", {}, u""_s);
        row("several", {"Cy\n", {}, "Ann\n", "Bo\n"}, u"Cy|Ann|Bo"_s, {u"File not found"_s});
        row("a locked database", {"Ann\n"}, u""_s,
            {errorReportText(locked, at, 30, Long),
             errorReportText(locked, u"in Tessmark.Form1.PushButton6_Click "_s, 30, Long)},
            "begin exclusive");
        row("rejected names",
            {"Ann\n" + QByteArray("Bad\n").repeated(ListEditor::MaxReportsPerFile + 15) + "Cy"},
            u"Ann|Cy"_s, refusals,
            "create trigger refuse before insert on user_firstname when new.firstname = 'Bad' "
            "begin select raise(abort, 'no'); end");
        // Read in pieces: the names are those of the whole file split at
        // once, and the reports are bounded.
        row("across reads", {QByteArray("\xC3\xAB\n").repeated(100000)}, {});
        row("a 20 MB line", {QByteArray(20 << 20, 'z') + "\nAfter"}, {});
    }

    void importing()
    {
        QFETCH(QList<QByteArray>, files);
        QFETCH(QString, names);
        QFETCH(QStringList, reports);
        QFETCH(QByteArray, other);
        Rig rig;
        sqlite3* second = nullptr;
        sqlite3_open(QFile::encodeName(rig.db).constData(), &second);
        QCOMPARE(sqlite3_exec(second, other.constData(), nullptr, nullptr, nullptr), SQLITE_OK);
        QStringList paths;
        for (const QByteArray& bytes : files) {
            QFile file(rig.env.filePath(u"%1.txt"_s.arg(paths.size())));
            QVERIFY(bytes.isNull()
                    || (file.open(QIODevice::WriteOnly) && file.write(bytes) == bytes.size()));
            paths += file.fileName();
        }
        rig.env.dialogs.answerOpen(paths);
        rig.editor.PushButton6_Click();
        sqlite3_close(second);

        const QStringList stored = rig.firstNames();
        QCOMPARE(stored.join(u'|'), names.isNull() ? storable(files[0]).join(u'|') : names);
        const QStringList messages = rig.env.dialogs.messages();
        if (names.isNull())
            QVERIFY(messages.size() <= ListEditor::MaxReportsPerFile + 1);
        else
            QCOMPARE(messages, reports.replaceInStrings(u"%1"_s, rig.env.folder()));
        // The hourglass over the whole import, then once more over the one refresh.
        const QList<int> busy{MousePointer::Hourglass, MousePointer::Default};
        QCOMPARE(rig.pointer.history, paths.isEmpty() ? QList<int>() : busy + busy);
        QCOMPARE(rig.lists.firstPane().count(), stored.size());
        // The database is whole, keeps its indexes, and the panes can be filled from it.
        QCOMPARE(tableColumn(rig.db, u"pragma_integrity_check"_s, u"*"_s), QStringList{u"ok"_s});
        QVERIFY(tableColumn(rig.db, u"sqlite_master"_s, u"name"_s)
                    .contains(u"user_firstname_firstname"_s));
        rig.lists.RefreshLists(rig.choice);
    }

    void aPathInTheRootFolderIsUsedAsGiven()
    {
        QTemporaryFile rootFile(u"/quillane-import-XXXXXX.txt"_s);
        if (!rootFile.open() || rootFile.write("Rooted\n") != 7 || !rootFile.flush())
            QSKIP("the root folder is not writable here");
        Rig rig;
        rig.env.dialogs.answerOpen({rootFile.fileName()});
        rig.editor.PushButton6_Click();
        QCOMPARE(rig.firstNames(), QStringList{u"Rooted"_s});
    }
};

QTEST_MAIN(TestImport)
#include "tst_import.moc"
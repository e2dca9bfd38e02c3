// Which names database the program works on, the user's own copy of it, and
// the removal of old workbooks from the cache folder.
#include "base/failure.h"
#include "base/programfiles.h"
#include "results/spreadsheet.h"
#include "support/testenvironment.h"

#include <QTest>

#include <unistd.h>

using namespace Qt::StringLiterals;

namespace {

void setAge(const QString& path, int days)
{
    QFile file(path);
    QVERIFY(file.open(QIODevice::ReadWrite));
    QVERIFY(file.setFileTime(QDateTime::currentDateTime().addDays(-days).addSecs(-60),
                             QFileDevice::FileModificationTime));
}

} // namespace

class TestProgramFiles : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void choice_data()
    {
        QTest::addColumn<QString>("state"); // of the program folder's names.mdb
        QTest::addColumn<bool>("ownCopy");
        QTest::newRow("writable") << u"writable"_s << false;
        // Missing: the database reports it under the name the user knows.
        QTest::newRow("missing") << u"missing"_s << false;
        QTest::newRow("read-only file") << u"read-only file"_s << true;
        QTest::newRow("read-only folder") << u"read-only folder"_s << true;
    }

    // Deciding changes nothing; only the use of a choice makes the copy,
    // once, from the shipped file, which stays as it was.
    void choice()
    {
        QFETCH(QString, state);
        QFETCH(bool, ownCopy);
        if (ownCopy && ::geteuid() == 0)
            QSKIP("root writes whatever the modes say; the package test runs this as another user");
        QTemporaryDir data;
        qputenv("XDG_DATA_HOME", data.path().toUtf8());
        TestEnvironment env(state != u"missing"_s);
        const QString shipped = env.databasePath();
        const QByteArray before = QFile::exists(shipped) ? fileBytes(shipped) : QByteArray();
        if (state == u"read-only file"_s)
            QFile::setPermissions(shipped, QFileDevice::ReadOwner);
        if (state == u"read-only folder"_s)
            QFile::setPermissions(env.folder(), QFileDevice::ReadOwner | QFileDevice::ExeOwner);

        const QString copy = data.path() + u"/quillane/names.mdb"_s;
        const NamesDatabaseChoice choice = chooseNamesDatabase(env.folder());
        QCOMPARE(choice.ownCopy, ownCopy);
        QCOMPARE(choice.path, ownCopy ? copy : shipped);
        QVERIFY(!QFile::exists(copy));
        QVERIFY(describeNamesDatabase(choice).contains(choice.path));

        QCOMPARE(namesDatabaseInUse(env.folder()), choice.path);
        QCOMPARE(QFile::exists(copy), ownCopy);
        if (ownCopy) // made as makeOwnCopy makes it
            QCOMPARE(fileBytes(copy), before);
        QFile::setPermissions(env.folder(), QFileDevice::ReadOwner | QFileDevice::WriteOwner
                                                | QFileDevice::ExeOwner);
        if (state != u"missing"_s)
            QCOMPARE(fileBytes(shipped), before);
        qunsetenv("XDG_DATA_HOME");
    }

    // A relative XDG_DATA_HOME is ignored; unset reads as empty, which is
    // relative too.
    void userDataFolder()
    {
        qputenv("XDG_DATA_HOME", "/srv/data/");
        QCOMPARE(::userDataFolder(), u"/srv/data/quillane"_s);
        qputenv("XDG_DATA_HOME", "data");
        QCOMPARE(::userDataFolder(), QDir::home().filePath(u".local/share/quillane"_s));
        qunsetenv("XDG_DATA_HOME");
    }

    void makeOwnCopy_data()
    {
        QTest::addColumn<QString>("state");
        QTest::addColumn<QByteArray>("bytes"); // of the copy afterwards; null: it fails
        const QByteArray fails;
        QTest::newRow("first use, from a read-only file") << u"first use"_s << "shipped lists"_ba;
        QTest::newRow("made before: kept") << u"made before"_s << "the user's names"_ba;
        QTest::newRow("a file where the folder goes") << u"blocked"_s << fails;
        QTest::newRow("shipped file missing") << u"no shipped"_s << fails;
        // Not followed, not replaced: the name is taken.
        QTest::newRow("a dangling link where the copy goes") << u"dangling link"_s << fails;
    }

    // A copy appears complete or not at all; an existing one is the user's
    // and is never replaced. (What a start killed while copying left is
    // cleared away by the one safe writer: tst_saving's stale files.)
    void makeOwnCopy()
    {
        QFETCH(QString, state);
        QFETCH(QByteArray, bytes);
        QTemporaryDir work;
        const QString shipped = work.filePath(u"names.mdb"_s);
        const QString folder = work.filePath(u"data/quillane"_s);
        const QString copy = folder + u"/names.mdb"_s;
        if (state != u"no shipped"_s) {
            writeBytes(shipped, "shipped lists");
            QFile::setPermissions(shipped, QFileDevice::ReadOwner | QFileDevice::ReadOther);
        }
        if (state == u"made before"_s) {
            QDir().mkpath(folder);
            writeBytes(copy, "the user's names");
        }
        if (state == u"blocked"_s)
            writeBytes(work.filePath(u"data"_s), "in the way");
        if (state == u"dangling link"_s) {
            QDir().mkpath(folder);
            QVERIFY(QFile::link(work.filePath(u"nowhere.mdb"_s), copy));
        }

        QString failure;
        try {
            ::makeOwnCopy(shipped, copy);
        } catch (const Failure& f) {
            failure = f.description();
        }
        QVERIFY2(bytes.isNull() ? failure.contains(copy) : failure.isEmpty(), qPrintable(failure));
        QCOMPARE(QFile::exists(copy) ? fileBytes(copy) : QByteArray(), bytes);
        if (!bytes.isNull())
            QVERIFY(QFileInfo(copy).permissions() & QFileDevice::WriteOwner);
        // Nothing left beside the copy, or the link that was there.
        QCOMPARE(QDir(folder).entryList(QDir::Files | QDir::Hidden | QDir::System),
                 !bytes.isNull() || state == u"dangling link"_s ? QStringList{u"names.mdb"_s}
                                                                : QStringList());
        QVERIFY(!QFile::exists(work.filePath(u"nowhere.mdb"_s)));
    }

    void oldWorkbooks_data()
    {
        QTest::addColumn<QString>("name"); // in the cache folder
        QTest::addColumn<QString>("kind"); // file, link (to an old file elsewhere), folder
        QTest::addColumn<int>("days");     // age
        QTest::addColumn<bool>("removed");
        const QString made = u"Quillane names 2026-11-01 10.00.00.xlsx"_s;
        QTest::newRow("made, 8 days") << made << u"file"_s << 8 << true;
        QTest::newRow("made, 6 days") << made << u"file"_s << 6 << false;
        QTest::newRow("made second in a second")
            << u"Quillane names 2026-11-01 10.00.00 (2).xlsx"_s << u"file"_s << 30 << true;
        QTest::newRow("left unfinished")
            << u".Quillane names a1B2c3.xlsx.part"_s << u"file"_s << 30 << true;
        QTest::newRow("the user's workbook") << u"budget.xlsx"_s << u"file"_s << 30 << false;
        QTest::newRow("a name like ours")
            << u"Quillane names of mine.xlsx"_s << u"file"_s << 30 << false;
        QTest::newRow("renamed copy") << made + u".bak"_s << u"file"_s << 30 << false;
        QTest::newRow("a link") << made << u"link"_s << 30 << false;
        QTest::newRow("a folder") << made << u"folder"_s << 30 << false;
        QTest::newRow("below the cache folder") << u"sub/"_s + made << u"file"_s << 30 << false;
    }

    // Making a spreadsheet for the user clears the old ones out of its folder.
    void oldWorkbooks()
    {
        QFETCH(QString, name);
        QFETCH(QString, kind);
        QFETCH(int, days);
        QFETCH(bool, removed);
        QTemporaryDir work;
        const QString cache = work.filePath(u"cache"_s);
        const QString path = cache + u'/' + name;
        const QString outside = work.filePath(u"elsewhere.xlsx"_s);
        QDir().mkpath(QFileInfo(path).absolutePath());
        writeBytes(outside, "kept");
        setAge(outside, days);
        if (kind == u"file"_s) {
            writeBytes(path, "workbook");
            setAge(path, days);
        } else if (kind == u"link"_s) {
            QVERIFY(QFile::link(outside, path));
        } else {
            QVERIFY(QDir().mkpath(path));
        }

        FakeShell shell;
        SpreadsheetApplication spreadsheet(shell, cache);
        QCOMPARE(QFileInfo(path).exists() || QFileInfo(path).isSymLink(), !removed);
        QVERIFY(QFile::exists(outside));
    }
};

QTEST_GUILESS_MAIN(TestProgramFiles)
#include "tst_programfiles.moc"

// The settings store: the default rule, Booleans as the program reads them,
// writes that reach the file at once, and stores that are malformed or
// cannot be written. (Booleans are written as text: the main window's
// choices read them back.)
#include "base/settings.h"
#include "support/program.h"

#include <QTest>

#include <cstdio>

#include <grp.h>
#include <pwd.h>
#include <sys/stat.h>
#include <unistd.h>

using namespace Qt::StringLiterals;

class TestSettings : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init() { useTemporarySettings(); }

    void storedValues_data()
    {
        QTest::addColumn<QString>("stored"); // null: not stored at all
        QTest::addColumn<QString>("defaultValue");
        QTest::addColumn<bool>("asBoolean");
        QTest::newRow("True") << u"True"_s << u"0"_s << true;
        QTest::newRow("False") << u"False"_s << u"1"_s << false;
        QTest::newRow("lower case") << u"true"_s << u"0"_s << true;
        QTest::newRow("zero") << u"0"_s << u"1"_s << false;
        QTest::newRow("other number") << u"-2.5"_s << u"0"_s << true;
        QTest::newRow("number in the user's format") << u"1,000"_s << u"0"_s << true;
        QTest::newRow("neither: the default") << u"maybe; \"x\" = 1,000"_s << u"1"_s << true;
        QTest::newRow("neither, nor the default") << u"maybe"_s << u"perhaps"_s << false;
        QTest::newRow("empty: the default") << u""_s << u"0"_s << false;
        QTest::newRow("absent: the default") << QString() << u"1"_s << true;
    }

    // The default applies only when the key is absent: an empty value stays
    // empty, and any text comes back as it was written.
    void storedValues()
    {
        QFETCH(QString, stored);
        QFETCH(QString, defaultValue);
        QFETCH(bool, asBoolean);
        Settings settings;
        if (!stored.isNull())
            settings.write(u"Option9"_s, stored);
        QCOMPARE(settings.read(u"Option9"_s, defaultValue),
                 stored.isNull() ? defaultValue : stored);
        QCOMPARE(settings.readBool(u"Option9"_s, defaultValue), asBoolean);
    }

    // With nowhere to report to, a write that fails is only remembered.
    void unreportedWriteFailure()
    {
        QTemporaryDir folder;
        QVERIFY(QDir(folder.path()).mkdir(u"Varnholt.ini"_s));
        QSettings::setPath(QSettings::IniFormat, QSettings::UserScope, folder.path());
        Settings settings;
        settings.write(u"Text1"_s, u"7"_s);
        QVERIFY(settings.writeFailed());
        QCOMPARE(settings.read(u"Text1"_s, {}), u"7"_s);
    }

    void damagedOrUnwritableStore_data()
    {
        QTest::addColumn<QString>("kind"); // of Varnholt.ini: file, none, folder, link
        QTest::addColumn<QByteArray>("content");
        QTest::addColumn<int>("folderMode");
        QTest::addColumn<int>("fileMode");
        QTest::addColumn<QString>("reason"); // of the one report; empty: written
        QTest::addColumn<QString>("before"); // what "Text1" read at start

        const QByteArray good = "[Quillane]\nText1=250\n[Other]\nkept=1\n";
        const QByteArray malformed =
            "[Quillane]\nText1=250\n=no key\nno value\n\x01\x1b[2J\n[Other]\nkept=1\n";
        const QString denied = u"Permission denied"_s;
        QTest::newRow("writable") << u"file"_s << good << 0777 << 0666 << QString() << u"250"_s;
        QTest::newRow("malformed lines")
            << u"file"_s << malformed << 0777 << 0666 << QString() << u"250"_s;
        QTest::newRow("read-only file") << u"file"_s << good << 0777 << 0444 << denied << u"250"_s;
        QTest::newRow("read-only folder")
            << u"none"_s << QByteArray() << 0555 << 0 << denied << u"100"_s;
        QTest::newRow("read-only folder, writable file")
            << u"file"_s << good << 0555 << 0666 << denied << u"250"_s;
        QTest::newRow("a folder in its place")
            << u"folder"_s << QByteArray() << 0777 << 0 << u"Is a directory"_s << u"100"_s;
        QTest::newRow("dangling link")
            << u"link"_s << QByteArray() << 0777 << 0 << u"No such file or directory"_s << u"100"_s;
    }

    // The store is used by an unprivileged child, since the tests may run
    // as root, whom permission bits do not stop. A store that cannot be
    // written is reported once, at the first write, and the values written
    // hold in memory; the file is left as it was. A malformed file reads as
    // the keys it holds, and the next write leaves a well-formed file that
    // keeps every key it held. The child ends without closing the store, so
    // what the file holds reached it at the write.
    void damagedOrUnwritableStore()
    {
        QFETCH(QString, kind);
        QFETCH(QByteArray, content);
        QFETCH(int, folderMode);
        QFETCH(int, fileMode);
        QFETCH(QString, reason);
        QFETCH(QString, before);
        QTemporaryDir folder;
        const QString path = folder.filePath(u"Varnholt.ini"_s);
        // Owner, group and others alike: the child may be any of them.
        if (kind == u"file") {
            writeBytes(path, content);
            QCOMPARE(::chmod(QFile::encodeName(path).constData(), mode_t(fileMode)), 0);
        }
        if (kind == u"folder")
            QVERIFY(QDir(folder.path()).mkdir(u"Varnholt.ini"_s));
        if (kind == u"link")
            QVERIFY(QFile::link(u"missing/Varnholt.ini"_s, path));
        QCOMPARE(::chmod(QFile::encodeName(folder.path()).constData(), mode_t(folderMode)), 0);

        const QString output = runSelf({u"--use-store-unprivileged"_s, folder.path()});
        QFile::setPermissions(folder.path(),
                              QFile::ReadOwner | QFile::WriteOwner | QFile::ExeOwner);

        const QString report = reason.isEmpty()
                                   ? QString()
                                   : u"Application Error!: The settings file %1 cannot be written: "
                                     "%2. Quillane goes on with your choices, but they will not be "
                                     "there at its next start."_s.arg(path, reason);
        QCOMPARE(output, u"%1 8 %2\nexit 0"_s.arg(before, report));
        // What cannot be written is left as it was; what can keeps every key.
        const QFileInfo after(path);
        if (reason.isEmpty()) {
            const QByteArray written = fileBytes(path);
            for (const char* line : {"Text1=8\n", "[Other]\nkept=1\n"})
                QVERIFY2(written.contains(line), written.constData());
        } else if (kind == u"file") {
            QCOMPARE(fileBytes(path), content);
        }
        QCOMPARE(after.exists(), kind == u"file" || kind == u"folder");
        QCOMPARE(after.isSymLink(), kind == u"link");
        QCOMPARE(after.isDir(), kind == u"folder");
    }
};

namespace {

// The child of damagedOrUnwritableStore, as nobody when started as root:
// reads "Text1", writes it twice and prints what it read at start, what it
// reads at the end, and each report shown, its title ending in "!" for the
// exclamation mark.
int useStoreUnprivileged(int&, char** argv)
{
    if (::geteuid() == 0) {
        const passwd* nobody = ::getpwnam("nobody");
        if (!nobody || ::setgroups(0, nullptr) != 0 || ::setgid(nobody->pw_gid) != 0
            || ::setuid(nobody->pw_uid) != 0)
            return 3;
    }
    QSettings::setPath(QSettings::IniFormat, QSettings::UserScope, QString::fromLocal8Bit(argv[2]));
    FakeDialogs dialogs;
    Settings settings;
    settings.reportWriteFailuresTo(&dialogs);
    const QString before = settings.read(u"Text1"_s, u"100"_s);
    settings.write(u"Text1"_s, u"7"_s);
    settings.write(u"Text1"_s, u"8"_s);
    QStringList reports;
    for (const FakeDialogs::Shown& shown : dialogs.shown)
        reports << shown.title + (shown.icon == MessageIcon::Exclamation ? u"!: "_s : u": "_s)
                       + shown.text;
    std::printf("%s %s %s\n", qUtf8Printable(before), qUtf8Printable(settings.read(u"Text1"_s, {})),
                qUtf8Printable(reports.join(u'|')));
    // Ended without the store's destructor: what is in the file was written at once.
    std::fflush(stdout);
    leaveChild(0);
}

} // namespace

QUILLANE_TEST_MAIN_WITH_CHILD(TestSettings, "--use-store-unprivileged", useStoreUnprivileged)

#include "tst_settings.moc"

// The settings store: the default rule, Booleans as the program reads them,
// and writes that reach the file at once.
#include "app/settings.h"
#include "support/testenvironment.h"

#include <QFile>
#include <QTest>

using namespace Qt::StringLiterals;

class TestSettings : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init() { useTemporarySettings(); }

    void defaultAppliesOnlyWhenAbsent()
    {
        Settings settings;
        QCOMPARE(settings.read(u"Text1"_s, u"100"_s), u"100"_s);
        settings.write(u"Text1"_s, QString());
        QCOMPARE(settings.read(u"Text1"_s, u"100"_s), QString());
        settings.write(u"Text1"_s, u"1,000; \"x\" = y"_s);
        QCOMPARE(settings.read(u"Text1"_s, u"100"_s), u"1,000; \"x\" = y"_s);
    }

    void writesReachTheFileAtOnce()
    {
        Settings settings;
        settings.write(u"Text1"_s, u"250"_s);
        QFile file(settings.fileName());
        QVERIFY(file.fileName().endsWith(u"Varnholt.ini"_s));
        QVERIFY(file.open(QIODevice::ReadOnly));
        const QByteArray content = file.readAll();
        QVERIFY(content.contains("[Quillane]"));
        QVERIFY(content.contains("Text1=250"));
    }

    void storedBooleans_data()
    {
        QTest::addColumn<QString>("stored");
        QTest::addColumn<QString>("defaultValue");
        QTest::addColumn<bool>("expected");
        QTest::newRow("True") << u"True"_s << u"0"_s << true;
        QTest::newRow("False") << u"False"_s << u"1"_s << false;
        QTest::newRow("lower case") << u"true"_s << u"0"_s << true;
        QTest::newRow("zero") << u"0"_s << u"1"_s << false;
        QTest::newRow("one") << u"1"_s << u"0"_s << true;
        QTest::newRow("other number") << u"-2.5"_s << u"0"_s << true;
        QTest::newRow("neither: the default") << u"maybe"_s << u"1"_s << true;
        QTest::newRow("empty: the default") << QString() << u"0"_s << false;
    }

    void storedBooleans()
    {
        QFETCH(QString, stored);
        QFETCH(QString, defaultValue);
        QFETCH(bool, expected);
        Settings settings;
        settings.write(u"Option9"_s, stored);
        QCOMPARE(settings.readBool(u"Option9"_s, defaultValue), expected);
    }

    void absentBooleanReadsItsDefault()
    {
        Settings settings;
        QCOMPARE(settings.readBool(u"Option9"_s, u"1"_s), true);
        QCOMPARE(settings.readBool(u"Option8"_s, u"0"_s), false);
    }

    void booleansAreWrittenAsText()
    {
        Settings settings;
        settings.writeBool(u"Option1"_s, true);
        settings.writeBool(u"Option2"_s, false);
        QCOMPARE(settings.read(u"Option1"_s, {}), u"True"_s);
        QCOMPARE(settings.read(u"Option2"_s, {}), u"False"_s);
    }
};

QTEST_GUILESS_MAIN(TestSettings)
#include "tst_settings.moc"

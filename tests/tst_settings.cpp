// The settings store: the default rule, Booleans as the program reads them,
// and writes that reach the file at once.
#include "base/settings.h"
#include "support/testenvironment.h"

#include <QTest>

using namespace Qt::StringLiterals;

class TestSettings : public QObject {
    Q_OBJECT

private Q_SLOTS:
    void init() { useTemporarySettings(); }

    // Booleans are written as text.
    void writesReachTheFileAtOnce()
    {
        Settings settings;
        settings.write(u"Text1"_s, u"250"_s);
        settings.writeBool(u"Option1"_s, true);
        settings.writeBool(u"Option2"_s, false);
        QVERIFY(settings.fileName().endsWith(u"Varnholt.ini"_s));
        const QByteArray content = fileBytes(settings.fileName());
        for (const char* line :
             {"[Quillane]\n", "Text1=250\n", "Option1=True\n", "Option2=False\n"})
            QVERIFY2(content.contains(line), line);
    }

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
        QTest::newRow("neither: the default") << u"maybe; \"x\" = 1,000"_s << u"1"_s << true;
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
};

QTEST_GUILESS_MAIN(TestSettings)
#include "tst_settings.moc"

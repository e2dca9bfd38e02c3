#include "app/application.h"
#include "app/environment.h"
#include "app/qtdialogs.h"
#include "base/clock.h"
#include "base/dialogs.h"
#include "base/failure.h"
#include "base/programfiles.h"
#include "base/settings.h"
#include "base/shell.h"
#include "generate/randomsource.h"

#include <QDir>
#include <QFileInfo>

#include <cstdio>

using namespace Qt::StringLiterals;

namespace {

const char Help[] = R"(Usage: quillane [--database FILE]

Makes lists of random personal names: choose where the names come from,
how many you want, and press "Start Generating".

Options:
  --database FILE  the names database (default: names.mdb beside the
                   program, or your own copy of it in
                   $XDG_DATA_HOME/quillane, ~/.local/share/quillane, where
                   the program's folder cannot be written; --version says
                   which)
  -h, --help       show this help
  --version        show the version and the names database in use

Qt's own options, such as -platform, are taken too.
)";

// The folder of the executable, links followed, before there is an
// application object to ask.
QString programFolder()
{
    return QFileInfo(QFileInfo(u"/proc/self/exe"_s).canonicalFilePath()).absolutePath();
}

// The file of --database FILE (or --database=FILE), empty without one. The
// first argument that is not ours goes to wrong.
QString databaseOption(const QStringList& arguments, QString& wrong)
{
    QString database;
    for (qsizetype at = 1; at < arguments.size(); ++at) {
        const QString& option = arguments.at(at);
        if (option == u"--database" && at + 1 < arguments.size())
            database = arguments.at(++at);
        else if (option.startsWith(u"--database="))
            database = option.section(u'=', 1);
        else if (wrong.isEmpty())
            wrong = option;
    }
    return database;
}

} // namespace

int main(int argc, char** argv)
{
    // Help and version need no display, so they come before the application.
    QStringList given;
    for (int i = 0; i < argc; ++i)
        given.append(QString::fromLocal8Bit(argv[i]));
    if (given.contains(u"-h"_s) || given.contains(u"--help"_s)) {
        std::fputs(Help, stdout);
        return 0;
    }
    if (given.contains(u"--version"_s)) {
        QString ignored;
        const QString database = databaseOption(given, ignored);
        const QString where = database.isEmpty()
                                  ? describeNamesDatabase(chooseNamesDatabase(programFolder()))
                                  : u"names database: "_s + database;
        std::printf("quillane %s\n%s\n", QUILLANE_VERSION, qUtf8Printable(where));
        return 0;
    }

    // Qt takes its own options out of the arguments.
    QuillaneApplication app(argc, argv);
    QString wrong;
    QString database = databaseOption(QCoreApplication::arguments(), wrong);
    if (!wrong.isEmpty()) {
        std::fprintf(stderr, "quillane: Unknown argument '%s'. Try 'quillane --help'.\n",
                     qUtf8Printable(wrong));
        return 2;
    }

    QtDialogs dialogs;
    app.setDialogs(&dialogs);
    if (database.isEmpty()) {
        try {
            database = namesDatabaseInUse(QCoreApplication::applicationDirPath());
        } catch (const Failure& failure) {
            // The shipped lists still make names; changing them will fail
            // with a message of its own.
            dialogs.messageBox(failure.description(), ApplicationTitle, MessageIcon::Exclamation);
        }
    }
    Settings settings;
    settings.reportWriteFailuresTo(&dialogs);
    DesktopShell shell;
    SystemClock clock;
    RandomSource random;
    Environment environment{
        dialogs, settings, shell, clock, random, QCoreApplication::applicationDirPath(), database};
    return runProgram(app, environment);
}

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
#include <cstring>

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

} // namespace

int main(int argc, char** argv)
{
    // Help and version need no display, so they come before the application.
    for (int i = 1; i < argc; ++i) {
        if (std::strcmp(argv[i], "-h") == 0 || std::strcmp(argv[i], "--help") == 0) {
            std::fputs(Help, stdout);
            return 0;
        }
        if (std::strcmp(argv[i], "--version") == 0) {
            std::printf(
                "quillane %s\n%s\n", QUILLANE_VERSION,
                qUtf8Printable(describeNamesDatabase(chooseNamesDatabase(programFolder()))));
            return 0;
        }
    }

    QuillaneApplication app(argc, argv);
    QString database;
    const QStringList arguments = QCoreApplication::arguments();
    for (qsizetype at = 1; at < arguments.size(); ++at) {
        const QString& option = arguments.at(at);
        if (option == u"--database" && at + 1 < arguments.size()) {
            database = arguments.at(++at);
        } else if (option.startsWith(u"--database=")) {
            database = option.section(u'=', 1);
        } else {
            std::fprintf(stderr, "quillane: Unknown argument '%s'. Try 'quillane --help'.\n",
                         qUtf8Printable(option));
            return 2;
        }
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
    DesktopShell shell;
    SystemClock clock;
    RandomSource random;
    Environment environment{
        dialogs, settings, shell, clock, random, QCoreApplication::applicationDirPath(), database};
    return runProgram(app, environment);
}

#include "app/application.h"
#include "app/environment.h"
#include "app/qtdialogs.h"
#include "base/clock.h"
#include "base/settings.h"
#include "base/shell.h"
#include "generate/randomsource.h"

int main(int argc, char** argv)
{
    QuillaneApplication app(argc, argv);
    QtDialogs dialogs;
    app.setDialogs(&dialogs);
    Settings settings;
    settings.reportWriteFailuresTo(&dialogs);
    DesktopShell shell;
    SystemClock clock;
    RandomSource random;
    Environment environment{dialogs, settings, shell,
                            clock,   random,   QCoreApplication::applicationDirPath()};
    return runProgram(app, environment);
}

#include "app/application.h"
#include "app/environment.h"
#include "app/qtdialogs.h"
#include "app/settings.h"

int main(int argc, char** argv)
{
    QuillaneApplication app(argc, argv);
    QtDialogs dialogs;
    app.setDialogs(&dialogs);
    Settings settings;
    Environment environment{dialogs, settings, QCoreApplication::applicationDirPath()};
    return runProgram(app, environment);
}

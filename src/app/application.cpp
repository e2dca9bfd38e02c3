#include "app/application.h"

#include "app/environment.h"
#include "app/form1.h"
#include "app/programicon.h"
#include "base/dialogs.h"
#include "base/failure.h"

#include <cstdio>
#include <cstdlib>

using namespace Qt::StringLiterals;

namespace {
constexpr int FailureExitStatus = 1;
}

QuillaneApplication::QuillaneApplication(int& argc, char** argv)
    : QApplication(argc, argv)
{
    setOrganizationName(u"Varnholt"_s);
    setApplicationName(u"Quillane"_s);
    // No display name: the window system integration would append it to
    // every title. The desktop file still ties the windows to the program's
    // entry and icon.
    setDesktopFileName(u"quillane"_s);
    setWindowIcon(programIcon());
}

bool QuillaneApplication::notify(QObject* receiver, QEvent* event)
{
    try {
        return QApplication::notify(receiver, event);
    } catch (...) {
        endOnFailure();
    }
}

void QuillaneApplication::endOnFailure()
{
    const QString description = escapeControlCharacters(describeCurrentException());
    std::fprintf(stderr, "quillane: %s\n", qUtf8Printable(description));
    if (m_dialogs) {
        m_dialogs->messageBox(u"Quillane cannot go on and will close.\n\n"_s + description,
                              ApplicationTitle, MessageIcon::Critical);
    }
    // Nothing is left to save: every setting was written when it changed,
    // and no database connection outlives its operation.
    std::fflush(nullptr);
    std::_Exit(FailureExitStatus);
}

int runProgram(QuillaneApplication& app, Environment& environment)
{
    try {
        Form1 form(environment);
        form.Form_Load();
        form.show();
        return app.exec();
    } catch (...) {
        app.endOnFailure();
    }
}

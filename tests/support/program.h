#pragma once

// Helpers for tests that drive the whole main window or the whole program:
// a started main window, and running this test executable again as a child
// process that runs the program and prints its closing notice.

#include "app/application.h"
#include "app/form1.h"
#include "support/controls.h"
#include "support/testenvironment.h"

#include <QCoreApplication>
#include <QProcess>
#include <QTest>

#include <cstdio>
#include <memory>

#include <unistd.h>

#ifdef QUILLANE_COVERAGE
extern "C" void __gcov_dump();
#endif

// Ends a child process at once, without the exit handlers that would close
// what a test wants left as it is. A coverage build writes the child's
// counts first, which those handlers would otherwise have written.
[[noreturn]] inline void leaveChild(int status)
{
#ifdef QUILLANE_COVERAGE
    __gcov_dump();
#endif
    ::_exit(status);
}

// The main window after its start-up sequence, shown when asked.
inline std::unique_ptr<Form1> loadedForm1(Environment& environment, bool show = false)
{
    auto form = std::make_unique<Form1>(environment);
    form->Form_Load();
    if (show)
        form->show();
    return form;
}

// Dialogs for the whole program run in a child process: a message box prints
// its title and last line instead of waiting for a click.
class PrintingDialogs : public FakeDialogs {
public:
    void messageBox(const QString& text, const QString& title, MessageIcon) override
    {
        std::printf("notice: %s|%s\n", qUtf8Printable(title),
                    qUtf8Printable(text.section(u'\n', -1)));
    }
};

// In the child process, started as `<program> <option> <folder>`: the
// program's application object, and an environment in that folder with
// fake platform parts and printing dialogs. The settings are kept in that
// folder too, which the parent removes: the child may end without running
// a destructor.
struct ChildProgram {
    ChildProgram(int& argc, char** argv)
        : app(argc, argv)
        , settings(
              (useSettingsFolder(QString::fromLocal8Bit(argv[2])), std::make_unique<Settings>()))
        , environment{dialogs, *settings, shell, clock, random, QString::fromLocal8Bit(argv[2])}
    {
        app.setDialogs(&dialogs);
        settings->reportWriteFailuresTo(&dialogs);
        std::setvbuf(stdout, nullptr, _IONBF, 0); // printed at once, even just before an end
    }

    QuillaneApplication app;
    PrintingDialogs dialogs;
    std::unique_ptr<Settings> settings;
    FakeShell shell;
    FakeClock clock;
    RandomSource random;
    Environment environment;
};

// Runs this test program again with the arguments given and waits for it:
// what it printed, then "exit N" when it ended by itself with status N.
inline QString runSelf(const QStringList& arguments)
{
    QProcess child;
    child.start(QCoreApplication::applicationFilePath(), arguments);
    const bool finished = child.waitForFinished(60000);
    const QString output = QString::fromUtf8(child.readAllStandardOutput());
    if (!finished || child.exitStatus() != QProcess::NormalExit)
        return output + QStringLiteral("crashed or timed out");
    return output + QStringLiteral("exit %1").arg(child.exitCode());
}

// A test main that runs `child` instead of the tests when the program is
// started as `<program> <childOption> <folder>`.
template <typename Test>
int testMainWithChild(int argc, char** argv, const char* childOption, int (*child)(int&, char**))
{
    if (argc == 3 && qstrcmp(argv[1], childOption) == 0)
        return child(argc, argv);
    QApplication app(argc, argv);
    Test test;
    return QTest::qExec(&test, argc, argv);
}

#define QUILLANE_TEST_MAIN_WITH_CHILD(Test, childOption, child)                                    \
    int main(int argc, char** argv)                                                                \
    {                                                                                              \
        return testMainWithChild<Test>(argc, argv, childOption, child);                            \
    }

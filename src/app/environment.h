#pragma once

#include "names/database.h"

#include <QString>

class Clock;
class Dialogs;
class RandomSource;
class Settings;
class Shell;

// What the windows take from the platform. The program builds it from the
// real implementations; tests build it from fakes and temporary folders.
struct Environment {
    Dialogs& dialogs;
    Settings& settings;
    Shell& shell;
    Clock& clock;
    RandomSource& random;
    // The folder the executable was started from: it holds names.mdb and the
    // program's other files.
    QString programFolder;
    // The names database the windows work on; empty for names.mdb in
    // programFolder.
    QString namesDatabase = {};

    QString namesDatabaseFile() const
    {
        return namesDatabase.isEmpty() ? namesDatabasePath(programFolder) : namesDatabase;
    }
};

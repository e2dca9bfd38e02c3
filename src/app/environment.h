#pragma once

#include <QString>

class Dialogs;
class Settings;

// What the windows take from the platform. The program builds it from the
// real implementations; tests build it from fakes and temporary folders.
struct Environment {
    Dialogs& dialogs;
    Settings& settings;
    // The folder the executable was started from: it holds names.mdb and the
    // program's other files.
    QString programFolder;
};

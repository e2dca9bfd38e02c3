#pragma once

#include <QString>

class Settings;

// The state of the main window's five option buttons at one moment: the
// source list (built-in or user) and the gender for the built-in list. Each
// group normally has exactly one selected, but stored settings can leave a
// group with none, and the program then leaves the affected panes alone.
struct ListChoice {
    bool builtIn = true; // "Option9"
    bool user = false;   // "Option8"
    bool both = true;    // "Option1"
    bool male = false;   // "Option2"
    bool female = false; // "Option3"
};

// "Clear" while the user list is chosen, else "Delete".
QString deleteButtonCaption(const ListChoice& choice);

// The option keys of the settings store, written in their group's order.
void storeSourceOptions(Settings& settings, const ListChoice& choice);
void storeGenderOptions(Settings& settings, const ListChoice& choice);

// The choice as stored, with the defaults of a first start.
ListChoice restoredListChoice(const Settings& settings);

#include "names/listchoice.h"

#include "base/settings.h"

using namespace Qt::StringLiterals;

QString deleteButtonCaption(const ListChoice& choice)
{
    return choice.user ? u"Clear"_s : u"Delete"_s;
}

void storeSourceOptions(Settings& settings, const ListChoice& choice)
{
    settings.writeBool(u"Option9"_s, choice.builtIn);
    settings.writeBool(u"Option8"_s, choice.user);
}

void storeGenderOptions(Settings& settings, const ListChoice& choice)
{
    settings.writeBool(u"Option1"_s, choice.both);
    settings.writeBool(u"Option2"_s, choice.male);
    settings.writeBool(u"Option3"_s, choice.female);
}

ListChoice restoredListChoice(const Settings& settings)
{
    ListChoice choice;
    choice.builtIn = settings.readBool(u"Option9"_s, u"1"_s);
    choice.user = settings.readBool(u"Option8"_s, u"0"_s);
    choice.both = settings.readBool(u"Option1"_s, u"1"_s);
    choice.male = settings.readBool(u"Option2"_s, u"0"_s);
    choice.female = settings.readBool(u"Option3"_s, u"0"_s);
    return choice;
}

#include "app/programicon.h"

using namespace Qt::StringLiterals;

QIcon programIcon()
{
    QIcon icon;
    for (const int size : {16, 24, 32, 48, 64, 128, 256})
        icon.addFile(u":/quillane/quillane-%1.png"_s.arg(size), QSize(size, size));
    return icon;
}

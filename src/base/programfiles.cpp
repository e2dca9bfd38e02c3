#include "base/programfiles.h"

#include <QFileInfo>

bool FileExists(const QString& path)
{
    if (path.isEmpty() || path.contains(QChar(u'\0')))
        return false;
    return QFileInfo::exists(path);
}

bool InDevelopment()
{
#ifdef NDEBUG
    return false;
#else
    return true;
#endif
}

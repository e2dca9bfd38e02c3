#pragma once

#include <QIcon>

// The program's icon, in every size drawn for it at build time; both windows
// and the task bar show it.
QIcon programIcon();

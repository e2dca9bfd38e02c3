#include "base/trap.h"

#include "base/failure.h"

Trap::Trap(Dialogs& dialogs, QString location, ClosingLine closing)
    : m_dialogs(dialogs)
    , m_location(std::move(location))
    , m_closing(closing)
{
}

void Trap::reportCurrentException(int line)
{
    ++m_failures;
    ShowErrorReport(m_dialogs, describeCurrentException(), m_location, line, m_closing);
}

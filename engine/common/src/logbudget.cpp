#include "orv/detail/logbudget.h"

#include "orv/detail/formattedtext.h"
#include "orv/log.h"
#include "orv/logsink.h"

#include <algorithm>

namespace orv::detail
{

namespace
{

thread_local LogBudget* t_budget = nullptr;

void writeRecord(LogLevel level, LogEntryPoint entryPoint, const char* file, const char* function, int line,
                 const char* format, va_list arguments)
{
    if (level >= getLogSink().lowest && LogBudget::mayWrite(entryPoint, file, function, line))
        entryPoint(file, function, line, "%s", FormattedText(format, arguments).get());
}

} // namespace

LogBudget::LogBudget(const char* what) : m_what(what)
{
    if (!t_budget)
        t_budget = this;
}

LogBudget::~LogBudget()
{
    if (t_budget != this)
        return;
    t_budget = nullptr;
    for (const Kind* kind = m_kinds; kind != m_kinds + m_kindCount; ++kind)
    {
        if (kind->counted > 0)
            kind->entryPoint(kind->file, kind->function, kind->line, "%u more records %s while loading %s",
                             kind->counted, kind < m_kinds + MOST_KINDS ? "like this" : "of all kinds",
                             m_what);
    }
}

bool LogBudget::mayWrite(LogEntryPoint entryPoint, const char* file, const char* function, int line)
{
    return !t_budget || t_budget->take({entryPoint, file, function, line, 0, 0});
}

bool LogBudget::take(const Kind& record)
{
    Kind* const end = m_kinds + m_kindCount;
    Kind* kind = std::find_if(m_kinds, end,
                              [&record](const Kind& known)
                              { return known.line == record.line && known.file == record.file; });
    if (kind == end)
    {
        if (m_kindCount <= MOST_KINDS)
            m_kinds[m_kindCount++] = record;
        else
            --kind;
        if (m_kindCount <= MOST_KINDS)
        {
            ++kind->written;
            return true;
        }
    }
    const bool isWritten =
        kind < m_kinds + MOST_KINDS && kind->written < MOST_OF_A_KIND && m_repeated < MOST_REPEATED;
    m_repeated += isWritten;
    ++(isWritten ? kind->written : kind->counted);
    return isWritten;
}

#define ORV_LOG_FUNCTION(name, level, entryPoint)                                                            \
    void name(const char* file, const char* function, int line, const char* format, ...)                     \
    {                                                                                                        \
        va_list arguments;                                                                                   \
        va_start(arguments, format);                                                                         \
        writeRecord(LogLevel::level, entryPoint, file, function, line, format, arguments);                   \
        va_end(arguments);                                                                                   \
    }

ORV_LOG_FUNCTION(logError, ERROR, pssLogError)
ORV_LOG_FUNCTION(logWarn, WARNING, pssLogWarn)
ORV_LOG_FUNCTION(logInfo, INFO, pssLogInfo)

} // namespace orv::detail

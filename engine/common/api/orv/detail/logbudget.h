#pragma once

#include "orv/export.h"

namespace orv::detail
{

/// One of pssLogError() and its fellows.
using LogEntryPoint = void (*)(const char* file, const char* function, int line, const char* format, ...);

/// Keeps the log short while it exists: fewer than 100 records, whatever a file makes the engine say.
///
/// Writes the first records of each of MOST_KINDS kinds; a kind is a line of the sources. Further records are counted,
/// and the destructor writes their number, one record for each kind. Only the oldest budget of a thread has an effect.
class LogBudget
{
public:
    /// @param what  is being loaded; borrowed.
    explicit LogBudget(const char* what);
    ~LogBudget();
    LogBudget(const LogBudget&) = delete;
    LogBudget& operator=(const LogBudget&) = delete;

    /// Asked before each record. @return false if it was counted instead.
    static bool mayWrite(LogEntryPoint entryPoint, const char* file, const char* function, int line);

    static constexpr unsigned MOST_KINDS = 30;
    static constexpr unsigned MOST_OF_A_KIND = 8;
    static constexpr unsigned MOST_REPEATED = 38; ///< records that are not the first of their kind

private:
    struct Kind
    {
        LogEntryPoint entryPoint;
        const char* file;
        const char* function;
        int line;
        unsigned written;
        unsigned counted; ///< instead of written
    };

    bool take(const Kind& record);

    const char* m_what;
    Kind m_kinds[MOST_KINDS + 1]; ///< the last one stands for all that are too many
    unsigned m_kindCount = 0;
    unsigned m_repeated = 0;
};

} // namespace orv::detail

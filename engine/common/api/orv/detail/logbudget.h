#pragma once

#include "orv/export.h"

namespace orv::detail
{

/// One of pssLogError() and its fellows.
using LogEntryPoint = void (*)(const char* file, const char* function, int line, const char* format, ...);

/// Keeps the log short while it exists: fewer than 100 records, whatever a file makes the engine say.
///
/// The first record of each of MOST_KINDS kinds is written and a few more; a kind is a place in the sources. What
/// comes beyond them is counted, and the destructor writes one record for each kind of which there was more. The
/// oldest budget of a thread counts, those made while it exists do nothing.
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

#pragma once

#include "orv/export.h"

#include <cstddef>

#if defined(__GNUC__)
#define ORV_PRINTF(formatIndex, firstArgument)                                                               \
    __attribute__((cold, format(printf, formatIndex, firstArgument)))
#else
#define ORV_PRINTF(formatIndex, firstArgument)
#endif

extern "C"
{

    /// The platform's log. Every call writes one record (setLogFunction() and setLogLevel() change that):
    ///
    ///     file name without directories; function; line; formatted message
    ///
    /// On Android it goes to the system log under the tag "ORV" at priority 6 (error), 5 (warning), 4 (info)
    /// or 3 (debug); on Linux the same record goes to standard error after "E/ORV: ", "W/ORV: ", "I/ORV: " or
    /// "D/ORV: ". Safe to call from any thread as far as the platform's log is.
    ///
    /// @param file      source path; everything up to the last '/' or '\\' is cut. Together with function it
    ///                  becomes part of the printf format, so neither may hold a '%'.
    /// @param function  bare name of the calling function.
    ORV_API void pssLogError(const char* file, const char* function, int line, const char* format, ...)
        ORV_PRINTF(4, 5);
    ORV_API void pssLogWarn(const char* file, const char* function, int line, const char* format, ...)
        ORV_PRINTF(4, 5);
    ORV_API void pssLogInfo(const char* file, const char* function, int line, const char* format, ...)
        ORV_PRINTF(4, 5);
    ORV_API void pssLogDebug(const char* file, const char* function, int line, const char* format, ...)
        ORV_PRINTF(4, 5);

    /// Nothing on today's platforms; called around everything else by a platform whose log needs setting up.
    ORV_API void pssLogInit();
    ORV_API void pssLogDeInit();

} // extern "C"

namespace orv::detail
{

// What the macros below call: the entry points above, as far as a LogBudget allows. (The engine logs nothing for
// debugging.)
ORV_API void logError(const char* file, const char* function, int line, const char* format, ...)
    ORV_PRINTF(4, 5);
ORV_API void logWarn(const char* file, const char* function, int line, const char* format, ...)
    ORV_PRINTF(4, 5);
ORV_API void logInfo(const char* file, const char* function, int line, const char* format, ...)
    ORV_PRINTF(4, 5);

/// A source path without its extension, cut at compile time: "engine/facility/src/assetpath".
template <std::size_t N>
struct SourcePath
{
    char text[N] = {};

    consteval SourcePath(const char (&path)[N])
    {
        std::size_t end = N - 1;
        while (end > 0 && path[end] != '.' && path[end] != '/')
            --end;
        if (end == 0 || path[end] != '.')
            end = N - 1;
        for (std::size_t i = 0; i < end; ++i)
            text[i] = path[i];
    }
};

/// The text once for all records of a source.
template <SourcePath PATH>
inline constexpr const char* sourcePathText = PATH.text;

} // namespace orv::detail

/// One record. While the engine loads something, records of one place in the sources beyond the first few are counted
/// instead, and one record tells how many they were (detail::LogBudget).
#define ORV_LOG(entryPoint, ...)                                                                             \
    entryPoint(::orv::detail::sourcePathText<__FILE__>, __func__, __LINE__, __VA_ARGS__)

#define ORV_LOG_ERROR(...) ORV_LOG(::orv::detail::logError, __VA_ARGS__)
#define ORV_LOG_WARN(...) ORV_LOG(::orv::detail::logWarn, __VA_ARGS__)
#define ORV_LOG_INFO(...) ORV_LOG(::orv::detail::logInfo, __VA_ARGS__)
#define ORV_LOG_DEBUG(...) ORV_LOG(pssLogDebug, __VA_ARGS__)

/// A broken promise inside the engine: logged as an error with the condition's text, and execution goes on.
#define ORV_ASSERT(condition)                                                                                \
    do                                                                                                       \
    {                                                                                                        \
        if (!(condition))                                                                                    \
            ORV_LOG_ERROR("%s", "ORV_ASSERT: " #condition);                                                  \
    } while (false)

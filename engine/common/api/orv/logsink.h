#pragma once

#include "orv/export.h"

#include <cstdint>

/// Where the engine's log goes, for applications that want it elsewhere than in the platform's log.
namespace orv
{

/// How much a record matters.
enum class LogLevel : int32_t
{
    DEBUGGING = 0,
    INFO = 1,
    WARNING = 2,
    ERROR = 3,
    NONE = 4 ///< no record has it: as the lowest level it silences the log
};

/// Takes one record in place of the platform's log, on the thread that wrote it. It may not log itself.
///
/// @param place  where in the engine: "file name; function; line". Borrowed for the call, as is text.
/// @param text   the message, without a line end. It can hold names and texts from files as they are.
/// @param user   what setLogFunction() was given.
using LogFunction = void (*)(LogLevel level, const char* place, const char* text, void* user);

/// Sends all records to function from now on; null brings back the platform's log. Call it while no other thread uses
/// the engine.
/// @param user  handed on to function; borrowed until another function is set.
ORV_API void setLogFunction(LogFunction function, void* user = nullptr);

/// Records below a level go nowhere. DEBUGGING, which is where a program starts, keeps them all. Like setLogFunction(), to
/// be called while no other thread uses the engine.
ORV_API void setLogLevel(LogLevel lowest);

namespace detail
{

struct LogSink
{
    LogFunction function = nullptr;
    void* user = nullptr;
    LogLevel lowest = LogLevel::DEBUGGING;
};

ORV_LOCAL const LogSink& getLogSink();

} // namespace detail

} // namespace orv

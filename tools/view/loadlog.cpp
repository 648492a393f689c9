#include "loadlog.h"

#include <algorithm>
#include <cstdarg>
#include <cstdio>

namespace view::loadlog
{

namespace
{

int g_errorCount = 0;
std::string g_message;

std::string format(const char* text, va_list arguments)
{
    va_list again;
    va_copy(again, arguments);
    std::string message(size_t(std::max(std::vsnprintf(nullptr, 0, text, again), 0)), '\0');
    va_end(again);
    std::vsnprintf(message.data(), message.size() + 1, text, arguments);
    return message;
}

} // namespace

void reset()
{
    g_errorCount = 0;
    g_message.clear();
}

int getErrorCount()
{
    return g_errorCount;
}

std::string getMessage()
{
    return g_message;
}

} // namespace view::loadlog

// What the engine calls in place of pssLogError() and its fellows, and what those are called behind it.
extern "C"
{
    void __real_pssLogError(const char* file, const char* function, int line, const char* format, ...);
    void __real_pssLogWarn(const char* file, const char* function, int line, const char* format, ...);
    void __wrap_pssLogError(const char* file, const char* function, int line, const char* format, ...)
        __attribute__((format(printf, 4, 5)));
    void __wrap_pssLogWarn(const char* file, const char* function, int line, const char* format, ...)
        __attribute__((format(printf, 4, 5)));
    void __wrap_pssLogInfo(const char* file, const char* function, int line, const char* format, ...);
    void __wrap_pssLogDebug(const char* file, const char* function, int line, const char* format, ...);

    void __wrap_pssLogError(const char* file, const char* function, int line, const char* format, ...)
    {
        va_list arguments;
        va_start(arguments, format);
        const std::string message = view::loadlog::format(format, arguments);
        va_end(arguments);
        if (view::loadlog::g_errorCount++ == 0)
            view::loadlog::g_message = message;
        __real_pssLogError(file, function, line, "%s", message.c_str());
    }

    void __wrap_pssLogWarn(const char* file, const char* function, int line, const char* format, ...)
    {
        va_list arguments;
        va_start(arguments, format);
        const std::string message = view::loadlog::format(format, arguments);
        va_end(arguments);
        __real_pssLogWarn(file, function, line, "%s", message.c_str());
    }

    void __wrap_pssLogInfo(const char*, const char*, int, const char*, ...) {}
    void __wrap_pssLogDebug(const char*, const char*, int, const char*, ...) {}
}

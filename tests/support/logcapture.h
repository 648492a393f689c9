#pragma once

#include <cstdio>
#include <functional>
#include <string>
#include <vector>

namespace support
{

/// Captures what is written to standard error in its scope, which is where the engine's log goes on Linux.
///
///     LogCapture log;
///     EXPECT_FALSE(cache->get("missing.png"));
///     EXPECT_EQ(1, log.count('E'));
///     EXPECT_TRUE(log.contains("missing.png"));
///
/// At the end, text that is not a log record goes to the real standard error. Captures nest.
class LogCapture
{
public:
    /// "E/ORV: assetpath; getStream; 42; message"
    struct Record
    {
        char level; ///< 'E', 'W', 'I' or 'D'
        std::string source;
        std::string function;
        int line;
        std::string message; ///< may hold line feeds
    };

    LogCapture();
    ~LogCapture();
    LogCapture(const LogCapture&) = delete;
    LogCapture& operator=(const LogCapture&) = delete;

    /// Everything captured since the start or the last clear().
    std::string text() const;
    std::vector<Record> records() const;

    /// Records of one level ('E', 'W', 'I', 'D').
    int count(char level) const;

    /// Whether a record's message contains part.
    bool contains(const std::string& part) const;

    /// Records whose whole message is message.
    int countMessage(const std::string& message) const;

    void clear();

private:
    int countIf(const std::function<bool(const Record&)>& condition) const;

    int m_file;
    int m_savedError;
    long m_start = 0;
};

} // namespace support

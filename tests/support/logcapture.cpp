#include "support/logcapture.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <sstream>

#include <fcntl.h>
#include <unistd.h>

// Where the sanitizers are linked in: their reports must not end in a captured, forgotten file.
extern "C" __attribute__((weak)) void __sanitizer_set_report_fd(void* descriptor);

namespace support
{

namespace
{

void setReportDescriptor(int descriptor)
{
    if (__sanitizer_set_report_fd)
        __sanitizer_set_report_fd(reinterpret_cast<void*>(intptr_t(descriptor)));
}

bool isRecordStart(const std::string& line)
{
    return line.size() > 6 && line.compare(1, 6, "/ORV: ") == 0;
}

/// The text before the next "; ", which is eaten too.
std::string takeField(std::string& rest)
{
    const size_t end = rest.find("; ");
    const std::string field = rest.substr(0, end);
    rest = end == std::string::npos ? "" : rest.substr(end + 2);
    return field;
}

} // namespace

LogCapture::LogCapture()
{
    std::fflush(stderr);
    char name[] = "/tmp/orv-log-XXXXXX";
    m_file = mkstemp(name);
    m_savedError = dup(STDERR_FILENO);
    if (m_file < 0 || m_savedError < 0)
    {
        ADD_FAILURE() << "cannot capture standard error";
        return;
    }
    unlink(name);
    fcntl(m_file, F_SETFL, O_APPEND); // a nested capture's leftovers must not overwrite
    setReportDescriptor(m_savedError);
    dup2(m_file, STDERR_FILENO);
}

LogCapture::~LogCapture()
{
    if (m_file < 0 || m_savedError < 0)
        return;
    m_start = 0;
    std::string foreign;
    std::stringstream lines(text());
    bool isInRecord = false;
    for (std::string line; std::getline(lines, line);)
    {
        isInRecord = isInRecord || isRecordStart(line);
        if (!isInRecord)
            foreign += line + "\n";
    }
    dup2(m_savedError, STDERR_FILENO);
    setReportDescriptor(STDERR_FILENO);
    close(m_savedError);
    close(m_file);
    std::fputs(foreign.c_str(), stderr);
}

std::string LogCapture::text() const
{
    std::fflush(stderr);
    std::string captured;
    char buffer[4096];
    for (ssize_t got; (got = pread(m_file, buffer, sizeof buffer, m_start + off_t(captured.size()))) > 0;)
        captured.append(buffer, size_t(got));
    return captured;
}

std::vector<LogCapture::Record> LogCapture::records() const
{
    std::vector<Record> found;
    std::stringstream lines(text());
    for (std::string line; std::getline(lines, line);)
    {
        if (isRecordStart(line))
        {
            std::string rest = line.substr(7);
            Record record = {line[0], takeField(rest), takeField(rest), std::atoi(takeField(rest).c_str()),
                             rest};
            found.push_back(record);
        }
        else if (!found.empty())
        {
            found.back().message += "\n" + line;
        }
    }
    return found;
}

int LogCapture::countIf(const std::function<bool(const Record&)>& condition) const
{
    const std::vector<Record> all = records();
    return int(std::count_if(all.begin(), all.end(), condition));
}

int LogCapture::count(char level) const
{
    return countIf([=](const Record& record) { return record.level == level; });
}

bool LogCapture::contains(const std::string& part) const
{
    return countIf([&](const Record& record) { return record.message.find(part) != std::string::npos; }) > 0;
}

int LogCapture::countMessage(const std::string& message) const
{
    return countIf([&](const Record& record) { return record.message == message; });
}

void LogCapture::clear()
{
    m_start += long(text().size());
}

} // namespace support

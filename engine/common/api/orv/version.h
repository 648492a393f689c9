#pragma once

#include "orv/export.h"

#include <string>

namespace orv
{

/// A version: three numbers, which order it, and a free text, which does not take part in comparisons.
class ORV_API Version
{
public:
    /// @param extra  copied; null counts as empty.
    Version(int major, int minor, int patch, const char* extra);

    int getMajor() const { return m_major; } ///< Its parts.
    int getMinor() const { return m_minor; }
    int getPatch() const { return m_patch; }
    const char* getExtra() const { return m_extra.c_str(); }

private:
    int m_major;
    int m_minor;
    int m_patch;
    std::string m_extra;
};

ORV_API bool operator==(const Version& a, const Version& b);
ORV_API bool operator!=(const Version& a, const Version& b);
ORV_API bool operator<(const Version& a, const Version& b);
ORV_API bool operator>(const Version& a, const Version& b);
ORV_API bool operator<=(const Version& a, const Version& b);
ORV_API bool operator>=(const Version& a, const Version& b);

/// The version of the engine itself.
ORV_API const Version& getVersion();

/// Three blanks, a label, ": ", the source-control change that the library was built from, and a line feed.
/// Built on the first call and kept for the life of the process.
ORV_API const char* getBuildInfo();

} // namespace orv

/// The source-control change that the library was built from.
extern "C" ORV_API const char* const CHANGE_ID;

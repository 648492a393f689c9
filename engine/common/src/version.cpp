#include "orv/version.h"

#ifndef ORV_CHANGE_ID
#define ORV_CHANGE_ID "unknown"
#endif

extern "C" const char* const CHANGE_ID = ORV_CHANGE_ID;

namespace orv
{

namespace
{

const Version ENGINE_VERSION(1, 0, 0, "");

} // namespace

Version::Version(int major, int minor, int patch, const char* extra)
    : m_major(major)
    , m_minor(minor)
    , m_patch(patch)
    , m_extra(extra ? extra : "")
{
}

bool operator==(const Version& a, const Version& b)
{
    return a.getMajor() == b.getMajor() && a.getMinor() == b.getMinor() && a.getPatch() == b.getPatch();
}

bool operator!=(const Version& a, const Version& b)
{
    return !(a == b);
}

bool operator<(const Version& a, const Version& b)
{
    if (a.getMajor() != b.getMajor())
        return a.getMajor() < b.getMajor();
    if (a.getMinor() != b.getMinor())
        return a.getMinor() < b.getMinor();
    return a.getPatch() < b.getPatch();
}

bool operator>(const Version& a, const Version& b)
{
    return !(a < b) && a != b;
}

bool operator<=(const Version& a, const Version& b)
{
    return !(a > b);
}

bool operator>=(const Version& a, const Version& b)
{
    return !(a < b);
}

const Version& getVersion()
{
    return ENGINE_VERSION;
}

const char* getBuildInfo()
{
    return "   Change: " ORV_CHANGE_ID "\n";
}

} // namespace orv

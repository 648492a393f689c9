#include "orv/filestreamsource.h"

#include "orv/log.h"

#include "filestream.h"

#include <cerrno>
#include <cstring>

#include <sys/stat.h>

namespace orv
{

SharedPtr<StreamSource> StreamSource::get(const char* path, bool archive)
{
    if (archive)
    {
        ORV_LOG_INFO("Archive streams are not currently supported.");
        return nullptr;
    }
    return makeShared<FileStreamSource>(path);
}

FileStreamSource::FileStreamSource(const char* root) : m_root(root && *root ? root : ".") {}

bool FileStreamSource::exists(const char* name) const
{
    return name && *name && detail::FileInputStream(getPath(name).c_str()).valid();
}

SharedPtr<Stream> FileStreamSource::open(const char* name, bool writable)
{
    if (!name || !*name)
        return nullptr;

    const std::string path = getPath(name);
    SharedPtr<Stream> stream;
    if (writable)
        stream = makeShared<detail::FileOutputStream>(path.c_str());
    else
        stream = makeShared<detail::FileInputStream>(path.c_str());
    return stream && stream->valid() ? stream : nullptr;
}

const char* FileStreamSource::getName() const
{
    return m_root.c_str();
}

bool FileStreamSource::makeFolders(const char* name)
{
    if (!name || std::strstr(name, ".."))
        return false;
    const std::string path = getPath(name);
    for (std::size_t end = path.find('/', m_root.size() + 1); end != std::string::npos;
         end = path.find('/', end + 1))
    {
        if (mkdir(path.substr(0, end).c_str(), 0777) != 0 && errno != EEXIST)
            return false;
    }
    return true;
}

std::string FileStreamSource::getPath(const char* name) const
{
    return m_root + "/" + name;
}

} // namespace orv

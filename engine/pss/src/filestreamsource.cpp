#include "orv/filestreamsource.h"

#include "orv/log.h"

#include "filestream.h"

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

std::string FileStreamSource::getPath(const char* name) const
{
    return m_root + "/" + name;
}

} // namespace orv

#pragma once

#include "orv/streamsource.h"

#include <string>

namespace orv
{

/// The files below a directory.
///
/// Full paths are root + "/" + name; names are not checked for "..". Only regular files are read: a directory
/// of the name does not exist as a stream. What cannot be opened is not logged here.
class ORV_API FileStreamSource : public StreamSource
{
public:
    using Ptr = SharedPtr<FileStreamSource>;

    /// @param root  copied; null or empty means ".".
    explicit FileStreamSource(const char* root);

    bool exists(const char* name) const override;

    /// Reading: empty for a file that is missing or larger than a stream can be. After a read that came to the
    /// end of the file the stream is failed, as a standard file stream is: eof() is true, valid() false, tell()
    /// and seek() give -1.
    ///
    /// Writing: the file is created or emptied. A file that cannot be created gives a stream all the same, to
    /// which 0 bytes can be written; empty for a null or empty name only. size() and tell() of a stream being
    /// written are the write position.
    SharedPtr<Stream> open(const char* name, bool writable) override;

    const char* getName() const override;

private:
    ORV_LOCAL std::string getPath(const char* name) const;

    std::string m_root;
};

} // namespace orv

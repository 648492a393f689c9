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

    /// Reading: empty for a file that is missing or larger than a stream can be. eof() is true
    /// once a read has asked for more than there was, until the next seek(); the stream stays valid.
    ///
    /// Writing: the file is created or emptied. A file that cannot be created gives a stream all the same, to
    /// which 0 bytes can be written; empty for a null or empty name only. size() and tell() of a stream being
    /// written are the write position.
    SharedPtr<Stream> open(const char* name, bool writable) override;

    const char* getName() const override;

    /// Makes the folders of the name below the directory, which must be there itself. A name with a ".." in it makes
    /// none.
    bool makeFolders(const char* name) override;

private:
    ORV_LOCAL std::string getPath(const char* name) const;

    std::string m_root;
};

} // namespace orv

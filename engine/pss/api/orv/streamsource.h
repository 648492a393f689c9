#pragma once

#include "orv/export.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"
#include "orv/stream.h"

namespace orv
{

/// A place that streams come from: a directory, the application package, memory.
///
/// Names are exact and case-sensitive; they may hold '/'. Programs may derive sources of their own.
class ORV_API StreamSource : public Shared
{
public:
    using Ptr = SharedPtr<StreamSource>;

    ORV_CLASS_NAME("StreamSource")

    /// A source over the directory path.
    /// @param archive  not supported yet: true gives an empty pointer and an info record.
    static SharedPtr<StreamSource> get(const char* path, bool archive);

    virtual bool exists(const char* name) const = 0; ///< Whether open() for reading would find it.

    /// @param writable  asks for a stream to write to, which replaces what was there.
    /// @return empty when the stream cannot be opened.
    virtual SharedPtr<Stream> open(const char* name, bool writable) = 0;

    /// The source's own name, by which an asset path finds it again.
    virtual const char* getName() const = 0;

    /// Makes the folders in which a stream of this name would be written, where the source has folders.
    /// @return false if that was not possible; what is written then fails as well.
    virtual bool makeFolders([[maybe_unused]] const char* name) { return true; }
};

} // namespace orv

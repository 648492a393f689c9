#include "orv/memfilesource.h"

#include "embeddedassets.h"
#include "imagedecoder.h"

#include "orv/log.h"

#include <memory>
#include <new>

namespace orv
{

namespace
{

using Bytes = std::unique_ptr<unsigned char[]>;

/// @param bytes  the archive unpacked: now, unless it is already.
SharedPtr<MemoryStreamSource> createSource(const detail::EmbeddedArchive& archive, Bytes& bytes)
{
    if (!bytes)
    {
        Bytes unpacked(new (std::nothrow) unsigned char[size_t(archive.size)]);
        if (!unpacked || !detail::inflate(archive.packed, archive.packedSize, unpacked.get(), archive.size))
        {
            ORV_LOG_ERROR("No memory for the built-in assets");
            return {};
        }
        bytes = std::move(unpacked);
    }
    const SharedPtr<MemoryStreamSource> source = makeShared<MemoryStreamSource>();
    const unsigned char* next = bytes.get();
    for (size_t i = 0; source && i < archive.count; ++i)
    {
        const detail::EmbeddedAsset& asset = archive.assets[i];
        const SharedPtr<MemoryStream> stream = makeShared<MemoryStream>(next, asset.size);
        if (!stream)
            return {};
        source->add(asset.name, stream);
        next += asset.size;
    }
    return source;
}

} // namespace

SharedPtr<MemoryStreamSource> create_memfilesource_orv()
{
    static Bytes bytes;
    return createSource(detail::ORV_ARCHIVE, bytes);
}

SharedPtr<MemoryStreamSource> create_memfilesource_luvane()
{
    static Bytes bytes;
    return createSource(detail::LUVANE_ARCHIVE, bytes);
}

} // namespace orv

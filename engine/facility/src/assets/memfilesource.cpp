#include "orv/memfilesource.h"

#include "orv/detail/embeddedassets.h"

namespace orv
{

namespace
{

SharedPtr<MemoryStreamSource> createSource(const detail::EmbeddedArchive& archive)
{
    const SharedPtr<MemoryStreamSource> source = makeShared<MemoryStreamSource>();
    for (size_t i = 0; source && i < archive.count; ++i)
    {
        const detail::EmbeddedAsset& asset = archive.assets[i];
        const SharedPtr<MemoryStream> stream = makeShared<MemoryStream>(asset.bytes, asset.size);
        if (!stream)
            return {};
        source->add(asset.name, stream);
    }
    return source;
}

} // namespace

SharedPtr<MemoryStreamSource> create_memfilesource_orv()
{
    return createSource(detail::ORV_ARCHIVE);
}

SharedPtr<MemoryStreamSource> create_memfilesource_luvane()
{
    return createSource(detail::LUVANE_ARCHIVE);
}

} // namespace orv

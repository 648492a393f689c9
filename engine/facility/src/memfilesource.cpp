#include "orv/memfilesource.h"

#include "embeddedassets.h"

namespace orv
{

namespace
{

SharedPtr<MemoryStreamSource> createSource(const detail::EmbeddedArchive& archive)
{
    const SharedPtr<MemoryStreamSource> source = makeShared<MemoryStreamSource>();
    for (size_t i = 0; i < archive.count; ++i)
    {
        const detail::EmbeddedAsset& asset = archive.assets[i];
        source->add(asset.name, makeShared<MemoryStream>(asset.data, asset.size));
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

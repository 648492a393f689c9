#include "orv/assetmgrstreamsource.h"

#include "orv/detail/logbudget.h"
#include "orv/log.h"

#include <android/asset_manager.h>
#include <android/log.h>

#include <algorithm>
#include <cstdio>
#include <limits>

namespace orv
{

namespace
{

const char* const LOG_TAG_ASSETS = "ORV Asset Mgr";
const int32_t LARGEST = std::numeric_limits<int32_t>::max();

/// Reads one asset of the package and closes it in the end.
class AssetStream : public Stream
{
public:
    AssetStream(AAsset* asset, int32_t length) : m_asset(asset), m_length(length) {}
    ~AssetStream() override { AAsset_close(m_asset); }

    bool valid() const override { return true; }
    bool eof() const override { return m_position >= m_length; }
    int32_t size() const override { return m_length; }

    int32_t seek(unsigned int position) override
    {
        m_position = int32_t(position);
        return int32_t(AAsset_seek(m_asset, off_t(position), SEEK_SET));
    }

    int32_t tell() const override { return m_position; }

    int32_t read(void* buffer, unsigned int count) override
    {
        if (!buffer)
            return 0;
        // By the requested count, so that eof() is true after a read past the end.
        m_position = int32_t(std::min<int64_t>(int64_t(m_position) + count, LARGEST));
        return AAsset_read(m_asset, buffer, count);
    }

    int32_t write(const void*, unsigned int) override { return 0; }

private:
    AAsset* m_asset;
    int32_t m_length;
    int32_t m_position = 0;
};

} // namespace

AssetMgrStreamSource::AssetMgrStreamSource(AAssetManager* manager) : m_manager(manager) {}

bool AssetMgrStreamSource::exists(const char* name) const
{
    if (!name || !*name)
        return false;

    AAsset* asset = AAssetManager_open(m_manager, name, AASSET_MODE_UNKNOWN);
    if (!asset)
    {
        // A file may name any number of missing assets.
        if (detail::LogBudget::mayWrite(pssLogInfo, "assetmgrstreamsource", __func__, __LINE__))
            __android_log_print(ANDROID_LOG_INFO, LOG_TAG_ASSETS,
                                "AssetMgrStreamSource %s  could not load from apk/assets folder", name);
        return false;
    }
    AAsset_close(asset);
    return true;
}

SharedPtr<Stream> AssetMgrStreamSource::open(const char* name, bool writable)
{
    if (writable)
    {
        ORV_LOG_ERROR("Cannot open a ZIP stream for writing");
        return nullptr;
    }

    AAsset* asset = name ? AAssetManager_open(m_manager, name, AASSET_MODE_UNKNOWN) : nullptr;
    if (!asset)
    {
        __android_log_print(ANDROID_LOG_ERROR, LOG_TAG_ASSETS, "AssetMgrStreamSource %s  not found",
                            name ? name : "");
        return nullptr;
    }

    const off_t length = AAsset_getLength(asset);
    SharedPtr<Stream> stream;
    if (length >= 0 && length <= LARGEST)
        stream = makeShared<AssetStream>(asset, int32_t(length));
    if (!stream)
    {
        ORV_LOG_ERROR("%s: no stream over its %lld bytes", name, static_cast<long long>(length));
        AAsset_close(asset);
    }
    return stream;
}

const char* AssetMgrStreamSource::getName() const
{
    return m_name;
}

} // namespace orv

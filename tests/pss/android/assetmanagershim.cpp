// On a device libandroid.so puts these five calls on top of libandroidfw. The distribution has the latter only,
// so the tests bring the thin layer between them.

#include <android/asset_manager.h>
#include <androidfw/Asset.h>
#include <androidfw/AssetManager.h>

namespace
{

android::Asset* toAsset(AAsset* asset)
{
    return reinterpret_cast<android::Asset*>(asset);
}

} // namespace

AAsset* AAssetManager_open(AAssetManager* manager, const char* name, int mode)
{
    android::Asset* const asset =
        static_cast<android::AssetManager*>(manager)->open(name, android::Asset::AccessMode(mode));
    return reinterpret_cast<AAsset*>(asset);
}

int AAsset_read(AAsset* asset, void* buffer, size_t count)
{
    return int(toAsset(asset)->read(buffer, count));
}

off_t AAsset_seek(AAsset* asset, off_t offset, int whence)
{
    return off_t(toAsset(asset)->seek(offset, whence));
}

off_t AAsset_getLength(AAsset* asset)
{
    return off_t(toAsset(asset)->getLength());
}

void AAsset_close(AAsset* asset)
{
    toAsset(asset)->close();
    delete toAsset(asset);
}

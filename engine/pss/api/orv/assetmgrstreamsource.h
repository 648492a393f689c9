#pragma once

#include "orv/streamsource.h"

struct AAssetManager;

namespace orv
{

/// The assets folder of an Android application package. Part of the library on Android only.
///
/// Names are relative to that folder. A missing asset is recorded under the tag "ORV Asset Mgr": as
/// information by exists(), as an error by open().
class ORV_API AssetMgrStreamSource : public StreamSource
{
public:
    using Ptr = SharedPtr<AssetMgrStreamSource>;

    /// @param manager  borrowed from the application, and has to outlive the source and its streams.
    explicit AssetMgrStreamSource(AAssetManager* manager);

    bool exists(const char* name) const override;

    /// Always for reading; asked for writing, logs an error and gives an empty pointer.
    /// The position of the stream advances by the bytes asked for, even where fewer were left.
    SharedPtr<Stream> open(const char* name, bool writable) override;

    /// "AssetMgrStreamSource" for each of them.
    const char* getName() const override;

private:
    char m_name[128] = "AssetMgrStreamSource";
    AAssetManager* m_manager;
};

} // namespace orv

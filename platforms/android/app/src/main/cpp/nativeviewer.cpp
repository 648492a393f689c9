#include "nativeviewer.h"

#include "orv/assetmgrstreamsource.h"

#include <algorithm>

#include <android/log.h>

namespace android
{

namespace
{

constexpr size_t MOST_LINES = 5; // of the message over the picture; the log has all lines

void writeToSystemLog(orv::LogLevel level, const char* place, const char* text, void*)
{
    __android_log_print(level == orv::LogLevel::ERROR ? ANDROID_LOG_ERROR : ANDROID_LOG_WARN, "ORV", "%s; %s",
                        place, text);
}

} // namespace

NativeViewer::NativeViewer(AAssetManager* assets) : SceneViewer(writeToSystemLog)
{
    addSource(orv::makeShared<orv::AssetMgrStreamSource>(assets));
}

bool NativeViewer::replaceContext()
{
    loseContext();
    return takeContext();
}

std::string NativeViewer::getMessage() const
{
    std::string message = getError();
    const size_t count = std::min(getRemarks().size(), MOST_LINES);
    for (size_t i = 0; i < count; ++i)
        message += (message.empty() ? "" : "\n") + getRemarks()[i].text;
    if (count < getRemarks().size())
        message += "\n...";
    return message;
}

} // namespace android

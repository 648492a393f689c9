#pragma once

#include "stage/sceneviewer.h"

struct AAssetManager;

namespace android
{

/// The viewer of the application: shows scenes of the package's assets folder and scenes in files. Writes to Android's log,
/// with the engine's tag.
class NativeViewer : public view::SceneViewer
{
public:
    /// @param assets  borrowed; has to outlive the viewer.
    explicit NativeViewer(AAssetManager* assets);

    /// A new context is current; the one before, if any, is lost.
    /// @return as SceneViewer::takeContext().
    bool replaceContext();

    /// The errors of the last load, one a line, the most important first; "" for none.
    std::string getMessage() const;
};

} // namespace android

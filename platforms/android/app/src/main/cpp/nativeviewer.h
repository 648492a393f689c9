#pragma once

#include "stage/sceneviewer.h"

struct AAssetManager;

namespace android
{

/// The viewer of the application: scenes of the package's assets folder and of files. Its log is the system's, under the
/// engine's tag.
class NativeViewer : public view::SceneViewer
{
public:
    /// @param assets  borrowed; has to outlive the viewer.
    explicit NativeViewer(AAssetManager* assets);

    /// A new context is current. Where there was one before, it was lost, with all that it held.
    /// @return as SceneViewer::takeContext().
    bool replaceContext();

    /// The errors of the last load, one a line, the most important first; "" for none.
    std::string getMessage() const;
};

} // namespace android

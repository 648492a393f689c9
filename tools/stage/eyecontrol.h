#pragma once

#include "orbit.h"
#include "player.h"
#include "stage.h"

#include <string>

namespace view
{

/// Where the viewer looks from: through the free camera, which goes around a place, or through a camera of the file.
class EyeControl
{
public:
    /// Looks at the whole scene, over the whole clip, with the free camera. @param width, height  of the view, pixels.
    void frameAll(Stage& stage, Player& player, int width, int height);

    /// After the scene was loaded again: the place stays, the size of the scene is found again.
    /// @param camera  of the old file, by name; "" for the free one.
    void adopt(Stage& stage, Player& player, const std::string& camera, int width, int height);

    void useCamera(Stage& stage, int index); ///< of the file; -1 for the free one
    /// @return whether there is more than one camera.
    bool stepCamera(Stage& stage, int count);
    int getCamera() const { return m_camera; }           ///< of the file; -1 for the free one
    std::string getCameraName(const Stage& stage) const; ///< "" for the free one

    // These go on with the free camera, from where the file's stands.

    void zoom(Stage& stage, float steps);
    void turn(Stage& stage, float right, float down);
    /// @param viewSize  the shorter side of the view, in pixels.
    void pan(Stage& stage, float right, float down, float viewSize);
    /// Goes closer to what is seen at a place of the view, if anything is. @param x, y  pixels from the upper left.
    void lookCloser(Stage& stage, float x, float y, int width, int height);

    /// Puts the free camera in its place.
    void apply(Stage& stage) const;

private:
    void leaveFileCamera(Stage& stage);

    Orbit m_orbit;
    int m_camera = -1; ///< of the file; -1 for the free one
};

} // namespace view

#pragma once

#include "orbit.h"
#include "player.h"
#include "stage.h"

#include <string>

namespace view
{

/// The viewer's camera: the free one, which orbits a point, or one of the file.
class EyeControl
{
public:
    /// Shows the whole scene, over the whole clip, with the free camera. @param width, height  of the view, pixels.
    void frameAll(Stage& stage, Player& player, int width, int height);

    /// After the scene was loaded again: keeps the position, updates the scene's size.
    /// @param camera  of the old file, by name; "" for the free one.
    void adopt(Stage& stage, Player& player, const std::string& camera, int width, int height);

    void useCamera(Stage& stage, int index); ///< of the file; -1 for the free one
    /// @return whether there is more than one camera.
    bool stepCamera(Stage& stage, int count);
    int getCamera() const { return m_camera; }           ///< of the file; -1 for the free one
    std::string getCameraName(const Stage& stage) const; ///< "" for the free one

    // These switch to the free camera at the position of the file's.

    void zoom(Stage& stage, float steps);
    void turn(Stage& stage, float right, float down);
    /// @param viewSize  the shorter side of the view, in pixels.
    void pan(Stage& stage, float right, float down, float viewSize);
    /// Moves closer to the surface at a point of the view, if there is one. @param x, y  pixels from the upper left.
    void lookCloser(Stage& stage, float x, float y, int width, int height);

    /// Updates the free camera.
    void apply(Stage& stage) const;

private:
    void leaveFileCamera(Stage& stage);

    Orbit m_orbit;
    int m_camera = -1; ///< of the file; -1 for the free one
};

} // namespace view

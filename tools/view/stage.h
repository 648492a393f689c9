#pragma once

#include "orv/animationcontroller.h"
#include "orv/assetcachepool.h"
#include "orv/camera.h"
#include "orv/colour.h"
#include "orv/glo.h"
#include "orv/light.h"
#include "orv/renderblock.h"
#include "orv/rendercontext.h"
#include "orv/renderer.h"
#include "orv/scenenode.h"

#include <memory>
#include <string>

/// A scene file, loaded, with all that it takes to draw it into the current GL context.
///
/// A scene without lights gets two of its own. One with lights is left as it is through its own cameras;
/// through another one, which those lights may not reach, a weak light comes along with the camera.
class Stage
{
public:
    /// @param path   a scene file; textures and programs are looked for beside it.
    /// @param error  set to "path: reason" on failure; the engine's log has the details.
    static std::unique_ptr<Stage> load(const std::string& path, std::string& error);

    /// Lets go of everything while the GL context is still there.
    ~Stage();

    Stage(const Stage&) = delete;
    Stage& operator=(const Stage&) = delete;

    /// Looks through a camera of the file.
    /// @return false, with the cameras that there are in error, if none has that name.
    bool chooseCamera(const std::string& name, std::string& error);

    /// Looks through a camera that is not of the file; it becomes part of the scene.
    void addCamera(const orv::Camera::Ptr& camera);

    /// What shows where the scene does not; a light grey at first.
    const orv::Colour4f& getBackground() const { return m_block->getBackground().getColour(); }
    void setBackground(const orv::Colour4f& colour) { m_block->setBackgroundColour(colour); }

    /// Puts the animation into its state at a time.
    void setTime(float time);

    /// Sets the time, clears and draws a viewport of that size, and waits until it is done.
    void draw(float time, int width, int height);

    float getStart() const { return m_animation->getStart(); } ///< seconds
    float getEnd() const { return m_animation->getEnd(); }
    orv::SceneNode& getScene() { return *m_scene; }

private:
    Stage() = default;

    /// Adds a light from far away, on the +z side of parent.
    orv::Light::Ptr addLight(const orv::SceneNode::Ptr& parent, float intensity, float ambientLevel);

    orv::RenderContext::Ptr m_context;
    orv::SharedPtr<orv::AssetCachePool> m_pool;
    orv::SceneNode::Ptr m_scene;
    orv::Glo::Ptr m_glo;
    orv::SharedPtr<orv::RenderBlock> m_block;
    orv::SharedPtr<orv::AnimationController> m_animation;
};

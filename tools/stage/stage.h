#pragma once

#include "player.h"
#include "studio.h"

#include "orv/camera.h"
#include "orv/colour.h"
#include "orv/glo.h"
#include "orv/light.h"
#include "orv/renderblock.h"
#include "orv/scenenode.h"

#include <memory>
#include <string>
#include <vector>

namespace view
{

/// What the suffix of a file says that it is.
enum class FileKind
{
    SCENE,    ///< .glo
    MATERIAL, ///< .ap
    PROGRAM,  ///< .sp
    MODEL     ///< anything else, to be converted
};

FileKind getFileKind(const std::string& path);

/// What to show: a scene file, or a material (.ap) or shader program (.sp), which is shown on a ball.
struct SceneFile
{
    struct Dressing
    {
        std::string material; ///< of the scene
        std::string path;     ///< of an appearance file that is put over it
    };

    std::string path;
    std::vector<Dressing> dressings;
};

/// A scene, loaded, with all that it takes to draw it into the current GL context.
///
/// A scene without lights gets two of its own. One with lights is left as it is through its own cameras;
/// through the free one, which those lights may not reach, a weak light comes along with the camera.
class Stage
{
public:
    /// @param studio  has to stay; textures and programs are looked for beside the files.
    /// @param error   set to "path: reason" on failure; the engine's log has the details.
    static std::unique_ptr<Stage> load(Studio& studio, const SceneFile& file, std::string& error);

    /// Lets go of everything while the GL context is still there.
    ~Stage();

    Stage(const Stage&) = delete;
    Stage& operator=(const Stage&) = delete;

    /// The cameras of the file. @param index  0 up to, without, the count.
    int getCameraCount() const { return m_glo ? m_glo->getCameraCount() : 0; }
    std::string getCameraName(int index) const { return m_glo->getCamera(index)->getName(); }
    void useCamera(int index);
    /// @return its index; -1, with the cameras that there are in error, if none has that name.
    int findCamera(const std::string& name, std::string& error) const;

    /// The one that is not of the file, to be put anywhere in the world. Looked through at first.
    orv::Camera& getFreeCamera() { return *m_freeCamera; }
    void useFreeCamera();

    orv::Camera& getCamera() { return *m_block->getCamera(); } ///< looked through now

    /// What shows where the scene does not; a light grey at first.
    const orv::Colour4f& getBackground() const { return m_block->getBackground().getColour(); }
    void setBackground(const orv::Colour4f& colour) { m_block->setBackgroundColour(colour); }

    /// All movement of the file.
    const orv::SharedPtr<orv::Animation>& getAnimation() const { return m_animation; }

    /// The whole time line, by the name of an animation that lasts as long or else "all", and the file's other
    /// animations.
    const std::vector<Clip>& getClips() const { return m_clips; }

    /// Whether shaders may show other things as time goes by.
    bool usesShaderTime() const { return m_usesShaderTime; }

    /// What TIME is in shaders, in seconds.
    void setShaderTime(float time) { m_block->update(time); }

    /// Clears and draws a viewport of that size at the lower left.
    void draw(int width, int height);

    orv::SceneNode& getScene() { return *m_scene; }
    Studio& getStudio() { return m_studio; }
    /// The top of what the file holds, without lights and cameras of the viewer's own.
    orv::SceneNode& getTopNode() { return m_glo && m_glo->getTopNode() ? *m_glo->getTopNode() : *m_scene; }

private:
    explicit Stage(Studio& studio);

    bool loadScene(const std::string& name);
    bool loadBall(const std::string& name, FileKind kind);
    bool dress(const SceneFile::Dressing& dressing, std::string& error);
    void findClips();

    /// Adds a light from far away, on the +z side of parent.
    orv::Light::Ptr addLight(const orv::SceneNode::Ptr& parent, float intensity, float ambientLevel);

    Studio& m_studio;
    orv::SceneNode::Ptr m_scene;
    orv::Glo::Ptr m_glo; ///< empty for a material
    orv::SharedPtr<orv::RenderBlock> m_block;
    orv::SharedPtr<orv::Animation> m_animation;
    std::vector<Clip> m_clips;
    orv::Camera::Ptr m_freeCamera;
    orv::Light::Ptr m_cameraLight; ///< the free camera's; empty where the scene needs none
    bool m_usesShaderTime = false;
};

} // namespace view

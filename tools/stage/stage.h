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

/// The kind of a file, by its suffix.
enum class FileKind
{
    SCENE,    ///< .glo
    MATERIAL, ///< .ap
    PROGRAM,  ///< .sp
    MODEL     ///< anything else, to be converted
};

FileKind getFileKind(const std::string& path);

/// The file to show: a scene, or a material (.ap) or shader program (.sp), which is shown on a ball.
struct SceneFile
{
    struct Dressing
    {
        std::string material; ///< of the scene
        std::string path;     ///< of an appearance file that is applied to it
    };

    std::string path;
    std::vector<Dressing> dressings;
    bool isAsset =
        false; ///< the path is a name in the studio's sources, where all that the file names is looked for
};

/// A loaded scene with everything needed to draw it into the current GL context.
///
/// A scene without lights gets two of its own. One with lights is unchanged through its own cameras; the free camera,
/// which may look at unlit places, has a weak light.
class Stage
{
public:
    /// @param studio  has to outlive it; textures and programs are searched beside the files.
    /// @param error   set to "path: reason" on failure; the engine's log has the details.
    static std::unique_ptr<Stage> load(Studio& studio, const SceneFile& file, std::string& error);

    /// Releases everything while the GL context still exists.
    ~Stage();

    Stage(const Stage&) = delete;
    Stage& operator=(const Stage&) = delete;

    /// The cameras of the file. @param index  below the count.
    int getCameraCount() const { return m_glo ? m_glo->getCameraCount() : 0; }
    std::string getCameraName(int index) const { return m_glo->getCamera(index)->getName(); }
    void useCamera(int index);
    /// @return its index; -1, with a list of the cameras in error, if none has that name.
    int findCamera(const std::string& name, std::string& error) const;

    /// The free camera, which can be anywhere in the world. Active at first.
    orv::Camera& getFreeCamera() { return *m_freeCamera; }
    void useFreeCamera();

    orv::Camera& getCamera() { return *m_block->getCamera(); } ///< the active one

    /// The background colour; a light grey at first.
    const orv::Colour4f& getBackground() const { return m_block->getBackground().getColour(); }
    void setBackground(const orv::Colour4f& colour) { m_block->setBackgroundColour(colour); }

    /// All animations of the file.
    const orv::SharedPtr<orv::Animation>& getAnimation() const { return m_animation; }

    /// The whole time line, named after an animation of its length or else "all", and the file's other animations.
    const std::vector<Clip>& getClips() const { return m_clips; }

    /// Whether shaders may change with time.
    bool usesShaderTime() const { return m_usesShaderTime; }

    /// TIME in shaders, in seconds.
    void setShaderTime(float time) { m_block->update(time); }

    /// Clears and draws a viewport of that size at the lower left.
    void draw(int width, int height);

    orv::SceneNode& getScene() { return *m_scene; }
    Studio& getStudio() { return m_studio; }
    /// The top node of the file, without the viewer's own lights and cameras.
    orv::SceneNode& getTopNode() { return m_glo && m_glo->getTopNode() ? *m_glo->getTopNode() : *m_scene; }

private:
    explicit Stage(Studio& studio);

    bool loadScene(const std::string& name);
    bool loadBall(const std::string& name, FileKind kind);
    bool dress(const SceneFile::Dressing& dressing, std::string& error);
    void findClips();

    /// Adds a directional light from the +z side of parent.
    orv::Light::Ptr addLight(const orv::SceneNode::Ptr& parent, float intensity, float ambientLevel);

    Studio& m_studio;
    orv::SceneNode::Ptr m_scene;
    orv::Glo::Ptr m_glo; ///< empty for a material
    orv::SharedPtr<orv::RenderBlock> m_block;
    orv::SharedPtr<orv::Animation> m_animation;
    std::vector<Clip> m_clips;
    orv::Camera::Ptr m_freeCamera;
    orv::Light::Ptr m_cameraLight; ///< the free camera's; empty if the scene needs none
    bool m_usesShaderTime = false;
};

} // namespace view

#include "stage.h"

#include "orv/animationgroup.h"
#include "orv/sceneutil.h"
#include "orv/simplerenderer.h"

#include <GLES2/gl2.h>

#include <filesystem>

using orv::makeShared;
using orv::Vector3f;

namespace
{

const orv::Colour4f BACKGROUND(0.84f, 0.86f, 0.89f, 1.0f);

/// Makes a light shine from a direction to the middle of the world.
void turnFrom(orv::Light& light, const Vector3f& direction)
{
    light.setPosition(direction);
    orv::point(light, Vector3f());
}

} // namespace

std::unique_ptr<Stage> Stage::load(const std::string& path, std::string& error)
{
    const std::filesystem::path file(path);
    std::error_code reason;
    if (!std::filesystem::is_regular_file(file, reason))
    {
        error = path + ": " + (reason ? reason.message() : "not a file");
        return nullptr;
    }

    std::unique_ptr<Stage> stage(new Stage);
    stage->m_context = makeShared<orv::RenderContext>();
    stage->m_pool = makeShared<orv::AssetCachePool>();
    stage->m_scene = makeShared<orv::SceneNode>();
    const std::string folder = file.has_parent_path() ? file.parent_path().string() : ".";
    orv::registerSource(*stage->m_pool, folder.c_str(), false);
    stage->m_glo = orv::loadGloFile(*stage->m_pool, stage->m_scene, file.filename().c_str(), true);
    if (!stage->m_glo)
    {
        error = path + ": cannot be loaded as a scene";
        return nullptr;
    }

    if (stage->m_glo->getLightCount() == 0)
    {
        turnFrom(*stage->addLight(stage->m_scene, 0.85f, 0.4f), Vector3f(-0.4f, 0.9f, 0.8f));
        turnFrom(*stage->addLight(stage->m_scene, 0.3f, 0.0f), Vector3f(0.9f, 0.1f, 0.4f));
    }
    stage->m_animation = makeShared<orv::AnimationController>(stage->m_glo->getAnimationGroup());
    const auto renderer = makeShared<orv::SimpleRenderer>(stage->m_context, stage->m_pool);
    stage->m_block = makeShared<orv::RenderBlock>(renderer, stage->m_scene, nullptr);
    stage->m_block->setBackgroundColour(BACKGROUND);
    return stage;
}

Stage::~Stage()
{
    m_block.reset();
    m_animation.reset();
    m_glo.reset();
    m_scene.reset();
    if (m_pool)
    {
        m_pool->flush(); // meshes and programs first,
        m_pool->flush(); // then what only they held
    }
}

orv::Light::Ptr Stage::addLight(const orv::SceneNode::Ptr& parent, float intensity, float ambientLevel)
{
    const auto light = makeShared<orv::Light>();
    light->setLightType(orv::Light::LightType::DIRECTIONAL);
    light->setIntensity(intensity);
    light->setAmbientLevel(ambientLevel);
    light->setParent(parent);
    return light;
}

bool Stage::chooseCamera(const std::string& name, std::string& error)
{
    const orv::Camera::Ptr camera = m_glo->getCamera(name.c_str());
    if (!camera)
    {
        error = "no camera \"" + name + "\"";
        for (int i = 0; i < m_glo->getCameraCount(); ++i)
            error += (i == 0 ? "; there are \"" : "\", \"") + std::string(m_glo->getCamera(i)->getName());
        error += m_glo->getCameraCount() > 0 ? "\"" : "; the scene has none";
        return false;
    }
    m_block->setCamera(camera);
    return true;
}

void Stage::addCamera(const orv::Camera::Ptr& camera)
{
    camera->setParent(m_scene);
    m_block->setCamera(camera);
    if (m_glo->getLightCount() > 0)
        addLight(camera, 0.35f, 0.5f);
}

void Stage::setTime(float time)
{
    orv::seek(*m_animation, time);
    m_block->update(time);
}

void Stage::draw(float time, int width, int height)
{
    setTime(time);
    m_block->setViewport(0, 0, width, height);
    m_block->render();
    glFinish();
}

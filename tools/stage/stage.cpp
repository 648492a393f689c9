#include "stage.h"

#include "solidvisitor.h"

#include "orv/animationgroup.h"
#include "orv/appearance.h"
#include "orv/sceneutil.h"
#include "orv/shaderprogramcache.h"
#include "orv/simplerenderer.h"

#include <cctype>
#include <filesystem>
#include <set>
#include <string_view>

namespace view
{

namespace fs = std::filesystem;
using orv::makeShared;
using orv::Vector3f;

namespace
{

const orv::Colour4f BACKGROUND(0.84f, 0.86f, 0.89f, 1.0f);
constexpr unsigned BALL_SEGMENTS = 48;
constexpr unsigned BALL_WEDGES = 96;

/// Makes a light shine from a direction towards the origin.
void turnFrom(orv::Light& light, const Vector3f& direction)
{
    light.setPosition(direction);
    orv::point(light, Vector3f());
}

/// Whether a solid's look changes with time.
bool takesTime(const orv::Solid& solid)
{
    const orv::Appearance* appearance = solid.getAppearance().get();
    const orv::ShaderProgram* program = appearance ? appearance->getShaderProgram().get() : nullptr;
    for (int i = 0; program && i < program->getUniformCount(); ++i)
    {
        const char* property = program->getUniformPropertyName(i);
        if (property && std::string_view(property) == "TIME")
            return true;
    }
    return false;
}

std::string getFolder(const fs::path& file)
{
    return file.has_parent_path() ? file.parent_path().string() : ".";
}

bool isFile(const std::string& path, std::string& error)
{
    std::error_code reason;
    if (fs::is_regular_file(path, reason))
        return true;
    error = path + ": " + (reason ? reason.message() : "not a file");
    return false;
}

} // namespace

FileKind getFileKind(const std::string& path)
{
    std::string suffix = fs::path(path).extension().string();
    for (char& c : suffix)
        c = char(std::tolower(static_cast<unsigned char>(c)));
    return suffix == ".glo"  ? FileKind::SCENE
           : suffix == ".ap" ? FileKind::MATERIAL
           : suffix == ".sp" ? FileKind::PROGRAM
                             : FileKind::MODEL;
}

Stage::Stage(Studio& studio)
    : m_studio(studio)
    , m_scene(makeShared<orv::SceneNode>())
    , m_freeCamera(makeShared<orv::Camera>())
{
}

std::unique_ptr<Stage> Stage::load(Studio& studio, const SceneFile& file, std::string& error)
{
    if (!file.isAsset && !isFile(file.path, error))
        return nullptr;
    const fs::path path(file.path);
    const std::string name = file.isAsset ? file.path : path.filename().string();
    studio.useSources(file.isAsset);
    if (!file.isAsset)
        studio.addFolder(getFolder(path));

    std::unique_ptr<Stage> stage(new Stage(studio));
    const FileKind kind = getFileKind(file.path);
    const bool isOnBall = kind == FileKind::MATERIAL || kind == FileKind::PROGRAM;
    if (!(isOnBall ? stage->loadBall(name, kind) : stage->loadScene(name)))
    {
        error = file.path + ": cannot be loaded as a " +
                (kind == FileKind::PROGRAM ? "shader program"
                 : isOnBall                ? "material"
                                           : "scene");
        return nullptr;
    }
    for (const SceneFile::Dressing& dressing : file.dressings)
    {
        if (!stage->dress(dressing, error))
            return nullptr;
    }

    const bool isLit = stage->m_glo && stage->m_glo->getLightCount() > 0;
    if (!isLit)
    {
        turnFrom(*stage->addLight(stage->m_scene, 0.85f, 0.4f), Vector3f(-0.4f, 0.9f, 0.8f));
        turnFrom(*stage->addLight(stage->m_scene, 0.3f, 0.0f), Vector3f(0.9f, 0.1f, 0.4f));
    }
    stage->m_freeCamera->setParent(stage->m_scene);
    if (isLit)
        stage->m_cameraLight = stage->addLight(stage->m_freeCamera, 0.35f, 0.5f);
    stage->findClips();
    forEachSolid(*stage->m_scene, [&](orv::Solid& solid)
                 { stage->m_usesShaderTime = stage->m_usesShaderTime || takesTime(solid); });
    const auto renderer = makeShared<orv::SimpleRenderer>(studio.getContext(), studio.getPool());
    renderer->setOpaqueGrouped(true);                         // a model's parts are in no useful order
    renderer->setCulled(file.dressings.empty() && !isOnBall); // other programs may move vertices about
    stage->m_block = makeShared<orv::RenderBlock>(renderer, stage->m_scene, stage->m_freeCamera);
    stage->m_block->setRenderFlags(orv::SceneNode::VISIBLE);
    stage->setBackground(BACKGROUND);
    return stage;
}

Stage::~Stage()
{
    m_block.reset();
    m_animation.reset();
    m_glo.reset();
    m_scene.reset();
    m_studio.flush();
}

bool Stage::loadScene(const std::string& name)
{
    m_glo = orv::loadGloFile(*m_studio.getPool(), m_scene, name.c_str(), orv::MeshData::GEOMETRY);
    if (!m_glo)
        return false;
    m_animation = m_glo->getAnimationGroup();
    return true;
}

bool Stage::loadBall(const std::string& name, FileKind kind)
{
    orv::AssetCachePool& pool = *m_studio.getPool();
    const orv::Solid::Ptr ball =
        orv::createSphere(pool, BALL_SEGMENTS, BALL_WEDGES, orv::Vector2f(2.0f, 1.0f));
    if (!ball || !ball->getAppearance())
        return false;
    if (kind == FileKind::PROGRAM)
        ball->getAppearance()->setShaderProgram(pool.getShaderProgramCache()->get(name.c_str()));
    else
        ball->setAppearance(orv::loadAppearance(pool, name.c_str()));
    ball->setName(name.c_str());
    ball->setParent(m_scene);
    m_animation = makeShared<orv::AnimationGroup>();
    return ball->getAppearance() && ball->getAppearance()->getShaderProgram();
}

bool Stage::dress(const SceneFile::Dressing& dressing, std::string& error)
{
    if (!isFile(dressing.path, error))
        return false;
    const fs::path path(dressing.path);
    m_studio.addFolder(getFolder(path));
    std::set<orv::Appearance*> dressed; // plain and skinned solids have one each
    std::set<std::string> names;
    forEachSolid(*m_scene,
                 [&](orv::Solid& solid)
                 {
                     orv::Appearance* appearance = solid.getAppearance().get();
                     if (!appearance)
                         return;
                     names.insert(appearance->getName());
                     if (appearance->getName() == dressing.material && dressed.insert(appearance).second)
                         appearance->apply(*m_studio.getPool(), path.filename().c_str());
                 });
    if (!dressed.empty())
        return true;
    error = "no material \"" + dressing.material + "\"";
    const char* separator = "; there are \"";
    for (const std::string& name : names)
    {
        error += separator + name;
        separator = "\", \"";
    }
    error += names.empty() ? "; the scene has none" : "\"";
    return false;
}

void Stage::findClips()
{
    m_clips.push_back(makeClip("all", *m_animation));
    for (int i = 0; m_glo && i < m_glo->getAnimationCount(); ++i)
    {
        const Clip clip = makeClip(m_glo->getAnimationName(i), *m_glo->getAnimation(i));
        if (clip.start == m_clips[0].start && clip.end == m_clips[0].end)
            m_clips[0].name = clip.name;
        else if (clip.end > clip.start)
            m_clips.push_back(clip);
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

void Stage::useCamera(int index)
{
    m_block->setCamera(m_glo->getCamera(index));
    if (m_cameraLight)
        m_cameraLight->setParent(nullptr);
}

int Stage::findCamera(const std::string& name, std::string& error) const
{
    const orv::Camera::Ptr camera = m_glo ? m_glo->getCamera(name.c_str()) : nullptr;
    for (int i = 0; camera && i < getCameraCount(); ++i)
    {
        if (m_glo->getCamera(i).get() == camera.get())
            return i;
    }
    error = "no camera \"" + name + "\"";
    for (int i = 0; i < getCameraCount(); ++i)
        error += (i == 0 ? "; there are \"" : "\", \"") + getCameraName(i);
    error += getCameraCount() > 0 ? "\"" : "; the scene has none";
    return -1;
}

void Stage::useFreeCamera()
{
    m_block->setCamera(m_freeCamera);
    if (m_cameraLight)
        m_cameraLight->setParent(m_freeCamera);
}

void Stage::draw(int width, int height)
{
    m_block->setViewport(0, 0, width, height);
    m_block->render();
}

} // namespace view

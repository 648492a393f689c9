#include "contender.h"

#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/light.h"
#include "orv/mesh.h"
#include "orv/meshutil.h"
#include "orv/renderblock.h"
#include "orv/rendercontext.h"
#include "orv/sceneutil.h"
#include "orv/shaderprogramcache.h"
#include "orv/simplerenderer.h"
#include "orv/solid.h"
#include "orv/texture2dcache.h"

#include <cstring>

using namespace orv;

namespace
{

struct UniformSource
{
    const char* uniform;
    const char* property;
};

constexpr UniformSource UNIFORMS[] = {{"u_modelViewProjection", "T_MODEL_VIEW_PROJECTION"},
                                      {"u_normal", "T_NORMAL_MODEL"},
                                      {"u_lightDirection", "L_POSITION"},
                                      {"u_lightColour", "L_DIFFUSE_COLOUR"},
                                      {"u_colour", "M_DIFFUSE_COLOUR"},
                                      {"u_texture", "M_DIFFUSE_TEXTURE"}};

enum class Order
{
    WALK,
    BY_MATERIAL,
    GROUPED
};

class EngineContender : public Contender
{
public:
    EngineContender(const DrawScene& plan, Order order)
        : m_plan(plan)
        , m_pool(makeShared<AssetCachePool>())
        , m_scene(makeShared<SceneNode>())
        , m_camera(makeShared<Camera>())
    {
        m_cubes = makeShared<SceneNode>();
        m_cubes->setParent(m_scene);
        addCubes(order == Order::BY_MATERIAL);

        const auto light = makeShared<Light>();
        light->setLightType(Light::LightType::DIRECTIONAL);
        light->setPosition(m_plan.lightDirection.xyz());
        point(*light, Vector3f());
        light->setParent(m_scene);

        const auto renderer = makeShared<SimpleRenderer>(makeShared<RenderContext>(), m_pool);
        renderer->setOpaqueGrouped(order == Order::GROUPED);
        m_block = makeShared<RenderBlock>(renderer, m_scene, m_camera);
        m_block->setBackgroundColour(Colour4f(0.0f, 0.0f, 0.0f, 1.0f));
    }

    ~EngineContender() override
    {
        surface().makeCurrent();
        m_block.reset();
        m_cubes.reset();
        m_scene.reset();
        m_pool->flush();
        m_pool->flush();
        m_pool.reset();
    }

    void draw(int frame) override
    {
        m_plan.placeCamera(*m_camera, frame);
        if (m_plan.motion == DrawScene::Motion::PARENT)
            m_cubes->setRotation(m_plan.turns[m_plan.findTurn(0, frame)]);
        const size_t step = m_plan.getTurningStep();
        size_t cube = 0;
        for (Solid* solid : m_turning)
        {
            solid->setRotation(m_plan.turns[m_plan.findTurn(cube, frame)]);
            cube += step;
        }
        m_block->render();
    }

private:
    SharedPtr<ShaderProgram> makeProgram()
    {
        const auto program = m_pool->getShaderProgramCache()->create(DrawScene::VERTEX_SOURCE,
                                                                     DrawScene::FRAGMENT_SOURCE, nullptr);
        if (!program)
            giveUp("the engine's program cannot be made");
        for (int i = 0; i < program->getUniformCount(); ++i)
        {
            for (const UniformSource& source : UNIFORMS)
            {
                if (!std::strcmp(source.uniform, program->getUniformInstanceName(i)))
                    program->setUniformPropertyName(i, source.property);
            }
        }
        return program;
    }

    std::vector<Appearance::Ptr> makeAppearances()
    {
        const SharedPtr<ShaderProgram> program = makeProgram();
        std::vector<Appearance::Ptr> appearances;
        for (int i = 0; i < DrawScene::MATERIALS; ++i)
        {
            const auto texture = m_pool->getTexture2DCache()->create(
                DrawScene::TEXTURE_SIZE, DrawScene::TEXTURE_SIZE, Texture::Format::RGB,
                Texture::Type::UNSIGNED_BYTE, m_plan.makeTexture(i).data(), nullptr);
            appearances.push_back(makeShared<Appearance>());
            appearances.back()->setShaderProgram(program);
            appearances.back()->setProperty("M_DIFFUSE_COLOUR", m_plan.colours[i]);
            appearances.back()->setProperty("M_DIFFUSE_TEXTURE", texture);
        }
        return appearances;
    }

    void addCubes(bool byMaterial)
    {
        const std::vector<Appearance::Ptr> appearances = makeAppearances();
        const Mesh::Ptr mesh = createCubeMesh(*m_pool->getMeshCache(), Vector2f(1.0f, 1.0f));
        if (!mesh)
            giveUp("the engine's cube cannot be made");
        const size_t step = m_plan.getTurningStep();
        m_turning.resize(step > 0 ? (m_plan.places.size() + step - 1) / step : 0);
        const size_t rounds = byMaterial ? appearances.size() : 1;
        for (size_t round = 0; round < rounds; ++round)
        {
            for (size_t i = round; i < m_plan.places.size(); i += rounds)
            {
                const auto solid = makeShared<Solid>(mesh, appearances[i % appearances.size()]);
                solid->setPosition(m_plan.places[i]);
                solid->setRotation(m_plan.turns[m_plan.findTurn(i, 0)]);
                solid->setParent(m_cubes);
                if (step > 0 && i % step == 0)
                    m_turning[i / step] = solid.get();
            }
        }
    }

    const DrawScene& m_plan;
    SharedPtr<AssetCachePool> m_pool;
    SceneNode::Ptr m_scene;
    SceneNode::Ptr m_cubes;
    Camera::Ptr m_camera;
    std::vector<Solid*> m_turning;
    RenderBlock::Ptr m_block;
};

} // namespace

std::unique_ptr<Contender> makeWalkContender(const DrawScene& scene)
{
    return std::make_unique<EngineContender>(scene, Order::WALK);
}

std::unique_ptr<Contender> makeByMaterialContender(const DrawScene& scene)
{
    return std::make_unique<EngineContender>(scene, Order::BY_MATERIAL);
}

std::unique_ptr<Contender> makeGroupedContender(const DrawScene& scene)
{
    return std::make_unique<EngineContender>(scene, Order::GROUPED);
}

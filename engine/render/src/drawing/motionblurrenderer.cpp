#include "orv/motionblurrenderer.h"

#include "orv/detail/eyes.h"
#include "rendererproperties.h"
#include "scene/scenewalk.h"

#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/maths.h"
#include "orv/mesh.h"
#include "orv/sceneutil.h"
#include "orv/shaderprogram.h"
#include "orv/shaderprogramcache.h"
#include "orv/solid.h"

namespace orv
{

namespace
{

constexpr float FRAME_SECONDS = 1.0f / 60.0f;

} // namespace

struct MotionBlurRenderer::Properties
{
    explicit Properties(RenderContext& context)
        : joints(context)
        , viewProjection(shareTransform(context, "T_VIEW_PROJECTION"))
        , oldModelViewProjection(shareTransform(context, "T_OLD_MODEL_VIEW_PROJECTION"))
        , modelViewProjection(shareTransform(context, "T_MODEL_VIEW_PROJECTION"))
        , time(detail::shareProperty(context, "TIME", 1, 0.0f))
        , deltaTime(detail::shareProperty(context, "DELTA_TIME", 1, 0.0f))
    {
        if (modelViewProjection && oldModelViewProjection)
        {
            modelViewProjection->setDrawTransform(detail::DrawTransform::MODEL_VIEW_PROJECTION);
            oldModelViewProjection->setDrawTransform(detail::DrawTransform::OLD_MODEL_VIEW_PROJECTION);
        }
        // After marking, so that programs see the marks.
        detail::shareProperty(context, "MOTION_BLUR_FACTOR", 1, 0.0f);
    }

    static SharedPtr<ShaderUniform<Matrix4f>> shareTransform(RenderContext& context, const char* name)
    {
        return detail::shareProperty<Matrix4f>(context, name, 1, Matrix4f::IDENTITY);
    }

    /// Whether all properties written each frame could be allocated.
    bool isComplete() const
    {
        return joints.isComplete() && viewProjection && oldModelViewProjection && modelViewProjection &&
               time && deltaTime;
    }

    detail::JointProperties joints;
    SharedPtr<ShaderUniform<Matrix4f>> viewProjection;
    SharedPtr<ShaderUniform<Matrix4f>> oldModelViewProjection;
    SharedPtr<ShaderUniform<Matrix4f>> modelViewProjection;
    SharedPtr<ShaderUniform<float>> time;
    SharedPtr<ShaderUniform<float>> deltaTime;
};

MotionBlurRenderer::MotionBlurRenderer(const SharedPtr<RenderContext>& context,
                                       const SharedPtr<AssetCachePool>& pool)
    : m_context(context)
    , m_pool(pool)
    , m_properties(std::make_unique<Properties>(*m_context))
    , m_velocity(makeShared<Appearance>())
    , m_skinnedVelocity(makeShared<Appearance>())
{
    if (!m_pool || !m_velocity)
        return;
    // Both are set on the same appearance, on purpose: skinned solids are drawn with the current program. Guarded by
    // MotionBlurTest.skinnedSolidsTakeTheCurrentProgram.
    ShaderProgramCache& programs = *m_pool->getShaderProgramCache();
    m_velocity->setShaderProgram(programs.get("orv#gen_velocity.sp"));
    m_velocity->setShaderProgram(programs.get("orv#gen_velocity.sp$SKIN"));
}

MotionBlurRenderer::~MotionBlurRenderer() = default;

void MotionBlurRenderer::visit(Solid* solid)
{
    m_solids.push_back(solid);
}

void MotionBlurRenderer::render(Camera* camera, SceneNode& scene, const FlagMask& renderFlags,
                                const FlagMask& recursiveFlags)
{
    m_solids.clear();
    if (!m_properties->isComplete() || !m_velocity || !m_skinnedVelocity)
        return;                          // logged when they were made
    const detail::SceneWalk walk(scene); // what a node removes when it is visited lives until the end
    visitScene(*this, scene, renderFlags, recursiveFlags);

    const RenderContext::DrawScope scope(*m_context);
    const detail::MirroredView mirroredView(*m_context, camera);
    const detail::Viewport full = detail::getViewport(*m_context);
    detail::Eye eyes[2];
    const int eyeCount = detail::findEyes(camera, detail::getAspect(full), eyes);

    m_properties->time->set(fmod(m_time, 60.0f));
    const float passed = m_time - m_lastTime;
    m_properties->deltaTime->set(passed == 0.0f ? 1.0f : FRAME_SECONDS / passed);
    m_lastTime = m_time;

    for (int i = 0; i < eyeCount; ++i)
    {
        detail::setViewport(*m_context, eyeCount > 1 ? detail::getHalf(full, i) : full);
        const Matrix4f viewProjection = eyes[i].projection * inverse(eyes[i].world);
        drawEye(viewProjection, m_lastViewProjections[i]);
        m_lastViewProjections[i] = viewProjection;
    }
    detail::setViewport(*m_context, full);

    for (Solid* solid : m_solids)
        solid->updateMotionData();
}

void MotionBlurRenderer::drawEye(const Matrix4f& viewProjection, const Matrix4f& lastViewProjection)
{
    Properties& properties = *m_properties;
    properties.viewProjection->set(viewProjection);
    const detail::UniformSources* sources = nullptr; // of the velocity material; null unless it is ready
    uint64_t revision = 0;                           // the process's last revision at that time
    bool turnsWinding = false;
    for (Solid* solid : m_solids)
    {
        const Matrix4f now = viewProjection * solid->getWorldTransform();
        const Matrix4f before = lastViewProjection * solid->getLastWorldTransform();
        // The properties must end with the last solid's values.
        if (solid->hasSkin() || !solid->getMesh() || solid == m_solids.back())
        {
            properties.oldModelViewProjection->set(before);
            properties.modelViewProjection->set(now);
            properties.joints.publish(*solid);
            solid->draw(*m_context, solid->getJointsPerVertex() == 0 ? *m_velocity : *m_skinnedVelocity);
            sources = nullptr;
            continue;
        }
        if (!sources || revision != detail::g_lastRevision || turnsWinding != solid->getWorldMirrored())
        {
            properties.joints.publish(*solid);
            turnsWinding = solid->getWorldMirrored();
            sources = m_velocity->prepare(*m_context, turnsWinding);
            revision = detail::g_lastRevision;
        }
        if (sources)
            drawReady(*solid, *sources, now, before);
    }
}

/// With the velocity material, which is ready.
void MotionBlurRenderer::drawReady(const Solid& solid, const detail::UniformSources& sources,
                                   const Matrix4f& now, const Matrix4f& before)
{
    using detail::DrawTransform;
    if (detail::DrawnUniform* uniform = sources.transforms[int(DrawTransform::MODEL_VIEW_PROJECTION)])
        ShaderProgram::sendTransform(*uniform, now);
    if (detail::DrawnUniform* uniform = sources.transforms[int(DrawTransform::OLD_MODEL_VIEW_PROJECTION)])
        ShaderProgram::sendTransform(*uniform, before);
    solid.bindMesh(*m_context, *m_velocity->getShaderProgram()).issue();
}

} // namespace orv

#include "orv/simplerenderer.h"

#include "culling.h"
#include "drawgroups.h"
#include "orv/detail/eyes.h"
#include "rendererproperties.h"
#include "solidpainter.h"

#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/light.h"
#include "orv/log.h"
#include "orv/maths.h"
#include "orv/propertyref.h"
#include "orv/renderdevice.h"
#include "orv/rendertarget.h"
#include "orv/sceneutil.h"
#include "orv/shaderprogram.h"
#include "orv/solid.h"
#include "orv/texture2dcache.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace orv
{

namespace
{

/// Reflects about the plane through the solid's position across its z axis.
Matrix4f reflectionMatrix(const Matrix4f& world)
{
    const Vector3f n = normalize(world.columns[2].xyz());
    const float d = dot(n, world.columns[3].xyz());
    return Matrix4f(Vector4f(Vector3f::X_AXIS - n * (2.0f * n.x), 0.0f),
                    Vector4f(Vector3f::Y_AXIS - n * (2.0f * n.y), 0.0f),
                    Vector4f(Vector3f::Z_AXIS - n * (2.0f * n.z), 0.0f), Vector4f(n * (2.0f * d), 1.0f));
}

/// For a solid that lacks one of the two.
[[gnu::noinline]] void assertDrawable(const Appearance* appearance, const ShaderProgram* program)
{
    ORV_ASSERT(appearance);
    if (appearance)
        ORV_ASSERT(program);
}

Vector4f toVector(const Colour4f& colour)
{
    return Vector4f(colour.r, colour.g, colour.b, colour.a);
}

} // namespace

SimpleRenderer::SimpleRenderer(const SharedPtr<RenderContext>& context, const SharedPtr<AssetCachePool>& pool)
    : m_context(context)
    , m_pool(pool)
    , m_properties(std::make_unique<detail::RendererProperties>(*m_context, m_pool.get()))
{
}

SimpleRenderer::~SimpleRenderer() = default;

void SimpleRenderer::setOpaqueGrouped(bool grouped)
{
    if (grouped != isOpaqueGrouped())
        m_groups = grouped ? std::make_unique<detail::DrawGroups>(m_opaque) : nullptr;
}

void SimpleRenderer::setCulled(bool culled)
{
    if (culled != isCulled())
        m_culling = culled ? std::make_unique<detail::Culling>(*this) : nullptr;
}

void SimpleRenderer::setCounted(bool counted)
{
    if (counted != isCounted())
        m_counters = counted ? std::make_unique<FrameCounters>() : nullptr;
}

void SimpleRenderer::visit(Solid* solid)
{
    const Appearance* const appearance = solid->getAppearance().get();
    if (m_groups)
    {
        if (!m_groups->addKnown(*solid, appearance))
            addToGroups(solid);
    }
    else if (detail::FrameList<Solid*>* const list = findList(appearance))
        list->add(solid);
}

[[gnu::noinline]] void SimpleRenderer::addToGroups(Solid* solid)
{
    const Appearance* const appearance = solid->getAppearance().get();
    detail::FrameList<Solid*>* const list = findList(appearance);
    if (list == &m_opaque)
        m_groups->add(*solid, *appearance);
    else if (list)
        list->add(solid);
}

/// @return where the solids of a material go; null, after logging an assertion, if they cannot be drawn.
[[gnu::always_inline]] inline detail::FrameList<Solid*>*
SimpleRenderer::findList(const Appearance* appearance)
{
    const ShaderProgram* const program = appearance ? appearance->getShaderProgram().get() : nullptr;
    if (!program) [[unlikely]]
    {
        assertDrawable(appearance, program);
        return nullptr;
    }
    if (program->usesMirrorTexture())
        return &m_mirrors;
    return appearance->isOpaque() ? &m_opaque : &m_transparent;
}

void SimpleRenderer::visit(Light* light)
{
    m_lights.push_back(light);
}

void SimpleRenderer::collect(SceneNode& scene, const FlagMask& renderFlags, const FlagMask& recursiveFlags)
{
    m_opaque.clear();
    m_transparent.clear();
    m_mirrors.clear();
    m_lights.clear();
    if (m_groups)
        m_groups->begin();
    if (m_culling)
        m_culling->walk(scene, renderFlags, recursiveFlags);
    else
        visitScene(*this, scene, renderFlags, recursiveFlags);
    if (m_groups)
        m_groups->finish();
}

void SimpleRenderer::render(Camera* camera, SceneNode& scene, const FlagMask& renderFlags,
                            const FlagMask& recursiveFlags)
{
    if (!m_properties->isComplete())
        return; // logged when they were made
    if (!m_counters)
        return drawFrame(camera, scene, renderFlags, recursiveFlags);
    const FrameCounters before = countGlCalls();
    drawFrame(camera, scene, renderFlags, recursiveFlags);
    *m_counters = countGlCalls() - before;
    m_counters->culled = m_culling ? m_culling->getCount() : 0;
}

void SimpleRenderer::drawFrame(Camera* camera, SceneNode& scene, const FlagMask& renderFlags,
                               const FlagMask& recursiveFlags)
{
    const detail::SceneWalk walk(scene); // what a node removes when it is visited lives until the end
    if (m_culling)
    {
        detail::Eye eyes[2];
        const float aspect = detail::getAspect(detail::getViewport(*m_context));
        m_culling->begin(eyes, detail::findEyes(camera, aspect, eyes));
    }
    collect(scene, renderFlags, recursiveFlags);
    if (m_culling && !m_culling->finish(m_mirrors.size() > 0))
        collect(scene, renderFlags, recursiveFlags);

    const RenderContext::DrawScope scope(*m_context);
    const detail::MirroredView mirroredView(*m_context, camera);
    m_viewport = detail::getViewport(*m_context);
    detail::Eye eyes[2];
    const int eyeCount = detail::findEyes(camera, detail::getAspect(m_viewport), eyes);
    m_properties->time->set(fmod(m_time, 60.0f));
    publishLights();

    for (int i = 0; i < eyeCount; ++i)
    {
        const detail::Viewport viewport = eyeCount > 1 ? detail::getHalf(m_viewport, i) : m_viewport;
        detail::setViewport(*m_context, viewport);
        renderEye(eyes[i], viewport);
    }
    detail::setViewport(*m_context, m_viewport);
}

void SimpleRenderer::publishLights()
{
    const int count = static_cast<int>(std::min(m_lights.size(), size_t(detail::MAX_LIGHTS)));
    m_properties->lightCount->set(count);
    for (int i = 0; i < count; ++i)
        publishLight(*m_lights[static_cast<size_t>(i)], i);
}

void SimpleRenderer::publishLight(const Light& light, int index)
{
    detail::RendererProperties& properties = *m_properties;
    const Matrix4f& world = light.getWorldTransform();
    const Vector3f zAxis = normalize(world.columns[2].xyz());
    const Light::LightType type = light.getLightType();

    properties.lightPosition->set(
        type == Light::LightType::DIRECTIONAL ? Vector4f(zAxis, 0.0f) : world.columns[3], index);

    const Vector4f colour = toVector(light.getColour()) * light.getIntensity();
    properties.lightAmbient->set(colour * light.getAmbientLevel(), index);
    properties.lightDiffuse->set(colour, index);
    properties.lightSpecular->set(colour, index);

    float attenuationReciprocal = 0.0f;
    if (light.isAttenuated())
    {
        const float scale = length(world.columns[0].xyz());
        const float nearDistance = light.getAttenuationNear() * scale;
        const float range = light.getAttenuationFar() * scale - nearDistance;
        properties.lightAttenuationNear->set(nearDistance, index);
        attenuationReciprocal = 1.0f / std::max(0.001f, range); // also for equal distances
    }
    properties.lightAttenuationReciprocal->set(attenuationReciprocal, index);

    const bool isSpot = type == Light::LightType::SPOT;
    properties.lightSpotInnerCos->set(isSpot ? std::cos(light.getSpotInnerAngle().radians() * 0.5f) : -1.0f,
                                      index);
    properties.lightSpotOuterCos->set(isSpot ? std::cos(light.getSpotOuterAngle().radians() * 0.5f) : -1.0f,
                                      index);
    if (isSpot)
        properties.lightSpotDirection->set(zAxis, index);
}

void SimpleRenderer::renderEye(const detail::Eye& eye, const detail::Viewport& viewport)
{
    const Matrix4f view = inverse(eye.world);
    publishEye(eye.world, view);
    sortTransparent(eye.world.columns[2].xyz());

    draw(m_opaque.begin(), m_opaque.size(), view, eye.projection);
    for (size_t i = 0; i < m_mirrors.size(); ++i)
    {
        Solid* mirror = m_mirrors[i];
        if (!mirror->getAppearance() || (m_culling && m_culling->hides(*mirror, view, eye.projection)))
            continue;
        if (prepareMirrorTarget())
        {
            renderReflection(*mirror, eye, viewport);
            publishEye(eye.world, view);
            while (m_mirrorProperties.size() <= i) // several, where mirrors before this one were hidden
                m_mirrorProperties.emplace_back("M_MIRROR_TEXTURE");
            m_mirrorProperties[i].set(*mirror->getAppearance(), m_mirrorTarget->getColourTexture());
        }
        draw(&mirror, 1, view, eye.projection);
    }
    draw(m_transparent.begin(), m_transparent.size(), view, eye.projection);
}

void SimpleRenderer::publishEye(const Matrix4f& world, const Matrix4f& view)
{
    m_properties->cameraPosition->set(world.columns[3]);
    m_properties->view->set(view);
}

/// Farthest first: eyes look along -z.
void SimpleRenderer::sortTransparent(const Vector3f& eyeZ)
{
    m_sortKeys.clear();
    for (Solid* const solid : m_transparent)
    {
        const float depth = dot(eyeZ, solid->getWorldTransform().columns[3].xyz());
        // Sorting needs a total order; NaN counts as farthest.
        m_sortKeys.push_back({std::isnan(depth) ? -std::numeric_limits<float>::infinity() : depth, solid});
    }
    std::sort(m_sortKeys.begin(), m_sortKeys.end(),
              [](const SortKey& a, const SortKey& b) { return a.depth < b.depth; });
    for (size_t i = 0; i < m_sortKeys.size(); ++i)
        m_transparent[i] = m_sortKeys[i].solid;
}

/// @return false if there is no target to reflect into; each size is tried once only, not frame after frame.
bool SimpleRenderer::prepareMirrorTarget()
{
    int surface[2] = {0, 0};
    const bool isKnown = RenderDevice::getSurfaceSize(surface[0], surface[1]);
    const bool isSame = surface[0] == m_mirrorSurface[0] && surface[1] == m_mirrorSurface[1];
    const int least[2] = {
        std::max(m_viewport.width, isKnown ? surface[0] : m_viewport.x + m_viewport.width),
        std::max(m_viewport.height, isKnown ? surface[1] : m_viewport.y + m_viewport.height)};
    const bool isEmpty = m_viewport.width <= 0 || m_viewport.height <= 0;
    const bool isLarge = isSame && least[0] <= m_mirrorSize[0] && least[1] <= m_mirrorSize[1];
    if (m_pool && !isEmpty && !isLarge)
    {
        std::copy_n(surface, 2, m_mirrorSurface);
        // It only grows: blocks of alternating shapes must not make it again in every frame.
        makeMirrorTarget(std::max(least[0], isSame ? m_mirrorSize[0] : 0),
                         std::max(least[1], isSame ? m_mirrorSize[1] : 0));
    }
    return m_mirrorTarget && m_mirrorTarget->isComplete();
}

/// Keeps the old target if GL refuses a new one.
void SimpleRenderer::makeMirrorTarget(int width, int height)
{
    m_mirrorSize[0] = width;
    m_mirrorSize[1] = height;
    const detail::Viewport viewport = detail::getViewport(*m_context);
    m_context->setViewport(0, 0, width, height); // from which the texture takes its size
    const SharedPtr<Texture2D> texture =
        m_pool->getTexture2DCache()->createFromBackbuffer(*m_context, Texture::Format::RGB, nullptr);
    detail::setViewport(*m_context, viewport);
    if (!texture)
        return;
    SharedPtr<RenderTarget> target = makeShared<RenderTarget>(texture, nullptr, true, false);
    if (!target || (m_mirrorTarget && !target->isComplete()))
    {
        target.reset(); // before its texture, by which it detects a lost context
        texture->discard();
        return;
    }
    const SharedPtr<Texture2D> old = m_mirrorTarget ? m_mirrorTarget->getColourTexture() : nullptr;
    m_mirrorTarget = target;
    if (old)
        old->discard(); // resizing a window would leave one behind for each size
}

/// Draws the reflection into the mirror target; restores framebuffer and viewport.
void SimpleRenderer::renderReflection(const Solid& mirror, const detail::Eye& eye,
                                      const detail::Viewport& viewport)
{
    const unsigned framebuffer = RenderTarget::getBoundFramebuffer();
    const Texture2D& texture = *m_mirrorTarget->getColourTexture();
    m_mirrorTarget->enable();
    m_context->setViewport(0, 0, static_cast<int>(texture.getWidth()), static_cast<int>(texture.getHeight()));

    // The last draw's masks and scissor box must not restrict clearing.
    m_context->setColourMask(true, true, true, true);
    m_context->setDepthWriteEnabled(true);
    setStencilMask(*m_context, 0xFFFFFFFF);
    m_context->setScissorTestEnabled(false);
    m_context->clear();

    // The reflection and the flipped picture each reverse the winding, so front faces stay front faces.
    const Matrix4f world = reflectionMatrix(mirror.getWorldTransform()) * eye.world;
    const Matrix4f view = inverse(world);
    Matrix4f projection = eye.projection;
    projection.columns[1] = -projection.columns[1];

    publishEye(world, view);
    draw(m_opaque.begin(), m_opaque.size(), view, projection);
    draw(m_transparent.begin(), m_transparent.size(), view, projection);

    RenderTarget::bindFramebuffer(framebuffer);
    detail::setViewport(*m_context, viewport);
}

void SimpleRenderer::draw(Solid* const* solids, size_t count, const Matrix4f& view,
                          const Matrix4f& projection)
{
    m_properties->viewProjection->set(projection * view);
    if (m_culling)
        solids = m_culling->select(solids, count, view, projection);
    detail::SolidPainter(*m_context, *m_properties, view, projection).draw(solids, count);
}

} // namespace orv

#include "orv/shadowmap.h"

#include "shadowcasters.h"
#include "shadowprograms.h"
#include "shadowview.h"
#include "solidcorners.h"

#include "orv/detail/eyes.h"

#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/background.h"
#include "orv/camera.h"
#include "orv/light.h"
#include "orv/log.h"
#include "orv/mesh.h"
#include "orv/rendercontext.h"
#include "orv/rendertarget.h"
#include "orv/scenenodevisitor.h"
#include "orv/sceneutil.h"
#include "orv/shaderprogramcache.h"
#include "orv/solid.h"
#include "orv/texture2d.h"
#include "orv/texture2dcache.h"

#include <algorithm>
#include <mutex>
#include <unordered_map>
#include <vector>

namespace orv
{

namespace detail
{

namespace
{

constexpr int MOST_LIGHTS = 5;     // that renderers take
constexpr float SOFT_REACH = 1.5f; // radius of the soft edge, texels
constexpr int SMALLEST = 16;
constexpr int LARGEST = 8192;

/// A property of the context that all its shadow maps share.
template <class T>
SharedPtr<ShaderUniform<T>> shareProperty(RenderContext& context, const char* name)
{
    SharedPtr<ShaderUniformBase> held = context.getProperty(name);
    if (!held)
    {
        held = makeShared<ShaderUniform<T>>(1);
        if (held)
            context.addProperty(held, name);
    }
    return SharedPtr<ShaderUniform<T>>(held && held->holds<T>() ? static_cast<ShaderUniform<T>*>(held.get())
                                                                : nullptr);
}

FlagMask join(const FlagMask& a, const FlagMask& b)
{
    return FlagMask(a.mask | b.mask, a.inverted | b.inverted);
}

bool throwsShadow(const Light& light)
{
    return light.getLightType() != Light::LightType::POINT;
}

/// Collects lights and casters in one walk.
class ShadowWalk : public SceneNodeVisitor
{
public:
    void begin(const Light* wanted)
    {
        m_wanted = wanted;
        light = nullptr;
        lightCount = 0;
        solids.clear();
        m_kept.clear();
    }

    bool takesSolids = true;
    bool takesLights = true;

    using SceneNodeVisitor::visit;
    void visit(Light* found) override
    {
        if (!takesLights)
            return;
        const bool isIt = m_wanted ? found == m_wanted : !light;
        if (isIt && throwsShadow(*found))
        {
            light = found;
            lightIndex = lightCount;
            keep(found);
        }
        ++lightCount;
    }

    void visit(Solid* solid) override
    {
        const Appearance* const appearance = solid->getAppearance().get();
        const ShaderProgram* const program = appearance ? appearance->getShaderProgram().get() : nullptr;
        if (takesSolids && program && solid->getMesh() && appearance->isOpaque() &&
            !program->usesMirrorTexture())
        {
            solids.push_back(solid);
            keep(solid);
        }
    }

    const Light* light = nullptr;
    int lightIndex = 0;
    int lightCount = 0;
    std::vector<Solid*> solids;

private:
    /// Nodes of the program's own may remove others when they are visited.
    void keep(SceneNode* node)
    {
        if (node->sharedGetCount() > 0)
            m_kept.emplace_back(node);
    }

    const Light* m_wanted = nullptr;
    std::vector<SharedPtr<SceneNode>> m_kept;
};

/// A material that receives shadows. The last of its maps restores its program.
struct Attachment
{
    SharedPtr<ShaderProgram> before;
    SharedPtr<ShaderProgram> now;
    int mapCount = 0;
};

/// The materials of all maps of all contexts. Never destroyed, since an application's global maps may outlive it.
struct Attachments
{
    std::mutex mutex; ///< each context may have a thread of its own
    std::unordered_map<const Appearance*, Attachment> byAppearance;

    static Attachments& getAll()
    {
        static Attachments& all = *new Attachments;
        return all;
    }
};

/// Calls a function for each solid's material that has a program; for shared materials several times.
template <class Function>
class MaterialWalk : public SceneNodeVisitor
{
public:
    explicit MaterialWalk(const Function& function) : m_function(function) {}

    using SceneNodeVisitor::visit;
    void visit(Solid* solid) override
    {
        if (solid->getAppearance() && solid->getAppearance()->getShaderProgram())
            m_function(solid->getAppearance());
    }

private:
    const Function& m_function;
};

} // namespace

struct ShadowParts
{
    ShadowParts(const SharedPtr<RenderContext>& contextToUse, const SharedPtr<AssetCachePool>& pool,
                int sizeToUse);

    bool isComplete() const { return bool(target); }
    void warn(bool& isSaid, const char* text) const;
    void render(Camera* camera);
    void find(SceneNode& scene, const FlagMask& renderFlags, const FlagMask& recursiveFlags);
    void findReach(Camera* camera);
    void draw(const ShadowView& view);
    void publish(const ShadowView& view, int lightIndex);
    void switchOff();

    void take(const SharedPtr<Appearance>& appearance, const SharedPtr<ShaderProgram>& program);
    void giveBack();

    SharedPtr<RenderContext> context;
    int size;
    ShadowPrograms programs;
    ShadowCasters casters;
    SharedPtr<Texture2D> texture;
    SharedPtr<RenderTarget> target;
    SharedPtr<ShaderUniform<Vector4f>> map; // this and the following are the context's
    SharedPtr<ShaderUniform<Vector4f>> rows[3];
    SharedPtr<ShaderUniform<float>> offset;
    SharedPtr<ShaderUniform<float>> index;
    SharedPtr<ShaderUniform<Vector4f>> light;
    SharedPtr<ShaderUniform<SharedPtr<Texture2D>>> depths;
    SharedPtr<Light> wanted;
    FlagMask thrower; ///< without bits: all cast shadows
    float distance = 0.0f;
    ShadowWalk walk;
    std::vector<Vector3f> corners;
    ShadowReach reach;
    std::unordered_map<const Appearance*, SharedPtr<Appearance>> attached; ///< materials
    bool isRoomSaid = false;
    bool isProgramSaid = false;
    bool isLightSaid = false;
};

ShadowParts::ShadowParts(const SharedPtr<RenderContext>& contextToUse, const SharedPtr<AssetCachePool>& pool,
                         int sizeToUse)
    : context(contextToUse)
    , size(std::clamp(sizeToUse, SMALLEST, LARGEST))
    , programs(pool)
    , casters(programs)
    , map(shareProperty<Vector4f>(*context, "S_MAP"))
    , rows{shareProperty<Vector4f>(*context, "S_ROW_X"), shareProperty<Vector4f>(*context, "S_ROW_Y"),
           shareProperty<Vector4f>(*context, "S_ROW_DEPTH")}
    , offset(shareProperty<float>(*context, "S_OFFSET"))
    , index(shareProperty<float>(*context, "S_INDEX"))
    , light(shareProperty<Vector4f>(*context, "S_LIGHT"))
    , depths(shareProperty<SharedPtr<Texture2D>>(*context, "S_DEPTHS"))
{
    switchOff();
    if (!map || !rows[0] || !rows[1] || !rows[2] || !offset || !index || !light || !depths)
    {
        ORV_LOG_WARN("No shadows: properties of the context called S_... are of other types.");
        return;
    }
    const SharedPtr<ShaderProgram> plain = pool->getShaderProgramCache()->get("shadow#depth.sp");
    if (!plain || !plain->uniformExists("S_SPLIT"))
    {
        ORV_LOG_WARN("No shadows: fragment shaders of this device lack the precision.");
        return;
    }
    const unsigned side = unsigned(size + 2 * ShadowView::BORDER); // not a power of two, so without mipmaps
    texture = pool->getTexture2DCache()->create(side, side, Texture::Format::RGBA,
                                                Texture::Type::UNSIGNED_BYTE, nullptr, nullptr);
    if (texture)
    {
        texture->setParameters({Texture2D::FilterMode::NEAREST, Texture2D::FilterMode::NEAREST,
                                Texture2D::WrapMode::CLAMP, Texture2D::WrapMode::CLAMP});
        target = makeShared<RenderTarget>(texture, nullptr, true, false);
    }
    if (!target || !target->isComplete())
    {
        target = nullptr;
        ORV_LOG_WARN("No shadows: this device cannot draw into a texture of %u x %u.", side, side);
    }
}

void ShadowParts::warn(bool& isSaid, const char* text) const
{
    if (!isSaid)
        ORV_LOG_WARN("%s", text);
    isSaid = true;
}

/// Finds the light and the casters.
void ShadowParts::find(SceneNode& scene, const FlagMask& renderFlags, const FlagMask& recursiveFlags)
{
    walk.begin(wanted.get());
    walk.takesLights = true;
    walk.takesSolids = thrower.mask == 0;
    visitScene(walk, scene, renderFlags, recursiveFlags);
    if (walk.takesSolids || !walk.light)
        return;
    walk.takesLights = false;
    walk.takesSolids = true;
    visitScene(walk, scene, join(renderFlags, thrower), join(recursiveFlags, thrower));
}

/// Finds the bounds of the casters, and of the camera's view up to the distance.
void ShadowParts::findReach(Camera* camera)
{
    reach = ShadowReach();
    corners.clear();
    for (const Solid* solid : walk.solids)
    {
        const size_t before = corners.size();
        addBoundsCorners(*solid, corners);
        reach.isAllKnown = reach.isAllKnown && corners.size() > before;
    }
    reach.casters = &corners;
    if (!camera)
        return;

    Eye eyes[2];
    const int count = findEyes(camera, getAspect(getViewport(*context)), eyes);
    Vector3f seen[16];
    int places = 0;
    for (int i = 0; i < count * 4; ++i)
    {
        const Eye& eye = eyes[i / 4];
        const Matrix4f toEye = inverse(eye.projection);
        const auto place = [&](float z)
        {
            const Vector4f at = toEye * Vector4f(i & 1 ? 1.0f : -1.0f, i & 2 ? 1.0f : -1.0f, z, 1.0f);
            return at.xyz() / at.w;
        };
        const Vector3f first = place(-1.0f);
        const Vector3f last = place(1.0f);
        const float depth = first.z - last.z;
        const float share =
            distance > 0.0f && depth > 0.0f ? std::clamp((distance + first.z) / depth, 0.0f, 1.0f) : 1.0f;
        for (const Vector3f& at : {first, first + (last - first) * share})
            seen[places++] = (eye.world * Vector4f(at, 1.0f)).xyz();
    }
    for (int i = 0; i < places; ++i)
        reach.seenCentre += seen[i] / float(places);
    for (int i = 0; i < places; ++i)
        reach.seenRadius = std::max(reach.seenRadius, length(seen[i] - reach.seenCentre));
}

void ShadowParts::draw(const ShadowView& view)
{
    const RenderContext::DrawScope scope(*context);
    const Viewport viewport = getViewport(*context);
    const unsigned framebuffer = RenderTarget::getBoundFramebuffer();
    target->enable();
    setViewport(*context, {ShadowView::BORDER, ShadowView::BORDER, size, size});
    Background(Colour4f::WHITE).enable(*context);
    casters.begin(view);
    for (Solid* solid : walk.solids)
        casters.draw(*context, *solid);
    casters.finish();
    RenderTarget::bindFramebuffer(framebuffer);
    setViewport(*context, viewport);
}

void ShadowParts::publish(const ShadowView& view, int lightIndex)
{
    const float side = float(size + 2 * ShadowView::BORDER);
    map->set(Vector4f(SOFT_REACH, 1.0f / side, (view.isSpot ? 1.0f : -1.0f) / 255.0f, float(lightIndex)));
    for (int i = 0; i < 3; ++i)
        rows[i]->set(view.rows[i]);
    offset->set(view.offset);
    index->set(float(lightIndex));
    light->set(view.light);
    depths->set(texture);
}

void ShadowParts::take(const SharedPtr<Appearance>& appearance, const SharedPtr<ShaderProgram>& program)
{
    Attachments& all = Attachments::getAll();
    const std::lock_guard<std::mutex> lock(all.mutex);
    Attachment& attachment = all.byAppearance[appearance.get()];
    if (attached.emplace(appearance.get(), appearance).second)
        ++attachment.mapCount;
    if (attachment.now && program == appearance->getShaderProgram())
        return;
    attachment.before = appearance->getShaderProgram();
    attachment.now = program;
    appearance->setShaderProgram(program);
}

void ShadowParts::giveBack()
{
    Attachments& all = Attachments::getAll();
    const std::lock_guard<std::mutex> lock(all.mutex);
    for (const auto& [key, appearance] : attached)
    {
        const auto found = all.byAppearance.find(key);
        if (--found->second.mapCount > 0)
            continue;
        if (appearance->getShaderProgram() == found->second.now)
            appearance->setShaderProgram(found->second.before);
        all.byAppearance.erase(found);
    }
    attached.clear();
}

/// Draws and publishes the map of what find() has found.
void ShadowParts::render(Camera* camera)
{
    if (!walk.light || walk.lightIndex >= MOST_LIGHTS)
    {
        switchOff();
        return warn(isLightSaid,
                    "No shadows: no directional or spot light among the first five of the scene.");
    }
    findReach(camera);
    ShadowView view;
    if (!makeShadowView(*walk.light, reach, size, view))
        return switchOff();
    draw(view);
    publish(view, walk.lightIndex);
}

/// Tells programs that no light has shadows.
void ShadowParts::switchOff()
{
    if (map)
        map->set(Vector4f(SOFT_REACH, 1.0f, -1.0f, -1.0f));
    if (index)
        index->set(-1.0f);
}

} // namespace detail

ShadowMap::ShadowMap(const SharedPtr<RenderContext>& context, const SharedPtr<AssetCachePool>& pool, int size)
    : m_parts(std::make_unique<detail::ShadowParts>(context, pool, size))
{
}

ShadowMap::~ShadowMap()
{
    detach();
    if (!m_parts->depths || m_parts->depths->get() != m_parts->texture)
        return; // another map's shadows
    m_parts->switchOff();
    m_parts->depths->set(nullptr); // a context does not keep its pool's textures
}

bool ShadowMap::isComplete() const
{
    return m_parts->isComplete();
}

int ShadowMap::attach(SceneNode& scene)
{
    if (!isComplete())
        return 0;
    detail::ShadowParts& parts = *m_parts;
    std::vector<const Appearance*> seen;
    int count = 0;
    const auto change = [&](const SharedPtr<Appearance>& appearance)
    {
        if (std::find(seen.begin(), seen.end(), appearance.get()) != seen.end())
            return;
        seen.push_back(appearance.get());
        SharedPtr<ShaderProgram> program;
        switch (parts.programs.findLit(*appearance, program))
        {
        case detail::ShadowAnswer::TAKES:
            ++count;
            parts.take(appearance, program);
            break;
        case detail::ShadowAnswer::NO_ROOM:
            parts.warn(parts.isRoomSaid, "A material takes no shadows: its program has no room for them.");
            break;
        case detail::ShadowAnswer::NO_PROGRAM:
            parts.warn(parts.isProgramSaid, "A material takes no shadows: the device refuses the program.");
            break;
        case detail::ShadowAnswer::STAYS: break;
        }
    };
    detail::MaterialWalk<decltype(change)> walk(change);
    visitScene(walk, scene);
    return count;
}

void ShadowMap::detach()
{
    m_parts->giveBack();
}

void ShadowMap::setLight(const SharedPtr<Light>& light)
{
    m_parts->wanted = light;
    m_parts->isLightSaid = false;
}

void ShadowMap::setThrowers(const FlagMask& flags)
{
    m_parts->thrower = flags;
}

void ShadowMap::setDistance(float distance)
{
    m_parts->distance = distance > 0.0f ? distance : 0.0f;
}

void ShadowMap::render(SceneNode& scene, Camera* camera, const FlagMask& renderFlags,
                       const FlagMask& recursiveFlags)
{
    if (!isComplete())
        return;
    m_parts->find(scene, renderFlags, recursiveFlags);
    m_parts->render(camera);
    m_parts->walk.begin(nullptr); // keeps no solids until the next frame
}

} // namespace orv

// The show-piece: the engine's features in one picture. A bumpy tiled floor, crates, a chrome ball that reflects the
// sky, glass, a planar mirror with a program of its own, a spot light and a point light, and two converted models: a
// duck that slides past, and a figure that plays its own animation.
//
//   build/default/examples/showpiece --out showpiece.png [--duck duck.glo] [--dancer motion.glo] [--time 3.2]
//                                    [--stereo] [--size 960x540] [--shadows sun|spot] [--far 2]

#include "headless/headless.h"
#include "headless/png.h"

#include <orv/orv.h>

#include <cmath>
#include <cstdio>
#include <cstring>
#include <string>

using namespace orv;

namespace
{

struct Arguments
{
    std::string out = "showpiece.png";
    std::string duck;   ///< path of a .glo that slides past; none leaves it out
    std::string dancer; ///< path of a .glo that plays its own animation; none leaves it out
    float time = 2.5f;  ///< seconds
    bool stereo = false;
    std::string shadows;   ///< the light that casts them; empty for none
    float distance = 1.0f; ///< of the camera, relative to the usual one
    int width = 960;
    int height = 540;
};

bool parse(int argc, char** argv, Arguments& arguments)
{
    for (int i = 1; i < argc; ++i)
    {
        const bool hasValue = i + 1 < argc;
        if (!std::strcmp(argv[i], "--stereo"))
            arguments.stereo = true;
        else if (!std::strcmp(argv[i], "--out") && hasValue)
            arguments.out = argv[++i];
        else if (!std::strcmp(argv[i], "--duck") && hasValue)
            arguments.duck = argv[++i];
        else if (!std::strcmp(argv[i], "--dancer") && hasValue)
            arguments.dancer = argv[++i];
        else if (!std::strcmp(argv[i], "--time") && hasValue)
            arguments.time = std::strtof(argv[++i], nullptr);
        else if (!std::strcmp(argv[i], "--shadows") && hasValue)
            arguments.shadows = argv[++i];
        else if (!std::strcmp(argv[i], "--far") && hasValue)
            arguments.distance = std::strtof(argv[++i], nullptr);
        else if (!std::strcmp(argv[i], "--size") && hasValue)
        {
            if (std::sscanf(argv[++i], "%dx%d", &arguments.width, &arguments.height) != 2)
                return false;
        }
        else
            return false;
    }
    return arguments.width > 0 && arguments.height > 0;
}

/// Attaches a solid to the scene, with the appearance file of that name.
bool place(const SharedPtr<Solid>& solid, const char* appearance, AssetCachePool& pool,
           const SharedPtr<SceneNode>& parent, const Vector3f& position, const Vector3f& scale)
{
    if (!solid)
        return false; // the log says why
    solid->setAppearance(loadAppearance(pool, appearance));
    solid->setPosition(position);
    solid->setScale(scale);
    solid->setParent(parent, false);
    return bool(solid->getAppearance()->getShaderProgram());
}

/// A square in the plane y = 0 with the tangents that a bump map needs: side 1, texture upright seen from +z.
SharedPtr<Solid> createFloor(AssetCachePool& pool)
{
    struct Attribute
    {
        const char* name;
        int componentCount;
        float values[4][3];
    };
    const Attribute attributes[] = {
        {"a_position", 3, {{-0.5f, 0, 0.5f}, {0.5f, 0, 0.5f}, {0.5f, 0, -0.5f}, {-0.5f, 0, -0.5f}}},
        {"a_normal", 3, {{0, 1, 0}, {0, 1, 0}, {0, 1, 0}, {0, 1, 0}}},
        {"a_tangent", 3, {{1, 0, 0}, {1, 0, 0}, {1, 0, 0}, {1, 0, 0}}},
        {"a_binormal", 3, {{0, 0, -1}, {0, 0, -1}, {0, 0, -1}, {0, 0, -1}}},
        {"a_uv0", 2, {{0, 0}, {1, 0}, {1, 1}, {0, 1}}},
    };
    const SharedPtr<VertexBuffer> vertices = pool.getVertexBufferCache()->create(nullptr);
    for (const Attribute& attribute : attributes)
    {
        const auto array = makeShared<VertexArray>(4, int(sizeof(float)), attribute.componentCount);
        float* out = array->getData<float>();
        for (const float(&value)[3] : attribute.values)
            for (int i = 0; i < attribute.componentCount; ++i)
                *out++ = value[i];
        vertices->addAttrib(array, attribute.name, VertexBuffer::AttribFormat::FLOAT,
                            VertexBuffer::AttribUsage::GL_BUFFER, false);
    }
    vertices->commit();

    const unsigned short indices[] = {0, 1, 2, 0, 2, 3};
    const SharedPtr<IndexBuffer> triangles =
        pool.getIndexBufferCache()->create(IndexBuffer::Primitive::TRIANGLES, 6, indices, nullptr);
    triangles->commit();
    const SharedPtr<Mesh> mesh = pool.getMeshCache()->create(MeshHeader(), triangles, vertices, nullptr);
    Box box;
    box.add(Vector3f(-0.5f, 0.0f, -0.5f));
    box.add(Vector3f(0.5f, 0.0f, 0.5f));
    mesh->setBounds(Bounds(box)); // for shadows
    return makeShared<Solid>(mesh, nullptr);
}

void addLights(const SharedPtr<SceneNode>& scene)
{
    const auto sun = makeShared<Light>("sun");
    sun->setLightType(Light::LightType::DIRECTIONAL);
    sun->setColour(Colour4f(0.62f, 0.60f, 0.56f, 1.0f));
    sun->setAmbientLevel(0.45f);
    sun->setPosition(Vector3f(4.5f, 6.5f, 7.0f));
    sun->setParent(scene, false);
    point(*sun, Vector3f());

    const auto spot = makeShared<Light>("spot");
    spot->setLightType(Light::LightType::SPOT);
    spot->setColour(Colour4f(1.0f, 0.85f, 0.55f, 1.0f));
    spot->setIntensity(0.9f);
    spot->setSpotInnerAngle(Anglef::fromDegrees(24.0f));
    spot->setSpotOuterAngle(Anglef::fromDegrees(44.0f));
    spot->setPosition(Vector3f(-1.5f, 7.0f, 3.0f));
    spot->setParent(scene, false);
    point(*spot, Vector3f(-0.6f, 0.0f, 0.4f));

    const auto lamp = makeShared<Light>("lamp");
    lamp->setColour(Colour4f(0.35f, 0.45f, 1.0f, 1.0f));
    lamp->setAttenuated(true);
    lamp->setAttenuationNear(0.5f);
    lamp->setAttenuationFar(5.0f);
    lamp->setPosition(Vector3f(3.4f, 1.1f, 1.6f));
    lamp->setParent(scene, false);
}

/// Set for all nodes but the sky, which is around everything.
constexpr FlagMask THROWS_SHADOWS(1u << 8, 1u << 8);

bool addSolids(AssetCachePool& pool, const SharedPtr<SceneNode>& scene)
{
    const Vector2f once(1.0f, 1.0f);
    const SharedPtr<Solid> sky = createSphere(pool, 24, 48, once);
    bool complete = place(sky, "sky.ap", pool, scene, {}, {80, 80, 80});
    setFlags(*sky, THROWS_SHADOWS, false);
    complete &= place(createFloor(pool), "floor.ap", pool, scene, {}, {20, 1, 20});

    const SharedPtr<Solid> crate = createCube(pool, once);
    complete &= place(crate, "crate.ap", pool, scene, {-3.2f, 0.75f, 0.2f}, {0.75f, 0.75f, 0.75f});
    crate->setRotation(quaternionFromAxisAngle(Vector3f::Y_AXIS, Anglef::fromDegrees(24.0f)));
    const SharedPtr<Solid> small = createCube(pool, once);
    complete &= place(small, "crate.ap", pool, scene, {-3.1f, 1.95f, 0.1f}, {0.45f, 0.45f, 0.45f});
    small->setRotation(quaternionFromAxisAngle(Vector3f::Y_AXIS, Anglef::fromDegrees(52.0f)));

    complete &=
        place(createSphere(pool, 32, 64, once), "chrome.ap", pool, scene, {3.7f, 1.0f, -0.7f}, {2, 2, 2});
    complete &= place(createSphere(pool, 32, 64, once), "glass.ap", pool, scene, {-1.2f, 0.8f, 2.6f},
                      {1.6f, 1.6f, 1.6f});

    complete &= place(createSquare(pool, once), "mirror.ap", pool, scene, {0, 1.75f, -3.9f}, {6.4f, 3.1f, 1});
    complete &= place(createSquare(pool, once), "frame.ap", pool, scene, {0, 1.75f, -3.95f}, {6.7f, 3.4f, 1});
    return complete;
}

/// Loads a model, places it on the floor, turned and scaled, and plays its animation to the current time.
bool addModel(AssetCachePool& pool, const SharedPtr<SceneNode>& scene, const std::string& path, float time,
              const Vector3f& position, float turnRadians, float scale)
{
    const std::string::size_type slash = path.rfind('/');
    registerSource(pool, slash == std::string::npos ? "." : path.substr(0, slash).c_str(), false);

    const auto place = makeShared<SceneNode>("place");
    place->setParent(scene, false);
    place->setPosition(position);
    place->setRotation(quaternionFromAxisAngle(Vector3f::Y_AXIS, Anglef::fromRadians(turnRadians)));
    place->setScale(Vector3f(scale, scale, scale));
    const Glo::Ptr model =
        loadGloFile(pool, place, slash == std::string::npos ? path.c_str() : path.substr(slash + 1).c_str(),
                    MeshData::BOUNDS);
    if (!model)
        return false; // the log says why
    for (int i = 0; i < model->getLightCount(); ++i)
        model->getLight(i)->setParent(nullptr, false); // the scene has lights of its own

    AnimationController controller(model->getAnimationGroup());
    setLoopRange(controller, controller.getStart(), controller.getEnd());
    controller.update(time);
    return true;
}

/// The duck slides round in a circle; the dancer stays and moves as it was recorded.
bool addModels(AssetCachePool& pool, const SharedPtr<SceneNode>& scene, const Arguments& arguments)
{
    const float angle = 0.3f + arguments.time * 0.4f;
    const Vector3f track(0.5f + std::cos(angle) * 1.2f, 0.0f, 0.6f + std::sin(angle) * 1.2f);
    if (!arguments.duck.empty() &&
        !addModel(pool, scene, arguments.duck, arguments.time, track, -1.1f - angle, 0.75f))
        return false;
    return arguments.dancer.empty() || addModel(pool, scene, arguments.dancer, arguments.time,
                                                Vector3f(-0.9f, 0.0f, -1.0f), 0.3f, 0.045f);
}

bool draw(const SharedPtr<AssetCachePool>& pool, const Arguments& arguments)
{
    const auto context = makeShared<RenderContext>();
    const auto renderer = makeShared<SimpleRenderer>(context, pool);
    renderer->setOpaqueGrouped(true); // fewer changes of program and texture, for the same picture

    const auto scene = makeShared<SceneNode>("scene");
    addLights(scene);
    if (!addSolids(*pool, scene))
        return false;
    if (!addModels(*pool, scene, arguments))
        return false;

    const auto camera = makeShared<Camera>("camera");
    camera->setPosition(Vector3f(1.8f, 3.3f, 9.2f) * arguments.distance);
    camera->setFieldOfView(Anglef::fromDegrees(42.0f));
    camera->setParent(scene, false);
    point(*camera, Vector3f(0.0f, 1.0f, 0.0f));

    const auto block = makeShared<RenderBlock>(renderer, scene, camera);
    block->setViewport(0, 0, arguments.width, arguments.height);
    if (arguments.stereo)
        block->setStereo(9.0f, 0.4f);
    block->update(arguments.time);
    const auto shadows =
        arguments.shadows.empty() ? SharedPtr<ShadowMap>() : makeShared<ShadowMap>(context, pool);
    if (shadows)
    {
        shadows->setLight(SharedPtr<Light>(static_cast<Light*>(scene->find(arguments.shadows.c_str()))));
        shadows->setThrowers(THROWS_SHADOWS);
        shadows->attach(*scene);
        shadows->render(*scene, camera.get());
    }
    block->render();
    return true;
}

} // namespace

int main(int argc, char** argv)
{
    orv::setLogLevel(orv::LogLevel::WARNING);
    Arguments arguments;
    if (!parse(argc, argv, arguments))
    {
        std::fprintf(stderr, "usage: showpiece [--out FILE.png] [--duck SCENE.glo] [--dancer SCENE.glo] "
                             "[--time SECONDS] [--stereo] [--size WxH] [--shadows sun|spot] [--far TIMES]\n");
        return 2;
    }

    headless::Options options;
    options.width = arguments.width;
    options.height = arguments.height;
    std::string error;
    const auto gl = headless::Context::create(options, error);
    if (!gl)
    {
        std::fprintf(stderr, "no GL context: %s\n", error.c_str());
        return 1;
    }

    const auto pool = makeShared<AssetCachePool>();
    registerSource(*pool, SAMPLES_FOLDER "/showpiece", false);
    const bool drawn = draw(pool, arguments);

    // The first flush deletes unused assets, the second the assets that those used.
    pool->flush();
    pool->flush();
    if (!drawn)
        return 1;

    if (!headless::writePng(arguments.out, arguments.width, arguments.height, gl->readPixels().data(), error))
    {
        std::fprintf(stderr, "%s\n", error.c_str());
        return 1;
    }
    std::printf("wrote %s\n", arguments.out.c_str());
    return 0;
}

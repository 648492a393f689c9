// Motion blur: a wheel spins and a crate passes, while a ball and another crate stay where they are.
//
// Each frame takes three render blocks: the sharp picture into a texture, the velocities of all pixels into another,
// and the composition of both by "orv#motionblur.sp" to the surface.
//
//   build/default/examples/motionblur --out blur [--factor 1] [--stereo] [--size 960x540]
//
// writes blur-sharp.png, blur-velocity.png (grey: at rest; red to the right, green upwards) and blur-blurred.png.

#include "headless/headless.h"
#include "headless/png.h"

#include <orv/orv.h>

#include <cstdio>
#include <cstring>
#include <string>

using namespace orv;

namespace
{

constexpr float FRAME_SECONDS = 1.0f / 60.0f;
constexpr int FRAMES = 12; // the last one is written

struct Arguments
{
    std::string out = "blur"; ///< prefix of the pictures' names
    float factor = 1.0f;      ///< shutter time in sixtieths of a second
    bool stereo = false;
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
        else if (!std::strcmp(argv[i], "--factor") && hasValue)
            arguments.factor = std::strtof(argv[++i], nullptr);
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

/// The scene and its moving nodes.
struct Scene
{
    SharedPtr<SceneNode> root = makeShared<SceneNode>("scene");
    SharedPtr<SceneNode> wheel = makeShared<SceneNode>("wheel");
    SharedPtr<SceneNode> passing = makeShared<SceneNode>("passing");
    SharedPtr<Camera> camera = makeShared<Camera>("camera");
};

/// Attaches a solid to a node, with the appearance file of that name.
bool place(AssetCachePool& pool, const SharedPtr<Solid>& solid, const char* appearance,
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

bool build(AssetCachePool& pool, Scene& scene)
{
    const Vector2f once(1.0f, 1.0f);
    const SharedPtr<SceneNode>& root = scene.root;
    bool complete = place(pool, createSphere(pool, 24, 48, once), "sky.ap", root, {}, {80, 80, 80});
    complete &= place(pool, createCube(pool, once), "floor.ap", root, {0, -0.5f, 0}, {10, 0.5f, 10});
    complete &= place(pool, createSphere(pool, 32, 64, once), "chrome.ap", root, {3.5f, 1, -1}, {2, 2, 2});
    complete &= place(pool, createCube(pool, once), "crate.ap", root, {1, 0.75f, -2}, {0.75f, 0.75f, 0.75f});

    scene.wheel->setParent(root, false);
    scene.wheel->setPosition(Vector3f(-2.6f, 1.7f, -0.5f));
    complete &=
        place(pool, createSphere(pool, 32, 64, once), "crate.ap", scene.wheel, {}, {3.2f, 3.2f, 0.4f});
    complete &= place(pool, createCube(pool, once), "chrome.ap", scene.wheel, {}, {1.5f, 0.12f, 0.22f});
    complete &= place(pool, createCube(pool, once), "chrome.ap", scene.wheel, {}, {0.12f, 1.5f, 0.22f});

    scene.passing->setParent(root, false);
    complete &= place(pool, createCube(pool, once), "crate.ap", scene.passing, {}, {0.6f, 0.6f, 0.6f});

    const auto sun = makeShared<Light>("sun");
    sun->setLightType(Light::LightType::DIRECTIONAL);
    sun->setAmbientLevel(0.4f);
    sun->setPosition(Vector3f(3.0f, 6.0f, 7.0f));
    sun->setParent(root, false);
    point(*sun, Vector3f());

    scene.camera->setPosition(Vector3f(0.0f, 2.6f, 9.0f));
    scene.camera->setFieldOfView(Anglef::fromDegrees(40.0f));
    scene.camera->setParent(root, false);
    point(*scene.camera, Vector3f(0.0f, 1.2f, 0.0f));
    return complete;
}

/// Three turns a second, and 18 units a second to the right.
void move(const Scene& scene, float time)
{
    const Anglef turn = Anglef::fromDegrees(-1080.0f * time);
    scene.wheel->setRotation(quaternionFromAxisAngle(Vector3f::Z_AXIS, turn));
    scene.passing->setPosition(Vector3f(-3.0f + 18.0f * time, 0.7f, 2.0f));
    scene.passing->setRotation(quaternionFromAxisAngle(Vector3f::Y_AXIS, Anglef::fromDegrees(30.0f)));
}

/// A texture to draw into, as large as the picture. Plain filters, since it gets no mipmaps, and no wrapping.
SharedPtr<RenderTarget> createTarget(AssetCachePool& pool, const Arguments& arguments)
{
    const SharedPtr<Texture2D> texture = pool.getTexture2DCache()->create(
        unsigned(arguments.width), unsigned(arguments.height), Texture::Format::RGBA,
        Texture::Type::UNSIGNED_BYTE, nullptr, nullptr);
    if (!texture)
        return nullptr;
    const auto filter = TextureParameters::FilterMode::LINEAR;
    const auto wrap = TextureParameters::WrapMode::CLAMP;
    texture->setParameters(TextureParameters(filter, filter, wrap, wrap));
    const auto target = makeShared<RenderTarget>(texture, nullptr, true, false);
    return target->isComplete() ? target : nullptr;
}

/// A scene of one square, which the composition's program stretches over the view.
SharedPtr<Solid> createComposition(AssetCachePool& pool, const RenderTarget& sharp,
                                   const RenderTarget& velocity, bool stereo)
{
    const SharedPtr<Solid> square = createSquare(pool, Vector2f(1.0f, 1.0f));
    const SharedPtr<ShaderProgram> program =
        pool.getShaderProgramCache()->get(stereo ? "orv#motionblur.sp$STEREO" : "orv#motionblur.sp");
    if (!square || !program)
        return nullptr;
    const auto appearance = makeShared<Appearance>();
    appearance->setShaderProgram(program);
    appearance->setProperty("M_SHARP_TEXTURE", sharp.getColourTexture());
    appearance->setProperty("M_VELOCITY_TEXTURE", velocity.getColourTexture());
    square->setAppearance(appearance);
    return square;
}

bool write(const std::string& path, const Arguments& arguments, const std::vector<uint8_t>& pixels)
{
    std::string error;
    if (!headless::writePng(path, arguments.width, arguments.height, pixels.data(), error))
    {
        std::fprintf(stderr, "%s\n", error.c_str());
        return false;
    }
    std::printf("wrote %s\n", path.c_str());
    return true;
}

bool writeTarget(const std::string& path, const Arguments& arguments, RenderTarget& target)
{
    target.enable();
    const std::vector<uint8_t> pixels = headless::readFramebuffer(0, 0, arguments.width, arguments.height);
    target.disable();
    return write(path, arguments, pixels);
}

/// Draws to the current GL context, and releases everything it made.
bool draw(const SharedPtr<AssetCachePool>& pool, const Arguments& arguments, const headless::Context& gl)
{
    Scene scene;
    if (!build(*pool, scene))
        return false;
    const SharedPtr<RenderTarget> sharp = createTarget(*pool, arguments);
    const SharedPtr<RenderTarget> velocity = createTarget(*pool, arguments);
    if (!sharp || !velocity)
        return false;
    const SharedPtr<Solid> composition = createComposition(*pool, *sharp, *velocity, arguments.stereo);
    if (!composition)
        return false;

    const auto context = makeShared<RenderContext>();
    const auto renderer = makeShared<SimpleRenderer>(context, pool);
    renderer->setOpaqueGrouped(true); // fewer changes of program and texture, for the same picture
    const auto velocityRenderer = makeShared<MotionBlurRenderer>(context, pool);
    if (!context->getProperty("MOTION_BLUR_FACTOR")->setValue(arguments.factor, 0))
        return false;

    const auto sharpBlock = makeShared<RenderBlock>(renderer, scene.root, scene.camera);
    sharpBlock->setRenderTarget(sharp);
    const auto velocityBlock = makeShared<RenderBlock>(velocityRenderer, scene.root, scene.camera);
    velocityBlock->setRenderTarget(velocity);
    velocityBlock->setBackgroundColour(Colour4f::BLACK); // black: nothing drawn
    const auto composedBlock = makeShared<RenderBlock>(renderer, composition, nullptr);
    composedBlock->setViewport(0, 0, arguments.width, arguments.height);

    RenderBlockGroup frame;
    frame.addBlock(sharpBlock);
    frame.addBlock(velocityBlock);
    frame.addBlock(composedBlock);
    if (arguments.stereo)
        scene.camera->setStereo(9.0f, 0.4f);

    for (int i = 1; i <= FRAMES; ++i) // the first frame has no previous one, so its velocities are wrong
    {
        const float time = float(i) * FRAME_SECONDS;
        move(scene, time);
        frame.update(time);
        frame.render();
    }
    return writeTarget(arguments.out + "-sharp.png", arguments, *sharp) &&
           writeTarget(arguments.out + "-velocity.png", arguments, *velocity) &&
           write(arguments.out + "-blurred.png", arguments, gl.readPixels());
}

} // namespace

int main(int argc, char** argv)
{
    orv::setLogLevel(orv::LogLevel::WARNING);
    Arguments arguments;
    if (!parse(argc, argv, arguments))
    {
        std::fprintf(stderr, "usage: motionblur [--out NAME] [--factor NUMBER] [--stereo] [--size WxH]\n");
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
    const bool drawn = draw(pool, arguments, *gl);

    // The first flush deletes unused assets, the second the assets that those used.
    pool->flush();
    pool->flush();
    return drawn ? 0 : 1;
}

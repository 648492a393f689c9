#include "canvas.h"

#include "headless/png.h"

#include <cstdio>
#include <cstring>
#include <string>

using namespace orv;

SharedPtr<SceneNode> Canvas::makeScene() const
{
    const auto scene = makeShared<SceneNode>("scene");
    const auto lamp = makeShared<Light>("lamp");
    lamp->setAmbientLevel(0.35f);
    lamp->setPosition(Vector3f(4.0f, 7.0f, 8.0f));
    lamp->setParent(scene);
    return scene;
}

SharedPtr<Camera> Canvas::addCamera(const SharedPtr<SceneNode>& scene, const Vector3f& eye,
                                    const Vector3f& target) const
{
    const auto camera = makeShared<Camera>("camera");
    camera->setFieldOfView(Anglef::fromDegrees(40.0f));
    camera->setPosition(eye);
    camera->setParent(scene);
    point(*camera, target);
    return camera;
}

SharedPtr<Solid> Canvas::add(const SharedPtr<Solid>& solid, const SharedPtr<SceneNode>& scene,
                             const Colour4f& colour, const Vector3f& position, float size) const
{
    if (!solid)
        return solid;
    const Vector4f value(colour.r, colour.g, colour.b, colour.a);
    solid->getAppearance()->setShaderProgram(
        pool->getShaderProgramCache()->get("orv#max_ppl.sp$DIFF$SPEC$AMBI"));
    for (const char* property : {"M_DIFFUSE_COLOUR", "M_AMBIENT_COLOUR"})
        solid->getAppearance()->setProperty(property, value);
    solid->getAppearance()->setProperty("M_SPECULAR_COLOUR", Vector4f(0.3f, 0.3f, 0.3f, 1.0f));
    solid->setPosition(position);
    solid->setScale(Vector3f(size, size, size));
    solid->setParent(scene);
    return solid;
}

bool Canvas::loseContext()
{
    std::string error;
    m_gl = nullptr;
    m_gl = headless::Context::create(m_options, error);
    if (!m_gl)
        std::fprintf(stderr, "%s\n", error.c_str());
    return m_gl != nullptr;
}

int Canvas::run(int argc, char** argv, const char* name, bool (*draw)(Canvas& canvas))
{
    const bool hasOut = argc == 3 && !std::strcmp(argv[1], "--out");
    if (argc > 1 && !hasOut)
    {
        std::fprintf(stderr, "usage: %s [--out FILE.png]\n", name);
        return 2;
    }
    const std::string path = hasOut ? argv[2] : std::string(name) + ".png";
    setLogLevel(LogLevel::WARNING);
    Canvas canvas;
    canvas.m_options.width = 400;
    canvas.m_options.height = 240;
    canvas.m_options.samples = 4;
    if (!canvas.loseContext()) // the first call makes the first context
        return 1;
    canvas.pool = makeShared<AssetCachePool>();
    canvas.context = makeShared<RenderContext>();
    canvas.renderer = makeShared<SimpleRenderer>(canvas.context, canvas.pool);

    std::string error;
    const bool isDrawn = draw(canvas);
    if (!isDrawn)
        std::fprintf(stderr, "%s: nothing drawn; the lines above say why\n", name);
    else if (!headless::writePng(path, canvas.getWidth(), canvas.getHeight(), canvas.readPixels().data(),
                                 error))
        std::fprintf(stderr, "%s\n", error.c_str());
    else
        std::printf("wrote %s\n", path.c_str());
    canvas.renderer = nullptr;
    canvas.pool->flush(); // deletes GL objects while their context exists
    canvas.pool->flush();
    return isDrawn && error.empty() ? 0 : 1;
}

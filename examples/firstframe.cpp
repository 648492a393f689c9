// A first frame: a lit cube, drawn without a window and written as a picture. docs/guide.md goes through it.
//   build/default/examples/firstframe > firstframe.ppm
#include <EGL/egl.h>
#include <EGL/eglext.h>
#include <cstdio>
#include <orv/orv.h>

/// The engine draws with whatever GL context is current. This one has no window.
static bool makeContextCurrent(int width, int height)
{
    EGLDisplay display = eglGetPlatformDisplay(EGL_PLATFORM_SURFACELESS_MESA, EGL_DEFAULT_DISPLAY, nullptr);
    const EGLint wanted[] = {EGL_SURFACE_TYPE, EGL_PBUFFER_BIT, EGL_DEPTH_SIZE, 24, EGL_NONE};
    const EGLint size[] = {EGL_WIDTH, width, EGL_HEIGHT, height, EGL_NONE};
    const EGLint version[] = {EGL_CONTEXT_CLIENT_VERSION, 2, EGL_NONE};
    EGLConfig config = nullptr;
    EGLint count = 0;
    eglInitialize(display, nullptr, nullptr);
    eglChooseConfig(display, wanted, &config, 1, &count);
    EGLSurface surface = eglCreatePbufferSurface(display, config, size);
    return eglMakeCurrent(display, surface, surface, eglCreateContext(display, config, nullptr, version));
}

int main()
{
    if (!makeContextCurrent(400, 300))
        return 1;
    const auto pool = orv::makeShared<orv::AssetCachePool>(); // finds and keeps assets
    const auto scene = orv::makeShared<orv::SceneNode>("scene");
    const auto cube = orv::createCube(*pool, orv::Vector2f(1.0f, 1.0f));
    const auto lamp = orv::makeShared<orv::Light>("lamp");
    const auto camera = orv::makeShared<orv::Camera>("camera");
    if (!cube)
        return 1; // the log says why
    cube->setParent(scene, false);
    lamp->setParent(scene, false);
    lamp->setPosition(orv::Vector3f(2.0f, 5.0f, 4.0f));
    camera->setPosition(orv::Vector3f(3.0f, 2.5f, 4.0f));
    orv::point(*camera, orv::Vector3f(0.0f, 0.0f, 0.0f));

    const auto context = orv::makeShared<orv::RenderContext>(); // one for each GL context
    orv::RenderBlock(orv::makeShared<orv::SimpleRenderer>(context, pool), scene, camera).render();
    static unsigned char pixels[300][400][4]; // rows from the bottom up, as GL has them
    orv::RenderDevice::getPixels(0, 0, 400, 300, &pixels[0][0][0]);
    std::printf("P6 400 300 255\n");
    for (int i = 0; i < 300 * 400; ++i)
        std::fwrite(pixels[299 - i / 400][i % 400], 3, 1, stdout);
    pool->release(); // the GL objects go with the context, which ends with the program
    return 0;
}

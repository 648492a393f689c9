// Names that the snippets of the pages use and that their text has introduced. tests/snippets.py puts each snippet into
// a function; nothing is linked or run.
#include <GLES2/gl2.h>
#include <cstdio>
#include <orv/orv.h>
#include <vector>

using namespace orv;

extern SharedPtr<AssetCachePool> pool;
extern SharedPtr<RenderContext> context;
extern SharedPtr<SimpleRenderer> renderer;
extern SharedPtr<SceneNode> scene;
extern SharedPtr<SceneNode> markers;
extern SharedPtr<SceneNode> cube;
extern SharedPtr<Camera> camera;
extern SharedPtr<Camera> mapCamera;
extern SharedPtr<Camera> otherCamera;
extern SharedPtr<Light> sun;
extern SharedPtr<Mesh> mesh;
extern SharedPtr<VertexArray> positions;
extern SharedPtr<Font> font;
extern SharedPtr<Glo> glo;
extern std::vector<SharedPtr<Solid>> solids;
extern GlyphCache::Ptr glyphs;
extern TextLayout::Ptr layout;
std::vector<TextLayout::Glyph> shape(const GlyphCache& glyphs, unsigned font, const char* utf8, float size);
extern Vector3f eye;
extern Vector3f target;
extern float width;
extern float seconds;
bool nextFrame(float* passed);
void start();

struct Console
{
    void addLine(const char* place, const char* text);
};
extern Console console;

void drawSparksWithGl();
class Sparks : public Renderer
{
public:
    void render(Camera* camera, SceneNode& scene, const FlagMask& renderFlags,
                const FlagMask& recursiveFlags) override;

private:
    SharedPtr<SimpleRenderer> m_inner;
    SharedPtr<Solid> m_label;
};

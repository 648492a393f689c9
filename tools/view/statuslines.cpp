#include "statuslines.h"

#include "orv/appearance.h"
#include "orv/camera.h"
#include "orv/light.h"
#include "orv/mesh.h"
#include "orv/sceneutil.h"
#include "orv/solid.h"

#include <cstdio>

namespace view
{

namespace
{

/// "1 draw", "4,212 triangles"
std::string count(uint64_t number, const char* what)
{
    std::string text = std::to_string(number);
    for (int i = int(text.size()) - 3; i > 0; i -= 3)
        text.insert(size_t(i), ",");
    return text + " " + what + (number == 1 ? "" : "s");
}

std::string toText(const char* format, double value)
{
    char text[40];
    std::snprintf(text, sizeof text, format, value);
    return text;
}

std::string describeSolid(const orv::Solid& solid)
{
    if (!solid.getMesh() || !solid.getAppearance())
        return "solid that draws nothing";
    const std::string material = solid.getAppearance()->getName();
    const int triangles = orv::getTriangleCount(*solid.getMesh()->getIndexBuffer());
    std::string text = "solid, " + count(uint64_t(triangles > 0 ? triangles : 0), "triangle");
    if (solid.getJointCount() > 0)
        text += ", " + count(uint64_t(solid.getJointCount()), "joint");
    return material.empty() ? text : text + ", " + material;
}

std::string describeNode(const orv::SceneNode& node)
{
    switch (node.getNodeType())
    {
    case orv::Solid::NODE_TYPE: return describeSolid(static_cast<const orv::Solid&>(node));
    case orv::Camera::NODE_TYPE: return "camera";
    case orv::Light::NODE_TYPE: return "light";
    default: return "node";
    }
}

void listNodes(const orv::SceneNode& node, int depth, bool isShownAbove, std::vector<HeadsUp::Row>& rows)
{
    const std::string name = node.getName();
    const bool isShown = isShownAbove && node.isVisible();
    const char* const hidden = isShown ? "" : node.isVisible() ? ", hidden above" : ", hidden";
    rows.push_back({std::string(size_t(depth) * 3, ' ') + (name.empty() ? "without a name" : name) + "   " +
                        describeNode(node) + hidden,
                    ""});
    for (const orv::SharedPtr<orv::SceneNode>& child : node.getChildren())
        listNodes(*child, depth + 1, isShown, rows);
}

} // namespace

std::vector<HeadsUp::Row> listNodes(const orv::SceneNode& top)
{
    std::vector<HeadsUp::Row> rows;
    listNodes(top, 0, true, rows);
    return rows;
}

std::string describeFrame(const FrameStats& stats, uint64_t triangleCount)
{
    const double framesPerSecond = stats.getFramesPerSecond();
    return (framesPerSecond > 0.0 ? toText("%.0f fps", framesPerSecond) : "at rest") + "   " +
           count(stats.draws, "draw") + "   " + count(triangleCount, "triangle") + "   " +
           count(stats.glCalls, "GL call");
}

std::string describeClip(const Player& player)
{
    const Clip& clip = player.getClip();
    if (clip.end <= clip.start)
        return {};
    std::string text = "\n" + clip.name + "   " + toText("%.2f", player.getTime() - clip.start) +
                       toText(" of %.2f s", clip.end - clip.start);
    text += player.isMoving() ? "   playing" : player.isPaused() ? "   paused" : "   at its end";
    if (player.getSpeed() != 1.0f)
        text += toText(", speed %g", player.getSpeed());
    return text + (player.isLooping() ? ", in a loop" : ", once");
}

} // namespace view

#pragma once

#include "orv/assetcachepool.h"
#include "orv/debuglines.h"
#include "orv/mesh.h"
#include "orv/rendercontext.h"
#include "orv/shadowmap.h"

#include <array>
#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace view
{

class Stage;

/// What can be shown of a scene beside its picture.
enum class Marking
{
    BOUNDS,    ///< a box around each solid
    SKELETONS, ///< joints, or nodes where there are none
    AXES,      ///< of each node
    GRID,      ///< the ground
    WIREFRAME, ///< the edges of triangles in place of the triangles
    SHADOWS,   ///< of the first directional or spot light
    COUNT
};

/// By its name on the command line. @return COUNT if there is none of that name.
Marking findMarking(const std::string& name);
std::string listMarkings(); ///< "bounds, skeletons, ..."

/// Draws a stage, and over it what was asked for. GL thread only; the GL context has to outlive it.
class Markings
{
public:
    /// @param context  of the picture; shared.
    explicit Markings(const orv::RenderContext::Ptr& context);
    ~Markings();

    Markings(const Markings&) = delete;
    Markings& operator=(const Markings&) = delete;

    bool shows(Marking marking) const { return m_shown[size_t(marking)]; }
    void toggle(Marking marking) { m_shown[size_t(marking)] = !shows(marking); }

    /// "bounds, grid of 0.1"; "" for none.
    std::string describe() const;

    /// Clears and draws a viewport of that size at the lower left.
    void draw(Stage& stage, int width, int height);

    /// Lets go of what it knows of a stage, which is about to be replaced by another one.
    void forget();

private:
    /// The same vertices once more, as the edges of their triangles.
    struct Edges
    {
        orv::SharedPtr<orv::Mesh> triangles; ///< held, so that its address stays its own
        orv::SharedPtr<orv::Mesh> lines;
    };

    orv::SharedPtr<orv::Mesh> findEdges(const orv::SharedPtr<orv::Mesh>& mesh);
    void drawShadows(Stage& stage);
    void drawWireframe(Stage& stage, int width, int height);
    void addBounds(Stage& stage);
    void addSkeletons(Stage& stage);
    void addAxes(Stage& stage);
    void addGrid();
    void measure(Stage& stage);

    orv::RenderContext::Ptr m_context;
    orv::SharedPtr<orv::AssetCachePool> m_pool; ///< of its own: that of the scene comes and goes
    orv::DebugLines::Ptr m_inside;              ///< what solids may hide
    orv::DebugLines::Ptr m_above;               ///< what they may not
    orv::ShadowMap::Ptr m_shadows;              ///< of the stage, while they are shown
    std::array<bool, size_t(Marking::COUNT)> m_shown{};
    std::map<const orv::Mesh*, Edges> m_edges;
    bool m_isMeasured = false;
    orv::Vector3f m_low; ///< of the stage in the world, as it stood when it was measured
    orv::Vector3f m_high;
};

} // namespace view

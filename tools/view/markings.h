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

/// Debug views of a scene.
enum class Marking
{
    BOUNDS,    ///< a box around each solid
    SKELETONS, ///< joints, or nodes if there are none
    AXES,      ///< of each node
    GRID,      ///< the ground
    WIREFRAME, ///< the edges of triangles instead of the triangles
    SHADOWS,   ///< of the first directional or spot light
    COUNT
};

/// By its name on the command line. @return COUNT for an unknown name.
Marking findMarking(const std::string& name);
std::string listMarkings(); ///< "bounds, skeletons, ..."

/// Draws a stage and the selected views over it. GL thread only; the GL context has to outlive it.
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

    /// Drops all references to a stage that is about to be replaced.
    void forget();

private:
    /// The same vertices with indices of the triangles' edges.
    struct Edges
    {
        orv::SharedPtr<orv::Mesh> triangles; ///< held, so that its address is not reused
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
    orv::SharedPtr<orv::AssetCachePool> m_pool; ///< a separate one: the scene's may be replaced
    orv::DebugLines::Ptr m_inside;              ///< may be hidden by solids
    orv::DebugLines::Ptr m_above;               ///< drawn over everything
    orv::ShadowMap::Ptr m_shadows;              ///< of the stage, while they are shown
    std::array<bool, size_t(Marking::COUNT)> m_shown{};
    std::map<const orv::Mesh*, Edges> m_edges;
    bool m_isMeasured = false;
    orv::Vector3f m_low; ///< of the stage in the world, when it was measured
    orv::Vector3f m_high;
};

} // namespace view

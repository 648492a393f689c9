#pragma once

#include "orv/export.h"
#include "orv/flagmask.h"
#include "orv/sharedptr.h"
#include "orv/vector.h"

namespace orv
{

class Appearance;
class AssetCachePool;
class SceneNode;
class SceneNodeVisitor;
class ShaderProgram;
class Solid;

/// Sets the meant flags of this node to a state; its other flags stay.
ORV_API void setFlags(SceneNode& node, const FlagMask& flags, bool state);

/// The meant flags as inherited from the root down to the node: an ordinary flag holds when the node or any
/// ancestor sets it, a flag that is on by default holds while no node on the path has switched it off.
/// @return true when every meant flag holds.
ORV_API bool getDerivedFlags(const SceneNode& node, const FlagMask& flags);

/// Hands the node, then each child's subtree in order, to the visitor.
ORV_API void visitScene(SceneNodeVisitor& visitor, SceneNode& node);

/// The same walk restricted by flags; the plain walk when renderFlags means no flag.
/// @param renderFlags  a node is visited when all of these hold for it.
/// @param recursiveFlags  flags that nodes inherit from their ancestors, counted from this node down. Without
/// inverted bits: below the first node at which all of them hold everything is visited, with no further test
/// (where no flag is meant they hold at once, and all is visited).
/// With inverted bits: the subtree of a node that loses the condition is left out, all but that node itself.
ORV_API void visitScene(SceneNodeVisitor& visitor, SceneNode& node, const FlagMask& renderFlags,
                        const FlagMask& recursiveFlags);

/// Gives a solid the appearance; ignored by other nodes. Children are not touched.
ORV_API void setAppearance(SceneNode& node, const SharedPtr<Appearance>& appearance);

/// Gives a solid's appearance the program; ignored by other nodes and by a solid without an appearance.
ORV_API void setShaderProgram(SceneNode& node, const SharedPtr<ShaderProgram>& program);

/// Generated shapes (see createSquareMesh() and its fellows), each with its own copy of the appearance
/// "orv#default_pvl.ap". uvScale is the texture coordinate reached at the far edge.
/// @return empty when the mesh could not be made. GL thread only.
ORV_API SharedPtr<Solid> createSquare(AssetCachePool& pool, const Vector2f& uvScale);
ORV_API SharedPtr<Solid> createCube(AssetCachePool& pool, const Vector2f& uvScale);
ORV_API SharedPtr<Solid> createSphere(AssetCachePool& pool, unsigned int segments, unsigned int wedges,
                                      const Vector2f& uvScale);

/// Turns a node so that its -z axis, where cameras look and lights shine, passes through a place in the world.
/// @param target  in world space; nothing happens when it is where the node is.
/// @param up  in world space; the node's +y axis is turned towards it as far as the target allows. One that
/// is parallel to the view is replaced.
ORV_API void point(SceneNode& node, const Vector3f& target, const Vector3f& up = Vector3f(0.0f, 1.0f, 0.0f));

} // namespace orv

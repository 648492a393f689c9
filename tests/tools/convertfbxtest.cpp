#include "converttest.h"

#include "orv/animationgroup.h"
#include "orv/quaternion.h"
#include "orv/solid.h"

#include <array>
#include <map>

using namespace orv;

namespace
{

using Triple = std::array<double, 3>;

/// A node of an FBX file with one triangle: what its properties are, and those that go from one value to another in a
/// second.
struct Joint
{
    std::map<std::string, Triple> properties;
    std::map<std::string, Triple> ends;
    int order = 0; ///< of rotations: 0 is x first, then y, then z
};

std::string list(const Triple& values)
{
    return std::to_string(values[0]) + "," + std::to_string(values[1]) + "," + std::to_string(values[2]);
}

Triple getUsual(const std::string& property)
{
    return property.find("Scaling") != std::string::npos && property != "ScalingPivot" &&
                   property != "ScalingOffset"
               ? Triple{1, 1, 1}
               : Triple{0, 0, 0};
}

Triple get(const Joint& joint, const std::string& property, double time)
{
    const auto start = joint.properties.find(property);
    Triple made = start != joint.properties.end() ? start->second : getUsual(property);
    const auto end = joint.ends.find(property);
    for (size_t i = 0; end != joint.ends.end() && i < 3; ++i)
        made[i] += (end->second[i] - made[i]) * time;
    return made;
}

void addCurves(const Joint& joint, const std::string& property, int number, std::string& objects,
               std::string& connections)
{
    const std::string node = std::to_string(number);
    const Triple from = get(joint, property, 0.0);
    const Triple to = joint.ends.at(property);
    const std::string kind = property.substr(4, 1); // of "Lcl Rotation"
    objects += "AnimationCurveNode: " + node + ", \"AnimCurveNode::" + kind + "\", \"\" {\n}\n";
    connections += "C: \"OO\"," + node + ",20\nC: \"OP\"," + node + ",1, \"" + property + "\"\n";
    for (size_t axis = 0; axis < 3; ++axis)
    {
        const std::string curve = std::to_string(number + 1 + int(axis));
        objects += "AnimationCurve: " + curve +
                   ", \"AnimCurve::\", \"\" {\nKeyTime: *2 {\na: 0,46186158000\n}\nKeyValueFloat: *2 {\na: " +
                   std::to_string(from[axis]) + "," + std::to_string(to[axis]) +
                   "\n}\nKeyAttrFlags: *1 {\na: 24836\n}\nKeyAttrDataFloat: *4 {\na: 0,0,0,0\n}\n"
                   "KeyAttrRefCount: *1 {\na: 2\n}\n}\n";
        connections +=
            "C: \"OP\"," + curve + "," + node + ", \"d|" + std::string(1, char('X' + axis)) + "\"\n";
    }
}

/// As text, in metres with y up.
std::string makeFbx(const Joint& joint)
{
    std::string properties =
        "P: \"RotationActive\", \"bool\", \"\", \"\",1\nP: \"RotationOrder\", \"enum\", \"\", \"\"," +
        std::to_string(joint.order) + "\n";
    for (const auto& [name, values] : joint.properties)
        properties += "P: \"" + name + "\", \"" + (name[0] == 'L' ? name : "Vector3D") + "\", \"\", \"\"," +
                      list(values) + "\n";
    std::string objects;
    std::string connections;
    int number = 100;
    for (const auto& [name, values] : joint.ends)
        addCurves(joint, name, number += 10, objects, connections);
    return "; FBX 7.4.0 project file\nFBXHeaderExtension:  {\nFBXHeaderVersion: 1003\nFBXVersion: 7400\n}\n"
           "GlobalSettings:  {\nVersion: 1000\nProperties70:  {\n"
           "P: \"UpAxis\", \"int\", \"Integer\", \"\",1\nP: \"UpAxisSign\", \"int\", \"Integer\", \"\",1\n"
           "P: \"FrontAxis\", \"int\", \"Integer\", \"\",2\nP: \"FrontAxisSign\", \"int\", \"Integer\", "
           "\"\",1\n"
           "P: \"CoordAxis\", \"int\", \"Integer\", \"\",0\nP: \"CoordAxisSign\", \"int\", \"Integer\", "
           "\"\",1\n"
           "P: \"UnitScaleFactor\", \"double\", \"Number\", \"\",100\n}\n}\n"
           "Definitions:  {\nVersion: 100\nCount: 1\n}\nObjects:  {\n"
           "Geometry: 2, \"Geometry::tri\", \"Mesh\" {\nVertices: *9 {\na: 0,0,0,1,0,0,0,1,0\n}\n"
           "PolygonVertexIndex: *3 {\na: 0,1,-3\n}\nGeometryVersion: 124\n}\n"
           "Model: 1, \"Model::joint\", \"Mesh\" {\nVersion: 232\nProperties70:  {\n" +
           properties +
           "}\n}\nAnimationStack: 10, \"AnimStack::take\", \"\" {\n}\nAnimationLayer: 20, "
           "\"AnimLayer::base\", \"\" {\n}\n" +
           objects + "}\nConnections:  {\nC: \"OO\",1,0\nC: \"OO\",2,1\nC: \"OO\",20,10\n" + connections +
           "}\n";
}

Matrix4f turn(const Triple& degrees, int order = 0)
{
    const char* const ORDERS[] = {"XYZ", "XZY", "YZX", "YXZ", "ZXY", "ZYX"};
    Matrix4f made = Matrix4f::IDENTITY;
    for (const char* axis = ORDERS[order]; *axis; ++axis)
    {
        Vector3f direction;
        (&direction.x)[*axis - 'X'] = 1.0f;
        const float radians = float(degrees[size_t(*axis - 'X')] * 3.14159265358979 / 180.0);
        made = toMatrix4(quaternionFromAxisAngle(direction, Anglef::fromRadians(radians))) * made;
    }
    return made;
}

Matrix4f shift(const Triple& by)
{
    return translationMatrix(Vector3f(float(by[0]), float(by[1]), float(by[2])));
}

/// The format's own formula.
Matrix4f getTransform(const Joint& joint, double time)
{
    const auto value = [&](const char* name) { return get(joint, name, time); };
    const Triple s = value("Lcl Scaling");
    const Triple g = value("GeometricScaling");
    return shift(value("Lcl Translation")) * shift(value("RotationOffset")) * shift(value("RotationPivot")) *
           turn(value("PreRotation")) * turn(value("Lcl Rotation"), joint.order) *
           inverse(turn(value("PostRotation"))) * inverse(shift(value("RotationPivot"))) *
           shift(value("ScalingOffset")) * shift(value("ScalingPivot")) *
           scaleMatrix(Vector3f(float(s[0]), float(s[1]), float(s[2]))) *
           inverse(shift(value("ScalingPivot"))) * shift(value("GeometricTranslation")) *
           turn(value("GeometricRotation")) * scaleMatrix(Vector3f(float(g[0]), float(g[1]), float(g[2])));
}

} // namespace

// Fault caught: rotations before and after a joint's own that are applied twice, or backwards, as soon as it moves;
// pivots, offsets and orders of rotation that a clip loses.
TEST_F(ConvertTest, fbxJointsMoveAsTheyStand)
{
    const std::map<std::string, Triple> moves = {{"Lcl Rotation", {20, -5, 40}},
                                                 {"Lcl Translation", {1, 4, 2}}};
    const Triple rest = {10, 5, 30};
    const Joint joints[] = {
        {{{"Lcl Rotation", rest}}, moves},
        {{{"Lcl Rotation", rest}, {"PreRotation", {90, 0, 0}}}, moves},
        {{{"Lcl Rotation", rest}, {"PreRotation", {90, 30, 0}}, {"PostRotation", {0, 20, 40}}}, moves},
        {{{"PreRotation", {0, 0, 90}}}, {{"Lcl Translation", {1, 4, 2}}}},
        {{{"Lcl Rotation", rest}, {"PreRotation", {90, 0, 0}}}, moves, 1},
        {{{"Lcl Rotation", rest}}, moves, 5},
        {{{"Lcl Rotation", rest},
          {"PreRotation", {90, 0, 0}},
          {"PostRotation", {0, 20, 40}},
          {"RotationPivot", {1, 2, 3}},
          {"RotationOffset", {0, 1, 0}},
          {"ScalingPivot", {0.5, 0, 0}},
          {"ScalingOffset", {0, 0, 1}},
          {"Lcl Scaling", {1, 2, 1}}},
         {{"Lcl Rotation", {20, -5, 40}}, {"Lcl Translation", {1, 4, 2}}, {"Lcl Scaling", {2, 3, 1}}}},
        {{{"Lcl Rotation", rest},
          {"GeometricTranslation", {1, 2, 3}},
          {"GeometricRotation", {0, 90, 0}},
          {"GeometricScaling", {1, 2, 1}}},
         moves},
    };
    for (const Joint& joint : joints)
    {
        SCOPED_TRACE(makeFbx(joint));
        m_folder.write("joint.fbx", makeFbx(joint));
        const Glo::Ptr loaded = convertAndLoad("joint.fbx out.glo", "out.glo");
        ASSERT_TRUE(loaded);
        SceneNode* drawn = nullptr;
        std::vector<SceneNode*> nodes = {loaded->getTopNode().get()};
        while (!nodes.empty())
        {
            SceneNode* node = nodes.back();
            nodes.pop_back();
            drawn = node->getNodeType() == Solid::NODE_TYPE ? node : drawn;
            for (const SharedPtr<SceneNode>& child : node->getChildren())
                nodes.push_back(child.get());
        }
        ASSERT_TRUE(drawn);
        const SharedPtr<AnimationGroup> take = loaded->getAnimation("take");
        ASSERT_TRUE(take);
        for (const double time : {-1.0, 0.0, 1.0}) // at rest, and at the keys
        {
            if (time >= 0.0)
                take->apply(float(time));
            const Matrix4f wanted = getTransform(joint, std::max(time, 0.0));
            const Matrix4f found = drawn->getWorldTransform();
            for (int column = 0; column < 4; ++column)
                EXPECT_LT(length(wanted[column] - found[column]), 1e-4f)
                    << "column " << column << " at " << time;
        }
    }
}

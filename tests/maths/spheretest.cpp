#include "orv/sphere.h"

#include "orv/ray.h"
#include "orv/sharedptr.h"

#include <gtest/gtest.h>

using namespace orv;

TEST(Sphere, fromItsCentreBothRootsAreEquallyNear)
{
    const RaycastResult result = makeShared<Sphere>()->raycast({Vector3f(), Vector3f(0, 2, 0)});
    EXPECT_TRUE(result.hit);
    EXPECT_NEAR(0.5f, std::fabs(result.distance), 1e-6f);
    EXPECT_NEAR(1.0f, std::fabs(result.normal.y), 1e-6f);
}

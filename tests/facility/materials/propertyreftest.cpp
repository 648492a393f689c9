#include "orv/propertyref.h"

#include "orv/appearance.h"

#include "facilitytest.h"

using namespace orv;
using support::LogCapture;

namespace
{

float valueOf(const Appearance& appearance)
{
    float value = -1.0f;
    EXPECT_TRUE(appearance.getPropertyUniform("P")->getValue(value, 0));
    return value;
}

} // namespace

// Fault caught: a remembered holder that is written although its appearance, or the property in it, is another.
TEST(PropertyRef, writesThePropertyOfTheMoment)
{
    PropertyRef reference("P");
    Appearance first, second;
    EXPECT_TRUE(reference.set(first, 1.0f)); // creates it
    EXPECT_TRUE(reference.set(second, 2.0f));
    EXPECT_EQ(1.0f, valueOf(first));
    EXPECT_EQ(2.0f, valueOf(second));
    second.addProperty<float>("P", 1);
    EXPECT_TRUE(reference.set(second, 3.0f));
    EXPECT_EQ(3.0f, valueOf(second));
    LogCapture log;
    EXPECT_FALSE(reference.set(second, 5));
    EXPECT_FALSE(reference.set(second, 5.0f, -1));
    EXPECT_FALSE(reference.set(second, 5.0f, 1));
    EXPECT_EQ(2, log.count('E'));
}

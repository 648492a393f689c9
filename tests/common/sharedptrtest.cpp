#include "orv/sharedptr.h"

#include "support/logcapture.h"

#include <gtest/gtest.h>

#include <cstring>
#include <thread>
#include <vector>

using namespace orv;

namespace
{

class Probe : public Shared
{
public:
    ORV_CLASS_NAME("Probe")

    explicit Probe(std::atomic<int>& deaths) : m_deaths(deaths) {}
    ~Probe() override { ++m_deaths; }

private:
    std::atomic<int>& m_deaths;
};

} // namespace

// Fault caught: a copy, move or assignment that takes or drops one reference too many or too few.
TEST(SharedPtr, deletesOnceWithTheLastReference)
{
    std::atomic<int> deaths = 0;
    Probe* const object = new Probe(deaths);
    SharedPtr<Probe> first(object);
    SharedPtr<Shared> second(first);
    SharedPtr<Shared> third;
    third = second;
    EXPECT_EQ(3, object->sharedGetCount());

    SharedPtr<Shared> moved(std::move(third));
    third = std::move(moved);
    const SharedPtr<Shared>& itself = third;
    third = itself;
    EXPECT_EQ(3, object->sharedGetCount());
    EXPECT_TRUE(moved == nullptr);

    first.reset();
    third = nullptr;
    EXPECT_EQ(1, object->sharedGetCount());
    EXPECT_EQ(0, deaths);

    second.reset(new Probe(deaths));
    EXPECT_EQ(1, deaths);
    second.reset();
    EXPECT_EQ(2, deaths);
}

// Fault caught: reading the count again after the decrement, by which two threads both see 0 and delete twice;
// a matter of luck, so it shows in about every other run.
TEST(SharedPtr, twoThreadsThatDropTheLastReferencesDeleteOnce)
{
    const int objects = 20000;
    std::atomic<int> deaths = 0;
    std::vector<SharedPtr<Probe>> left;
    for (int i = 0; i < objects; ++i)
        left.push_back(makeShared<Probe>(deaths));
    std::vector<SharedPtr<Probe>> right = left;

    std::atomic<int> arrived = 0;
    const auto drop = [&arrived](std::vector<SharedPtr<Probe>>& pointers)
    {
        int meeting = 0;
        for (SharedPtr<Probe>& pointer : pointers)
        {
            meeting += 2;
            for (++arrived; arrived < meeting;)
                std::this_thread::yield();
            pointer.reset();
        }
    };
    std::thread other(drop, std::ref(right));
    drop(left);
    other.join();
    EXPECT_EQ(objects, deaths);
}

TEST(SharedPtr, emptyArrowLogsTwiceAndGivesNull)
{
    support::LogCapture log;
    const SharedPtr<Probe> empty;
    EXPECT_EQ(nullptr, empty.operator->());

    const std::vector<support::LogCapture::Record> records = log.records();
    ASSERT_EQ(2u, records.size());
    EXPECT_EQ("Error: pointer operator on null. class: Probe", records[0].message);
    EXPECT_EQ("ORV_ASSERT: m_ptr", records[1].message);
    EXPECT_EQ("sharedptr operator->", records[0].source + " " + records[0].function);
}

// Fault caught: an object that is copied while its count is 0 (inside its destructor, say) passing unnoticed.
TEST(SharedPtr, copyWithoutAnyReferenceIsReported)
{
    std::atomic<int> deaths = 0;
    Probe* const object = new Probe(deaths);
    alignas(SharedPtr<Probe>) unsigned char storage[sizeof(SharedPtr<Probe>)];
    const SharedPtr<Probe>& uncounted = *new (storage) SharedPtr<Probe>();
    std::memcpy(storage, &object, sizeof object); // holds the object now without having counted it

    support::LogCapture log;
    {
        const SharedPtr<Probe> copy(uncounted);
        EXPECT_EQ(1, log.countMessage("ORV_ASSERT: m_ptr->sharedGetCount() > 0"));
        EXPECT_EQ(1, copy->sharedGetCount());
    }
    EXPECT_EQ(1, deaths);
}

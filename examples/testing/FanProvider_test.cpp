#include "FanProvider.h"

#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "observe/GoogleTest.h"

// What a provider's test checks with IC::Testing: the records, the locks and the clock, and the state of the provider
// when the platform fails.

TEST(FanProvider, ShowsTheSpeedThatWasMeasured)
{
    FanProvider fan("AFB0812");
    fan.measured(3600);
    EXPECT_EQ(fan.getProperties().at(FanProvider::SPEED), IC::PropertyValue(IC::Number(3600u)));
    EXPECT_EQ(fan.getStatus(), IC::Node::STATUS_INITIAL);
}

TEST(FanProvider, KeepsItsModel)
{
    FanProvider fan("AFB0812");
    EXPECT_EQ(fan.setProperty(FanProvider::MODEL, IC::PropertyValue("another")).getStatus(),
              IC::Error::STATUS_READ_ONLY);
    expectRecords({{"setProperty", "Vexilon.IC.Node", 3000, "setProperty: 1 another"},
                   {"setProperty", "Vexilon.IC.Node", 6000, "setProperty: 1 read-only"}});
}

TEST(FanProvider, TakesOverAMeasurementUnderOneLock)
{
    FanProvider fan("AFB0812");
    const std::size_t before = observe::lockCalls().size();
    fan.measured(0);
    EXPECT_EQ(observe::lockCalls().size(), before + 2);  // lock and unlock
    EXPECT_EQ(observe::locksHeld(), 0);
}

TEST(FanProvider, KeepsTheOldSpeedWhenTheLockFails)
{
    FanProvider fan("AFB0812");
    fan.measured(3600);
    observe::throwAt(observe::Call::lock, 1);
    EXPECT_THROW(fan.measured(0), observe::Thrown);
    EXPECT_TRUE(observe::thrown());
    EXPECT_EQ(fan.getProperties().at(FanProvider::SPEED), IC::PropertyValue(IC::Number(3600u)));
}

TEST(FanProvider, TellsTheOperatorWhenItStopped)
{
    FanProvider fan("AFB0812");
    fan.measured(0);
    observe::setClock(1234567890, 5);
    const IC::Alert alert = fan.alert();
    EXPECT_EQ(static_cast<long>(alert.getTimeStamp()), 1234567890);
    EXPECT_EQ(alert.getStatus(), 3u);
    EXPECT_THAT(alert.getNodePaths(), testing::ElementsAre("/chassis/fan1"));
}

// What strict mode notices.
#include <gtest/gtest.h>

#include "Fake_Broker.h"

namespace tvx::host {
namespace {

using test::FakeBroker;

constexpr auto stringKind = static_cast<std::size_t>(ObjectKind::String);

TEST(StrictDeathTest, ADoubleReleaseAbortsAndNamesTheKind) {
  FakeBroker broker(true);
  EXPECT_DEATH(broker.misbehave("double-release"),
               "broker: double release of a CMPIString made by \"invokeMethod FAKE_Widget\"");
}

TEST(StrictDeathTest, UseAfterReleaseAborts) {
  FakeBroker broker(true);
  EXPECT_DEATH(broker.misbehave("use-after-release"),
               "broker: getCharPtr: use of a CMPIString made by \"invokeMethod FAKE_Widget\" after "
               "its release");
}

TEST(StrictDeathTest, AnObjectOfAnotherKindAborts) {
  FakeBroker broker(true);
  EXPECT_DEATH(broker.misbehave("wrong-kind"),
               "newInstance: a CMPIString was passed where a CMPIObjectPath is expected");
}

TEST(StrictTest, WithoutItAnObjectOfAnotherKindIsRefused) {
  FakeBroker broker;
  EXPECT_EQ(broker.misbehave("wrong-kind").status.rc, CMPI_RC_OK);
}

TEST(StrictTest, AReleaseAfterTheRequestIsNoted) {
  FakeBroker broker(true);
  const Reply kept = broker.misbehave("keep");
  EXPECT_EQ(kept.report.leftBehind[stringKind], 1U);
  EXPECT_TRUE(broker.lateNotes().empty());
  broker.misbehave("release-kept");
  EXPECT_EQ(broker.lateNotes(), (std::vector<std::string>{
                                    "CMPIString made by \"invokeMethod FAKE_Widget\" was released "
                                    "after the end of its request"}));
}

TEST(StrictTest, AReleaseOnAnotherThreadIsNoted) {
  FakeBroker broker(true);
  EXPECT_FALSE(broker.misbehave("release-elsewhere").report.leaks());
  EXPECT_EQ(broker.lateNotes(),
            (std::vector<std::string>{"CMPIString made by \"invokeMethod FAKE_Widget\" was "
                                      "released on another thread"}));
}

TEST(StrictTest, AClonedObjectThatStaysIsALeak) {
  FakeBroker broker(true);
  const Reply leaked = broker.misbehave("leak-clone");
  EXPECT_TRUE(leaked.report.leaks());
  EXPECT_EQ(leaked.report.leakedClones[stringKind], 1U);
  EXPECT_NE(leaked.report.text().find("invokeMethod FAKE_Widget: 1 cloned CMPIString leaked"),
            std::string::npos);
  const Reply clean = broker.misbehave("release-clone");
  EXPECT_FALSE(clean.report.leaks());
  EXPECT_EQ(clean.report.cloned[stringKind], 1U);
}

TEST(StrictTest, MemoryThatStaysIsALeak) {
  FakeBroker broker(true);
  const Reply leaked = broker.misbehave("leak-memory");
  EXPECT_EQ(leaked.report.leakedBlocks, 1U);
  EXPECT_TRUE(leaked.report.leaks());
  EXPECT_NE(leaked.report.text().find("1 memory blocks leaked"), std::string::npos);
  EXPECT_FALSE(broker.misbehave("free-kept-memory").report.leaks());
  EXPECT_FALSE(broker.misbehave("free-memory").report.leaks());
}

TEST(StrictTest, ObjectsLeftToTheBrokerAreCountedButAreNoLeak) {
  FakeBroker broker(true);
  const Reply reply = broker.misbehave("nothing");
  EXPECT_EQ(reply.report.created[stringKind], 1U);
  EXPECT_EQ(reply.report.leftBehind[stringKind], 1U);
  EXPECT_FALSE(reply.report.leaks());
  EXPECT_EQ(reply.report.text(), "invokeMethod FAKE_Widget: 1 CMPIString left to the broker\n");
}

TEST(StrictTest, AProviderThatReleasesAllLeavesNothing) {
  FakeBroker broker(true);
  const Reply reply = broker.enumerateInstances("FAKE_Gadget");
  EXPECT_EQ(reply.instances.size(), 1U);
  EXPECT_EQ(reply.report.count(reply.report.leftBehind), 0U);
  EXPECT_EQ(reply.report.created[static_cast<std::size_t>(ObjectKind::Instance)], 1U);
  EXPECT_EQ(reply.report.text(), "");
}

TEST(StrictTest, UnknownPropertiesAndWrongTypesAreComplaints) {
  FakeBroker broker(true);
  const Reply unknown = broker.misbehave("unknown-property");
  EXPECT_EQ(unknown.returnValue.asUnsigned(), static_cast<unsigned>(CMPI_RC_OK));
  EXPECT_EQ(unknown.report.complaints, std::vector<std::string>{"FAKE_Widget has no property Odd"});
  const Reply wrong = broker.misbehave("wrong-type");
  EXPECT_EQ(wrong.returnValue.asUnsigned(), static_cast<unsigned>(CMPI_RC_ERR_TYPE_MISMATCH));
  EXPECT_EQ(wrong.report.complaints,
            std::vector<std::string>{"FAKE_Widget.Color is a string, the provider set a uint8"});
}

}  // namespace
}  // namespace tvx::host

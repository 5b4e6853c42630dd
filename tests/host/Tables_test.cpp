// What each version of the broker offers.
#include <gtest/gtest.h>

#include <thread>

#include "Broker.h"
#include "Test_Classes.h"
#include "cmpi/cmpimacs.h"

namespace tvx::host {
namespace {

BrokerOptions version(int number) {
  BrokerOptions options;
  options.version = number;
  return options;
}

TEST(TablesTest, Version200HasEveryTable) {
  const Broker broker(version(200));
  const CMPIBroker* mb = broker.face();
  EXPECT_EQ(mb->bft->brokerVersion, 200);
  EXPECT_STREQ(mb->bft->brokerName, "tvxcim");
  EXPECT_EQ(mb->eft->ftVersion, 200);
  EXPECT_EQ(mb->xft->ftVersion, 200);
  ASSERT_NE(mb->mft, nullptr);
  EXPECT_EQ(mb->mft->ftVersion, 200);
  EXPECT_NE(mb->eft->newCMPIError, nullptr);
  EXPECT_EQ(mb->eft->openMessageFile, nullptr);
  EXPECT_EQ(mb->eft->closeMessageFile, nullptr);
  EXPECT_EQ(mb->eft->getMessage2, nullptr);
  EXPECT_NE(mb->xft->joinThread, nullptr);
}

TEST(TablesTest, Version100HasTheFirstSlotsAlone) {
  // Later slots are not even in memory there; what is, works.
  const Broker broker(version(100));
  const CMPIBroker* mb = broker.face();
  EXPECT_EQ(mb->bft->brokerVersion, 100);
  EXPECT_EQ(mb->eft->ftVersion, 100);
  EXPECT_NE(mb->eft->logMessage, nullptr);
  const CMPIObjectPath* path = CMNewObjectPath(mb, "root/a", "X", nullptr);
  EXPECT_EQ(path->ft->ftVersion, 100);
  EXPECT_NE(path->ft->getParameterQualifier, nullptr);
  EXPECT_EQ(CMNewInstance(mb, path, nullptr)->ft->ftVersion, 100);
}

TEST(TablesTest, VersionZeroCallsItsTablesOneAndLacksThreadControl) {
  const Broker broker(version(0));
  const CMPIBroker* mb = broker.face();
  EXPECT_EQ(mb->bft->brokerVersion, 0);
  EXPECT_EQ(mb->eft->ftVersion, 1);
  EXPECT_EQ(mb->mft, nullptr);
  EXPECT_EQ(mb->xft->joinThread, nullptr);
  EXPECT_EQ(mb->xft->exitThread, nullptr);
  EXPECT_EQ(mb->xft->cancelThread, nullptr);
  EXPECT_EQ(mb->xft->threadSleep, nullptr);
  EXPECT_EQ(mb->xft->signalCondition, nullptr);
  EXPECT_NE(mb->xft->newThread, nullptr);
}

TEST(TablesTest, VersionZeroHandsOutStringsWithoutTextForMissingPlaces) {
  const Broker broker(version(0));
  const CMPIObjectPath* path = CMNewObjectPath(broker.face(), nullptr, "X", nullptr);
  EXPECT_EQ(CMGetCharsPtr(CMGetNameSpace(path, nullptr), nullptr), nullptr);
  EXPECT_EQ(CMGetCharsPtr(CMGetHostname(path, nullptr), nullptr), nullptr);
  const Broker usual(version(200));
  const CMPIObjectPath* other = CMNewObjectPath(usual.face(), nullptr, "X", nullptr);
  EXPECT_STREQ(CMGetCharsPtr(CMGetNameSpace(other, nullptr), nullptr), "");
}

TEST(TablesTest, VersionZeroChecksNeitherPropertiesNorKeys) {
  BrokerOptions options = version(0);
  options.classes = &test::testClasses();
  const Broker broker(options);
  CMPIObjectPath* path = CMNewObjectPath(broker.face(), "root/fake", "FAKE_Widget", nullptr);
  CMPIValue value{};
  EXPECT_EQ(CMAddKey(path, "Number", &value, CMPI_uint64).rc, CMPI_RC_OK);
  const CMPIInstance* instance = CMNewInstance(broker.face(), path, nullptr);
  EXPECT_EQ(CMSetProperty(instance, "Color", &value, CMPI_uint8).rc, CMPI_RC_OK);
}

CMPI_THREAD_RETURN addOne(void* number) {
  ++*static_cast<int*>(number);
  return number;
}

int onceCount = 0;
void countOnce() {
  ++onceCount;
}

TEST(ThreadTableTest, ThreadsRunAndAreJoined) {
  const Broker broker;
  const CMPIBrokerExtFT& xft = *broker.face()->xft;
  int number = 1;
  CMPI_THREAD_RETURN result = nullptr;
  CMPI_THREAD_TYPE thread = xft.newThread(addOne, &number, 0);
  ASSERT_NE(thread, nullptr);
  EXPECT_EQ(xft.joinThread(thread, &result), 0);
  EXPECT_EQ(result, &number);
  EXPECT_EQ(number, 2);
  EXPECT_EQ(xft.threadSleep(1), 0);
}

TEST(ThreadTableTest, KeysOnceMutexesAndConditionsWork) {
  const Broker broker;
  const CMPIBrokerExtFT& xft = *broker.face()->xft;
  unsigned int key = 0;
  int value = 5;
  ASSERT_EQ(xft.createThreadKey(&key, nullptr), 0);
  EXPECT_EQ(xft.setThreadSpecific(key, &value), 0);
  EXPECT_EQ(xft.getThreadSpecific(key), &value);
  EXPECT_EQ(xft.destroyThreadKey(key), 0);
  int once = 0;
  xft.threadOnce(&once, countOnce);
  xft.threadOnce(&once, countOnce);
  EXPECT_EQ(onceCount, 1);

  CMPI_MUTEX_TYPE mutex = xft.newMutex(0);
  CMPI_COND_TYPE condition = xft.newCondition(0);
  bool ready = false;
  std::thread waker([&] {
    xft.lockMutex(mutex);
    ready = true;
    xft.signalCondition(condition);
    xft.unlockMutex(mutex);
  });
  xft.lockMutex(mutex);
  while (!ready) {
    xft.condWait(condition, mutex);
  }
  timespec past{0, 0};
  EXPECT_EQ(xft.timedCondWait(condition, mutex, &past), ETIMEDOUT);
  xft.unlockMutex(mutex);
  waker.join();
  xft.destroyCondition(condition);
  xft.destroyMutex(mutex);
}

TEST(ThreadTableTest, LibraryNamesAreResolved) {
  const Broker broker;
  char* name = broker.face()->xft->resolveFileName("thing");
  EXPECT_STREQ(name, "libthing.so");
  free(name);
}

TEST(MemoryTableTest, BlocksAreMadeGrownAndFreed) {
  Broker broker;
  const CMPIBroker* mb = broker.face();
  auto* block = static_cast<char*>(mb->mft->cmpiMalloc(mb, 4));
  block[0] = 'x';
  block = static_cast<char*>(mb->mft->cmpiRealloc(mb, block, 400));
  EXPECT_EQ(block[0], 'x');
  mb->mft->cmpiFree(mb, block);
  auto* zeroed = static_cast<char*>(mb->mft->cmpiCalloc(mb, 2, 2));
  EXPECT_EQ(zeroed[3], 0);
  mb->mft->cmpiFree(mb, zeroed);
  char* copy = mb->mft->cmpiStrDup(mb, "text");
  EXPECT_STREQ(copy, "text");
  mb->mft->cmpiFree(mb, copy);
  mb->mft->cmpiFree(mb, nullptr);
}

TEST(MemoryTableTest, FreeFunctionsReleaseObjectsOfEachKind) {
  Broker broker;
  const CMPIBroker* mb = broker.face();
  CMPIObjectPath* path = CMNewObjectPath(mb, "n", "X", nullptr);
  mb->mft->freeInstance(mb, CMNewInstance(mb, path, nullptr));
  mb->mft->freeObjectPath(mb, path);
  mb->mft->freeArgs(mb, CMNewArgs(mb, nullptr));
  mb->mft->freeString(mb, CMNewString(mb, "x", nullptr));
  mb->mft->freeArray(mb, CMNewArray(mb, 1, CMPI_uint8, nullptr));
  mb->mft->freeDateTime(mb, CMNewDateTime(mb, nullptr));
  mb->mft->freeSelectExp(mb, mb->eft->newSelectExp(mb, "q", "l", nullptr, nullptr));
  const ScopeReport report = broker.permanentReport();
  EXPECT_EQ(report.count(report.created), 7U);
  EXPECT_EQ(report.count(report.released), 7U);
}

TEST(MemoryTableTest, MarksAreAccepted) {
  const Broker broker;
  const CMPIBroker* mb = broker.face();
  CMPIStatus rc{};
  CMPIGcStat* mark = mb->mft->mark(mb, &rc);
  EXPECT_EQ(rc.rc, CMPI_RC_OK);
  EXPECT_EQ(mb->mft->release(mb, mark).rc, CMPI_RC_OK);
  EXPECT_EQ(mb->mft->release(mb, nullptr).rc, CMPI_RC_ERR_INVALID_HANDLE);
}

}  // namespace
}  // namespace tvx::host

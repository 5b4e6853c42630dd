// Up-calls, threads of the provider's own, and requests on several threads at once.
#include <gtest/gtest.h>

#include <thread>

#include "Fake_Broker.h"

namespace tvx::host {
namespace {

using test::FakeBroker;

constexpr const char* twoForeign = R"({"version": 1, "instances": [
  {"class": "FAKE_Foreign", "properties": {"Id": "a"}}, {"class": "FAKE_Foreign", "properties": {"Id": "b"}}]})";

class UpCallTest : public ::testing::TestWithParam<int> {};

TEST_P(UpCallTest, AnAttachedThreadOfTheProviderReachesForeignInstances) {
  FakeBroker broker(true, GetParam());
  broker.addForeign(twoForeign);
  const Reply reply = broker.misbehave("thread");
  EXPECT_EQ(reply.returnValue.asUnsigned(), 2U);
  EXPECT_EQ(broker.openAttachments(), 0U);
  ASSERT_EQ(broker.threadReports().size(), 1U);
  const ScopeReport report = broker.threadReports()[0];
  EXPECT_EQ(report.label, "attached thread");
  EXPECT_EQ(report.created[static_cast<std::size_t>(ObjectKind::ObjectPath)], 1U);
  EXPECT_EQ(report.handedOut[static_cast<std::size_t>(ObjectKind::Instance)], 2U);
  EXPECT_FALSE(report.leaks());
}

TEST_P(UpCallTest, AnUpCallMayComeBackIntoTheSameLibrary) {
  FakeBroker broker(true, GetParam());
  EXPECT_EQ(broker.misbehave("up-call-self").returnValue.asUnsigned(), 1U);
}

INSTANTIATE_TEST_SUITE_P(Versions, UpCallTest, ::testing::Values(0, 100, 200));

TEST(UpCallsTest, AnUnservedClassIsEmptyAndAnUnknownOneAnError) {
  FakeBroker broker;
  EXPECT_EQ(broker.misbehave("thread").returnValue.asUnsigned(), 0U);
}

TEST(UpCallsTest, AThreadThatIsNotAttachedIsRefusedAndNoted) {
  FakeBroker broker(true);
  EXPECT_EQ(broker.misbehave("unattached").returnValue.asUnsigned(),
            static_cast<unsigned>(CMPI_RC_ERR_FAILED));
  EXPECT_EQ(
      broker.lateNotes(),
      std::vector<std::string>{"enumerateInstances was called on a thread that is not attached"});
}

TEST(UpCallsTest, PlannedFailuresReachTheProvider) {
  FakeBroker broker;
  broker.addForeign(
      R"({"version": 1, "failures": [{"class": "FAKE_Foreign", "operation": "enumerateInstances", "rc": 6}]})");
  EXPECT_EQ(broker.misbehave("thread").returnValue.asUnsigned(), 1006U);
}

// ---- The table of up-calls, called with a context of the broker's own ----

class UpCallTableTest : public ::testing::Test {
 protected:
  UpCallTableTest() : mb(broker.face()) {
    broker.addForeign(R"({"version": 1,
      "instances": [{"class": "FAKE_Foreign", "properties": {"Id": "a", "Level": 1}}],
      "methods": [{"class": "FAKE_Foreign", "method": "Go", "return": {"type": "uint32", "value": 8}, "out": {"Word": "w"}}]})");
    current = this;
    broker.addProvider("TEST_Run", {runner, nullptr, nullptr});
  }

  /// Runs the body inside a request, with its context.
  void inRequest(std::function<void(const CMPIContext*)> body) {
    m_Body = std::move(body);
    EXPECT_TRUE(broker.enumerateInstanceNames("TEST_Run").status.ok());
  }

  CMPIObjectPath* foreign(const char* id) {
    CMPIObjectPath* path = mb->eft->newObjectPath(mb, "root/fake", "FAKE_Foreign", nullptr);
    path->ft->addKey(path, "Id", reinterpret_cast<const CMPIValue*>(id), CMPI_chars);
    return path;
  }

  FakeBroker broker{true};
  const CMPIBroker* mb;
  CMPIStatus rc{};

 private:
  static CMPIStatus run(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult*,
                        const CMPIObjectPath*) {
    current->m_Body(context);
    return {CMPI_RC_OK, nullptr};
  }
  static CMPIStatus cleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) {
    return {CMPI_RC_OK, nullptr};
  }
  static CMPIInstanceMI* runner(const CMPIBroker*, const CMPIContext*, CMPIStatus*) {
    static CMPIInstanceMIFT table{};
    table.cleanup = cleanup;
    table.enumerateInstanceNames = run;
    static CMPIInstanceMI interface { nullptr, &table };
    return &interface;
  }

  static UpCallTableTest* current;
  std::function<void(const CMPIContext*)> m_Body;
};
UpCallTableTest* UpCallTableTest::current = nullptr;

TEST_F(UpCallTableTest, InstancesAreReadCreatedChangedAndDeleted) {
  inRequest([&](const CMPIContext* ctx) {
    const CMPIInstance* got = mb->bft->getInstance(mb, ctx, foreign("a"), nullptr, &rc);
    ASSERT_NE(got, nullptr);
    EXPECT_EQ(got->ft->getProperty(got, "Level", nullptr).value.uint16, 1);
    EXPECT_EQ(mb->bft->getInstance(mb, ctx, foreign("z"), nullptr, &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_FOUND);
    ASSERT_NE(rc.msg, nullptr);
    CMPIInstance* made = mb->eft->newInstance(mb, foreign("b"), nullptr);
    EXPECT_NE(mb->bft->createInstance(mb, ctx, foreign("b"), made, &rc), nullptr);
    CMPIValue value{};
    value.uint16 = 5;
    EXPECT_EQ(mb->bft->setProperty(mb, ctx, foreign("b"), "Level", &value, CMPI_uint16).rc,
              CMPI_RC_OK);
    EXPECT_EQ(mb->bft->getProperty(mb, ctx, foreign("b"), "Level", &rc).value.uint16, 5);
    made->ft->setProperty(made, "Level", nullptr, CMPI_uint16);
    EXPECT_EQ(mb->bft->modifyInstance(mb, ctx, foreign("b"), made, nullptr).rc, CMPI_RC_OK);
    EXPECT_EQ(mb->bft->deleteInstance(mb, ctx, foreign("b")).rc, CMPI_RC_OK);
    EXPECT_EQ(mb->bft->deleteInstance(mb, ctx, foreign("b")).rc, CMPI_RC_ERR_NOT_FOUND);
  });
  EXPECT_EQ(broker.foreignInstances("FAKE_Foreign").size(), 1U);
}

TEST_F(UpCallTableTest, EnumerationsAnswerNamesInstancesAndArrays) {
  inRequest([&](const CMPIContext* ctx) {
    const CMPIEnumeration* names = mb->bft->enumerateInstanceNames(mb, ctx, foreign(""), &rc);
    ASSERT_NE(names, nullptr);
    EXPECT_EQ(names->ft->getNext(names, &rc).type, CMPI_ref);
    EXPECT_FALSE(names->ft->hasNext(names, nullptr));
    names->ft->getNext(names, &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_FOUND);
    const char* properties[] = {"Id", nullptr};
    CMPIEnumeration* all = mb->bft->enumerateInstances(mb, ctx, foreign(""), properties, &rc);
    ASSERT_NE(all, nullptr);
    const CMPIArray* array = all->ft->toArray(all, nullptr);
    ASSERT_EQ(array->ft->getSize(array, nullptr), 1U);
    EXPECT_EQ(array->ft->getSimpleType(array, nullptr), CMPI_instance);
    const CMPIInstance* first = array->ft->getElementAt(array, 0, nullptr).value.inst;
    EXPECT_EQ(first->ft->getPropertyCount(first, nullptr), 1U);
    CMPIEnumeration* clone = all->ft->clone(all, nullptr);
    EXPECT_TRUE(clone->ft->hasNext(clone, nullptr));
    clone->ft->release(clone);
    EXPECT_EQ(mb->bft->execQuery(mb, ctx, foreign(""), "q", "l", &rc), nullptr);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
  });
}

TEST_F(UpCallTableTest, WalksReachTheAssociations) {
  const ObjectPath widget = broker.widget(0);
  inRequest([&](const CMPIContext* ctx) {
    CMPIObjectPath* source = mb->eft->newObjectPath(mb, "root/fake", "FAKE_Widget", nullptr);
    source->ft->addKey(source, "Name", reinterpret_cast<const CMPIValue*>("widget0"), CMPI_chars);
    const auto countOf = [&](const CMPIEnumeration* all) {
      unsigned count = 0;
      for (; all != nullptr && all->ft->hasNext(all, nullptr); ++count) {
        all->ft->getNext(all, nullptr);
      }
      return count;
    };
    EXPECT_EQ(countOf(mb->bft->associators(mb, ctx, source, nullptr, nullptr, nullptr, nullptr,
                                           nullptr, &rc)),
              1U);
    EXPECT_EQ(countOf(mb->bft->associatorNames(mb, ctx, source, "FAKE_Link", nullptr, "Dependent",
                                               nullptr, &rc)),
              0U);
    EXPECT_EQ(countOf(mb->bft->references(mb, ctx, source, nullptr, nullptr, nullptr, &rc)), 1U);
    EXPECT_EQ(countOf(mb->bft->referenceNames(mb, ctx, source, "FAKE_Link", "Antecedent", &rc)),
              1U);
  });
}

TEST_F(UpCallTableTest, MethodsAnswerReturnValueAndOutputs) {
  inRequest([&](const CMPIContext* ctx) {
    const CMPIArgs* in = mb->eft->newArgs(mb, nullptr);
    CMPIArgs* out = mb->eft->newArgs(mb, nullptr);
    const CMPIData data = mb->bft->invokeMethod(mb, ctx, foreign("a"), "Go", in, out, &rc);
    EXPECT_EQ(rc.rc, CMPI_RC_OK);
    EXPECT_EQ(data.value.uint32, 8U);
    EXPECT_EQ(out->ft->getArgCount(out, nullptr), 1U);
    EXPECT_NE(
        mb->bft->invokeMethod(mb, ctx, foreign("a"), "Stay", in, out, &rc).state & CMPI_nullValue,
        0);
    EXPECT_EQ(rc.rc, CMPI_RC_ERR_METHOD_NOT_FOUND);
  });
}

TEST_F(UpCallTableTest, AttachNeedsAPreparedContext) {
  inRequest([&](const CMPIContext* ctx) {
    EXPECT_EQ(mb->bft->attachThread(mb, ctx).rc, CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(mb->bft->detachThread(mb, ctx).rc, CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(mb->bft->prepareAttachThread(mb, nullptr), nullptr);
    const CMPIContext* prepared = mb->bft->prepareAttachThread(mb, ctx);
    EXPECT_EQ(broker.openAttachments(), 1U);
    EXPECT_EQ(mb->bft->detachThread(mb, prepared).rc, CMPI_RC_ERR_FAILED)
        << "it was never attached";
    EXPECT_EQ(broker.openAttachments(), 0U);
  });
}

TEST(ConcurrencyTest, RequestsRunOnSeveralThreadsAtOnce) {
  FakeBroker broker(true);
  broker.addForeign(twoForeign);
  const ObjectPath widget = broker.widget(1);
  std::atomic<unsigned> good{0};
  const auto work = [&] {
    for (int i = 0; i < 50; ++i) {
      good += broker.enumerateInstances("CIM_Thing").instances.size() == 6 ? 1 : 0;
      good += broker.associators(widget).instances.size() == 2 ? 1 : 0;
      good += broker.misbehave("thread").returnValue.asUnsigned() == 2 ? 1 : 0;
    }
  };
  std::vector<std::thread> threads;
  for (int i = 0; i < 4; ++i) {
    threads.emplace_back(work);
  }
  for (std::thread& thread : threads) {
    thread.join();
  }
  EXPECT_EQ(good.load(), 600U);
  EXPECT_EQ(broker.openAttachments(), 0U);
}

}  // namespace
}  // namespace tvx::host

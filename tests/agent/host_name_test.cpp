// A host whose name or address cannot be found.
#include <dlfcn.h>
#include <netdb.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>

#include "Map_Test.h"

namespace {

std::atomic<bool> nameFails{false};
std::atomic<bool> addressFails{false};

}  // namespace

// In the place of the C library's for this program.
extern "C" int gethostname(char* name, std::size_t size) noexcept {
  if (nameFails) {
    errno = EPERM;
    return -1;
  }
  static const auto real =
      reinterpret_cast<int (*)(char*, std::size_t)>(::dlsym(RTLD_NEXT, "gethostname"));
  return real(name, size);
}

extern "C" hostent* gethostbyname(const char* name) {
  if (addressFails) return nullptr;
  static const auto real =
      reinterpret_cast<hostent* (*)(const char*)>(::dlsym(RTLD_NEXT, "gethostbyname"));
  return real(name);
}

namespace cimrt::test {
namespace {

class Host_Name : public Adapter_Maps {
 protected:
  void TearDown() override {
    nameFails = false;
    addressFails = false;
    Adapter_Maps::TearDown();
  }
};

TEST_F(Host_Name, ThatCannotBeReadIsUnknownWithItsAddress) {
  nameFails = true;
  const ProviderAgent& agent = build();
  EXPECT_EQ(log.level("Error! gethostname() failed err : 1 , using 'unknown' for hostname and IP "
                      "address"),
            TVX_ERR);
  EXPECT_EQ(agent.m_HostName, "unknown");
  EXPECT_EQ(agent.m_IPAddress, "unknown");
  ASSERT_EQ(agent.m_CIM_ComputerSystem_map.size(), 1U);
  EXPECT_EQ(text(agent.m_CIM_ComputerSystem_map[0]->Name), "unknown");
  EXPECT_EQ(agent.m_TVXHBA_FCPort_map.size(), 4U);
}

TEST_F(Host_Name, WithoutAnAddressStands) {
  addressFails = true;
  const ProviderAgent& agent = build();
  EXPECT_EQ(log.level("Error! gethostbyname() failed, using 'unknown' for IP address."), TVX_ERR);
  char name[256] = {};
  ASSERT_EQ(::gethostname(name, sizeof name - 1), 0);
  EXPECT_EQ(agent.m_HostName, name);
  EXPECT_EQ(agent.m_IPAddress, "unknown");
  ASSERT_EQ(agent.m_CIM_ComputerSystem_map.size(), 1U);
  EXPECT_EQ(texts(agent.m_CIM_ComputerSystem_map[0]->OtherIdentifyingInfo).at(0), "unknown");
}

}  // namespace
}  // namespace cimrt::test

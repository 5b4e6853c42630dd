// The program brings its own system log.
#include <gtest/gtest.h>
#include <syslog.h>

#include <cstring>
#include <string>

#include "common/CLogger.h"

namespace {

std::string opened;
int options = 0;
int facility = 0;
int closes = 0;
int messages = 0;

}  // namespace

extern "C" {
void openlog(const char* ident, int option, int log_facility) {
  opened = ident;
  options = option;
  facility = log_facility;
}
void closelog() {
  ++closes;
}
void syslog(int, const char*, ...) {
  ++messages;
}
// What a fortified build calls instead.
void __syslog_chk(int, int, const char*, ...) {
  ++messages;
}
}

namespace {

TEST(Sys_Logger, OpensAndClosesTheSystemLog) {
  {
    const cimrt::TVX_SysLogger system;
    EXPECT_EQ(opened, "[TVX][CIM][FC]");
    EXPECT_EQ(options, LOG_PID | LOG_NDELAY);
    EXPECT_EQ(facility, LOG_USER);
    EXPECT_EQ(closes, 0);
  }
  EXPECT_EQ(closes, 1);
}

TEST(Sys_Logger, PassesNoLevelInUse) {
  cimrt::TVX_SysLogger system;
  cimrt::getLogger().enable();
  for (int mode = 0; mode <= 4; ++mode) {
    cimrt::getLogger().setMode(mode);
    for (int level = 0; level <= 5; ++level) TVX_LOG(level, "GetInterfaceState %d", level);
  }
  cimrt::getLogger().disable();
  system.log(-1, "f", nullptr, std::string(5000, 'x').c_str());
  system.log(0, "f", nullptr, nullptr);
  EXPECT_EQ(messages, 0);
}

}  // namespace

// Values, instances and paths between CMPI and the runtime: what the tests of both directions
// share.
#pragma once

#include <gmock/gmock.h>

#include <limits>

#include "Faulty_Broker.h"
#include "Test_Instances.h"
#include "Test_Server.h"
#include "Trace_Log.h"
#include "cmpi/CMPI_Containers.h"
#include "cmpi/CMPI_Value.h"
#include "cmpi/Converter.h"

namespace cimrt::test {

using tvx::host::NamedValues;
using Object = tvx::host::Instance;
using Any = tvx::host::Value;

inline constexpr const char* TIME = "20240229235959.123456+060";

/// One scalar type with two values on either side.
struct Row {
  Type type;
  CMPIType cmpi_type;
  Any first;
  Any second;
};

inline const std::vector<Row>& rows() {
  static const std::vector<Row> all = {
      {BOOLEAN, CMPI_boolean, Any::boolean(true), Any::boolean(false)},
      {UINT8, CMPI_uint8, Any::number(CMPI_uint8, 255), Any::number(CMPI_uint8, 0)},
      {SINT8, CMPI_sint8, Any::signedNumber(CMPI_sint8, -128), Any::signedNumber(CMPI_sint8, 127)},
      {UINT16, CMPI_uint16, Any::number(CMPI_uint16, 65535), Any::number(CMPI_uint16, 1)},
      {SINT16, CMPI_sint16, Any::signedNumber(CMPI_sint16, -32768),
       Any::signedNumber(CMPI_sint16, 5)},
      {UINT32, CMPI_uint32, Any::number(CMPI_uint32, 4294967295u), Any::number(CMPI_uint32, 2)},
      {SINT32, CMPI_sint32, Any::signedNumber(CMPI_sint32, -2147483647 - 1),
       Any::signedNumber(CMPI_sint32, 3)},
      {UINT64, CMPI_uint64, Any::number(CMPI_uint64, ~0ull), Any::number(CMPI_uint64, 4)},
      {SINT64, CMPI_sint64,
       Any::signedNumber(CMPI_sint64, std::numeric_limits<std::int64_t>::min()),
       Any::signedNumber(CMPI_sint64, 6)},
      {REAL32, CMPI_real32, Any::real(CMPI_real32, 0.5), Any::real(CMPI_real32, -2.25)},
      {REAL64, CMPI_real64, Any::real(CMPI_real64, 1e300), Any::real(CMPI_real64, -0.125)},
      {CHAR16, CMPI_char16, Any::number(CMPI_char16, 'A'), Any::number(CMPI_char16, 'z')},
      {STRING, CMPI_string, Any::string("first"), Any::string("")},
      {DATETIME, CMPI_dateTime, Any::dateTime(TIME), Any::dateTime("00000002030405.000006:000")},
  };
  return all;
}

/// Conversions on a strict server whose makers fail on demand.
class Conversion : public ::testing::Test {
 protected:
  const CMPIBroker* face() { return faulty.face(); }
  const Meta_Repository* repository() const { return classes.repository; }

  Object object(const NamedValues& properties, const char* class_name = "TEST_All") const {
    Object made;
    made.path = path_of(class_name, "x");
    made.properties = properties;
    return made;
  }
  /// Through the containers into an instance of TEST_All.
  Ref<Instance> read(const NamedValues& properties) {
    CMPIInstance* source = objects.instance(object(properties));
    Instance* out = nullptr;
    EXPECT_EQ(make_cimrt_instance(face(), classes.all, objects.path(path_of("TEST_All", "x")),
                                  source, out),
              0);
    return Ref<Instance>(out);
  }
  /// Back again; the result lives as long as the test.
  const Object& write(const Ref<Instance>& instance, const char** properties = nullptr) {
    CMPIObjectPath* path = nullptr;
    EXPECT_EQ(make_CMPI_object_path(face(), instance.get(), "root/test", path), 0);
    CMPIInstance* out = nullptr;
    EXPECT_EQ(make_CMPI_instance(face(), instance.get(), "root/test", path, properties, out), 0);
    return contents_of(out);
  }
  int to_value(const CMPIData& data, Value& value) {
    return cmpi_to_cimrt_value(repository(), face(), "root/test", data, value);
  }
  CMPIArray* array(CMPIType element_type, const Any::List& elements) {
    return tvx::host::makeArray(objects.core, element_type, elements, tvx::host::Origin::HandedOut);
  }

  const Test_Classes& classes = Test_Classes::get();
  Test_Server server;
  Request_Objects objects{server};
  Faulty_Broker faulty{server.broker.face()};
};

}  // namespace cimrt::test

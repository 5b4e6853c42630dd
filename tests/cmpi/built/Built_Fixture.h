// The test library in a strict broker, opened as any provider library is.
#pragma once

#include <gmock/gmock.h>

#include <optional>
#include <string>
#include <vector>

#include "Broker.h"
#include "Control.h"
#include "Trace_Log.h"
#include "broker/Objects.h"
#include "broker/Scope.h"
#include "runtime/Provider_Operations.h"

namespace cimrt::test {

using tvx::host::NamedValues;
using tvx::host::ObjectPath;
using tvx::host::Reply;
using tvx::host::Request;
using Any = tvx::host::Value;
using Object = tvx::host::Instance;
/// What a server asks for; `Operation` alone is what a provider is asked for.
using Call = tvx::host::Operation;
using tvx::host::InterfaceKind;

inline constexpr const char* NAME_SPACE = "root/test";

class Built_Bridge : public ::testing::Test {
 protected:
  explicit Built_Bridge(tvx::host::BrokerOptions options = {});
  ~Built_Bridge() override;

  void play(const char* class_name, std::uint32_t operation, const std::string& steps) {
    control->play(class_name, operation, steps.c_str());
  }
  static ObjectPath path(const char* class_name, const char* id) {
    return {"", NAME_SPACE, class_name, {{"Id", Any::string(id)}}};
  }
  static Object object(const char* class_name, const NamedValues& properties) {
    return {path(class_name, "x"), properties};
  }
  /// A request of one class's provider; walks go to `association`.
  static Request request(Call call, const ObjectPath& path,
                         const std::string& association = "TEST_Link");

  /// Runs a request twice and answers the first reply. The second time nothing may be lost,
  /// whatever it answers: no object of the server, no block of the library's memory. `lines` and
  /// `asked` are of that time.
  Reply run(const Request& request);
  /// The lines of a level among `lines`.
  std::vector<std::string> texts(const std::string& level) const;
  /// The one line that ends an operation in the log: "getInstance(): CMPI_RC_OK".
  std::string ending() const;

  tvx::host::Broker broker;
  const Control* control = nullptr;
  std::vector<Log_Line> lines;
  std::vector<std::string> asked;  ///< what the providers were asked and saw

 private:
  Reply run_once(const Request& request);

  void* _library = nullptr;
};

/// Objects for calls past the broker, straight into a function table.
class Straight_Call {
 public:
  explicit Straight_Call(tvx::host::Broker& broker)
      : core(tvx::host::Core::of(broker.face())),
        scope(core, "straight"),
        guard(scope),
        context(tvx::host::makeContext(core, {}, tvx::host::Origin::HandedOut)),
        result(tvx::host::makeResult(core, reply)) {}

  CMPIObjectPath* path(const ObjectPath& contents) {
    return tvx::host::makePath(core, contents, tvx::host::Origin::HandedOut);
  }

  tvx::host::Core& core;
  Reply reply;
  tvx::host::Scope scope;
  tvx::host::ScopeGuard guard;
  CMPIContext* context;
  CMPIResult* result;
};

}  // namespace cimrt::test

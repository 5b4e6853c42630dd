// The test library on a server whose makers of objects fail on demand.
#pragma once

#include <functional>

#include "Built_Fixture.h"
#include "Faulty_Broker.h"

namespace cimrt::test {

class Failing_Server : public Built_Bridge {
 protected:
  ~Failing_Server() override {
    for (const auto& give_back : _held) give_back();
  }

  /// Makes a class's adapter on that server. Requests of the broker go through the same adapter,
  /// and so meet its failures.
  template <class MI>
  void put_before(const char* class_name, char letter, const CMPIBroker* server) {
    auto* mi = static_cast<MI*>(control->interface(class_name, server, straight.context, letter));
    _held.push_back([this, mi] { mi->ft->cleanup(mi, straight.context, 1); });
  }
  void put_before(const char* class_name) {
    put_before<CMPIInstanceMI>(class_name, 'I', faulty.face());
  }

  Faulty_Broker faulty{broker.face()};
  Straight_Call straight{broker};

 private:
  std::vector<std::function<void()>> _held;
};

}  // namespace cimrt::test

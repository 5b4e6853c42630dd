// A server whose functions fail on demand, in front of a real one.
#pragma once

#include <cstddef>
#include <cstring>
#include <map>
#include <string>

#include "cmpi/cmpift.h"

namespace cimrt::test {

/// Copy of a broker whose making functions (and invokeMethod) fail when told to. One at a time.
class Faulty_Broker {
 public:
  explicit Faulty_Broker(const CMPIBroker* real) : _face(*real), _real(real) {
    // Only what the first version has is there for sure.
    std::memcpy(&_eft, real->eft, offsetof(CMPIBrokerEncFT, newCMPIError));
    std::memcpy(&_bft, real->bft, offsetof(CMPIBrokerFT, enumerateInstancesFiltered));
    _face.eft = &_eft;
    _face.bft = &_bft;
    _eft.newInstance = &new_instance;
    _eft.newObjectPath = &new_object_path;
    _eft.newArgs = &new_args;
    _eft.newString = &new_string;
    _eft.newArray = &new_array;
    _eft.newDateTimeFromChars = &new_date_time;
    current = this;
  }
  ~Faulty_Broker() { current = nullptr; }
  Faulty_Broker(const Faulty_Broker&) = delete;
  Faulty_Broker& operator=(const Faulty_Broker&) = delete;

  const CMPIBroker* face() const { return &_face; }
  CMPIBrokerFT& up_calls() { return _bft; }

  /// Lets the call of that number (1 is the next one) of a function fail, and all that follow.
  void fail(const std::string& function, int from = 1) { _left[function] = from; }
  void heal() { _left.clear(); }

 private:
  static bool fails(const char* function) {
    const auto found = current->_left.find(function);
    if (found == current->_left.end()) return false;
    if (found->second > 1) {
      --found->second;
      return false;
    }
    return true;
  }
  template <class T>
  static T* failed(CMPIStatus* rc) {
    if (rc) *rc = CMPIStatus{CMPI_RC_ERR_FAILED, nullptr};
    return nullptr;
  }
  static const CMPIBroker* real() { return current->_real; }

  static CMPIInstance* new_instance(const CMPIBroker*, const CMPIObjectPath* op, CMPIStatus* rc) {
    return fails("newInstance") ? failed<CMPIInstance>(rc)
                                : real()->eft->newInstance(real(), op, rc);
  }
  static CMPIObjectPath* new_object_path(const CMPIBroker*, const char* ns, const char* cn,
                                         CMPIStatus* rc) {
    return fails("newObjectPath") ? failed<CMPIObjectPath>(rc)
                                  : real()->eft->newObjectPath(real(), ns, cn, rc);
  }
  static CMPIArgs* new_args(const CMPIBroker*, CMPIStatus* rc) {
    return fails("newArgs") ? failed<CMPIArgs>(rc) : real()->eft->newArgs(real(), rc);
  }
  static CMPIString* new_string(const CMPIBroker*, const char* chars, CMPIStatus* rc) {
    return fails("newString") ? failed<CMPIString>(rc) : real()->eft->newString(real(), chars, rc);
  }
  static CMPIArray* new_array(const CMPIBroker*, CMPICount count, CMPIType type, CMPIStatus* rc) {
    return fails("newArray") ? failed<CMPIArray>(rc)
                             : real()->eft->newArray(real(), count, type, rc);
  }
  static CMPIDateTime* new_date_time(const CMPIBroker*, const char* chars, CMPIStatus* rc) {
    return fails("newDateTimeFromChars") ? failed<CMPIDateTime>(rc)
                                         : real()->eft->newDateTimeFromChars(real(), chars, rc);
  }

  static inline Faulty_Broker* current = nullptr;

  CMPIBroker _face;
  CMPIBrokerEncFT _eft{};
  CMPIBrokerFT _bft{};
  const CMPIBroker* _real;
  std::map<std::string, int> _left;
};

}  // namespace cimrt::test

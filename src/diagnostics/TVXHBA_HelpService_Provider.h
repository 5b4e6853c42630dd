// Provider of the help on the tests.
#pragma once

#include "generated/Records.h"
#include "runtime/Provider_Operations.h"

namespace cimrt {

class TVXHBA_HelpService_Provider {
 public:
  /// Gives the description of a test.
  /// @param RequestedDocument the test's name
  /// @param Format, RequestedDelivery 1, a text in the answer
  /// @param return_value 0; 4 for a document that the service has not; 5 for arguments that are no
  /// good
  std::int32_t GetHelp(const TVXHBA_HelpService* service, const Property<String>& RequestedDocument,
                       const Property<std::uint16_t>& Format,
                       const Property<std::uint16_t>& RequestedDelivery,
                       Property<String>& DocumentInfo, Property<std::uint32_t>& return_value);
};

}  // namespace cimrt

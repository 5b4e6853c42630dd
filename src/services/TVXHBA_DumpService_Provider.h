// Provider of the service that makes, lists and removes dumps of a port.
#pragma once

#include "generated/Records.h"

namespace cimrt {

/// No method touches an instance of the cache.
class TVXHBA_DumpService_Provider {
 public:
  std::int32_t GenerateDump(const TVXHBA_DumpService* service, const TVXHBA_FCPort* target,
                            Property<std::uint32_t>& return_value);
  std::int32_t DeleteDump(const TVXHBA_DumpService* service, const TVXHBA_FCPort* target,
                          Property<std::uint32_t>& return_value);
  /// The names of the dump files, of those with a usual ending.
  /// @param files emptied; null stays null where there are none
  std::int32_t GetDumpFileNames(const TVXHBA_DumpService* service, const TVXHBA_FCPort* target,
                                Property<Array<String>>& files,
                                Property<std::uint32_t>& return_value);
};

}  // namespace cimrt

// Provider of the service for frame tagging: the global flag and the table of tags.
#pragma once

#include "generated/Records.h"

namespace cimrt {

/// Results beside the common ones: 1 when the tagging library failed, 4097 for a null target or a
/// URI that is no good, 32768 for a library without adapters, 32968 also for one that does not
/// open. Every method holds the agent's data lock to its end.
class TVXHBA_FCTagService_Provider {
 public:
  /// @param state the library's own value; left as it was on failure
  std::int32_t GetGlobalFlag(const TVXHBA_FCTagService* service, const TVXHBA_FCPort* target,
                             Property<std::uint32_t>& state, Property<std::uint32_t>& return_value);
  std::int32_t SetGlobalFlag(const TVXHBA_FCTagService* service, const TVXHBA_FCPort* target,
                             const Property<std::uint32_t>& state,
                             Property<std::uint32_t>& return_value);
  /// Writes the table into a file of this machine, in the dump directory of the port; in that of
  /// the last port that had one, or in /tmp, without. Gives 32767 if there are no entries.
  /// @param uri name of the file; one that leads out of the directory gives 4097
  std::int32_t GetConfigTable(const TVXHBA_FCTagService* service, const TVXHBA_FCPort* target,
                              const Property<String>& uri, Property<std::uint32_t>& return_value);
  /// Sets the table from a document. A document that can't be read shows in the log alone.
  /// @param uri a path, or anything that can be fetched; gives 4107 if there is no such file
  std::int32_t SetConfigTable(const TVXHBA_FCTagService* service, const TVXHBA_FCPort* target,
                              const Property<String>& uri, Property<std::uint32_t>& return_value);
};

}  // namespace cimrt

// The provider that serves most classes: reads come from the class's map, everything else is
// unsupported.
#pragma once

#include <cstddef>
#include <cstdint>

#include "generated/Repository.h"
#include "runtime/Provider_Operations.h"

namespace cimrt {

class ProviderAgent;
class Skeleton_Provider;

/// Runs the agent's enumeration over the map of one class.
using Enumeration = void (*)(ProviderAgent& agent, const Instance_Handler& handler);

/// A registration with what its dispatcher needs beyond it.
struct Provider_Entry : Registration {
  /// Makes the provider object; the caller owns it.
  Skeleton_Provider* (*create)(const Provider_Entry& entry);
  Enumeration enumerate;  ///< null for a class that has no map
};

/// The registrations, in their fixed order; each points at the one before it.
extern const Provider_Entry provider_entries[num_provider_classes];

/// A provider object as the dispatchers see it, and at the same time the whole provider of a class
/// that does nothing special. It has no state of its own: that lies in the agent. Answers are the
/// numbers of `Provider_Status`. Calls for one object come one at a time, under the lock of the
/// class's adapter; no agent lock is held on entry or on return.
class Skeleton_Provider {
 public:
  explicit Skeleton_Provider(const Provider_Entry& entry) : _entry(entry) {}
  virtual ~Skeleton_Provider() = default;
  Skeleton_Provider(const Skeleton_Provider&) = delete;
  Skeleton_Provider& operator=(const Skeleton_Provider&) = delete;

  /// Takes a reference to the agent; LOAD_FAILED, and none taken, if its libraries are not loaded.
  virtual std::int32_t load();
  /// Gives the reference back.
  virtual std::int32_t unload();

  /// Leaves a new instance, owned by the caller, in `out` only when it answers 0.
  virtual std::int32_t get_instance(const Instance* model, Instance*& out);
  /// Delivers the entries of the map; the dispatcher makes the end call.
  virtual std::int32_t enum_instances(const Instance* model, const Instance_Handler& handler);
  virtual std::int32_t create_instance(const Instance* instance);
  virtual std::int32_t delete_instance(const Instance* instance);
  virtual std::int32_t modify_instance(const Instance* model, const Instance* instance);

  /// Associations only. An empty text filters nothing.
  virtual std::int32_t enum_associator_names(const Instance* source, const String& result_class,
                                             const String& role, const String& result_role,
                                             const Instance_Handler& handler);
  virtual std::int32_t enum_references(const Instance* source, const Instance* model,
                                       const String& role, const Instance_Handler& handler);
  virtual std::int32_t enum_associators(const Instance* source, const String& result_class,
                                        const String& role, const String& result_role,
                                        const Instance_Handler& handler);

  /// Runs one of the class's methods on the record of a call.
  virtual std::int32_t invoke(const Meta_Method* method, Instance* instance, Instance* record);

 private:
  void log_call(const char* operation) const;

  const Provider_Entry& _entry;
};

/// `Provider_Entry::create` of a class without a provider of its own.
Skeleton_Provider* create_skeleton(const Provider_Entry& entry);

}  // namespace cimrt

#include "derivedObjects/Dispatcher.h"

#include <strings.h>

#include <array>

namespace cimrt {

namespace {

constexpr std::size_t NUM_OPERATIONS = OPERATION_ENUM_ASSOCIATORS + 1;
constexpr std::size_t NUM_ARGUMENTS = 8;
constexpr std::int32_t NO_OPERATION = -1;

/// The arguments behind the operation code, by position.
class Arguments {
 public:
  explicit Arguments(const std::array<void*, NUM_ARGUMENTS>& values) : _values(values) {}

  Skeleton_Provider* provider() const { return static_cast<Skeleton_Provider*>(_values[0]); }
  Instance* instance(std::size_t i) const { return static_cast<Instance*>(_values[i]); }
  const String& text(std::size_t i) const { return *static_cast<const String*>(_values[i]); }
  template <class T>
  T& place(std::size_t i) const {
    return *static_cast<T*>(_values[i]);
  }
  /// The callback at position `i` and its client data behind it.
  Instance_Handler handler(std::size_t i) const {
    return {reinterpret_cast<Instance_Proc>(_values[i]), _values[i + 1]};
  }

 private:
  const std::array<void*, NUM_ARGUMENTS>& _values;
};

using Step = std::int32_t (*)(const Provider_Entry& entry, const Arguments& args);
using Steps = std::array<Step, NUM_OPERATIONS>;

/// Tells the handler that nothing follows. Its answer means nothing any more.
std::int32_t finish(const Instance_Handler& handler, std::int32_t status) {
  handler.handle(nullptr, status);
  return status;
}

std::int32_t get_meta_class(const Provider_Entry& entry, const Arguments& args) {
  args.place<const Meta_Class*>(0) = entry.meta_class;
  return 0;
}

std::int32_t get_repository(const Provider_Entry& entry, const Arguments& args) {
  args.place<const Meta_Repository*>(0) = entry.meta_class->meta_repository;
  return 0;
}

std::int32_t create_provider(const Provider_Entry& entry, const Arguments& args) {
  args.place<void*>(0) = entry.create(entry);
  return 0;
}

std::int32_t destroy_provider(const Provider_Entry&, const Arguments& args) {
  delete args.provider();
  return 0;
}

std::int32_t load(const Provider_Entry&, const Arguments& args) {
  return args.provider()->load();
}

std::int32_t unload(const Provider_Entry&, const Arguments& args) {
  return args.provider()->unload();
}

std::int32_t get_instance(const Provider_Entry&, const Arguments& args) {
  return args.provider()->get_instance(args.instance(1), args.place<Instance*>(2));
}

std::int32_t enum_instances(const Provider_Entry&, const Arguments& args) {
  const Instance_Handler handler = args.handler(2);
  return finish(handler, args.provider()->enum_instances(args.instance(1), handler));
}

std::int32_t create_instance(const Provider_Entry&, const Arguments& args) {
  return args.provider()->create_instance(args.instance(1));
}

std::int32_t delete_instance(const Provider_Entry&, const Arguments& args) {
  return args.provider()->delete_instance(args.instance(1));
}

std::int32_t modify_instance(const Provider_Entry&, const Arguments& args) {
  return args.provider()->modify_instance(args.instance(1), args.instance(2));
}

/// Finds the method by the name of the record's description, in the order of the class.
std::int32_t invoke_method(const Provider_Entry& entry, const Arguments& args) {
  Instance* record = args.instance(2);
  if (!record) return NO_OPERATION;
  for (std::uint64_t i = 0; i < entry.meta_class->num_meta_features; ++i) {
    const Meta_Feature* feature = entry.meta_class->meta_features[i];
    if (!is_method(feature)) continue;
    if (strcasecmp(feature->name, record->meta_class->name) == 0) {
      return args.provider()->invoke(as_method(feature), args.instance(1), record);
    }
  }
  return NO_OPERATION;
}

std::int32_t enum_associator_names(const Provider_Entry&, const Arguments& args) {
  const Instance_Handler handler = args.handler(5);
  const std::int32_t status = args.provider()->enum_associator_names(
      args.instance(1), args.text(2), args.text(3), args.text(4), handler);
  return status == ENUM_ASSOCIATOR_NAMES_UNSUPPORTED ? status : finish(handler, status);
}

std::int32_t enum_references(const Provider_Entry&, const Arguments& args) {
  const Instance_Handler handler = args.handler(4);
  const std::int32_t status =
      args.provider()->enum_references(args.instance(1), args.instance(2), args.text(3), handler);
  return status == ENUM_REFERENCES_UNSUPPORTED ? status : finish(handler, status);
}

std::int32_t enum_associators(const Provider_Entry&, const Arguments& args) {
  const Instance_Handler handler = args.handler(5);
  const std::int32_t status = args.provider()->enum_associators(
      args.instance(1), args.text(2), args.text(3), args.text(4), handler);
  return status == ENUM_ASSOCIATORS_UNSUPPORTED ? status : finish(handler, status);
}

constexpr Steps plain_steps() {
  Steps steps{};
  steps[OPERATION_GET_META_CLASS] = get_meta_class;
  steps[OPERATION_CREATE_PROVIDER] = create_provider;
  steps[OPERATION_DESTROY_PROVIDER] = destroy_provider;
  steps[OPERATION_LOAD] = load;
  steps[OPERATION_UNLOAD] = unload;
  steps[OPERATION_GET_INSTANCE] = get_instance;
  steps[OPERATION_ENUM_INSTANCES] = enum_instances;
  steps[OPERATION_CREATE_INSTANCE] = create_instance;
  steps[OPERATION_DELETE_INSTANCE] = delete_instance;
  steps[OPERATION_MODIFY_INSTANCE] = modify_instance;
  steps[OPERATION_GET_REPOSITORY] = get_repository;
  return steps;
}

constexpr Steps method_steps() {
  Steps steps = plain_steps();
  steps[OPERATION_INVOKE_METHOD] = invoke_method;
  return steps;
}

constexpr Steps association_steps() {
  Steps steps = plain_steps();
  steps[OPERATION_ENUM_ASSOCIATOR_NAMES] = enum_associator_names;
  steps[OPERATION_ENUM_REFERENCES] = enum_references;
  steps[OPERATION_ENUM_ASSOCIATORS] = enum_associators;
  return steps;
}

std::int32_t dispatch(const Steps& steps, const Registration* registration, std::uint32_t operation,
                      const std::array<void*, NUM_ARGUMENTS>& values) {
  if (operation >= NUM_OPERATIONS || !steps[operation]) return NO_OPERATION;
  if (!values[0] && operation != OPERATION_DESTROY_PROVIDER) return NO_OPERATION;
  return steps[operation](static_cast<const Provider_Entry&>(*registration), Arguments(values));
}

constexpr Steps PLAIN = plain_steps();
constexpr Steps WITH_METHODS = method_steps();
constexpr Steps ASSOCIATION = association_steps();

}  // namespace

std::int32_t plain_proc(const Registration* registration, std::uint32_t operation, void* arg0,
                        void* arg1, void* arg2, void* arg3, void* arg4, void* arg5, void* arg6,
                        void* arg7) {
  return dispatch(PLAIN, registration, operation, {arg0, arg1, arg2, arg3, arg4, arg5, arg6, arg7});
}

std::int32_t method_proc(const Registration* registration, std::uint32_t operation, void* arg0,
                         void* arg1, void* arg2, void* arg3, void* arg4, void* arg5, void* arg6,
                         void* arg7) {
  return dispatch(WITH_METHODS, registration, operation,
                  {arg0, arg1, arg2, arg3, arg4, arg5, arg6, arg7});
}

std::int32_t association_proc(const Registration* registration, std::uint32_t operation, void* arg0,
                              void* arg1, void* arg2, void* arg3, void* arg4, void* arg5,
                              void* arg6, void* arg7) {
  return dispatch(ASSOCIATION, registration, operation,
                  {arg0, arg1, arg2, arg3, arg4, arg5, arg6, arg7});
}

}  // namespace cimrt

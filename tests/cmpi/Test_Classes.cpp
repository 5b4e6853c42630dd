#include "Test_Classes.h"

#include <string>

#include "runtime/Instance.h"

namespace cimrt::test {

namespace {

// Everything here is made once and stays to the end of the program, as generated data does.
std::deque<std::string>& names() {
  static std::deque<std::string> all;
  return all;
}
std::deque<std::vector<const Meta_Feature*>>& feature_lists() {
  static std::deque<std::vector<const Meta_Feature*>> all;
  return all;
}
std::deque<std::vector<std::uint8_t>>& local_lists() {
  static std::deque<std::vector<std::uint8_t>> all;
  return all;
}

const char* keep(const std::string& name) {
  return names().emplace_back(name).c_str();
}

template <class T>
T& make() {
  static std::deque<T> all;
  return all.emplace_back();
}

void set_head(Meta_Feature& feature, const char* name, std::uint32_t flags) {
  feature.refs = 0;
  feature.flags = flags;
  feature.name = keep(name);
  feature.meta_qualifiers = nullptr;
  feature.num_meta_qualifiers = 0;
}

}  // namespace

Record_Builder::Record_Builder(const Meta_Record* super)
    : _features(feature_lists().emplace_back()),
      _end(super ? super->size : static_cast<std::uint32_t>(sizeof(Instance))),
      _super(super) {
  if (super)
    _features.assign(super->meta_features, super->meta_features + super->num_meta_features);
}

std::uint32_t Record_Builder::place(std::size_t value_width, bool null_flag) {
  const auto width = static_cast<std::uint32_t>(value_width);
  const std::uint32_t start = (_end + width - 1) / width * width;
  _end = start + width * (null_flag ? 2 : 1);
  return start;
}

Record_Builder& Record_Builder::property(const char* name, Type type, std::uint32_t flags) {
  auto& feature = make<Meta_Property>();
  set_head(feature, name, FLAG_PROPERTY | FLAG_READ | flags);
  const bool array = (type & ARRAY_BIT) != 0;
  feature.type = static_cast<std::uint16_t>(type & ~ARRAY_BIT);
  feature.subscript = array ? -1 : 0;
  feature.offset = place(array ? sizeof(void*) : type_size_table[feature.type], true);
  feature.value = nullptr;
  _features.push_back(&feature);
  return *this;
}

Record_Builder& Record_Builder::reference(const char* name, const Meta_Class* target,
                                          std::uint32_t flags, bool array) {
  auto& feature = make<Meta_Reference>();
  set_head(feature, name, FLAG_REFERENCE | FLAG_READ | flags);
  feature.subscript = array ? -1 : 0;
  feature.meta_class = target;
  feature.offset = place(sizeof(void*), array);
  _features.push_back(&feature);
  return *this;
}

Record_Builder& Record_Builder::method(const Meta_Method* method) {
  _features.push_back(method);
  return *this;
}

void Record_Builder::finish(Meta_Record& record, const char* name, std::uint32_t flags) {
  set_head(record, name, flags);
  record.meta_features = _features.data();
  record.num_meta_features = _features.size();
  record.size = (_end + 7) / 8 * 8;
}

const Meta_Class* Record_Builder::build_class(const char* name, std::uint32_t flags) {
  auto& made = make<Meta_Class>();
  finish(made, name, flags);
  auto& locals = local_lists().emplace_back(_features.size(), 1);
  if (_super)
    for (std::size_t i = 0; i < _super->num_meta_features; ++i) locals[i] = 0;
  made.locals = locals.data();
  made.super_meta_class =
      _super ? static_cast<const Meta_Class*>(_super) : &Instance::static_meta_class;
  made.num_keys = 0;
  for (const Meta_Feature* feature : _features)
    if ((feature->flags & FLAG_KEY) != 0) ++made.num_keys;
  made.meta_repository = nullptr;
  return &made;
}

const Meta_Method* Record_Builder::build_method(const char* name, Type return_type,
                                                std::uint32_t flags) {
  property("return_value", return_type, FLAG_OUT);
  auto& made = make<Meta_Method>();
  finish(made, name, FLAG_METHOD | flags);
  made.return_type = static_cast<std::uint16_t>(return_type);
  return &made;
}

const char* short_name(Type scalar) {
  return type_name_table[scalar];
}

const std::vector<Type>& scalar_types() {
  static const std::vector<Type> types = {BOOLEAN, UINT8,  SINT8,  UINT16,  SINT16,
                                          UINT32,  SINT32, UINT64, SINT64,  REAL32,
                                          REAL64,  CHAR16, STRING, DATETIME};
  return types;
}

namespace {

std::string named(const char* prefix, Type scalar) {
  return std::string(prefix) + short_name(scalar);
}

const Meta_Method* build_run(const Meta_Class* part) {
  Record_Builder run;
  for (const Type type : scalar_types()) {
    run.property(named("I", type).c_str(), type, FLAG_IN);
    run.property(named("O", type).c_str(), type, FLAG_OUT);
  }
  run.property("INames", STRING_ARRAY, FLAG_IN);
  run.property("ONames", STRING_ARRAY, FLAG_OUT);
  run.property("Both", UINT32, FLAG_IN | FLAG_OUT);
  run.reference("IPart", part, FLAG_IN);
  run.reference("OPart", part, FLAG_OUT);
  run.reference("IEmbedded", part, FLAG_IN | FLAG_EMBEDDED_INSTANCE);
  run.reference("OEmbedded", part, FLAG_OUT | FLAG_EMBEDDED_INSTANCE);
  run.reference("IParts", part, FLAG_IN, true);
  run.reference("OParts", part, FLAG_OUT, true);
  return run.build_method("Run", UINT32);
}

const Meta_Class* build_all(const Test_Classes& made) {
  Record_Builder all;
  all.property("Id", STRING, FLAG_KEY);
  for (const Type type : scalar_types()) all.property(named("V", type).c_str(), type);
  for (const Type type : scalar_types())
    all.property(named("A", type).c_str(), static_cast<Type>(type | ARRAY_BIT));
  all.reference("VEmbedded", made.part, FLAG_EMBEDDED_INSTANCE);
  all.reference("AEmbedded", made.part, FLAG_EMBEDDED_OBJECT, true);
  all.reference("VReference", made.part);
  all.reference("AReference", made.part, 0, true);
  all.method(made.run).method(made.ping);
  return all.build_class("TEST_All");
}

const Meta_Class* build_keys() {
  Record_Builder keys;
  for (const Type type : scalar_types()) keys.property(named("K", type).c_str(), type, FLAG_KEY);
  return keys.property("Note", STRING).build_class("TEST_Keys");
}

Test_Classes build() {
  Test_Classes made = {};
  made.element = Record_Builder()
                     .property("Id", STRING, FLAG_KEY)
                     .property("Caption", STRING)
                     .build_class("TEST_Element");
  made.part = Record_Builder(made.element).property("Size", UINT32).build_class("TEST_Part");
  made.spare = Record_Builder(made.element).build_class("TEST_Spare");
  made.keys = build_keys();
  made.run = build_run(made.part);
  made.ping = Record_Builder().build_method("Ping", UINT32, FLAG_STATIC);
  made.all = build_all(made);
  made.link = Record_Builder()
                  .reference("Antecedent", made.element, FLAG_KEY)
                  .reference("Dependent", made.part, FLAG_KEY)
                  .property("Note", STRING)
                  .build_class("TEST_Link", FLAG_ASSOCIATION);
  made.triple = Record_Builder()
                    .reference("First", made.element, FLAG_KEY)
                    .reference("Second", made.element, FLAG_KEY)
                    .reference("Third", made.element, FLAG_KEY)
                    .build_class("TEST_Triple", FLAG_ASSOCIATION);
  made.peer = Record_Builder()
                  .reference("Left", made.part, FLAG_KEY)
                  .reference("Right", made.part, FLAG_KEY)
                  .build_class("TEST_Peer", FLAG_ASSOCIATION);
  made.tie = Record_Builder()
                 .reference("Owner", made.keys, FLAG_KEY)
                 .property("Slot", UINT16, FLAG_KEY)
                 .property("Place", SINT8, FLAG_KEY)
                 .build_class("TEST_Tie", FLAG_ASSOCIATION);
  made.odd = Record_Builder()
                 .property("Id", STRING, FLAG_KEY)
                 .method(Record_Builder().build_method("Test_ODD", UINT32))
                 .build_class("TEST_Odd");
  return made;
}

const Meta_Repository* enter(const Test_Classes& made) {
  static const std::vector<const Meta_Class*> classes = {
      made.element, made.part,   made.spare, made.keys, made.all,
      made.link,    made.triple, made.peer,  made.tie,  made.odd};
  static const Meta_Repository repository = {classes.data(), classes.size()};
  for (const Meta_Class* each : classes)
    const_cast<Meta_Class*>(each)->meta_repository = &repository;
  return &repository;
}

}  // namespace

const Test_Classes& Test_Classes::get() {
  static const Test_Classes classes = [] {
    Test_Classes made = build();
    made.repository = enter(made);
    return made;
  }();
  return classes;
}

}  // namespace cimrt::test

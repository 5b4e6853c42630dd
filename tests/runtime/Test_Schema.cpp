// Descriptions of the test classes, as constant data.
#include "Test_Schema.h"

#include <cstddef>

// Records derive from the header of every instance, so their members lie in two classes; the
// offsets are well defined all the same.
#pragma GCC diagnostic ignored "-Winvalid-offsetof"

namespace cimrt::test {
namespace {

constexpr Meta_Property property(const char* name, Type type, std::size_t offset,
                                 std::uint32_t flags = 0, const Meta_Value* value = nullptr) {
  const bool is_array = (type & ARRAY_BIT) != 0;
  return {{0, FLAG_PROPERTY | FLAG_READ | flags, name, nullptr, 0},
          static_cast<std::uint16_t>(type & ~ARRAY_BIT),
          static_cast<std::int16_t>(is_array ? -1 : 0),
          static_cast<std::uint32_t>(offset),
          value};
}

constexpr Meta_Reference reference(const char* name, const Meta_Class* meta_class,
                                   std::size_t offset, std::uint32_t flags = 0,
                                   std::int16_t subscript = 0) {
  return {{0, FLAG_REFERENCE | FLAG_READ | flags, name, nullptr, 0},
          subscript,
          meta_class,
          static_cast<std::uint32_t>(offset)};
}

template <std::size_t N>
constexpr Meta_Class describe(const char* name, std::uint32_t flags,
                              const Meta_Feature* const (&features)[N],
                              const std::uint8_t (&locals)[N], std::size_t size,
                              std::uint64_t num_keys, const Meta_Class* super = nullptr) {
  return {{{0, flags, name, nullptr, 0}, features, N, static_cast<std::uint32_t>(size)},
          locals,
          super,
          num_keys,
          &repository};
}

constexpr std::uint16_t default_uint16 = 7;
constexpr std::uint16_t default_uint16s[] = {1, 2, 3};
constexpr const char* default_texts[] = {"a", "b"};
constexpr const char* default_whens[] = {"00000001020304.000005:000"};
constexpr Meta_Value id_value = {"all", 1};
constexpr Meta_Value uint16_value = {&default_uint16, 1};
constexpr Meta_Value when_value = {"00000001020304.000005:000", 1};
constexpr Meta_Value uint16s_value = {default_uint16s, 3};
constexpr Meta_Value texts_value = {default_texts, 2};
constexpr Meta_Value whens_value = {default_whens, 1};

// Parameters of Reset.
constinit const Meta_Property reset_mode =
    property("Mode", UINT16, offsetof(T_Device_Reset, Mode), FLAG_IN);
constinit const Meta_Property reset_answer =
    property("Answer", STRING, offsetof(T_Device_Reset, Answer), FLAG_OUT);
constinit const Meta_Reference reset_target =
    reference("Target", &T_Device::static_meta_class, offsetof(T_Device_Reset, Target), FLAG_IN);
constinit const Meta_Property reset_return =
    property("return_value", UINT32, offsetof(T_Device_Reset, return_value), FLAG_OUT);
constinit const Meta_Feature* const reset_features[] = {&reset_mode, &reset_answer, &reset_target,
                                                        &reset_return};

// T_Device.
constinit const Meta_Property device_name =
    property("Name", STRING, offsetof(T_Device, Name), FLAG_KEY);
constinit const Meta_Property device_number =
    property("Number", UINT32, offsetof(T_Device, Number), FLAG_KEY);
constinit const Meta_Property device_caption =
    property("Caption", STRING, offsetof(T_Device, Caption));
constinit const Meta_Property device_speed = property("Speed", UINT64, offsetof(T_Device, Speed));
constinit const Meta_Feature* const device_features[] = {&device_name, &device_number,
                                                         &device_caption, &device_speed,
                                                         &T_Device_Reset::static_meta_method};
constexpr std::uint8_t device_locals[] = {1, 1, 1, 1, 1};

// T_Port.
constinit const Meta_Property port_kind = property("Kind", UINT16, offsetof(T_Port, Kind));
constinit const Meta_Feature* const port_features[] = {&device_name,
                                                       &device_number,
                                                       &device_caption,
                                                       &device_speed,
                                                       &T_Device_Reset::static_meta_method,
                                                       &port_kind};
constexpr std::uint8_t port_locals[] = {0, 0, 0, 0, 0, 1};

// T_Other.
constinit const Meta_Property other_number =
    property("number", UINT32, offsetof(T_Other, number), FLAG_KEY);
constinit const Meta_Property other_filler = property("Filler", UINT8, offsetof(T_Other, Filler));
constinit const Meta_Property other_name =
    property("name", STRING, offsetof(T_Other, name), FLAG_KEY);
constinit const Meta_Feature* const other_features[] = {&other_number, &other_filler, &other_name};
constexpr std::uint8_t other_locals[] = {1, 1, 1};

// T_Wide.
constinit const Meta_Property wide_name =
    property("Name", STRING, offsetof(T_Wide, Name), FLAG_KEY);
constinit const Meta_Property wide_number =
    property("Number", UINT32, offsetof(T_Wide, Number), FLAG_KEY);
constinit const Meta_Property wide_extra =
    property("Extra", UINT8, offsetof(T_Wide, Extra), FLAG_KEY);
constinit const Meta_Feature* const wide_features[] = {&wide_name, &wide_number, &wide_extra};
constexpr std::uint8_t wide_locals[] = {1, 1, 1};

// T_Narrow.
constinit const Meta_Property narrow_name =
    property("Name", STRING, offsetof(T_Narrow, Name), FLAG_KEY);
constinit const Meta_Property narrow_number =
    property("Number", UINT16, offsetof(T_Narrow, Number), FLAG_KEY);
constinit const Meta_Feature* const narrow_features[] = {&narrow_name, &narrow_number};
constexpr std::uint8_t narrow_locals[] = {1, 1};

// T_Link.
constinit const Meta_Reference link_antecedent =
    reference("Antecedent", &T_Device::static_meta_class, offsetof(T_Link, Antecedent), FLAG_KEY);
constinit const Meta_Reference link_dependent =
    reference("Dependent", &T_Device::static_meta_class, offsetof(T_Link, Dependent), FLAG_KEY);
constinit const Meta_Property link_weight = property("Weight", UINT16, offsetof(T_Link, Weight));
constinit const Meta_Feature* const link_features[] = {&link_antecedent, &link_dependent,
                                                       &link_weight};
constexpr std::uint8_t link_locals[] = {1, 1, 1};

// T_Port_Link.
constinit const Meta_Reference port_link_antecedent = reference(
    "Antecedent", &T_Device::static_meta_class, offsetof(T_Port_Link, Antecedent), FLAG_KEY);
constinit const Meta_Reference port_link_dependent =
    reference("Dependent", &T_Port::static_meta_class, offsetof(T_Port_Link, Dependent), FLAG_KEY);
constinit const Meta_Feature* const port_link_features[] = {&port_link_antecedent,
                                                            &port_link_dependent};
constexpr std::uint8_t port_link_locals[] = {1, 1};

// T_Meta_Link.
constinit const Meta_Reference meta_link_link =
    reference("Link", &T_Link::static_meta_class, offsetof(T_Meta_Link, Link), FLAG_KEY);
constinit const Meta_Feature* const meta_link_features[] = {&meta_link_link};
constexpr std::uint8_t meta_link_locals[] = {1};

// T_Group.
constinit const Meta_Property group_id = property("Id", STRING, offsetof(T_Group, Id), FLAG_KEY);
constinit const Meta_Reference group_members =
    reference("Members", &T_Device::static_meta_class, offsetof(T_Group, Members), 0, -1);
constinit const Meta_Reference group_leader =
    reference("Leader", &T_Device::static_meta_class, offsetof(T_Group, Leader));
constinit const Meta_Reference group_embedded = reference(
    "Embedded", &T_Device::static_meta_class, offsetof(T_Group, Embedded), FLAG_EMBEDDED_INSTANCE);
constinit const Meta_Feature* const group_features[] = {&group_id, &group_members, &group_leader,
                                                        &group_embedded};
constexpr std::uint8_t group_locals[] = {1, 1, 1, 1};

// T_Timed.
constinit const Meta_Property timed_stamp =
    property("Stamp", DATETIME, offsetof(T_Timed, Stamp), FLAG_KEY);
constinit const Meta_Property timed_ratio =
    property("Ratio", REAL64, offsetof(T_Timed, Ratio), FLAG_KEY);
constinit const Meta_Property timed_flag =
    property("Flag", BOOLEAN, offsetof(T_Timed, Flag), FLAG_KEY);
constinit const Meta_Property timed_letter =
    property("Letter", CHAR16, offsetof(T_Timed, Letter), FLAG_KEY);
constinit const Meta_Feature* const timed_features[] = {&timed_stamp, &timed_ratio, &timed_flag,
                                                        &timed_letter};
constexpr std::uint8_t timed_locals[] = {1, 1, 1, 1};

// T_All.
constinit const Meta_Property all_id =
    property("Id", STRING, offsetof(T_All, Id), FLAG_KEY, &id_value);
constinit const Meta_Property all_boolean = property("Boolean", BOOLEAN, offsetof(T_All, Boolean));
constinit const Meta_Property all_uint8 = property("Uint8", UINT8, offsetof(T_All, Uint8));
constinit const Meta_Property all_sint8 = property("Sint8", SINT8, offsetof(T_All, Sint8));
constinit const Meta_Property all_uint16 =
    property("Uint16", UINT16, offsetof(T_All, Uint16), 0, &uint16_value);
constinit const Meta_Property all_sint16 = property("Sint16", SINT16, offsetof(T_All, Sint16));
constinit const Meta_Property all_uint32 = property("Uint32", UINT32, offsetof(T_All, Uint32));
constinit const Meta_Property all_sint32 = property("Sint32", SINT32, offsetof(T_All, Sint32));
constinit const Meta_Property all_uint64 = property("Uint64", UINT64, offsetof(T_All, Uint64));
constinit const Meta_Property all_sint64 = property("Sint64", SINT64, offsetof(T_All, Sint64));
constinit const Meta_Property all_real32 = property("Real32", REAL32, offsetof(T_All, Real32));
constinit const Meta_Property all_real64 = property("Real64", REAL64, offsetof(T_All, Real64));
constinit const Meta_Property all_char16 = property("Char16", CHAR16, offsetof(T_All, Char16));
constinit const Meta_Property all_text = property("Text", STRING, offsetof(T_All, Text));
constinit const Meta_Property all_when =
    property("When", DATETIME, offsetof(T_All, When), 0, &when_value);
constinit const Meta_Property all_booleans =
    property("Booleans", BOOLEAN_ARRAY, offsetof(T_All, Booleans));
constinit const Meta_Property all_uint8s = property("Uint8s", UINT8_ARRAY, offsetof(T_All, Uint8s));
constinit const Meta_Property all_sint8s = property("Sint8s", SINT8_ARRAY, offsetof(T_All, Sint8s));
constinit const Meta_Property all_uint16s =
    property("Uint16s", UINT16_ARRAY, offsetof(T_All, Uint16s), 0, &uint16s_value);
constinit const Meta_Property all_sint16s =
    property("Sint16s", SINT16_ARRAY, offsetof(T_All, Sint16s));
constinit const Meta_Property all_uint32s =
    property("Uint32s", UINT32_ARRAY, offsetof(T_All, Uint32s));
constinit const Meta_Property all_sint32s =
    property("Sint32s", SINT32_ARRAY, offsetof(T_All, Sint32s));
constinit const Meta_Property all_uint64s =
    property("Uint64s", UINT64_ARRAY, offsetof(T_All, Uint64s));
constinit const Meta_Property all_sint64s =
    property("Sint64s", SINT64_ARRAY, offsetof(T_All, Sint64s));
constinit const Meta_Property all_real32s =
    property("Real32s", REAL32_ARRAY, offsetof(T_All, Real32s));
constinit const Meta_Property all_real64s =
    property("Real64s", REAL64_ARRAY, offsetof(T_All, Real64s));
constinit const Meta_Property all_char16s =
    property("Char16s", CHAR16_ARRAY, offsetof(T_All, Char16s));
constinit const Meta_Property all_texts =
    property("Texts", STRING_ARRAY, offsetof(T_All, Texts), 0, &texts_value);
constinit const Meta_Property all_whens =
    property("Whens", DATETIME_ARRAY, offsetof(T_All, Whens), 0, &whens_value);
constinit const Meta_Feature* const all_features[] = {
    &all_id,      &all_boolean, &all_uint8,   &all_sint8,    &all_uint16,  &all_sint16,
    &all_uint32,  &all_sint32,  &all_uint64,  &all_sint64,   &all_real32,  &all_real64,
    &all_char16,  &all_text,    &all_when,    &all_booleans, &all_uint8s,  &all_sint8s,
    &all_uint16s, &all_sint16s, &all_uint32s, &all_sint32s,  &all_uint64s, &all_sint64s,
    &all_real32s, &all_real64s, &all_char16s, &all_texts,    &all_whens};
constexpr std::uint8_t all_locals[] = {1, 1, 1, 1, 1, 1, 1, 1, 1, 1, 1, 1, 1, 1, 1,
                                       1, 1, 1, 1, 1, 1, 1, 1, 1, 1, 1, 1, 1, 1};

// T_Integers.
constinit const Meta_Property integers_uint8 =
    property("Uint8", UINT8, offsetof(T_Integers, Uint8), FLAG_KEY);
constinit const Meta_Property integers_sint16 =
    property("Sint16", SINT16, offsetof(T_Integers, Sint16), FLAG_KEY);
constinit const Meta_Property integers_uint64 =
    property("Uint64", UINT64, offsetof(T_Integers, Uint64), FLAG_KEY);
constinit const Meta_Property integers_sint64 =
    property("Sint64", SINT64, offsetof(T_Integers, Sint64), FLAG_KEY);
constinit const Meta_Property integers_flag =
    property("Flag", BOOLEAN, offsetof(T_Integers, Flag), FLAG_KEY);
constinit const Meta_Feature* const integers_features[] = {
    &integers_uint8, &integers_sint16, &integers_uint64, &integers_sint64, &integers_flag};
constexpr std::uint8_t integers_locals[] = {1, 1, 1, 1, 1};

// T_Real_Key.
constinit const Meta_Property real_key_ratio =
    property("Ratio", REAL32, offsetof(T_Real_Key, Ratio), FLAG_KEY);
constinit const Meta_Feature* const real_key_features[] = {&real_key_ratio};
constexpr std::uint8_t real_key_locals[] = {1};

// T_Array_Key.
constinit const Meta_Property array_key_numbers =
    property("Numbers", UINT32_ARRAY, offsetof(T_Array_Key, Numbers), FLAG_KEY);
constinit const Meta_Feature* const array_key_features[] = {&array_key_numbers};
constexpr std::uint8_t array_key_locals[] = {1};

// T_Layout.
constinit const Meta_Property layout_a = property("A", UINT16, offsetof(T_Layout, A));
constinit const Meta_Property layout_b = property("B", UINT16, offsetof(T_Layout, B));
constinit const Meta_Property layout_c = property("C", STRING, offsetof(T_Layout, C));
constinit const Meta_Property layout_d = property("D", UINT32, offsetof(T_Layout, D));
constinit const Meta_Feature* const layout_features[] = {&layout_a, &layout_b, &layout_c,
                                                         &layout_d};
constexpr std::uint8_t layout_locals[] = {1, 1, 1, 1};

// T_Empty.

constinit const Meta_Class* const classes[] = {
    &T_Device::static_meta_class,    &T_Port::static_meta_class,
    &T_Other::static_meta_class,     &T_Wide::static_meta_class,
    &T_Narrow::static_meta_class,    &T_Link::static_meta_class,
    &T_Port_Link::static_meta_class, &T_Meta_Link::static_meta_class,
    &T_Group::static_meta_class,     &T_Timed::static_meta_class,
    &T_All::static_meta_class,       &T_Integers::static_meta_class,
    &T_Real_Key::static_meta_class,  &T_Array_Key::static_meta_class,
    &T_Layout::static_meta_class,    &T_Empty::static_meta_class};

}  // namespace

constinit const Meta_Method T_Device_Reset::static_meta_method = {
    {{0, FLAG_METHOD, "Reset", nullptr, 0}, reset_features, 4, sizeof(T_Device_Reset)}, UINT32};

constinit const Meta_Class T_Device::static_meta_class =
    describe("T_Device", FLAG_CLASS, device_features, device_locals, sizeof(T_Device), 2);

constinit const Meta_Class T_Port::static_meta_class =
    describe("T_Port", FLAG_CLASS, port_features, port_locals, sizeof(T_Port), 2,
             &T_Device::static_meta_class);

constinit const Meta_Class T_Other::static_meta_class =
    describe("T_Other", FLAG_CLASS, other_features, other_locals, sizeof(T_Other), 2);

constinit const Meta_Class T_Wide::static_meta_class =
    describe("T_Wide", FLAG_CLASS, wide_features, wide_locals, sizeof(T_Wide), 3);

constinit const Meta_Class T_Narrow::static_meta_class =
    describe("T_Narrow", FLAG_CLASS, narrow_features, narrow_locals, sizeof(T_Narrow), 2);

constinit const Meta_Class T_Link::static_meta_class =
    describe("T_Link", FLAG_ASSOCIATION, link_features, link_locals, sizeof(T_Link), 2);

constinit const Meta_Class T_Port_Link::static_meta_class = describe(
    "T_Port_Link", FLAG_ASSOCIATION, port_link_features, port_link_locals, sizeof(T_Port_Link), 2);

constinit const Meta_Class T_Meta_Link::static_meta_class = describe(
    "T_Meta_Link", FLAG_ASSOCIATION, meta_link_features, meta_link_locals, sizeof(T_Meta_Link), 1);

constinit const Meta_Class T_Group::static_meta_class =
    describe("T_Group", FLAG_CLASS, group_features, group_locals, sizeof(T_Group), 1);

constinit const Meta_Class T_Timed::static_meta_class =
    describe("T_Timed", FLAG_CLASS, timed_features, timed_locals, sizeof(T_Timed), 4);

constinit const Meta_Class T_All::static_meta_class =
    describe("T_All", FLAG_CLASS, all_features, all_locals, sizeof(T_All), 1);

constinit const Meta_Class T_Integers::static_meta_class =
    describe("T_Integers", FLAG_CLASS, integers_features, integers_locals, sizeof(T_Integers), 5);

constinit const Meta_Class T_Real_Key::static_meta_class =
    describe("T_Real_Key", FLAG_CLASS, real_key_features, real_key_locals, sizeof(T_Real_Key), 1);

constinit const Meta_Class T_Array_Key::static_meta_class = describe(
    "T_Array_Key", FLAG_CLASS, array_key_features, array_key_locals, sizeof(T_Array_Key), 1);

constinit const Meta_Class T_Layout::static_meta_class =
    describe("T_Layout", FLAG_CLASS, layout_features, layout_locals, sizeof(T_Layout), 0);

constinit const Meta_Class T_Empty::static_meta_class = {
    {{0, FLAG_CLASS, "T_Empty", nullptr, 0}, nullptr, 0, sizeof(T_Empty)},
    nullptr,
    nullptr,
    0,
    &repository};

constinit const Meta_Repository repository = {classes, sizeof classes / sizeof classes[0]};

}  // namespace cimrt::test

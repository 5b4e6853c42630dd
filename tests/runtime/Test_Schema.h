// A small set of classes with hand-written descriptions, for the tests and benchmarks of the
// runtime.
#pragma once

#include "runtime/Instance.h"

namespace cimrt::test {

/// Two keys, two plain properties and a method.
struct T_Device : Instance {
  Property<String> Name;           // key
  Property<std::uint32_t> Number;  // key
  Property<String> Caption;
  Property<std::uint64_t> Speed;
  static const Meta_Class static_meta_class;
};

/// Subclass of T_Device.
struct T_Port : Instance {
  Property<String> Name;           // key, inherited
  Property<std::uint32_t> Number;  // key, inherited
  Property<String> Caption;        // inherited
  Property<std::uint64_t> Speed;   // inherited
  Property<std::uint16_t> Kind;
  static const Meta_Class static_meta_class;
};

/// The keys of T_Device in another order, spelt in another case, in an unrelated class.
struct T_Other : Instance {
  Property<std::uint32_t> number;  // key
  Property<std::uint8_t> Filler;
  Property<String> name;  // key
  static const Meta_Class static_meta_class;
};

/// The keys of T_Device and one more.
struct T_Wide : Instance {
  Property<String> Name;           // key
  Property<std::uint32_t> Number;  // key
  Property<std::uint8_t> Extra;    // key
  static const Meta_Class static_meta_class;
};

/// The keys of T_Device, one of another width.
struct T_Narrow : Instance {
  Property<String> Name;           // key
  Property<std::uint16_t> Number;  // key
  static const Meta_Class static_meta_class;
};

/// Association between two devices.
struct T_Link : Instance {
  T_Device* Antecedent;  // key
  T_Device* Dependent;   // key
  Property<std::uint16_t> Weight;
  static const Meta_Class static_meta_class;
};

/// Association with the keys of T_Link; its Dependent is a T_Port.
struct T_Port_Link : Instance {
  T_Device* Antecedent;  // key
  T_Port* Dependent;     // key
  static const Meta_Class static_meta_class;
};

/// Association whose key names another association.
struct T_Meta_Link : Instance {
  T_Link* Link;  // key
  static const Meta_Class static_meta_class;
};

/// Holds an array of references, a scalar reference that is no key, and an embedded instance.
struct T_Group : Instance {
  Property<String> Id;  // key
  Property<Array<Instance*>> Members;
  T_Device* Leader;
  T_Device* Embedded;
  static const Meta_Class static_meta_class;
};

/// Keys of the types that compare in their own way.
struct T_Timed : Instance {
  Property<Datetime> Stamp;   // key
  Property<double> Ratio;     // key
  Property<bool> Flag;        // key
  Property<char16_t> Letter;  // key
  static const Meta_Class static_meta_class;
};

/// One property of each type, scalar and array; some have defaults.
struct T_All : Instance {
  Property<String> Id;  // key, default "all"
  Property<bool> Boolean;
  Property<std::uint8_t> Uint8;
  Property<std::int8_t> Sint8;
  Property<std::uint16_t> Uint16;  // default 7
  Property<std::int16_t> Sint16;
  Property<std::uint32_t> Uint32;
  Property<std::int32_t> Sint32;
  Property<std::uint64_t> Uint64;
  Property<std::int64_t> Sint64;
  Property<float> Real32;
  Property<double> Real64;
  Property<char16_t> Char16;
  Property<String> Text;
  Property<Datetime> When;  // default one day, 2:03:04.000005
  Property<Array<bool>> Booleans;
  Property<Array<std::uint8_t>> Uint8s;
  Property<Array<std::int8_t>> Sint8s;
  Property<Array<std::uint16_t>> Uint16s;  // default 1, 2, 3
  Property<Array<std::int16_t>> Sint16s;
  Property<Array<std::uint32_t>> Uint32s;
  Property<Array<std::int32_t>> Sint32s;
  Property<Array<std::uint64_t>> Uint64s;
  Property<Array<std::int64_t>> Sint64s;
  Property<Array<float>> Real32s;
  Property<Array<double>> Real64s;
  Property<Array<char16_t>> Char16s;
  Property<Array<String>> Texts;    // default "a", "b"
  Property<Array<Datetime>> Whens;  // default one text
  static const Meta_Class static_meta_class;
};

/// Integer keys of every width and a boolean one.
struct T_Integers : Instance {
  Property<std::uint8_t> Uint8;    // key
  Property<std::int16_t> Sint16;   // key
  Property<std::uint64_t> Uint64;  // key
  Property<std::int64_t> Sint64;   // key
  Property<bool> Flag;             // key
  static const Meta_Class static_meta_class;
};

struct T_Real_Key : Instance {
  Property<float> Ratio;  // key
  static const Meta_Class static_meta_class;
};

struct T_Array_Key : Instance {
  Property<Array<std::uint32_t>> Numbers;  // key
  static const Meta_Class static_meta_class;
};

/// uint16, uint16, string, uint32.
struct T_Layout : Instance {
  Property<std::uint16_t> A;
  Property<std::uint16_t> B;
  Property<String> C;
  Property<std::uint32_t> D;
  static const Meta_Class static_meta_class;
};

struct T_Empty : Instance {
  static const Meta_Class static_meta_class;
};

/// Parameters of T_Device's method Reset.
struct T_Device_Reset : Instance {
  Property<std::uint16_t> Mode;  // in
  Property<String> Answer;       // out
  T_Device* Target;              // in
  Property<std::uint32_t> return_value;
  static const Meta_Method static_meta_method;
};

extern const Meta_Repository repository;

/// A counted new instance.
template <class T>
Ref<T> make(bool defaults = true) {
  return Ref<T>(static_cast<T*>(create(&T::static_meta_class, defaults)));
}

/// A device, or another class with the keys Name and Number, with these keys set.
template <class T = T_Device>
Ref<T> make_device(const char* name, std::uint32_t number) {
  Ref<T> device = make<T>();
  device->Name.set(name);
  device->Number.set(static_cast<decltype(device->Number.value)>(number));
  return device;
}

/// A link of class `T` between two devices, which it takes over.
template <class T = T_Link, class A, class D>
Ref<T> make_link(Ref<A> antecedent, Ref<D> dependent) {
  Ref<T> link = make<T>();
  link->Antecedent = antecedent.release();
  link->Dependent = dependent.release();
  return link;
}

}  // namespace cimrt::test

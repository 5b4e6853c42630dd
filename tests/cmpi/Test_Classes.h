// Class descriptions made by hand, laid out as the generated ones are.
#pragma once

#include <deque>
#include <vector>

#include "runtime/Meta_Class.h"

namespace cimrt::test {

/// Features of one class or method with their places in the record. Lives as long as the program.
class Record_Builder {
 public:
  explicit Record_Builder(const Meta_Record* super = nullptr);

  /// `type` may be an array type.
  Record_Builder& property(const char* name, Type type, std::uint32_t flags = 0);
  /// A reference, or with an embedded flag an embedded instance; `array` for a list of them.
  Record_Builder& reference(const char* name, const Meta_Class* target, std::uint32_t flags = 0,
                            bool array = false);
  Record_Builder& method(const Meta_Method* method);

  const Meta_Class* build_class(const char* name, std::uint32_t flags = FLAG_CLASS);
  const Meta_Method* build_method(const char* name, Type return_type, std::uint32_t flags = 0);

 private:
  std::uint32_t place(std::size_t value_width, bool null_flag);
  void finish(Meta_Record& record, const char* name, std::uint32_t flags);

  std::vector<const Meta_Feature*>& _features;
  std::uint32_t _end;
  const Meta_Record* _super;
};

/// The test schema. All classes lie in one repository.
struct Test_Classes {
  const Meta_Repository* repository;

  const Meta_Class* element;  ///< TEST_Element: key string Id, string Caption
  const Meta_Class* part;     ///< TEST_Part, an element: uint32 Size
  const Meta_Class* spare;    ///< TEST_Spare, an element
  const Meta_Class* keys;     ///< TEST_Keys: one key of every type that a key can have
  /// TEST_All: key string Id; every scalar as V<type>, every array as A<type>; an embedded part
  /// VEmbedded, a list of them AEmbedded, a reference VReference, a list AReference.
  const Meta_Class* all;
  const Meta_Class* link;  ///< TEST_Link: keys Antecedent (element), Dependent (part); string Note
  const Meta_Class* triple;  ///< TEST_Triple: keys First, Second, Third (elements)
  const Meta_Class* peer;    ///< TEST_Peer: keys Left, Right (parts)
  const Meta_Class* tie;     ///< TEST_Tie: keys Owner (keys), Slot uint16, Place sint8
  const Meta_Class* odd;     ///< TEST_Odd: key string Id; a method of the class's own name
  const Meta_Method* run;  ///< TEST_All.Run: every scalar In as I<type>, Out as O<type>, more below
  const Meta_Method* ping;  ///< TEST_All.Ping: static, no parameters

  static const Test_Classes& get();
};

/// Name of a scalar type as the test schema uses it: "boolean", "uint8", ...
const char* short_name(Type scalar);

/// All scalar types from boolean to datetime.
const std::vector<Type>& scalar_types();

}  // namespace cimrt::test

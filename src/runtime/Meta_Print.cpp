// MOF-like dump of class descriptions, for debugging.
#include <cstdio>

#include "runtime/Thread_Context.h"
#include "runtime/Value.h"

namespace cimrt {
namespace {

constexpr std::uint32_t FIRST_SHOWN_BIT = 4;

enum class Role { CLASS, MEMBER, PARAMETER };

/// Writes "[" before the first item of a bracket, ", " before the others, and "]" at the end.
class Bracket {
 public:
  Bracket(const char* indent) : _indent(indent) {}
  Bracket(const Bracket&) = delete;
  Bracket& operator=(const Bracket&) = delete;
  ~Bracket() {
    if (_open) std::printf("]\n");
  }
  void item() {
    if (_open) {
      std::printf(", ");
    } else {
      std::printf("%s[", _indent);
    }
    _open = true;
  }

 private:
  const char* _indent;
  bool _open = false;
};

void print_flag(Bracket& bracket, const char* name, bool is_false) {
  bracket.item();
  std::printf(is_false ? "%s(False)" : "%s", name);
}

void print_flags(Bracket& bracket, const Meta_Feature* feature, Role role) {
  for (std::uint32_t bit = FIRST_SHOWN_BIT; bit < 32; ++bit) {
    const std::uint32_t flag = 1u << bit;
    const bool is_set = (feature->flags & flag) != 0;
    const char* name = flag_names[bit];
    if (flag == FLAG_READ) {
      if (!is_set && role == Role::MEMBER && is_property(feature)) print_flag(bracket, name, true);
    } else if (flag == FLAG_IN) {
      if (role == Role::PARAMETER) print_flag(bracket, name, !is_set);
    } else if (is_set) {
      print_flag(bracket, name, false);
    }
  }
}

bool is_flag_name(const char* name) {
  for (const char* flag : flag_names)
    if (name_eq(flag, name)) return true;
  return false;
}

/// One value of constant data: texts stand as they are, the rest as an instance stores it.
void print_constant(Type type, const void* data) {
  if (type == STRING || type == DATETIME) {
    const String text(static_cast<const char*>(data));
    write_scalar(stdout, STRING, &text);
  } else {
    write_scalar(stdout, type, data);
  }
}

void print_value(Type type, bool is_array, const Meta_Value* value) {
  if (!is_array) {
    print_constant(type, value->data);
    return;
  }
  const auto* texts = static_cast<const char* const*>(value->data);
  std::printf("{ ");
  for (std::uint64_t i = 0; i < value->size; ++i) {
    if (i != 0) std::printf(", ");
    const bool is_text = type == STRING || type == DATETIME;
    print_constant(type, is_text
                             ? texts[i]
                             : static_cast<const char*>(value->data) + i * type_size_table[type]);
  }
  std::printf("}");
}

void print_qualifier(Bracket& bracket, const Meta_Qualifier* qualifier) {
  bracket.item();
  std::printf("%s", qualifier->name);
  if (!qualifier->value) return;
  std::printf("(");
  print_value(static_cast<Type>(qualifier->type), qualifier->subscript != 0, qualifier->value);
  std::printf(")");
}

void print_head(const Meta_Feature* feature, Role role, bool print_qualifiers, const char* indent) {
  Bracket bracket(indent);
  print_flags(bracket, feature, role);
  for (std::uint64_t i = 0; print_qualifiers && i < feature->num_meta_qualifiers; ++i)
    if (!is_flag_name(feature->meta_qualifiers[i]->name))
      print_qualifier(bracket, feature->meta_qualifiers[i]);
}

void print_subscript(std::int16_t subscript) {
  if (subscript < 0) std::printf("[]");
  if (subscript > 0) std::printf("[%d]", int{subscript});
}

/// Type, name and subscript of a property or reference, without what ends the line.
void print_declaration(const Meta_Feature* feature) {
  if (is_property(feature)) {
    const Meta_Property* mp = as_property(feature);
    std::printf("%s %s", type_name_table[mp->type], mp->name);
    print_subscript(mp->subscript);
  } else {
    const Meta_Reference* mr = as_reference(feature);
    std::printf("%s REF %s", mr->meta_class->name, mr->name);
    print_subscript(mr->subscript);
  }
}

void print_member(const Meta_Feature* feature, bool print_qualifiers) {
  print_head(feature, Role::MEMBER, print_qualifiers, "    ");
  std::printf("    ");
  print_declaration(feature);
  if (is_property(feature) && as_property(feature)->value) {
    const Meta_Property* mp = as_property(feature);
    std::printf(" = ");
    print_value(static_cast<Type>(mp->type), mp->subscript != 0, mp->value);
  }
  std::printf(";\n");
}

void print_method(const Meta_Method* mm, bool print_qualifiers) {
  CIMRT_ASSERT(mm->num_meta_features > 0);
  print_head(mm, Role::MEMBER, print_qualifiers, "    ");
  std::printf("    %s %s(\n", type_name_table[mm->return_type], mm->name);
  const std::uint64_t parameters = mm->num_meta_features - 1;
  for (std::uint64_t i = 0; i < parameters; ++i) {
    print_head(mm->meta_features[i], Role::PARAMETER, print_qualifiers, "        ");
    std::printf("        ");
    print_declaration(mm->meta_features[i]);
    std::printf(i + 1 < parameters ? ",\n" : "\n");
  }
  std::printf("    );\n");
}

}  // namespace

void print(const Meta_Class* meta_class, bool print_qualifiers) {
  print_head(meta_class, Role::CLASS, print_qualifiers, "");
  if (meta_class->super_meta_class) {
    std::printf("class %s : %s\n", meta_class->name, meta_class->super_meta_class->name);
  } else {
    std::printf("class %s\n", meta_class->name);
  }
  std::printf("{\n");
  for (std::uint64_t i = 0; i < meta_class->num_meta_features; ++i) {
    const Meta_Feature* f = meta_class->meta_features[i];
    if (is_method(f)) {
      print_method(as_method(f), print_qualifiers);
    } else {
      print_member(f, print_qualifiers);
    }
  }
  std::printf("};\n");
}

}  // namespace cimrt

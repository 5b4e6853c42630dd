// MOF-like dump of instances, for debugging.
#include "runtime/Instance.h"
#include "runtime/Key_Features.h"
#include "runtime/Value.h"

namespace cimrt {
namespace {

constexpr char16_t FIRST_PRINTABLE = 32;
constexpr char16_t LAST_PRINTABLE = 126;

void indent(std::FILE* stream, int level) {
  for (int i = 0; i < level; ++i) std::fputs("    ", stream);
}

void print_char16(std::FILE* stream, char16_t c) {
  if (c >= FIRST_PRINTABLE && c <= LAST_PRINTABLE) {
    std::fprintf(stream, "'%c'", static_cast<char>(c));
  } else {
    std::fprintf(stream, "0x%04X", unsigned{c});
  }
}

struct Printer {
  std::FILE* stream;
  bool keys_only;

  bool is_shown(const Meta_Feature* f, int level) const {
    if (is_method(f)) return false;
    if (is_key(f)) return true;
    if (keys_only) return false;
    return level <= 1 || (f->flags & (FLAG_EMBEDDED_OBJECT | FLAG_EMBEDDED_INSTANCE)) != 0;
  }

  void property(const Instance* instance, const Meta_Property* mp, int level) const {
    indent(stream, level);
    std::fprintf(stream, "%s %s%s = ", type_name_table[mp->type], mp->name,
                 mp->subscript != 0 ? "[]" : "");
    const auto type = static_cast<Type>(mp->type);
    if (*null_flag(instance, mp) != 0) {
      std::fputs("NULL", stream);
    } else if (mp->subscript != 0) {
      print_array(stream, type, *static_cast<const Array_Base*>(storage(instance, mp)));
    } else {
      print_scalar(stream, type, storage(instance, mp));
    }
    std::fputs(";\n", stream);
  }

  void block(const Instance* instance, int level) const {
    indent(stream, level);
    std::fputs("{\n", stream);
    body(instance, level + 1);
    indent(stream, level);
    std::fputs("}\n", stream);
  }

  void null_reference(const Meta_Reference* mr, int level) const {
    indent(stream, level);
    std::fprintf(stream, "%s %s%s = NULL;\n", mr->meta_class->name, mr->name,
                 mr->subscript != 0 ? "[]" : "");
  }

  void target(const Instance* instance, const Meta_Reference* mr, int level) const {
    indent(stream, level);
    std::fprintf(stream, "%s %s =\n", instance->meta_class->name, mr->name);
    block(instance, level);
  }

  void reference(const Instance* instance, const Meta_Reference* mr, int level) const {
    if (is_null(instance, mr)) {
      null_reference(mr, level);
    } else if (mr->subscript == 0) {
      target(target_of(instance, mr), mr, level);
    } else {
      for (const Instance* element : targets_of(instance, mr))
        if (element) target(element, mr, level);
    }
  }

  void body(const Instance* instance, int level) const {
    if (!instance->__name_space.empty()) {
      indent(stream, level - 1);
      std::fprintf(stream, "    string __name_space = \"%s\";\n", instance->__name_space.c_str());
    }
    const Meta_Record* record = instance->meta_class;
    for (std::uint64_t i = 0; i < record->num_meta_features; ++i) {
      const Meta_Feature* f = record->meta_features[i];
      if (!is_shown(f, level)) continue;
      if (is_property(f)) {
        property(instance, as_property(f), level);
      } else {
        reference(instance, as_reference(f), level);
      }
    }
  }
};

}  // namespace

void print_scalar(std::FILE* stream, Type type, const void* value) {
  if (type == CHAR16) {
    print_char16(stream, *static_cast<const char16_t*>(value));
  } else {
    write_scalar(stream, type, value);
  }
}

void print_array(std::FILE* stream, Type type, const Array_Base& array) {
  std::fputs("{ ", stream);
  for (std::size_t i = 0; i < array.size(); ++i) {
    if (i != 0) std::fputs(", ", stream);
    print_scalar(stream, type, array.element(i));
  }
  std::fputs("}", stream);
}

void print(std::FILE* stream, const Instance* instance, bool keys_only) {
  std::fprintf(stream, "%s\n", instance->meta_class->name);
  Printer{stream, keys_only}.block(instance, 0);
}

}  // namespace cimrt

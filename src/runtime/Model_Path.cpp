// Model paths: class name and keys as one text, and back.
//   Class.Name=value,Name="text",Name="Class.Name=\"text\""
#include <bit>
#include <cctype>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>

#include "runtime/Conversions.h"
#include "runtime/Instance.h"
#include "runtime/Key_Features.h"

namespace cimrt {
namespace {

template <class T>
const T& at(const void* p) {
  return *static_cast<const T*>(p);
}

// Writing.

void append_real(std::string& text, double value) {
  const std::unique_ptr<char, void (*)(void*)> block(format_alloc("%f", value), std::free);
  if (block) text += block.get();
}

void append_unsigned(std::string& text, std::uint64_t value) {
  char buffer[NUMBER_TEXT_SIZE];
  std::size_t size = 0;
  text += uint64_to_str(buffer, value, size);
}

void append_signed(std::string& text, std::int64_t value) {
  char buffer[NUMBER_TEXT_SIZE];
  std::size_t size = 0;
  text += sint64_to_str(buffer, value, size);
}

void append_datetime(std::string& text, const Datetime& value) {
  char buffer[Datetime::ASCII_SIZE];
  value.ascii(buffer, false);
  text += buffer;
}

void append_scalar(std::string& text, std::uint16_t type, const void* p) {
  switch (type) {
    case BOOLEAN:
      text += at<std::uint8_t>(p) != 0 ? "true" : "false";
      break;
    case UINT8:
      return append_unsigned(text, at<std::uint8_t>(p));
    case SINT8:
      return append_signed(text, at<std::int8_t>(p));
    case UINT16:
      return append_unsigned(text, at<std::uint16_t>(p));
    case SINT16:
      return append_signed(text, at<std::int16_t>(p));
    case UINT32:
      return append_unsigned(text, at<std::uint32_t>(p));
    case SINT32:
      return append_signed(text, at<std::int32_t>(p));
    case UINT64:
      return append_unsigned(text, at<std::uint64_t>(p));
    case SINT64:
      return append_signed(text, at<std::int64_t>(p));
    case REAL32:
      return append_real(text, static_cast<double>(at<float>(p)));
    case REAL64:
      return append_real(text, at<double>(p));
    case CHAR16:
      text += {'\'', static_cast<char>(at<char16_t>(p)), '\''};
      break;
    case STRING:
      text.append("\"").append(at<String>(p).view()).append("\"");
      break;
    default:
      append_datetime(text, at<Datetime>(p));
      break;
  }
}

bool append_path(std::string& text, const Instance* instance);

/// A path as a value: double quotes around it and a backslash before each one in it.
bool append_quoted_path(std::string& text, const Instance* target) {
  std::string path;
  if (!append_path(path, target)) return false;
  text += '"';
  for (const char c : path) {
    if (c == '"') text += '\\';
    text += c;
  }
  text += '"';
  return true;
}

bool append_value(std::string& text, const Instance* instance, const Meta_Feature* key) {
  if (is_null(instance, key)) return false;
  if (is_scalar_reference(key)) return append_quoted_path(text, target_of(instance, key));
  if (is_reference(key) || as_property(key)->subscript != 0) return false;
  append_scalar(text, as_property(key)->type, storage(instance, key));
  return true;
}

bool append_path(std::string& text, const Instance* instance) {
  const Meta_Class* mc = class_of(instance);
  if (!mc || mc->num_keys == 0) return false;
  text += mc->name;
  char separator = '.';
  for (std::uint64_t i = 0; i < mc->num_meta_features; ++i) {
    const Meta_Feature* f = mc->meta_features[i];
    if (!is_key(f) || is_method(f)) continue;
    text.append(1, separator).append(f->name).append("=");
    if (!append_value(text, instance, f)) return false;
    separator = ',';
  }
  return true;
}

// Reading.

bool is_identifier_start(char c) {
  return std::isalpha(static_cast<unsigned char>(c)) || c == '_';
}

bool is_identifier_part(char c) {
  return std::isalnum(static_cast<unsigned char>(c)) || c == '_';
}

/// Reads one path, front to back. Every reader leaves the position behind what it read, or answers
/// false.
class Path_Reader {
 public:
  explicit Path_Reader(const char* path) : _p(path) {}

  Instance* read(const Meta_Class* scope) {
    std::string name;
    if (!identifier(name)) return nullptr;
    const Meta_Class* mc = find_dependent(scope, name.c_str());
    if (!mc || *_p++ != '.') return nullptr;
    Ref<Instance> instance(create(mc, false));
    nullify_non_keys(instance.get());
    std::uint64_t pairs = 0;
    for (; *_p != '\0'; ++pairs)
      if (!pair(instance.get())) return nullptr;
    return pairs == mc->num_keys ? instance.release() : nullptr;
  }

 private:
  bool identifier(std::string& name) {
    const char* start = _p;
    if (!is_identifier_start(*_p)) return false;
    while (is_identifier_part(*_p)) ++_p;
    name.assign(start, _p);
    return true;
  }

  bool at_end_of_value() const { return *_p == '\0' || *_p == ','; }

  bool pair(Instance* instance) {
    std::string name;
    if (!identifier(name) || *_p++ != '=') return false;
    const Meta_Feature* f = find_feature(instance->meta_class, name.c_str(), ANY_FEATURE);
    if (!f || !is_key(f) || !value(instance, f) || !at_end_of_value()) return false;
    if (*_p == ',') ++_p;
    return true;
  }

  bool value(Instance* instance, const Meta_Feature* f) {
    if (is_scalar_reference(f)) return reference(instance, as_reference(f));
    if (!is_property(f) || as_property(f)->subscript != 0) return false;
    void* to = storage(instance, f);
    switch (as_property(f)->type) {
      case BOOLEAN:
        return boolean(to);
      case UINT8:
      case SINT8:
      case UINT16:
      case SINT16:
      case UINT32:
      case SINT32:
      case UINT64:
      case SINT64:
        return integer(to, type_size_table[as_property(f)->type]);
      case STRING:
        return string(*static_cast<String*>(to));
      default:
        return false;
    }
  }

  bool boolean(void* to) {
    const std::string text(_p, std::strcspn(_p, ","));
    bool value = false;
    if (str_to_boolean(text.c_str(), value) != 0) return false;
    std::memcpy(to, &value, sizeof value);
    _p += text.size();
    return true;
  }

  /// Decimal, or else hexadecimal; stored in the low bytes that the type has.
  bool integer(void* to, std::size_t width) {
    const char* start = _p;
    for (const int base : {10, 16}) {
      char* end = nullptr;
      const long long value = std::strtoll(start, &end, base);
      if (end == start || (*end != '\0' && *end != ',')) continue;
      static_assert(std::endian::native == std::endian::little);
      std::memcpy(to, &value, width);
      _p = end;
      return true;
    }
    return false;
  }

  /// Text between double quotes; only a backslash and a double quote may be escaped.
  bool quoted(std::string& text) {
    if (*_p++ != '"') return false;
    for (; *_p != '"'; ++_p) {
      if (*_p == '\\') {
        ++_p;
        if (*_p != '\\' && *_p != '"') return false;
      }
      if (*_p == '\0') return false;
      text += *_p;
    }
    ++_p;
    return true;
  }

  bool string(String& to) {
    std::string text;
    if (!quoted(text)) return false;
    to.assign(text.data(), text.size());
    return true;
  }

  /// A target of another class than the reference's is refused: its record may be smaller than what
  /// users of the reference read.
  bool reference(Instance* instance, const Meta_Reference* mr) {
    std::string path;
    if (!quoted(path)) return false;
    Ref<Instance> target(model_path_to_instance(mr->meta_class, path.c_str()));
    if (!target || !is_subclass(mr->meta_class, class_of(target.get()))) return false;
    set_reference(target_of(instance, mr), target.release());
    return true;
  }

  const char* _p;
};

}  // namespace

int instance_to_model_path(const Instance* instance, String& text) {
  std::string path;
  if (!append_path(path, instance)) return -1;
  text.assign(path.data(), path.size());
  return 0;
}

Instance* model_path_to_instance(const Meta_Class* meta_class, const char* path) {
  return path ? Path_Reader(path).read(meta_class) : nullptr;
}

}  // namespace cimrt

#include "Object_Text.h"

#include <cstdlib>
#include <memory>
#include <stdexcept>

#include "Test_Classes.h"
#include "runtime/Value.h"

namespace cimrt::test {

namespace {

[[noreturn]] void refuse(const std::string& what, std::string_view text) {
  throw std::logic_error(what + ": " + std::string(text));
}

/// Reads an object, front to back.
class Reader {
 public:
  explicit Reader(std::string_view text) : _text(text) {}

  Ref<Instance> object() {
    std::string name_space;
    std::string name = until(":(");
    if (next() == ':') {
      name_space = name;
      name = until("(");
      next();
    }
    Ref<Instance> made = empty_instance(name);
    made->__name_space = name_space.c_str();
    while (!_text.empty() && _text.front() != ')') {
      feature(made.get());
      if (_text.starts_with(", ")) _text.remove_prefix(2);
    }
    next();
    return made;
  }

  void feature(Instance* instance) {
    const std::string name = until("=");
    next();
    const Meta_Feature* found =
        find_feature(instance->meta_class, name.c_str(), FLAG_PROPERTY | FLAG_REFERENCE);
    if (!found) refuse("no such feature", name);
    Value value;
    read(feature_type(found), value);
    if (value.set(instance, found) != 0) refuse("a value that does not fit", name);
    if (std::uint8_t* flag = null_flag(instance, found)) *flag = 0;
  }

 private:
  static Ref<Instance> empty_instance(const std::string& class_name) {
    const Meta_Class* found = find_meta_class(Test_Classes::get().repository, class_name.c_str());
    if (!found) refuse("no such class", class_name);
    Ref<Instance> made(create(found, false));
    empty(made.get());
    return made;
  }

  void read(Type type, Value& value) {
    switch (type) {
      case INSTANCE:
        value.set(object().release());
        break;
      case STRING:
        value.set(String(until(",)").c_str()));
        break;
      case STRING_ARRAY:
        texts(value);
        break;
      case INSTANCE_ARRAY:
        instances(value);
        break;
      case DATETIME:
        value.set(Datetime(until(",)").c_str()));
        break;
      case REAL32:
        value.set(std::strtof(until(",)").c_str(), nullptr));
        break;
      case REAL64:
        value.set(std::strtod(until(",)").c_str(), nullptr));
        break;
      default:
        integer(type, value);
    }
  }

  /// Reads "{one, two}" with `read` for each element.
  template <class Read>
  void elements(Read&& read) {
    next();
    while (!_text.empty() && _text.front() != '}') {
      read();
      if (_text.starts_with(", ")) _text.remove_prefix(2);
    }
    next();
  }

  void texts(Value& value) {
    Array<String> list;
    elements([&] { list.append(String(until(",}").c_str())); });
    value.set(list);
  }

  void instances(Value& value) {
    Array<Instance*> list;
    elements([&] {
      const bool null = _text.starts_with("null");
      if (null) _text.remove_prefix(4);
      list.append(null ? nullptr : object().release());
    });
    value.set(list);
  }

  void integer(Type type, Value& value) {
    const std::string text = until(",)");
    const std::uint64_t bits = std::strtoull(text.c_str(), nullptr, 10);
    switch (type) {
      case UINT8:
        return value.set(static_cast<std::uint8_t>(bits));
      case SINT8:
        return value.set(static_cast<std::int8_t>(bits));
      case UINT16:
        return value.set(static_cast<std::uint16_t>(bits));
      case SINT16:
        return value.set(static_cast<std::int16_t>(bits));
      case UINT32:
        return value.set(static_cast<std::uint32_t>(bits));
      case SINT32:
        return value.set(static_cast<std::int32_t>(bits));
      case UINT64:
        return value.set(bits);
      case SINT64:
        return value.set(static_cast<std::int64_t>(bits));
      case BOOLEAN:
        return value.set(text == std::string("true"));
      case CHAR16:
        return value.set(static_cast<char16_t>(bits));
      default:
        refuse("no values of this type", text);
    }
  }

  std::string until(const char* ends) {
    const std::size_t length = std::min(_text.find_first_of(ends), _text.size());
    const std::string part(_text.substr(0, length));
    _text.remove_prefix(length);
    return part;
  }

  char next() {
    if (_text.empty()) refuse("a text that ends early", _text);
    const char c = _text.front();
    _text.remove_prefix(1);
    return c;
  }

  std::string_view _text;
};

template <class Write>
std::string written(Write&& write) {
  char* text = nullptr;
  std::size_t size = 0;
  std::FILE* stream = open_memstream(&text, &size);
  write(stream);
  std::fclose(stream);
  const std::unique_ptr<char, void (*)(void*)> owned(text, std::free);
  return text;
}

bool is_null_here(const Instance* instance, const Meta_Feature* feature) {
  if (const std::uint8_t* flag = null_flag(instance, feature)) return *flag != 0;
  return *static_cast<Instance* const*>(storage(instance, feature)) == nullptr;
}

std::string describe_list(const Array<Instance*>& list) {
  std::string text;
  for (const Instance* each : list)
    text += (text.empty() ? "" : ", ") + (each ? describe(each) : std::string("null"));
  return "{" + text + "}";
}

std::string describe_value(const Instance* instance, const Meta_Feature* feature) {
  const void* place = storage(instance, feature);
  const Type type = feature_type(feature);
  if (type == INSTANCE) return describe(*static_cast<Instance* const*>(place));
  if (type == INSTANCE_ARRAY) return describe_list(*static_cast<const Array<Instance*>*>(place));
  if ((type & ARRAY_BIT) == 0)
    return written([&](std::FILE* stream) { write_scalar(stream, type, place); });
  return "{" + written([&](std::FILE* stream) {
           write_array(stream, static_cast<Type>(type & ~ARRAY_BIT),
                       *static_cast<const Array_Base*>(place));
         }) +
         "}";
}

}  // namespace

void empty(Instance* instance) {
  nullify_properties(instance, true, true, true);
  const Meta_Record* record = instance->meta_class;
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i)
    if (std::uint8_t* flag = null_flag(instance, record->meta_features[i])) *flag = 1;
}

Ref<Instance> object_of(std::string_view text) {
  return Reader(text).object();
}

void assign(Instance* instance, std::string_view text) {
  Reader(text).feature(instance);
}

std::string describe(const Instance* instance) {
  std::string features;
  const Meta_Record* record = instance->meta_class;
  for (std::uint64_t i = 0; i < record->num_meta_features; ++i) {
    const Meta_Feature* feature = record->meta_features[i];
    if ((feature->flags & FLAG_METHOD) != 0 || is_null_here(instance, feature)) continue;
    if (!features.empty()) features += ", ";
    features += std::string(feature->name) + "=" + describe_value(instance, feature);
  }
  return std::string(record->name) + "(" + features + ")";
}

}  // namespace cimrt::test

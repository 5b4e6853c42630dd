#include "Play.h"

#include <cctype>
#include <new>
#include <stdexcept>
#include <string_view>

#include "Object_Text.h"
#include "Test_Classes.h"
#include "cmpi/cimom.h"

namespace cimrt::test {

namespace {

constexpr const char* NAME_SPACE = "root/test";

/// An exception that nothing derives from and that derives from nothing.
struct Odd_Object {
  int value;
};

/// What the steps of one call work on; members that the operation does not have are null.
struct Stage {
  Note note;
  const Instance* model = nullptr;
  Instance* changed = nullptr;
  Instance** out = nullptr;
  const Instance_Handler* handler = nullptr;
};

void give(const Stage& stage, Ref<Instance> object) {
  if (stage.handler)
    stage.note(stage.handler->handle(object.release()) ? "wanted" : "no more");
  else if (stage.out)
    *stage.out = object.release();
  else
    throw std::logic_error("nobody takes an instance here");
}

// Calls of the server.

void up_get(const Stage& stage, const std::string& object) {
  const Ref<Instance> found = cimom::get_instance(NAME_SPACE, object_of(object).get());
  stage.note("got " + (found ? describe(found.get()) : std::string("nothing")));
}

void up_list(const Stage& stage, const std::string& object) {
  Instance_Enumerator all;
  stage.note("list " +
             std::to_string(cimom::enum_instances(NAME_SPACE, object_of(object).get(), all)));
  for (; all.more(); all.next()) stage.note("item " + describe(all.get().get()));
}

void up_change(const Stage& stage, int (*call)(const char*, const Instance*),
               const std::string& object) {
  stage.note("changed " + std::to_string(call(NAME_SPACE, object_of(object).get())));
}

/// Calls TEST_All.Run of the object, or without one of nothing at all.
void up_invoke(const Stage& stage, const std::string& object) {
  const Ref<Instance> record(create(Test_Classes::get().run));
  empty(record.get());
  const Ref<Instance> target = object.empty() ? Ref<Instance>() : object_of(object);
  const int answer = cimom::invoke_method(NAME_SPACE, target.get(), record.get());
  stage.note("invoked " + std::to_string(answer) + " " + describe(record.get()));
}

void up_user(const Stage& stage, const std::string&) {
  String name;
  stage.note(cimom::get_username(name) ? "user " + std::string(name.c_str()) : "no user");
}

void up(const Stage& stage, const std::string& rest) {
  const std::size_t end = rest.find(' ');
  const std::string call = rest.substr(0, end);
  const std::string object = end == std::string::npos ? "" : rest.substr(end + 1);
  if (call == "get") return up_get(stage, object);
  if (call == "list") return up_list(stage, object);
  if (call == "create") return up_change(stage, &cimom::create_instance, object);
  if (call == "modify") return up_change(stage, &cimom::modify_instance, object);
  if (call == "delete") return up_change(stage, &cimom::delete_instance, object);
  if (call == "invoke") return up_invoke(stage, object);
  if (call == "user") return up_user(stage, object);
  throw std::logic_error("no such call: " + call);
}

// Steps.

void step(const Stage& stage, const std::string& verb, const std::string& rest) {
  if (verb == "deliver" || verb == "out") return give(stage, object_of(rest));
  if (verb == "echo") return give(stage, Ref<Instance>(clone(stage.model)));
  if (verb == "set") return assign(stage.changed, rest);
  if (verb == "up") return up(stage, rest);
  if (verb == "keep") return cimom::allow_unload(rest == "no");
  if (verb == "break") throw_kind(rest);
  throw std::logic_error("no such step: " + verb);
}

bool is_number(const std::string& text) {
  return !text.empty() && (text[0] == '-' || std::isdigit(static_cast<unsigned char>(text[0])));
}

std::int32_t follow(std::string_view steps, const Stage& stage) {
  while (!steps.empty()) {
    const std::size_t end = std::min(steps.find("; "), steps.size());
    const std::string one(steps.substr(0, end));
    steps.remove_prefix(std::min(end + 2, steps.size()));
    if (is_number(one)) return std::stoi(one);
    const std::size_t space = one.find(' ');
    step(stage, one.substr(0, space), space == std::string::npos ? "" : one.substr(space + 1));
  }
  return 0;
}

std::string filter_text(const String& a, const String& b, const String& c) {
  return std::string(" ") + a.c_str() + "/" + b.c_str() + "/" + c.c_str();
}

void play_instances(Script& script, std::uint32_t operation, const std::string& steps, Note note) {
  switch (operation) {
    case OPERATION_GET_INSTANCE:
      script.get = [=](const Instance* model, Instance*& out) {
        note("get " + describe(model));
        return follow(steps, {.note = note, .model = model, .out = &out});
      };
      break;
    case OPERATION_ENUM_INSTANCES:
      script.enumerate = [=](const Instance* model, const Instance_Handler& handler) {
        note("enumerate " + describe(model));
        return follow(steps, {.note = note, .model = model, .handler = &handler});
      };
      break;
    case OPERATION_CREATE_INSTANCE:
      script.create = [=](Instance* instance) {
        note("create " + describe(instance));
        return follow(steps, {.note = note, .model = instance, .changed = instance});
      };
      break;
    case OPERATION_DELETE_INSTANCE:
      script.erase = [=](const Instance* model) {
        note("delete " + describe(model));
        return follow(steps, {.note = note, .model = model});
      };
      break;
    case OPERATION_MODIFY_INSTANCE:
      script.modify = [=](const Instance* model, const Instance* instance) {
        note("modify " + describe(model) + " by " + describe(instance));
        return follow(steps, {.note = note, .model = model});
      };
      break;
    default:
      script.invoke = [=](const Instance* instance, Instance* record) {
        note("invoke " + describe(instance) + " " + describe(record));
        return follow(steps, {.note = note, .model = instance, .changed = record});
      };
  }
}

void play_walks(Script& script, std::uint32_t operation, const std::string& steps, Note note) {
  const auto walk = [=](const char* name) {
    return [=](const Instance* source, const String& result_class, const String& role,
               const String& result_role, const Instance_Handler& handler) {
      note(name + describe(source) + filter_text(result_class, role, result_role));
      return follow(steps, {.note = note, .model = source, .handler = &handler});
    };
  };
  if (operation == OPERATION_ENUM_ASSOCIATOR_NAMES)
    script.associator_names = walk("names ");
  else if (operation == OPERATION_ENUM_ASSOCIATORS)
    script.associators = walk("associators ");
  else
    script.references = [=](const Instance* source, const Instance* model, const String& role,
                            const Instance_Handler& handler) {
      note("references " + describe(source) + " " + describe(model) + " " + role.c_str());
      return follow(steps, {.note = note, .model = source, .handler = &handler});
    };
}

void play_life(Script& script, std::uint32_t operation, const std::string& steps, Note note) {
  const auto act = [=] { return follow(steps, {.note = note}); };
  if (operation == OPERATION_CREATE_PROVIDER)
    script.on_create = act;
  else if (operation == OPERATION_LOAD)
    script.on_load = act;
  else if (operation == OPERATION_UNLOAD)
    script.on_unload = act;
  else
    script.enable = [=](Instance_Proc proc, void* client_data) {
      const Instance_Handler handler = {proc, client_data};
      return follow(steps, {.note = note, .handler = &handler});
    };
}

}  // namespace

void play(Script& script, std::uint32_t operation, const std::string& steps, Note note) {
  switch (operation) {
    case OPERATION_CREATE_PROVIDER:
    case OPERATION_LOAD:
    case OPERATION_UNLOAD:
    case OPERATION_ENABLE_INDICATIONS:
      return play_life(script, operation, steps, note);
    case OPERATION_ENUM_ASSOCIATOR_NAMES:
    case OPERATION_ENUM_REFERENCES:
    case OPERATION_ENUM_ASSOCIATORS:
      return play_walks(script, operation, steps, note);
    case OPERATION_DISABLE_INDICATIONS:
      script.statuses[operation] = follow(steps, {.note = note});
      break;
    default:
      return play_instances(script, operation, steps, note);
  }
}

void throw_kind(const std::string& kind) {
  if (kind == "runtime_error") throw std::runtime_error("broken");
  if (kind == "bad_alloc") throw std::bad_alloc();
  if (kind == "int") throw 5;
  if (kind == "text") throw "broken";
  throw Odd_Object{5};
}

}  // namespace cimrt::test

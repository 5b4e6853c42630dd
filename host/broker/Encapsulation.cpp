// The broker's table of object makers.
#include <fmt/format.h>

#include "broker/Marshal.h"
#include "cim/DateTimeText.h"

namespace tvx::host {
namespace {

CMPIInstance* newInstance(const CMPIBroker* broker, const CMPIObjectPath* path, CMPIStatus* rc) {
  const PathObject* source = PathObject::from(path, "newInstance");
  setStatus(rc, source == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
  return source == nullptr
             ? nullptr
             : makeInstance(Core::of(broker), Instance{source->contents, {}}, Origin::Created);
}

CMPIObjectPath* newObjectPath(const CMPIBroker* broker, const char* nameSpace,
                              const char* className, CMPIStatus* rc) {
  ObjectPath path;
  path.nameSpace = nameSpace == nullptr ? "" : nameSpace;
  path.className = className == nullptr ? "" : className;
  setStatus(rc, CMPI_RC_OK);
  return makePath(Core::of(broker), std::move(path), Origin::Created);
}

CMPIArgs* newArgs(const CMPIBroker* broker, CMPIStatus* rc) {
  setStatus(rc, CMPI_RC_OK);
  return makeArgs(Core::of(broker), {}, Origin::Created);
}

CMPIString* newString(const CMPIBroker* broker, const char* text, CMPIStatus* rc) {
  setStatus(rc, CMPI_RC_OK);
  return makeString(Core::of(broker),
                    text == nullptr ? std::nullopt : std::optional<std::string>(text),
                    Origin::Created);
}

CMPIArray* newArray(const CMPIBroker* broker, CMPICount count, CMPIType type, CMPIStatus* rc) {
  if (type == CMPI_null || (type & CMPI_ARRAY) != 0) {
    setStatus(rc, CMPI_RC_ERR_INVALID_DATA_TYPE);
    return nullptr;
  }
  const CMPIType stored = type == CMPI_chars || type == CMPI_charsptr ? CMPI_string : type;
  setStatus(rc, CMPI_RC_OK);
  return makeArray(Core::of(broker), stored, Value::List(count, Value::null(stored)),
                   Origin::Created);
}

CMPIDateTime* newDateTime(const CMPIBroker* broker, CMPIStatus* rc) {
  timespec now{};
  clock_gettime(CLOCK_REALTIME, &now);
  const auto microseconds = static_cast<std::uint64_t>(now.tv_sec) * 1000000 +
                            static_cast<std::uint64_t>(now.tv_nsec) / 1000;
  setStatus(rc, CMPI_RC_OK);
  return makeDateTime(Core::of(broker), dateTimeText(microseconds, false), Origin::Created);
}

CMPIDateTime* newDateTimeFromBinary(const CMPIBroker* broker, CMPIUint64 microseconds,
                                    CMPIBoolean interval, CMPIStatus* rc) {
  setStatus(rc, CMPI_RC_OK);
  return makeDateTime(Core::of(broker), dateTimeText(microseconds, interval != 0), Origin::Created);
}

CMPIDateTime* newDateTimeFromChars(const CMPIBroker* broker, const char* text, CMPIStatus* rc) {
  if (text == nullptr || !isDateTimeText(text)) {
    setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER);
    return nullptr;
  }
  setStatus(rc, CMPI_RC_OK);
  return makeDateTime(Core::of(broker), text, Origin::Created);
}

CMPISelectExp* newSelectExp(const CMPIBroker* broker, const char* query, const char* language,
                            CMPIArray** projection, CMPIStatus* rc) {
  if (query == nullptr) {
    setStatus(rc, CMPI_RC_ERR_INVALID_QUERY);
    return nullptr;
  }
  if (projection != nullptr) {
    *projection = nullptr;
  }
  setStatus(rc, CMPI_RC_OK);
  return makeSelectExp(Core::of(broker), query, language == nullptr ? "" : language,
                       Origin::Created);
}

CMPIBoolean classPathIsA(const CMPIBroker* broker, const CMPIObjectPath* path,
                         const char* className, CMPIStatus* rc) {
  const PathObject* source = PathObject::from(path, "classPathIsA");
  if (source == nullptr || className == nullptr) {
    setStatus(rc, source == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_ERR_INVALID_PARAMETER);
    return 0;
  }
  setStatus(rc, CMPI_RC_OK);
  const ClassCatalogue* classes = Core::of(broker).options().classes;
  const std::string& name = source->contents.className;
  return (classes == nullptr ? sameName(name, className) : classes->isA(name, className)) ? 1 : 0;
}

/// Any object starts with its handle, whatever it is.
Tracked* anyObject(const void* object) {
  return object == nullptr ? nullptr
                           : static_cast<Tracked*>(static_cast<const CMPIString*>(object)->hdl);
}

std::string describe(const void* object, ObjectKind kind) {
  switch (kind) {
    case ObjectKind::ObjectPath:
      return printPath(
          PathObject::from(static_cast<const CMPIObjectPath*>(object), "toString")->contents);
    case ObjectKind::String:
      return StringObject::from(static_cast<const CMPIString*>(object), "toString")
          ->contents.text.value_or("");
    case ObjectKind::DateTime:
      return DateTimeObject::from(static_cast<const CMPIDateTime*>(object), "toString")->contents;
    case ObjectKind::Instance:
      return "instance of " +
             InstanceObject::from(static_cast<const CMPIInstance*>(object), "toString")
                 ->contents.instance.className();
    default:
      return kindName(kind);
  }
}

CMPIString* toString(const CMPIBroker* broker, const void* object, CMPIStatus* rc) {
  const Tracked* tracked = anyObject(object);
  setStatus(rc, tracked == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
  return tracked == nullptr
             ? nullptr
             : makeString(Core::of(broker), describe(object, tracked->kind()), Origin::Created);
}

CMPIBoolean isOfType(const CMPIBroker*, const void* object, const char* type, CMPIStatus* rc) {
  const Tracked* tracked = anyObject(object);
  setStatus(rc, tracked == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
  return tracked != nullptr && type != nullptr &&
                 std::string_view(kindName(tracked->kind())) == type
             ? 1
             : 0;
}

CMPIString* getType(const CMPIBroker* broker, const void* object, CMPIStatus* rc) {
  const Tracked* tracked = anyObject(object);
  setStatus(rc, tracked == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
  return tracked == nullptr
             ? nullptr
             : makeString(Core::of(broker), kindName(tracked->kind()), Origin::Created);
}

/// There are no message files here: the default text as it stands.
CMPIString* getMessage(const CMPIBroker* broker, const char*, const char* defaultText,
                       CMPIStatus* rc, CMPICount, ...) {
  return newString(broker, defaultText == nullptr ? "" : defaultText, rc);
}

std::string messageText(const char* text, const CMPIString* string) {
  if (text != nullptr) {
    return text;
  }
  const StringObject* object = StringObject::from(string, "logMessage");
  return object == nullptr ? std::string() : object->contents.text.value_or("");
}

CMPIStatus logMessage(const CMPIBroker* broker, int severity, const char* id, const char* text,
                      const CMPIString* string) {
  Core::of(broker).log(
      fmt::format("log {} {}: {}", severity, id == nullptr ? "" : id, messageText(text, string)));
  return status(CMPI_RC_OK);
}

CMPIStatus trace(const CMPIBroker* broker, int level, const char* component, const char* text,
                 const CMPIString* string) {
  Core::of(broker).log(fmt::format("trace {} {}: {}", level, component == nullptr ? "" : component,
                                   messageText(text, string)));
  return status(CMPI_RC_OK);
}

CMPIError* newCMPIError(const CMPIBroker*, const char*, const char*, const char*, int, int, int,
                        CMPIStatus* rc) {
  setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
  return nullptr;
}

}  // namespace

const CMPIBrokerEncFT encapsulationTable = {
    CMPIVersion200,
    newInstance,
    newObjectPath,
    newArgs,
    newString,
    newArray,
    newDateTime,
    newDateTimeFromBinary,
    newDateTimeFromChars,
    newSelectExp,
    classPathIsA,
    toString,
    isOfType,
    getType,
    getMessage,
    logMessage,
    trace,
    newCMPIError,
    nullptr,  // openMessageFile: servers leave the three message file slots null
    nullptr,  // closeMessageFile
    nullptr,  // getMessage2
    nullptr,
    nullptr,
    nullptr,
};

}  // namespace tvx::host

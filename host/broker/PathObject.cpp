// Object paths.
#include <fmt/format.h>

#include "broker/Marshal.h"

namespace tvx::host {
namespace {

/// One text of a path as a string object: a missing one is empty, or without text for servers of
/// version 0.
CMPIString* getText(const CMPIObjectPath* face, const std::string ObjectPath::*member,
                    CMPIStatus* rc) {
  const PathObject* object = PathObject::from(face, "a get function of object paths");
  if (object == nullptr) {
    setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
    return nullptr;
  }
  setStatus(rc, CMPI_RC_OK);
  const std::string& text = object->contents.*member;
  const BrokerOptions& options = object->core().options();
  const bool absent = text.empty() && (options.version == 0 || !options.tellsNameSpace);
  return makeString(object->core(), absent ? std::nullopt : std::optional(text), Origin::HandedOut);
}

CMPIStatus setText(CMPIObjectPath* face, std::string ObjectPath::*member, const char* text) {
  PathObject* object = PathObject::from(face, "a set function of object paths");
  if (object == nullptr) {
    return status(CMPI_RC_ERR_INVALID_HANDLE);
  }
  object->contents.*member = text == nullptr ? "" : text;
  return status(CMPI_RC_OK);
}

CMPIStatus setNameSpace(CMPIObjectPath* face, const char* text) {
  return setText(face, &ObjectPath::nameSpace, text);
}
CMPIString* getNameSpace(const CMPIObjectPath* face, CMPIStatus* rc) {
  return getText(face, &ObjectPath::nameSpace, rc);
}
CMPIStatus setHostname(CMPIObjectPath* face, const char* text) {
  return setText(face, &ObjectPath::host, text);
}
CMPIString* getHostname(const CMPIObjectPath* face, CMPIStatus* rc) {
  return getText(face, &ObjectPath::host, rc);
}
CMPIStatus setClassName(CMPIObjectPath* face, const char* text) {
  return setText(face, &ObjectPath::className, text);
}
CMPIString* getClassName(const CMPIObjectPath* face, CMPIStatus* rc) {
  return getText(face, &ObjectPath::className, rc);
}

/// A careful server refuses a key that does not have its declared type.
CMPIrc checkKey(Core& core, const std::string& className, const char* name, const Value& value) {
  const ClassCatalogue* classes = core.options().classes;
  const ClassData* classData = classes == nullptr ? nullptr : classes->find(className);
  const FeatureData* feature = classData == nullptr ? nullptr : findFeature(*classData, name);
  if (feature == nullptr || core.options().version == 0 || feature->cmpiType == value.type()) {
    return CMPI_RC_OK;
  }
  core.owner().complain(fmt::format("key {}.{} is a {}, the provider set a {}", className, name,
                                    typeName(feature->cmpiType), typeName(value.type())));
  return CMPI_RC_ERR_INVALID_DATA_TYPE;
}

CMPIStatus addKey(CMPIObjectPath* face, const char* name, const CMPIValue* value, CMPIType type) {
  PathObject* object = PathObject::from(face, "addKey");
  if (object == nullptr) {
    return status(CMPI_RC_ERR_INVALID_HANDLE);
  }
  if (name == nullptr) {
    return status(CMPI_RC_ERR_INVALID_PARAMETER);
  }
  std::optional<Value> copy = fromCmpi(value, type);
  if (!copy || copy->isArray()) {
    return status(CMPI_RC_ERR_INVALID_DATA_TYPE);
  }
  const CMPIrc rc = checkKey(object->core(), object->contents.className, name, *copy);
  if (rc == CMPI_RC_OK) {
    object->contents.keys.set(name, std::move(*copy));
  }
  return status(rc);
}

CMPIData marked(CMPIData data) {
  data.state = static_cast<CMPIValueState>(data.state | CMPI_keyValue);
  return data;
}

CMPIData getKey(const CMPIObjectPath* face, const char* name, CMPIStatus* rc) {
  const PathObject* object = PathObject::from(face, "getKey");
  if (object == nullptr) {
    return notFoundData(rc, CMPI_RC_ERR_INVALID_HANDLE);
  }
  CMPIStatus found{};
  const CMPIData data =
      valueNamed(object->core(), object->contents.keys, name, &found, CMPI_RC_ERR_NO_SUCH_PROPERTY);
  setStatus(rc, found.rc);
  return found.rc == CMPI_RC_OK ? marked(data) : data;
}

CMPIData getKeyAt(const CMPIObjectPath* face, CMPICount index, CMPIString** name, CMPIStatus* rc) {
  const PathObject* object = PathObject::from(face, "getKeyAt");
  if (object == nullptr) {
    return notFoundData(rc, CMPI_RC_ERR_INVALID_HANDLE);
  }
  CMPIStatus found{};
  const CMPIData data = valueAt(object->core(), object->contents.keys, index, name, &found,
                                CMPI_RC_ERR_NO_SUCH_PROPERTY);
  setStatus(rc, found.rc);
  return found.rc == CMPI_RC_OK ? marked(data) : data;
}

CMPICount getKeyCount(const CMPIObjectPath* face, CMPIStatus* rc) {
  const PathObject* object = PathObject::from(face, "getKeyCount");
  setStatus(rc, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
  return object == nullptr ? 0 : static_cast<CMPICount>(object->contents.keys.size());
}

CMPIStatus copyPlace(CMPIObjectPath* face, const CMPIObjectPath* source, bool withHost) {
  PathObject* object = PathObject::from(face, "setNameSpaceFromObjectPath");
  const PathObject* other = PathObject::from(source, "setNameSpaceFromObjectPath");
  if (object == nullptr || other == nullptr) {
    return status(CMPI_RC_ERR_INVALID_HANDLE);
  }
  object->contents.nameSpace = other->contents.nameSpace;
  if (withHost) {
    object->contents.host = other->contents.host;
  }
  return status(CMPI_RC_OK);
}

CMPIStatus setNameSpaceFromObjectPath(CMPIObjectPath* face, const CMPIObjectPath* source) {
  return copyPlace(face, source, false);
}
CMPIStatus setHostAndNameSpaceFromObjectPath(CMPIObjectPath* face, const CMPIObjectPath* source) {
  return copyPlace(face, source, true);
}

/// Qualifiers are not kept by this server.
CMPIData noQualifier(const CMPIObjectPath* face, CMPIStatus* rc) {
  return notFoundData(rc, PathObject::from(face, "a qualifier function") == nullptr
                              ? CMPI_RC_ERR_INVALID_HANDLE
                              : CMPI_RC_ERR_NOT_FOUND);
}
CMPIData getClassQualifier(const CMPIObjectPath* face, const char*, CMPIStatus* rc) {
  return noQualifier(face, rc);
}
CMPIData getPropertyQualifier(const CMPIObjectPath* face, const char*, const char*,
                              CMPIStatus* rc) {
  return noQualifier(face, rc);
}
CMPIData getMethodQualifier(const CMPIObjectPath* face, const char*, const char*, CMPIStatus* rc) {
  return noQualifier(face, rc);
}
CMPIData getParameterQualifier(const CMPIObjectPath* face, const char*, const char*, const char*,
                               CMPIStatus* rc) {
  return noQualifier(face, rc);
}

CMPIString* toString(const CMPIObjectPath* face, CMPIStatus* rc) {
  const PathObject* object = PathObject::from(face, "toString");
  setStatus(rc, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
  return object == nullptr
             ? nullptr
             : makeString(object->core(), printPath(object->contents), Origin::Created);
}

}  // namespace

CMPIObjectPath* makePath(Core& core, ObjectPath path, Origin origin) {
  return core
      .adopt(std::make_unique<PathObject>(core, core.tables().objectPath, std::move(path)), origin)
      ->face();
}

const CMPIObjectPathFT objectPathTable = {
    CMPIVersion200,
    releaseObject<PathObject, CMPIObjectPath>,
    cloneObject<PathObject, CMPIObjectPath>,
    setNameSpace,
    getNameSpace,
    setHostname,
    getHostname,
    setClassName,
    getClassName,
    addKey,
    getKey,
    getKeyAt,
    getKeyCount,
    setNameSpaceFromObjectPath,
    setHostAndNameSpaceFromObjectPath,
    getClassQualifier,
    getPropertyQualifier,
    getMethodQualifier,
    getParameterQualifier,
    toString,
};

}  // namespace tvx::host

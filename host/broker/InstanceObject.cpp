// Instances: properties, the filter, and keys that find their way into the path.
#include <fmt/format.h>

#include <algorithm>

#include "broker/Marshal.h"

namespace tvx::host {
namespace {

CMPIData getProperty(const CMPIInstance* face, const char* name, CMPIStatus* rc) {
  const InstanceObject* object = InstanceObject::from(face, "getProperty");
  if (object == nullptr) {
    return notFoundData(rc, CMPI_RC_ERR_INVALID_HANDLE);
  }
  return valueNamed(object->core(), object->contents.instance.properties, name, rc,
                    CMPI_RC_ERR_NO_SUCH_PROPERTY);
}

CMPIData getPropertyAt(const CMPIInstance* face, CMPICount index, CMPIString** name,
                       CMPIStatus* rc) {
  const InstanceObject* object = InstanceObject::from(face, "getPropertyAt");
  if (object == nullptr) {
    return notFoundData(rc, CMPI_RC_ERR_INVALID_HANDLE);
  }
  return valueAt(object->core(), object->contents.instance.properties, index, name, rc,
                 CMPI_RC_ERR_NO_SUCH_PROPERTY);
}

CMPICount getPropertyCount(const CMPIInstance* face, CMPIStatus* rc) {
  const InstanceObject* object = InstanceObject::from(face, "getPropertyCount");
  setStatus(rc, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
  return object == nullptr ? 0
                           : static_cast<CMPICount>(object->contents.instance.properties.size());
}

bool passesFilter(const InstanceContents& contents, std::string_view name) {
  return !contents.filter ||
         std::any_of(contents.filter->begin(), contents.filter->end(),
                     [&](const std::string& each) { return sameName(each, name); });
}

/// Checks a property against its class as a careful server does: an unknown name is noted and let
/// through, a wrong type refused.
CMPIrc checkProperty(Core& core, const std::string& className, const char* name,
                     const Value& value) {
  const ClassCatalogue* classes = core.options().classes;
  const ClassData* classData = classes == nullptr ? nullptr : classes->find(className);
  if (classData == nullptr || core.options().version == 0) {
    return CMPI_RC_OK;
  }
  const FeatureData* feature = findFeature(*classData, name);
  if (feature == nullptr) {
    core.owner().complain(fmt::format("{} has no property {}", className, name));
    return CMPI_RC_OK;
  }
  const auto declared =
      static_cast<CMPIType>(feature->cmpiType | (feature->isArray ? CMPI_ARRAY : 0));
  if (value.type() != declared && !(value.isNull() && value.type() == CMPI_null)) {
    core.owner().complain(fmt::format("{}.{} is a {}, the provider set a {}", className, name,
                                      typeName(declared), typeName(value.type())));
    return CMPI_RC_ERR_TYPE_MISMATCH;
  }
  return CMPI_RC_OK;
}

bool isKey(const Core& core, const Instance& instance, std::string_view name) {
  if (instance.path.keys.find(name) != nullptr) {
    return true;
  }
  const ClassCatalogue* classes = core.options().classes;
  const ClassData* classData = classes == nullptr ? nullptr : classes->find(instance.className());
  const FeatureData* feature = classData == nullptr ? nullptr : findFeature(*classData, name);
  return feature != nullptr && feature->isKey;
}

CMPIStatus setProperty(const CMPIInstance* face, const char* name, const CMPIValue* value,
                       CMPIType type) {
  InstanceObject* object = InstanceObject::from(face, "setProperty");
  if (object == nullptr) {
    return status(CMPI_RC_ERR_INVALID_HANDLE);
  }
  if (name == nullptr) {
    return status(CMPI_RC_ERR_INVALID_PARAMETER);
  }
  std::optional<Value> copy = fromCmpi(value, type);
  if (!copy) {
    return status(CMPI_RC_ERR_INVALID_DATA_TYPE);
  }
  Instance& instance = object->contents.instance;
  const CMPIrc rc = checkProperty(object->core(), instance.className(), name, *copy);
  if (rc != CMPI_RC_OK) {
    return status(rc);
  }
  if (!copy->isNull() && isKey(object->core(), instance, name)) {
    instance.path.keys.set(name, *copy);
  }
  if (passesFilter(object->contents, name)) {
    instance.properties.set(name, std::move(*copy));
  }
  return status(CMPI_RC_OK);
}

CMPIStatus setPropertyWithOrigin(const CMPIInstance* face, const char* name, const CMPIValue* value,
                                 CMPIType type, const char*) {
  return setProperty(face, name, value, type);
}

CMPIObjectPath* getObjectPath(const CMPIInstance* face, CMPIStatus* rc) {
  const InstanceObject* object = InstanceObject::from(face, "getObjectPath");
  setStatus(rc, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
  return object == nullptr
             ? nullptr
             : makePath(object->core(), object->contents.instance.path, Origin::HandedOut);
}

void appendNames(std::vector<std::string>& names, const char** list) {
  for (; list != nullptr && *list != nullptr; ++list) {
    names.emplace_back(*list);
  }
}

CMPIStatus setPropertyFilter(CMPIInstance* face, const char** properties, const char** keys) {
  InstanceObject* object = InstanceObject::from(face, "setPropertyFilter");
  if (object == nullptr) {
    return status(CMPI_RC_ERR_INVALID_HANDLE);
  }
  if (properties == nullptr) {
    object->contents.filter.reset();
    return status(CMPI_RC_OK);
  }
  object->contents.filter.emplace();
  appendNames(*object->contents.filter, properties);
  appendNames(*object->contents.filter, keys);
  std::erase_if(object->contents.instance.properties.items(), [&](const NamedValue& property) {
    return !passesFilter(object->contents, property.name);
  });
  return status(CMPI_RC_OK);
}

CMPIStatus setObjectPath(CMPIInstance* face, const CMPIObjectPath* path) {
  InstanceObject* object = InstanceObject::from(face, "setObjectPath");
  const PathObject* source = PathObject::from(path, "setObjectPath");
  if (object == nullptr || source == nullptr) {
    return status(CMPI_RC_ERR_INVALID_HANDLE);
  }
  object->contents.instance.path = source->contents;
  return status(CMPI_RC_OK);
}

}  // namespace

CMPIInstance* makeInstance(Core& core, Instance instance, Origin origin) {
  return core
      .adopt(std::make_unique<InstanceObject>(core, core.tables().instance,
                                              InstanceContents{std::move(instance), std::nullopt}),
             origin)
      ->face();
}

const CMPIInstanceFT instanceTable = {
    CMPIVersion200,
    releaseObject<InstanceObject, CMPIInstance>,
    cloneObject<InstanceObject, CMPIInstance>,
    getProperty,
    getPropertyAt,
    getPropertyCount,
    setProperty,
    getObjectPath,
    setPropertyFilter,
    setObjectPath,
    setPropertyWithOrigin,
};

}  // namespace tvx::host

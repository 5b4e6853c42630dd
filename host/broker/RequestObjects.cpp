// The objects that carry a request: arguments, context and result.
#include "broker/Marshal.h"

namespace tvx::host {
namespace {

// ---- Arguments ----

CMPIStatus addArg(CMPIArgs* face, const char* name, const CMPIValue* value, CMPIType type) {
  ArgsObject* object = ArgsObject::from(face, "addArg");
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
  object->contents.set(name, std::move(*copy));
  return status(CMPI_RC_OK);
}

CMPIData getArg(const CMPIArgs* face, const char* name, CMPIStatus* rc) {
  const ArgsObject* object = ArgsObject::from(face, "getArg");
  if (object == nullptr) {
    return notFoundData(rc, CMPI_RC_ERR_INVALID_HANDLE);
  }
  return valueNamed(object->core(), object->contents, name, rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
}

CMPIData getArgAt(const CMPIArgs* face, CMPICount index, CMPIString** name, CMPIStatus* rc) {
  const ArgsObject* object = ArgsObject::from(face, "getArgAt");
  if (object == nullptr) {
    return notFoundData(rc, CMPI_RC_ERR_INVALID_HANDLE);
  }
  return valueAt(object->core(), object->contents, index, name, rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
}

CMPICount getArgCount(const CMPIArgs* face, CMPIStatus* rc) {
  const ArgsObject* object = ArgsObject::from(face, "getArgCount");
  setStatus(rc, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
  return object == nullptr ? 0 : static_cast<CMPICount>(object->contents.size());
}

// ---- Context ----

CMPIData getEntry(const CMPIContext* face, const char* name, CMPIStatus* rc) {
  const ContextObject* object = ContextObject::from(face, "getEntry");
  if (object == nullptr) {
    return notFoundData(rc, CMPI_RC_ERR_INVALID_HANDLE);
  }
  return valueNamed(object->core(), object->contents.entries, name, rc,
                    CMPI_RC_ERR_NO_SUCH_PROPERTY);
}

CMPIData getEntryAt(const CMPIContext* face, CMPICount index, CMPIString** name, CMPIStatus* rc) {
  const ContextObject* object = ContextObject::from(face, "getEntryAt");
  if (object == nullptr) {
    return notFoundData(rc, CMPI_RC_ERR_INVALID_HANDLE);
  }
  return valueAt(object->core(), object->contents.entries, index, name, rc,
                 CMPI_RC_ERR_NO_SUCH_PROPERTY);
}

CMPICount getEntryCount(const CMPIContext* face, CMPIStatus* rc) {
  const ContextObject* object = ContextObject::from(face, "getEntryCount");
  setStatus(rc, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
  return object == nullptr ? 0 : static_cast<CMPICount>(object->contents.entries.size());
}

CMPIStatus addEntry(const CMPIContext* face, const char* name, const CMPIValue* value,
                    CMPIType type) {
  ContextObject* object = ContextObject::from(face, "addEntry");
  if (object == nullptr) {
    return status(CMPI_RC_ERR_INVALID_HANDLE);
  }
  std::optional<Value> copy = fromCmpi(value, type);
  if (name == nullptr || !copy) {
    return status(CMPI_RC_ERR_INVALID_PARAMETER);
  }
  object->contents.entries.set(name, std::move(*copy));
  return status(CMPI_RC_OK);
}

// ---- Result ----

CMPIStatus returnData(const CMPIResult* face, const CMPIValue* value, CMPIType type) {
  const ResultObject* object = ResultObject::from(face, "returnData");
  if (object == nullptr) {
    return status(CMPI_RC_ERR_INVALID_HANDLE);
  }
  std::optional<Value> copy = fromCmpi(value, type);
  if (!copy) {
    return status(CMPI_RC_ERR_INVALID_DATA_TYPE);
  }
  object->contents.reply->data.push_back(std::move(*copy));
  return status(CMPI_RC_OK);
}

CMPIStatus returnInstance(const CMPIResult* face, const CMPIInstance* instance) {
  const ResultObject* object = ResultObject::from(face, "returnInstance");
  const InstanceObject* source = InstanceObject::from(instance, "returnInstance");
  if (object == nullptr || source == nullptr) {
    return status(CMPI_RC_ERR_INVALID_HANDLE);
  }
  const auto& [reply, request] = object->contents;
  if (request != nullptr && request->takeInstance) {
    request->takeInstance(source->contents.instance);
  } else {
    reply->instances.push_back(source->contents.instance);
  }
  return status(CMPI_RC_OK);
}

CMPIStatus returnObjectPath(const CMPIResult* face, const CMPIObjectPath* path) {
  const ResultObject* object = ResultObject::from(face, "returnObjectPath");
  const PathObject* source = PathObject::from(path, "returnObjectPath");
  if (object == nullptr || source == nullptr) {
    return status(CMPI_RC_ERR_INVALID_HANDLE);
  }
  object->contents.reply->paths.push_back(source->contents);
  return status(CMPI_RC_OK);
}

CMPIStatus returnDone(const CMPIResult* face) {
  const ResultObject* object = ResultObject::from(face, "returnDone");
  if (object == nullptr) {
    return status(CMPI_RC_ERR_INVALID_HANDLE);
  }
  if (object->contents.reply->done) {
    object->core().owner().complain("returnDone was called twice");
  }
  object->contents.reply->done = true;
  return status(CMPI_RC_OK);
}

CMPIStatus returnError(const CMPIResult*, const CMPIError*) {
  return status(CMPI_RC_ERR_NOT_SUPPORTED);
}

}  // namespace

CMPIArgs* makeArgs(Core& core, NamedValues args, Origin origin) {
  return core
      .adopt(std::make_unique<ArgsObject>(core, core.tables().args, std::move(args)), origin)
      ->face();
}

CMPIContext* makeContext(Core& core, NamedValues entries, Origin origin) {
  return core
      .adopt(std::make_unique<ContextObject>(core, core.tables().context,
                                             ContextContents{std::move(entries)}),
             origin)
      ->face();
}

CMPIResult* makeResult(Core& core, Reply& reply, const Request* request) {
  return core
      .adopt(std::make_unique<ResultObject>(core, core.tables().result,
                                            ResultContents{&reply, request}),
             Origin::HandedOut)
      ->face();
}

const CMPIArgsFT argsTable = {CMPIVersion200,
                              releaseObject<ArgsObject, CMPIArgs>,
                              cloneObject<ArgsObject, CMPIArgs>,
                              addArg,
                              getArg,
                              getArgAt,
                              getArgCount};

const CMPIContextFT contextTable = {CMPIVersion200,
                                    releaseObject<ContextObject, CMPIContext>,
                                    cloneObject<ContextObject, CMPIContext>,
                                    getEntry,
                                    getEntryAt,
                                    getEntryCount,
                                    addEntry};

const CMPIResultFT resultTable = {CMPIVersion200,
                                  releaseObject<ResultObject, CMPIResult>,
                                  cloneObject<ResultObject, CMPIResult>,
                                  returnData,
                                  returnInstance,
                                  returnObjectPath,
                                  returnDone,
                                  returnError};

}  // namespace tvx::host

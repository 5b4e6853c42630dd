// The small objects: strings, datetimes, arrays, enumerations and select expressions.
#include "broker/Marshal.h"
#include "cim/DateTimeText.h"

namespace tvx::host {
namespace {

// ---- Strings ----

const char* getCharPtr(const CMPIString* face, CMPIStatus* rc) {
  const StringObject* object = StringObject::from(face, "getCharPtr");
  setStatus(rc, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
  return object == nullptr || !object->contents.text ? nullptr : object->contents.text->c_str();
}

// ---- Datetimes ----

CMPIUint64 getBinaryFormat(const CMPIDateTime* face, CMPIStatus* rc) {
  const DateTimeObject* object = DateTimeObject::from(face, "getBinaryFormat");
  if (object == nullptr) {
    setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
    return 0;
  }
  const auto microseconds = dateTimeMicroseconds(object->contents);
  setStatus(rc, microseconds ? CMPI_RC_OK : CMPI_RC_ERR_FAILED);
  return microseconds.value_or(0);
}

CMPIString* getStringFormat(const CMPIDateTime* face, CMPIStatus* rc) {
  const DateTimeObject* object = DateTimeObject::from(face, "getStringFormat");
  setStatus(rc, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
  return object == nullptr ? nullptr
                           : makeString(object->core(), object->contents, Origin::HandedOut);
}

CMPIBoolean isInterval(const CMPIDateTime* face, CMPIStatus* rc) {
  const DateTimeObject* object = DateTimeObject::from(face, "isInterval");
  setStatus(rc, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
  return object != nullptr && isIntervalText(object->contents) ? 1 : 0;
}

// ---- Arrays ----

CMPICount getSize(const CMPIArray* face, CMPIStatus* rc) {
  const ArrayObject* object = ArrayObject::from(face, "getSize");
  setStatus(rc, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
  return object == nullptr ? 0 : static_cast<CMPICount>(object->contents.elements.size());
}

CMPIType getSimpleType(const CMPIArray* face, CMPIStatus* rc) {
  const ArrayObject* object = ArrayObject::from(face, "getSimpleType");
  setStatus(rc, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
  return object == nullptr ? CMPI_null : object->contents.elementType;
}

CMPIData getElementAt(const CMPIArray* face, CMPICount index, CMPIStatus* rc) {
  const ArrayObject* object = ArrayObject::from(face, "getElementAt");
  if (object == nullptr) {
    return notFoundData(rc, CMPI_RC_ERR_INVALID_HANDLE);
  }
  if (index >= object->contents.elements.size()) {
    return notFoundData(rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
  }
  setStatus(rc, CMPI_RC_OK);
  return toCmpi(object->core(), object->contents.elements[index]);
}

CMPIStatus setElementAt(CMPIArray* face, CMPICount index, const CMPIValue* value, CMPIType type) {
  ArrayObject* object = ArrayObject::from(face, "setElementAt");
  if (object == nullptr) {
    return status(CMPI_RC_ERR_INVALID_HANDLE);
  }
  if (index >= object->contents.elements.size()) {
    return status(CMPI_RC_ERR_NO_SUCH_PROPERTY);
  }
  std::optional<Value> copy = fromCmpi(value, type);
  if (!copy) {
    return status(CMPI_RC_ERR_INVALID_DATA_TYPE);
  }
  if (type == CMPI_null) {
    copy = Value::null(object->contents.elementType);
  }
  if (copy->type() != object->contents.elementType) {
    return status(CMPI_RC_ERR_TYPE_MISMATCH);
  }
  object->contents.elements[index] = std::move(*copy);
  return status(CMPI_RC_OK);
}

// ---- Enumerations ----

CMPIData getNext(const CMPIEnumeration* face, CMPIStatus* rc) {
  EnumerationObject* object = EnumerationObject::from(face, "getNext");
  if (object == nullptr) {
    return notFoundData(rc, CMPI_RC_ERR_INVALID_HANDLE);
  }
  EnumerationContents& contents = object->contents;
  if (contents.position >= contents.items.size()) {
    return notFoundData(rc, CMPI_RC_ERR_NOT_FOUND);
  }
  setStatus(rc, CMPI_RC_OK);
  return toCmpi(object->core(), contents.items[contents.position++]);
}

CMPIBoolean hasNext(const CMPIEnumeration* face, CMPIStatus* rc) {
  const EnumerationObject* object = EnumerationObject::from(face, "hasNext");
  setStatus(rc, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
  return object != nullptr && object->contents.position < object->contents.items.size() ? 1 : 0;
}

CMPIArray* toArray(const CMPIEnumeration* face, CMPIStatus* rc) {
  const EnumerationObject* object = EnumerationObject::from(face, "toArray");
  setStatus(rc, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
  return object == nullptr ? nullptr
                           : makeArray(object->core(), object->contents.elementType,
                                       object->contents.items, Origin::HandedOut);
}

// ---- Select expressions: the text is kept, evaluation is not this server's business ----

CMPIBoolean evaluate(const CMPISelectExp*, const CMPIInstance*, CMPIStatus* rc) {
  setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
  return 0;
}

CMPIString* getSelectString(const CMPISelectExp* face, CMPIStatus* rc) {
  const SelectObject* object = SelectObject::from(face, "getString");
  setStatus(rc, object == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
  return object == nullptr ? nullptr
                           : makeString(object->core(), object->contents.query, Origin::HandedOut);
}

CMPISelectCond* noCondition(const CMPISelectExp*, CMPIStatus* rc) {
  setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
  return nullptr;
}

CMPIBoolean evaluateUsingAccessor(const CMPISelectExp*, CMPIAccessor*, void*, CMPIStatus* rc) {
  setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
  return 0;
}

}  // namespace

CMPIString* makeString(Core& core, std::optional<std::string> text, Origin origin) {
  return core
      .adopt(
          std::make_unique<StringObject>(core, core.tables().string, TextContents{std::move(text)}),
          origin)
      ->face();
}

CMPIDateTime* makeDateTime(Core& core, std::string text, Origin origin) {
  return core
      .adopt(std::make_unique<DateTimeObject>(core, core.tables().dateTime, std::move(text)),
             origin)
      ->face();
}

CMPIArray* makeArray(Core& core, CMPIType elementType, Value::List elements, Origin origin) {
  return core
      .adopt(std::make_unique<ArrayObject>(core, core.tables().array,
                                           ArrayContents{elementType, std::move(elements)}),
             origin)
      ->face();
}

CMPIEnumeration* makeEnumeration(Core& core, CMPIType elementType, Value::List items,
                                 Origin origin) {
  return core
      .adopt(std::make_unique<EnumerationObject>(
                 core, core.tables().enumeration,
                 EnumerationContents{elementType, std::move(items), 0}),
             origin)
      ->face();
}

CMPISelectExp* makeSelectExp(Core& core, std::string query, std::string language, Origin origin) {
  return core
      .adopt(std::make_unique<SelectObject>(core, core.tables().selectExp,
                                            SelectContents{std::move(query), std::move(language)}),
             origin)
      ->face();
}

const CMPIStringFT stringTable = {CMPIVersion200, releaseObject<StringObject, CMPIString>,
                                  cloneObject<StringObject, CMPIString>, getCharPtr, nullptr};

const CMPIDateTimeFT dateTimeTable = {CMPIVersion200,
                                      releaseObject<DateTimeObject, CMPIDateTime>,
                                      cloneObject<DateTimeObject, CMPIDateTime>,
                                      getBinaryFormat,
                                      getStringFormat,
                                      isInterval};

const CMPIArrayFT arrayTable = {CMPIVersion200,
                                releaseObject<ArrayObject, CMPIArray>,
                                cloneObject<ArrayObject, CMPIArray>,
                                getSize,
                                getSimpleType,
                                getElementAt,
                                setElementAt};

const CMPIEnumerationFT enumerationTable = {CMPIVersion200,
                                            releaseObject<EnumerationObject, CMPIEnumeration>,
                                            cloneObject<EnumerationObject, CMPIEnumeration>,
                                            getNext,
                                            hasNext,
                                            toArray};

const CMPISelectExpFT selectExpTable = {CMPIVersion200,
                                        releaseObject<SelectObject, CMPISelectExp>,
                                        cloneObject<SelectObject, CMPISelectExp>,
                                        evaluate,
                                        getSelectString,
                                        noCondition,
                                        noCondition,
                                        evaluateUsingAccessor};

}  // namespace tvx::host

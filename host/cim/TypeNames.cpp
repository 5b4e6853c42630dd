#include "cim/TypeNames.h"

#include <fmt/format.h>

#include "cim/Value.h"

namespace tvx::host {
namespace {

struct TypeRow {
  CMPIType type;
  const char* name;
};

constexpr TypeRow typeRows[] = {
    {CMPI_boolean, "boolean"},  {CMPI_uint8, "uint8"},       {CMPI_sint8, "sint8"},
    {CMPI_uint16, "uint16"},    {CMPI_sint16, "sint16"},     {CMPI_uint32, "uint32"},
    {CMPI_sint32, "sint32"},    {CMPI_uint64, "uint64"},     {CMPI_sint64, "sint64"},
    {CMPI_real32, "real32"},    {CMPI_real64, "real64"},     {CMPI_char16, "char16"},
    {CMPI_string, "string"},    {CMPI_dateTime, "datetime"}, {CMPI_ref, "ref"},
    {CMPI_instance, "instance"}};

struct RcRow {
  int rc;
  const char* name;
  const char* words;
};

constexpr RcRow rcRows[] = {
    {CMPI_RC_OK, "CMPI_RC_OK", "success"},
    {CMPI_RC_ERR_FAILED, "CMPI_RC_ERR_FAILED", "the operation failed"},
    {CMPI_RC_ERR_ACCESS_DENIED, "CMPI_RC_ERR_ACCESS_DENIED", "access denied"},
    {CMPI_RC_ERR_INVALID_NAMESPACE, "CMPI_RC_ERR_INVALID_NAMESPACE", "unknown namespace"},
    {CMPI_RC_ERR_INVALID_PARAMETER, "CMPI_RC_ERR_INVALID_PARAMETER", "invalid parameter"},
    {CMPI_RC_ERR_INVALID_CLASS, "CMPI_RC_ERR_INVALID_CLASS", "unknown class"},
    {CMPI_RC_ERR_NOT_FOUND, "CMPI_RC_ERR_NOT_FOUND", "not found"},
    {CMPI_RC_ERR_NOT_SUPPORTED, "CMPI_RC_ERR_NOT_SUPPORTED", "not supported"},
    {CMPI_RC_ERR_CLASS_HAS_CHILDREN, "CMPI_RC_ERR_CLASS_HAS_CHILDREN", "the class has subclasses"},
    {CMPI_RC_ERR_CLASS_HAS_INSTANCES, "CMPI_RC_ERR_CLASS_HAS_INSTANCES", "the class has instances"},
    {CMPI_RC_ERR_INVALID_SUPERCLASS, "CMPI_RC_ERR_INVALID_SUPERCLASS", "unknown superclass"},
    {CMPI_RC_ERR_ALREADY_EXISTS, "CMPI_RC_ERR_ALREADY_EXISTS", "already exists"},
    {CMPI_RC_ERR_NO_SUCH_PROPERTY, "CMPI_RC_ERR_NO_SUCH_PROPERTY", "no such property"},
    {CMPI_RC_ERR_TYPE_MISMATCH, "CMPI_RC_ERR_TYPE_MISMATCH", "type mismatch"},
    {CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED, "CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED",
     "query language not supported"},
    {CMPI_RC_ERR_INVALID_QUERY, "CMPI_RC_ERR_INVALID_QUERY", "invalid query"},
    {CMPI_RC_ERR_METHOD_NOT_AVAILABLE, "CMPI_RC_ERR_METHOD_NOT_AVAILABLE", "method not available"},
    {CMPI_RC_ERR_METHOD_NOT_FOUND, "CMPI_RC_ERR_METHOD_NOT_FOUND", "no such method"},
    {CMPI_RC_DO_NOT_UNLOAD, "CMPI_RC_DO_NOT_UNLOAD", "the provider asks not to be unloaded"},
    {CMPI_RC_NEVER_UNLOAD, "CMPI_RC_NEVER_UNLOAD", "the provider must never be unloaded"},
    {CMPI_RC_ERR_INVALID_HANDLE, "CMPI_RC_ERR_INVALID_HANDLE", "invalid handle"},
    {CMPI_RC_ERR_INVALID_DATA_TYPE, "CMPI_RC_ERR_INVALID_DATA_TYPE", "invalid data type"},
    {CMPI_RC_ERROR_SYSTEM, "CMPI_RC_ERROR_SYSTEM", "system error"},
    {CMPI_RC_ERROR, "CMPI_RC_ERROR", "error"}};

const RcRow* findRc(int rc) {
  for (const RcRow& row : rcRows) {
    if (row.rc == rc) {
      return &row;
    }
  }
  return nullptr;
}

}  // namespace

std::string typeName(CMPIType type) {
  if (type == CMPI_null) {
    return "null";
  }
  const bool array = (type & CMPI_ARRAY) != 0;
  for (const TypeRow& row : typeRows) {
    if (row.type == (type & ~CMPI_ARRAY)) {
      return std::string(row.name) + (array ? "[]" : "");
    }
  }
  return fmt::format("type 0x{:x}", type);
}

std::optional<CMPIType> typeOfName(std::string_view name) {
  for (const TypeRow& row : typeRows) {
    if (sameName(row.name, name)) {
      return row.type;
    }
  }
  return std::nullopt;
}

std::string rcName(int rc) {
  const RcRow* row = findRc(rc);
  return row != nullptr ? row->name : fmt::format("CMPI_RC({})", rc);
}

std::string rcWords(int rc) {
  const RcRow* row = findRc(rc);
  return row != nullptr ? row->words : fmt::format("code {}", rc);
}

}  // namespace tvx::host

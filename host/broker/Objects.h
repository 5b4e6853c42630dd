// The encapsulated objects: a CMPI face in front of plain C++ contents.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "broker/Core.h"
#include "broker/Tracked.h"
#include "cim/Value.h"
#include "cmpi/cmpift.h"

namespace tvx::host {

/// Common shape: `Face` is the CMPI structure, `Contents` what it stands for.
template <class Face, class Table, class Contents, ObjectKind Kind>
class Object : public Tracked {
 public:
  Object(Core& owner, const Table* table, Contents initial)
      : Tracked(owner, Kind), contents(std::move(initial)) {
    m_Face.hdl = static_cast<Tracked*>(this);
    m_Face.ft = table;
  }

  Face* face() { return &m_Face; }

  /// The object behind a face that the provider passed in; null for a null face.
  static Object* from(const Face* face, const char* function) {
    if (face == nullptr || face->hdl == nullptr) {
      return nullptr;
    }
    auto* base = static_cast<Tracked*>(face->hdl);
    return static_cast<Object*>(base->core().check(face->hdl, Kind, function));
  }

  Contents contents;

 protected:
  void wipe() override { contents = Contents(); }

 private:
  Face m_Face;
};

struct InstanceContents {
  Instance instance;
  /// Names that may be set; nothing means all.
  std::optional<std::vector<std::string>> filter;
};

struct TextContents {
  std::optional<std::string> text;
};

struct ArrayContents {
  CMPIType elementType = CMPI_null;
  Value::List elements;
};

struct EnumerationContents {
  CMPIType elementType = CMPI_null;
  Value::List items;
  std::size_t position = 0;
};

struct ContextContents {
  NamedValues entries;
};

struct ResultContents {
  Reply* reply = nullptr;            ///< belongs to the request
  const Request* request = nullptr;  ///< outlives the result; may be absent
};

struct SelectContents {
  std::string query;
  std::string language;
};

using InstanceObject = Object<CMPIInstance, CMPIInstanceFT, InstanceContents, ObjectKind::Instance>;
using PathObject = Object<CMPIObjectPath, CMPIObjectPathFT, ObjectPath, ObjectKind::ObjectPath>;
using ArgsObject = Object<CMPIArgs, CMPIArgsFT, NamedValues, ObjectKind::Args>;
using StringObject = Object<CMPIString, CMPIStringFT, TextContents, ObjectKind::String>;
using ArrayObject = Object<CMPIArray, CMPIArrayFT, ArrayContents, ObjectKind::Array>;
using DateTimeObject = Object<CMPIDateTime, CMPIDateTimeFT, std::string, ObjectKind::DateTime>;
using EnumerationObject =
    Object<CMPIEnumeration, CMPIEnumerationFT, EnumerationContents, ObjectKind::Enumeration>;
using ContextObject = Object<CMPIContext, CMPIContextFT, ContextContents, ObjectKind::Context>;
using ResultObject = Object<CMPIResult, CMPIResultFT, ResultContents, ObjectKind::Result>;
using SelectObject = Object<CMPISelectExp, CMPISelectExpFT, SelectContents, ObjectKind::SelectExp>;

// Makers; the object belongs to the calling thread's request.
CMPIInstance* makeInstance(Core& core, Instance instance, Origin origin);
CMPIObjectPath* makePath(Core& core, ObjectPath path, Origin origin);
CMPIArgs* makeArgs(Core& core, NamedValues args, Origin origin);
/// Nothing makes a string object without text.
CMPIString* makeString(Core& core, std::optional<std::string> text, Origin origin);
CMPIArray* makeArray(Core& core, CMPIType elementType, Value::List elements, Origin origin);
CMPIDateTime* makeDateTime(Core& core, std::string text, Origin origin);
CMPIEnumeration* makeEnumeration(Core& core, CMPIType elementType, Value::List items,
                                 Origin origin);
CMPIContext* makeContext(Core& core, NamedValues entries, Origin origin);
/// Without a request the reply keeps everything.
CMPIResult* makeResult(Core& core, Reply& reply, const Request* request = nullptr);
CMPISelectExp* makeSelectExp(Core& core, std::string query, std::string language, Origin origin);

inline CMPIStatus status(CMPIrc rc) {
  return CMPIStatus{rc, nullptr};
}

/// Stores a code where the caller wants one.
inline void setStatus(CMPIStatus* place, CMPIrc rc) {
  if (place != nullptr) {
    *place = status(rc);
  }
}

/// Release slot of an object's table.
template <class Type, class Face>
CMPIStatus releaseObject(Face* face) {
  if (face == nullptr || face->hdl == nullptr) {
    return status(CMPI_RC_ERR_INVALID_HANDLE);
  }
  auto* object = static_cast<Tracked*>(face->hdl);
  return object->core().release(object);
}

/// Clone slot of an object's table: the copy belongs to the provider.
template <class Type, class Face>
Face* cloneObject(const Face* face, CMPIStatus* rc) {
  Type* object = Type::from(face, "clone");
  if (object == nullptr) {
    setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
    return nullptr;
  }
  Core& core = object->core();
  auto copy = std::make_unique<Type>(core, object->face()->ft, object->contents);
  setStatus(rc, CMPI_RC_OK);
  return core.adopt(std::move(copy), Origin::Cloned)->face();
}

}  // namespace tvx::host

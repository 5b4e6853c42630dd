// A provider library for tests of the broker: three widgets, one gadget, a chain of links between
// the widgets, and a method that breaks the rules in the way it is told.
#include <pthread.h>

#include <cstring>
#include <string>
#include <thread>

#include "cmpi/cmpimacs.h"

namespace {

constexpr const char* nameSpace = "root/fake";
constexpr unsigned widgetCount = 3;

const CMPIBroker* broker = nullptr;
bool refuseUnload = false;
CMPIString* lateString = nullptr;
void* keptBlock = nullptr;

CMPIStatus ok() {
  return CMPIStatus{CMPI_RC_OK, nullptr};
}
CMPIStatus failed(CMPIrc rc, const char* text) {
  return CMPIStatus{rc, text == nullptr ? nullptr : CMNewString(broker, text, nullptr)};
}

std::string textOf(const CMPIString* string) {
  const char* text = string == nullptr ? nullptr : CMGetCharsPtr(string, nullptr);
  return text == nullptr ? "" : text;
}

std::string nameOf(unsigned index) {
  // A name with everything that needs care in a path text.
  return index == 1 ? "wid get: \"1\"\\" : "widget" + std::to_string(index);
}

CMPIObjectPath* makePath(const char* className, unsigned index) {
  CMPIObjectPath* path = CMNewObjectPath(broker, nameSpace, className, nullptr);
  const std::string name = nameOf(index);
  CMAddKey(path, "Name", reinterpret_cast<const CMPIValue*>(name.c_str()), CMPI_chars);
  CMPIValue number{};
  number.uint32 = index;
  CMAddKey(path, "Number", &number, CMPI_uint32);
  return path;
}

void setSizes(CMPIInstance* instance, unsigned index) {
  CMPIArray* sizes = CMNewArray(broker, index, CMPI_uint16, nullptr);
  for (unsigned i = 0; i < index; ++i) {
    CMPIValue size{};
    size.uint16 = static_cast<CMPIUint16>(10 * (i + 1));
    CMSetArrayElementAt(sizes, i, &size, CMPI_uint16);
  }
  CMPIValue value{};
  value.array = sizes;
  CMSetProperty(instance, "Sizes", &value, CMPI_uint16A);
  CMRelease(sizes);
}

CMPIInstance* makeWidget(const char* className, unsigned index, const char** properties) {
  CMPIObjectPath* path = makePath(className, index);
  CMPIInstance* instance = CMNewInstance(broker, path, nullptr);
  CMSetPropertyFilter(instance, properties, nullptr);
  const std::string name = nameOf(index);
  CMSetProperty(instance, "Name", reinterpret_cast<const CMPIValue*>(name.c_str()), CMPI_chars);
  CMPIValue value{};
  value.uint32 = index;
  CMSetProperty(instance, "Number", &value, CMPI_uint32);
  CMSetProperty(instance, "Color",
                reinterpret_cast<const CMPIValue*>(index % 2 == 0 ? "red" : "blue"), CMPI_chars);
  setSizes(instance, index);
  CMRelease(path);
  return instance;
}

/// Index of the widget that a path names, or widgetCount.
unsigned indexOf(const CMPIObjectPath* path) {
  CMPIStatus rc{};
  const CMPIData name = CMGetKey(path, "Name", &rc);
  if (rc.rc != CMPI_RC_OK || name.type != CMPI_string) {
    return widgetCount;
  }
  unsigned index = 0;
  while (index < widgetCount && nameOf(index) != textOf(name.value.string)) {
    ++index;
  }
  return index;
}

// ---- Instances ----

unsigned countOf(const std::string& className) {
  return className == "FAKE_Gadget" ? 1 : widgetCount;
}

CMPIStatus cleanupInstance(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean terminating) {
  return refuseUnload && terminating == 0 ? CMPIStatus{CMPI_RC_DO_NOT_UNLOAD, nullptr} : ok();
}

CMPIStatus enumerateNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                          const CMPIObjectPath* path) {
  const std::string className = textOf(CMGetClassName(path, nullptr));
  for (unsigned i = 0; i < countOf(className); ++i) {
    CMPIObjectPath* each = makePath(className.c_str(), i);
    CMReturnObjectPath(result, each);
    CMRelease(each);
  }
  return CMReturnDone(result);
}

CMPIStatus enumerate(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                     const CMPIObjectPath* path, const char** properties) {
  const std::string className = textOf(CMGetClassName(path, nullptr));
  for (unsigned i = 0; i < countOf(className); ++i) {
    CMPIInstance* each = makeWidget(className.c_str(), i, properties);
    CMReturnInstance(result, each);
    CMRelease(each);
  }
  return CMReturnDone(result);
}

CMPIStatus get(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
               const CMPIObjectPath* path, const char** properties) {
  const std::string className = textOf(CMGetClassName(path, nullptr));
  const unsigned index = indexOf(path);
  if (index >= countOf(className)) {
    return failed(CMPI_RC_ERR_NOT_FOUND, "no such widget");
  }
  CMPIInstance* instance = makeWidget(className.c_str(), index, properties);
  CMReturnInstance(result, instance);
  CMRelease(instance);
  return CMReturnDone(result);
}

CMPIStatus create(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                  const CMPIObjectPath*, const CMPIInstance* instance) {
  const CMPIData name = CMGetProperty(instance, "Name", nullptr);
  if (name.type != CMPI_string || textOf(name.value.string).starts_with("widget")) {
    return failed(CMPI_RC_ERR_ALREADY_EXISTS, nullptr);
  }
  CMReturnObjectPath(result, CMGetObjectPath(instance, nullptr));
  return CMReturnDone(result);
}

CMPIStatus modify(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,
                  const CMPIObjectPath* path, const CMPIInstance* instance,
                  const char** properties) {
  if (indexOf(path) >= widgetCount) {
    return failed(CMPI_RC_ERR_NOT_FOUND, nullptr);
  }
  const bool named = properties != nullptr && properties[0] != nullptr &&
                     std::strcmp(properties[0], "Color") == 0 && properties[1] == nullptr;
  const CMPIData color = CMGetProperty(instance, "Color", nullptr);
  return named && color.type == CMPI_string && textOf(color.value.string) == "green"
             ? ok()
             : failed(CMPI_RC_ERR_INVALID_PARAMETER, "only the color green can be set");
}

CMPIStatus remove(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,
                  const CMPIObjectPath* path) {
  return indexOf(path) < widgetCount ? ok() : failed(CMPI_RC_ERR_NOT_FOUND, nullptr);
}

CMPIStatus query(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                 const char*, const char*) {
  return failed(CMPI_RC_ERR_NOT_SUPPORTED, nullptr);
}

// ---- Links: widget n to widget n + 1 ----

CMPIStatus cleanupAssociation(CMPIAssociationMI*, const CMPIContext*, CMPIBoolean) {
  return ok();
}

CMPIInstance* makeLink(unsigned from) {
  CMPIObjectPath* path = CMNewObjectPath(broker, nameSpace, "FAKE_Link", nullptr);
  CMPIValue antecedent{};
  antecedent.ref = makePath("FAKE_Widget", from);
  CMPIValue dependent{};
  dependent.ref = makePath("FAKE_Widget", from + 1);
  CMAddKey(path, "Antecedent", &antecedent, CMPI_ref);
  CMAddKey(path, "Dependent", &dependent, CMPI_ref);
  CMPIInstance* link = CMNewInstance(broker, path, nullptr);
  CMSetProperty(link, "Antecedent", &antecedent, CMPI_ref);
  CMSetProperty(link, "Dependent", &dependent, CMPI_ref);
  return link;
}

bool wants(const char* role, const char* own) {
  return role == nullptr || *role == '\0' || std::strcmp(role, own) == 0;
}

template <class Visit>
void eachNeighbour(const CMPIObjectPath* source, const char* role, Visit visit) {
  const unsigned index = indexOf(source);
  if (index < widgetCount && index > 0 && wants(role, "Dependent")) {
    visit(index - 1, index - 1);
  }
  if (index + 1 < widgetCount && wants(role, "Antecedent")) {
    visit(index, index + 1);
  }
}

CMPIStatus associatorNames(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                           const CMPIObjectPath* source, const char*, const char* resultClass,
                           const char* role, const char*) {
  if (wants(resultClass, "FAKE_Widget")) {
    eachNeighbour(source, role, [&](unsigned, unsigned other) {
      CMReturnObjectPath(result, makePath("FAKE_Widget", other));
    });
  }
  return CMReturnDone(result);
}

/// Far ends come from the server, as providers of associations get them.
CMPIStatus associators(CMPIAssociationMI*, const CMPIContext* context, const CMPIResult* result,
                       const CMPIObjectPath* source, const char*, const char*, const char* role,
                       const char*, const char** properties) {
  eachNeighbour(source, role, [&](unsigned, unsigned other) {
    CMPIStatus rc{};
    const CMPIInstance* instance =
        CBGetInstance(broker, context, makePath("FAKE_Widget", other), properties, &rc);
    if (instance != nullptr) {
      CMReturnInstance(result, instance);
    }
  });
  return CMReturnDone(result);
}

CMPIStatus references(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                      const CMPIObjectPath* source, const char*, const char* role, const char**) {
  eachNeighbour(source, role,
                [&](unsigned link, unsigned) { CMReturnInstance(result, makeLink(link)); });
  return CMReturnDone(result);
}

CMPIStatus referenceNames(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                          const CMPIObjectPath* source, const char*, const char* role) {
  eachNeighbour(source, role, [&](unsigned link, unsigned) {
    CMReturnObjectPath(result, CMGetObjectPath(makeLink(link), nullptr));
  });
  return CMReturnDone(result);
}

// ---- Methods ----

struct ThreadWork {
  CMPIContext* context;
  unsigned found;
  CMPIrc rc;
};

/// Counts the foreign instances from a thread of the provider's own.
void* countForeign(void* parameter) {
  auto* work = static_cast<ThreadWork*>(parameter);
  CBAttachThread(broker, work->context);
  CMPIStatus rc{};
  const CMPIObjectPath* path = CMNewObjectPath(broker, nameSpace, "FAKE_Foreign", nullptr);
  const CMPIEnumeration* all = CBEnumInstances(broker, work->context, path, nullptr, &rc);
  while (all != nullptr && CMHasNext(all, nullptr) != 0) {
    CMGetNext(all, nullptr);
    ++work->found;
  }
  work->rc = rc.rc;
  CBDetachThread(broker, work->context);
  return nullptr;
}

unsigned runThread(const CMPIContext* context) {
  ThreadWork work{CBPrepareAttachThread(broker, context), 0, CMPI_RC_OK};
  pthread_t thread{};
  pthread_create(&thread, nullptr, countForeign, &work);
  pthread_join(thread, nullptr);
  return work.rc == CMPI_RC_OK ? work.found : 1000U + static_cast<unsigned>(work.rc);
}

void* upCallUnattached(void* parameter) {
  auto* work = static_cast<ThreadWork*>(parameter);
  CMPIStatus rc{};
  const CMPIObjectPath* path = CMNewObjectPath(broker, nameSpace, "FAKE_Foreign", nullptr);
  CBEnumInstances(broker, work->context, path, nullptr, &rc);
  work->rc = rc.rc;
  return nullptr;
}

unsigned runUnattached(const CMPIContext* context) {
  ThreadWork work{const_cast<CMPIContext*>(context), 0, CMPI_RC_OK};
  pthread_t thread{};
  pthread_create(&thread, nullptr, upCallUnattached, &work);
  pthread_join(thread, nullptr);
  return work.rc;
}

unsigned upCallSelf(const CMPIContext* context) {
  CMPIStatus rc{};
  const CMPIEnumeration* names =
      CBEnumInstanceNames(broker, context, makePath("FAKE_Gadget", 0), &rc);
  unsigned count = 0;
  while (names != nullptr && CMHasNext(names, nullptr) != 0) {
    CMGetNext(names, nullptr);
    ++count;
  }
  return count;
}

unsigned misbehave(const std::string& how, const CMPIContext* context) {
  CMPIString* string = CMNewString(broker, "text", nullptr);
  if (how == "double-release") {
    CMRelease(string);
    CMRelease(string);
  } else if (how == "use-after-release") {
    CMRelease(string);
    CMGetCharsPtr(string, nullptr);
  } else if (how == "leak-clone") {
    CMClone(string, nullptr);
  } else if (how == "release-clone") {
    CMPIString* clone = CMClone(string, nullptr);
    CMRelease(clone);
  } else if (how == "leak-memory") {
    keptBlock = broker->mft->cmpiMalloc(broker, 1);
  } else if (how == "free-kept-memory") {
    broker->mft->cmpiFree(broker, keptBlock);
  } else if (how == "free-memory") {
    broker->mft->cmpiFree(broker, broker->mft->cmpiMalloc(broker, 1));
  } else if (how == "keep") {
    lateString = string;
  } else if (how == "release-elsewhere") {
    std::thread([string] { CMRelease(string); }).join();
  } else if (how == "release-kept") {
    CMRelease(lateString);
  } else if (how == "unknown-property" || how == "wrong-type") {
    CMPIInstance* instance = makeWidget("FAKE_Widget", 0, nullptr);
    CMPIValue value{};
    return CMSetProperty(instance, how == "wrong-type" ? "Color" : "Odd", &value, CMPI_uint8).rc;
  } else if (how == "wrong-kind") {
    CMNewInstance(broker, reinterpret_cast<CMPIObjectPath*>(string), nullptr);
  } else if (how == "refuse-unload") {
    refuseUnload = true;
  } else if (how == "thread") {
    return runThread(context);
  } else if (how == "unattached") {
    return runUnattached(context);
  } else if (how == "up-call-self") {
    return upCallSelf(context);
  } else if (how == "indication") {
    return CBDeliverIndication(broker, context, nameSpace, makeWidget("FAKE_Widget", 2, nullptr))
        .rc;
  }
  return 0;
}

CMPIStatus cleanupMethod(CMPIMethodMI*, const CMPIContext*, CMPIBoolean) {
  return ok();
}

/// Echoes every argument's name and type, and counts one coat more.
CMPIStatus paint(const CMPIResult* result, const CMPIArgs* in, CMPIArgs* out) {
  const CMPICount count = CMGetArgCount(in, nullptr);
  CMPIArray* log = CMNewArray(broker, count, CMPI_string, nullptr);
  CMPIValue returnValue{};
  for (CMPICount i = 0; i < count; ++i) {
    CMPIString* name = nullptr;
    const CMPIData data = CMGetArgAt(in, i, &name, nullptr);
    const std::string line = textOf(name) + ":" + std::to_string(data.type);
    CMPIValue text{};
    text.string = CMNewString(broker, line.c_str(), nullptr);
    CMSetArrayElementAt(log, i, &text, CMPI_string);
    if (textOf(name) == "Coats") {
      CMPIValue coats{};
      coats.uint16 = static_cast<CMPIUint16>(data.value.uint16 + 1);
      CMAddArg(out, "Coats", &coats, CMPI_uint16);
    }
    if (textOf(name) == "Color" && textOf(data.value.string) == "none") {
      returnValue.uint32 = 5;
    }
  }
  CMPIValue value{};
  value.array = log;
  CMAddArg(out, "Log", &value, CMPI_stringA);
  CMReturnData(result, &returnValue, CMPI_uint32);
  return CMReturnDone(result);
}

CMPIStatus invoke(CMPIMethodMI*, const CMPIContext* context, const CMPIResult* result,
                  const CMPIObjectPath*, const char* method, const CMPIArgs* in, CMPIArgs* out) {
  if (std::strcmp(method, "Paint") == 0) {
    return paint(result, in, out);
  }
  if (std::strcmp(method, "Misbehave") != 0) {
    return failed(CMPI_RC_ERR_METHOD_NOT_FOUND, nullptr);
  }
  CMPIValue value{};
  value.uint32 = misbehave(textOf(CMGetArg(in, "How", nullptr).value.string), context);
  CMReturnData(result, &value, CMPI_uint32);
  return CMReturnDone(result);
}

// ---- Factories ----

/// A factory may be called while requests run on other threads: those read the broker and the
/// tables, which are therefore written but once.
void useBroker(const CMPIBroker* given) {
  if (broker != given) broker = given;
}

CMPIInstanceMI* instanceInterface() {
  static CMPIInstanceMIFT table = [] {
    CMPIInstanceMIFT made{};
    made.ftVersion = made.miVersion = CMPIVersion100;
    made.miName = "fake";
    made.cleanup = cleanupInstance;
    made.enumerateInstanceNames = enumerateNames;
    made.enumerateInstances = enumerate;
    made.getInstance = get;
    made.createInstance = create;
    made.modifyInstance = modify;
    made.deleteInstance = remove;
    made.execQuery = query;
    return made;
  }();
  static CMPIInstanceMI interface { nullptr, &table };
  return &interface;
}

CMPIAssociationMI* associationInterface() {
  static CMPIAssociationMIFT table = [] {
    CMPIAssociationMIFT made{};
    made.cleanup = cleanupAssociation;
    made.associators = associators;
    made.associatorNames = associatorNames;
    made.references = references;
    made.referenceNames = referenceNames;
    return made;
  }();
  static CMPIAssociationMI interface { nullptr, &table };
  return &interface;
}

CMPIMethodMI* methodInterface() {
  static CMPIMethodMIFT table = [] {
    CMPIMethodMIFT made{};
    made.cleanup = cleanupMethod;
    made.invokeMethod = invoke;
    return made;
  }();
  static CMPIMethodMI interface { nullptr, &table };
  return &interface;
}

}  // namespace

#define FAKE_EXPORT extern "C" __attribute__((visibility("default")))

FAKE_EXPORT CMPIInstanceMI* FAKE_Widget_Provider_Create_InstanceMI(const CMPIBroker* mb,
                                                                   const CMPIContext*,
                                                                   CMPIStatus*) {
  useBroker(mb);
  return instanceInterface();
}

FAKE_EXPORT CMPIMethodMI* FAKE_Widget_Provider_Create_MethodMI(const CMPIBroker* mb,
                                                               const CMPIContext*, CMPIStatus*) {
  useBroker(mb);
  return methodInterface();
}

// Only the short form of the name, which a broker has to try as well.
FAKE_EXPORT CMPIInstanceMI* FAKE_Gadget_Create_InstanceMI(const CMPIBroker* mb, const CMPIContext*,
                                                          CMPIStatus*) {
  useBroker(mb);
  return instanceInterface();
}

FAKE_EXPORT CMPIInstanceMI* FAKE_Link_Provider_Create_InstanceMI(const CMPIBroker*,
                                                                 const CMPIContext*,
                                                                 CMPIStatus* rc) {
  *rc = CMPIStatus{CMPI_RC_ERR_FAILED, nullptr};
  return nullptr;
}

FAKE_EXPORT CMPIAssociationMI* FAKE_Link_Provider_Create_AssociationMI(const CMPIBroker* mb,
                                                                       const CMPIContext*,
                                                                       CMPIStatus*) {
  useBroker(mb);
  return associationInterface();
}

// Instances, references and method calls to and from the CMPI objects of a request.
#pragma once

#include "cmpi/cmpidt.h"
#include "runtime/Instance.h"

namespace cimrt {

class CMPI_Adapter;

// All answer 0 on success, else a non-zero code that serves as a CMPI return code. Instances that
// are made belong to the caller; CMPI objects that are made belong to the request. `broker` may be
// null where instances are made.

/// A model of `meta_class` with the keys of `path`, everything else null.
int make_cimrt_reference(const CMPIBroker* broker, const Meta_Class* meta_class,
                         const CMPIObjectPath* path, Instance*& out);

/// An instance with the properties of `instance` and the namespace of `path`.
int make_cimrt_instance(const CMPIBroker* broker, const Meta_Class* meta_class,
                        const CMPIObjectPath* path, const CMPIInstance* instance, Instance*& out);

/// A call record with the In parameters out of `args`, which may be null. `adapter` is the one that
/// the call came to.
int make_cimrt_method(const CMPIBroker* broker, const Meta_Class* meta_class,
                      const Meta_Method* meta_method, const CMPIObjectPath* path,
                      const CMPIArgs* args, CMPI_Adapter* adapter, Instance*& out);

/// A path with the keys of `instance`, in `name_space`.
int make_CMPI_object_path(const CMPIBroker* broker, const Instance* instance,
                          const char* name_space, CMPIObjectPath*& out);

/// An instance with the non-null properties of `instance`, restricted to `properties` unless that
/// is null. `path` is made if null.
int make_CMPI_instance(const CMPIBroker* broker, const Instance* instance, const char* name_space,
                       const CMPIObjectPath* path, const char** properties, CMPIInstance*& out);

/// The Out parameters of a call record into `args`; its "return_value" into `data` and `type`,
/// which become zero if it is null.
int make_CMPI_method(const CMPIBroker* broker, const char* name_space, const Instance* method,
                     CMPIArgs* args, CMPIValue& data, CMPIType& type);

}  // namespace cimrt

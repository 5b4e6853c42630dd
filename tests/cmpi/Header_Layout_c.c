/* The same layout as a C compiler sees it. */
#include <stddef.h>
#include <string.h>

#include "cmpi/cmpimacs.h"

struct Row {
  const char* name;
  size_t offset;
};

#define MEMBER(STRUCT, NAME) \
  { #STRUCT "." #NAME, offsetof(STRUCT, NAME) }
#define SIZE(STRUCT) \
  { "sizeof(" #STRUCT ")", sizeof(STRUCT) }

static const struct Row rows[] = {
    MEMBER(CMPIBrokerFT, prepareAttachThread),
    MEMBER(CMPIBrokerFT, attachThread),
    MEMBER(CMPIBrokerFT, detachThread),
    MEMBER(CMPIBrokerFT, deliverIndication),
    MEMBER(CMPIBrokerFT, enumerateInstanceNames),
    MEMBER(CMPIBrokerFT, getInstance),
    MEMBER(CMPIBrokerFT, createInstance),
    MEMBER(CMPIBrokerFT, modifyInstance),
    MEMBER(CMPIBrokerFT, deleteInstance),
    MEMBER(CMPIBrokerFT, execQuery),
    MEMBER(CMPIBrokerFT, enumerateInstances),
    MEMBER(CMPIBrokerFT, associators),
    MEMBER(CMPIBrokerFT, associatorNames),
    MEMBER(CMPIBrokerFT, references),
    MEMBER(CMPIBrokerFT, referenceNames),
    MEMBER(CMPIBrokerFT, invokeMethod),
    MEMBER(CMPIBrokerFT, setProperty),
    MEMBER(CMPIBrokerFT, getProperty),
    MEMBER(CMPIBrokerFT, enumerateInstancesFiltered),
    MEMBER(CMPIBrokerFT, associatorsFiltered),
    MEMBER(CMPIBrokerFT, referencesFiltered),
    MEMBER(CMPIInstanceMIFT, cleanup),
    MEMBER(CMPIInstanceMIFT, enumerateInstanceNames),
    MEMBER(CMPIInstanceMIFT, enumerateInstances),
    MEMBER(CMPIInstanceMIFT, getInstance),
    MEMBER(CMPIInstanceMIFT, createInstance),
    MEMBER(CMPIInstanceMIFT, modifyInstance),
    MEMBER(CMPIInstanceMIFT, deleteInstance),
    MEMBER(CMPIInstanceMIFT, execQuery),
    MEMBER(CMPIInstanceMIFT, enumerateInstancesFiltered),
    MEMBER(CMPIBrokerFT, brokerVersion),
    MEMBER(CMPIBrokerFT, brokerName),
    MEMBER(CMPIInstanceMIFT, ftVersion),
    MEMBER(CMPIInstanceMIFT, miVersion),
    MEMBER(CMPIInstanceMIFT, miName),
    SIZE(CMPIData),
    SIZE(CMPIValue),
    SIZE(CMPIStatus),
    SIZE(CMPIValuePtr),
};

/* 1 if C puts the member at `offset`. */
int tvx_c_layout_agrees(const char* member, size_t offset);

int tvx_c_layout_agrees(const char* member, size_t offset) {
  size_t i;
  for (i = 0; i < sizeof rows / sizeof rows[0]; ++i)
    if (strcmp(rows[i].name, member) == 0) return rows[i].offset == offset;
  return 0;
}

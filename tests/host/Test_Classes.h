// A small class table for tests of the host programs.
#pragma once

#include "cim/ClassCatalogue.h"

namespace tvx::host::test {

/// CIM_Thing (abstract), FAKE_Widget and its subclass FAKE_Gadget, the association FAKE_Link
/// between widgets, and FAKE_Foreign, which nothing in the fake provider serves.
const ClassCatalogue& testClasses();

}  // namespace tvx::host::test

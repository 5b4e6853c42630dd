// tvxcim: talks to the provider library as a CIM server does.
#include "cli/Commands.h"
#include "schema/ClassData.h"

int main(int argc, char** argv) {
  const tvx::host::ClassCatalogue classes(tvx::host::allClasses, tvx::host::allClassCount);
  return tvx::host::runProgram(argc, argv, classes);
}

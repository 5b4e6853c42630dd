// The program over the test classes, so that its behaviour can be tested without the provider.
#include "Test_Classes.h"
#include "cli/Commands.h"

int main(int argc, char** argv) {
  return tvx::host::runProgram(argc, argv, tvx::host::test::testClasses());
}

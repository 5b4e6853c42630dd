#include "Built_Fixture.h"

#include <dlfcn.h>

#include <sstream>
#include <stdexcept>

#include "Library_Blocks.h"

namespace cimrt::test {

namespace {

tvx::host::BrokerOptions strict(tvx::host::BrokerOptions options) {
  options.strict = true;
  options.nameSpace = NAME_SPACE;
  return options;
}

std::vector<std::string> split(const char* lines) {
  std::istringstream text(lines);
  std::vector<std::string> result;
  for (std::string line; std::getline(text, line);) result.push_back(line);
  return result;
}

bool is_walk(Call call) {
  return call == Call::Associators || call == Call::AssociatorNames || call == Call::References ||
         call == Call::ReferenceNames;
}

}  // namespace

Built_Bridge::Built_Bridge(tvx::host::BrokerOptions options) : broker(strict(std::move(options))) {
  broker.load(CMPI_TEST_MODULE);
  _library = dlopen(CMPI_TEST_MODULE, RTLD_NOW | RTLD_NOLOAD);
  if (!_library) throw std::runtime_error("the library is not in the process");
  using Get = const Control* (*)();
  if (!Library_Blocks::watch(CMPI_TEST_MODULE)) throw std::runtime_error("no code of the library");
  control = reinterpret_cast<Get>(dlsym(_library, "cmpi_test_control"))();
}

Built_Bridge::~Built_Bridge() {
  control->reset();
  EXPECT_EQ(broker.unload(true).rc, CMPI_RC_OK);
  EXPECT_TRUE(broker.lateNotes().empty());
  EXPECT_EQ(broker.openAttachments(), 0U);
  dlclose(_library);
  EXPECT_FALSE(broker.stillMapped(CMPI_TEST_MODULE));
}

Request Built_Bridge::request(Call call, const ObjectPath& path, const std::string& association) {
  Request made;
  made.operation = call;
  made.path = path;
  made.exact = true;
  if (is_walk(call)) made.assocClass = association;
  if (call == Call::References || call == Call::ReferenceNames) made.resultClass = association;
  return made;
}

Reply Built_Bridge::run_once(const Request& request) {
  Reply reply = broker.run(request);
  EXPECT_FALSE(reply.report.leaks()) << reply.report.text();
  EXPECT_TRUE(reply.report.complaints.empty()) << reply.report.complaints.front();
  EXPECT_EQ(reply.status.message, "");
  return reply;
}

Reply Built_Bridge::run(const Request& request) {
  Reply first = run_once(request);
  control->asked();
  const Trace_Log log;
  const std::size_t before = Library_Blocks::live();
  run_once(request);
  const char* notes = control->asked();
  EXPECT_EQ(Library_Blocks::live(), before) << "memory was lost";
  asked = split(notes);
  lines = log.lines();
  return first;
}

std::vector<std::string> Built_Bridge::texts(const std::string& level) const {
  std::vector<std::string> result;
  for (const Log_Line& line : lines)
    if (line.level == level) result.push_back(line.text);
  return result;
}

std::string Built_Bridge::ending() const {
  std::string result;
  for (const std::string& text : texts("DBG"))
    if (text.starts_with("return: ")) result = text.substr(8);
  return result;
}

}  // namespace cimrt::test

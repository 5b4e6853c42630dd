#include "cli/Commands.h"

#include <fmt/format.h>

#include <algorithm>
#include <iostream>
#include <set>

#include "cim/JsonText.h"
#include "cli/Arguments.h"
#include "cli/Describe.h"
#include "cli/Output.h"
#include "cli/Places.h"
#include "cli/Requests.h"
#include "cli/Session.h"
#include "cli/Table.h"

namespace tvx::host {
namespace {

using Json = nlohmann::ordered_json;

PathResolver resolverOf(Session& session) {
  return [&session](const std::string& text) { return session.resolve(text); };
}

// ---- Printing ----

void printPaths(Session& session, const std::vector<ObjectPath>& paths) {
  if (session.options().format != Format::Json) {
    for (const ObjectPath& path : paths) {
      session.out() << printPath(path) << "\n";
    }
    return;
  }
  Json list = Json::array();
  for (const ObjectPath& path : paths) {
    list.push_back(printPath(path));
  }
  printJson(session, "paths", std::move(list));
}

/// One table for each class, so that the columns suit it.
void printTables(Session& session, const std::vector<Instance>& instances) {
  std::vector<std::string> names;
  for (const Instance& instance : instances) {
    if (std::find(names.begin(), names.end(), instance.className()) == names.end()) {
      names.push_back(instance.className());
    }
  }
  if (names.empty()) {
    session.out() << "no instances\n";
  }
  for (const std::string& name : names) {
    std::vector<Instance> group;
    std::copy_if(instances.begin(), instances.end(), std::back_inserter(group),
                 [&](const Instance& each) { return each.className() == name; });
    if (names.size() > 1) {
      session.out() << (name == names.front() ? "" : "\n") << name << "\n";
    }
    session.out() << instanceTable(group, session.options().properties);
  }
}

void printInstances(Session& session, const std::vector<Instance>& instances) {
  switch (session.options().format) {
    case Format::Json: {
      Json list = Json::array();
      for (const Instance& instance : instances) {
        list.push_back(toJson(instance));
      }
      printJson(session, "instances", std::move(list));
      break;
    }
    case Format::Mof:
      for (const Instance& instance : instances) {
        session.out() << mofText(instance);
      }
      break;
    case Format::Table:
      printTables(session, instances);
      break;
  }
}

bool isNames(Operation operation) {
  return operation == Operation::EnumerateInstanceNames ||
         operation == Operation::AssociatorNames || operation == Operation::ReferenceNames;
}

const ObjectPath& pathOf(const ObjectPath& path) {
  return path;
}
const ObjectPath& pathOf(const Instance& instance) {
  return instance.path;
}

/// Several association classes may lead to the same object: keeps the first of each.
template <class T>
void dropRepeated(std::vector<T>& items) {
  std::set<std::string> seen;
  std::erase_if(items, [&](const T& item) {
    return !pathOf(item).keys.empty() && !seen.insert(printPath(pathOf(item))).second;
  });
}

/// For requests to several providers: prints what came, then fails if one of them failed.
void printReply(Session& session, const Request& request, Reply reply) {
  dropRepeated(reply.instances);
  dropRepeated(reply.paths);
  if (reply.status.ok() || !reply.instances.empty() || !reply.paths.empty()) {
    if (isNames(request.operation)) {
      printPaths(session, reply.paths);
    } else {
      printInstances(session, reply.instances);
    }
  }
  if (!reply.status.ok()) {
    session.fail(reply.status,
                 fmt::format("{} {}", operationName(request.operation), printPath(request.path)));
  }
}

// ---- Commands ----

ExitCode enumerate(Session& session) {
  const Options& options = session.options();
  session.requireClass(options.className);
  Request request;
  request.operation =
      options.command == "ein" ? Operation::EnumerateInstanceNames : Operation::EnumerateInstances;
  request.path.className = options.className;
  request.path.nameSpace = options.nameSpace;
  request.properties = options.properties;
  printReply(session, request, session.run(request, true));
  return ExitCode::Ok;
}

ExitCode get(Session& session) {
  const Options& options = session.options();
  Request request;
  request.operation = Operation::GetInstance;
  request.path = session.resolve(options.path);
  request.properties = options.properties;
  const Reply reply = session.run(request);
  if (reply.instances.empty()) {
    throw CommandError(ExitCode::NotFound,
                       "no instance " + printPath(request.path) + " was answered");
  }
  if (options.format == Format::Table) {
    session.out() << instanceDetails(reply.instances.front());
  } else {
    printInstances(session, reply.instances);
  }
  return ExitCode::Ok;
}

ExitCode walk(Session& session) {
  const Options& options = session.options();
  Request request;
  request.operation = options.command == "ai"    ? Operation::Associators
                      : options.command == "ain" ? Operation::AssociatorNames
                      : options.command == "ri"  ? Operation::References
                                                 : Operation::ReferenceNames;
  request.path = session.resolve(options.path);
  request.properties = options.properties;
  request.assocClass = options.assocClass;
  request.resultClass = options.resultClass;
  request.role = options.role;
  request.resultRole = options.resultRole;
  for (const std::string& name : {options.assocClass, options.resultClass}) {
    if (!name.empty()) {
      session.requireClass(name);
    }
  }
  printReply(session, request, session.run(request, true));
  return ExitCode::Ok;
}

const MethodData& requireMethod(const ClassData& classData, const std::string& name) {
  if (const MethodData* method = findMethod(classData, name)) {
    return *method;
  }
  std::vector<std::string> names;
  for (const MethodData& method : methods(classData)) {
    names.emplace_back(method.name);
  }
  throw CommandError(ExitCode::BadArgument,
                     names.empty() ? fmt::format("class {} has no methods", classData.name)
                                   : fmt::format("class {} has no method '{}'; it has: {}",
                                                 classData.name, name, fmt::join(names, ", ")),
                     CMPI_RC_ERR_METHOD_NOT_FOUND);
}

void printMethodReply(Session& session, const Reply& reply) {
  if (session.options().format == Format::Json) {
    Json json = jsonHead("cm");
    json["return"] = toJson(reply.returnValue);
    Json& outputs = json["outputs"] = Json::object();
    for (const NamedValue& output : reply.outputs) {
      outputs[output.name] = toJson(output.value);
    }
    session.out() << json.dump(2) << "\n";
    return;
  }
  session.out() << "return = " << mofValue(reply.returnValue) << "\n";
  for (const NamedValue& output : reply.outputs) {
    session.out() << output.name << " = " << mofValue(output.value) << "\n";
  }
}

const ClassData& describedClass(Session& session, const std::string& name) {
  const ClassData* classData = session.requireClass(name);
  if (classData == nullptr) {
    throw CommandError(ExitCode::UnknownClass,
                       fmt::format("class '{}' has no description to take types from", name));
  }
  return *classData;
}

ExitCode callMethod(Session& session) {
  const Options& options = session.options();
  Request request;
  request.operation = Operation::InvokeMethod;
  request.path = session.resolve(options.path);
  const ClassData& classData = describedClass(session, request.path.className);
  const MethodData& method = requireMethod(classData, options.method);
  request.method = method.name;
  request.arguments = parseArguments(classData, method, options.assignments, session.classes(),
                                     resolverOf(session));
  const Reply reply = session.run(request);
  printMethodReply(session, reply);
  const Value& result = reply.returnValue;
  const bool isNumber =
      !result.isNull() && result.type() >= CMPI_uint8 && result.type() <= CMPI_sint64;
  return isNumber && result.display() != "0" ? ExitCode::MethodResult : ExitCode::Ok;
}

ExitCode create(Session& session) {
  const Options& options = session.options();
  const ClassData& classData = describedClass(session, options.className);
  Request request;
  request.operation = Operation::CreateInstance;
  request.path.className = classData.name;
  request.path.nameSpace = options.nameSpace;
  request.instance.properties =
      parseProperties(classData, options.assignments, session.classes(), resolverOf(session));
  for (const NamedValue& property : request.instance.properties) {
    if (findFeature(classData, property.name)->isKey) {
      request.path.keys.set(property.name, property.value);
    }
  }
  printPaths(session, session.run(request).paths);
  return ExitCode::Ok;
}

ExitCode modify(Session& session) {
  const Options& options = session.options();
  Request request;
  request.operation = Operation::ModifyInstance;
  request.path = session.resolve(options.path);
  const ClassData& classData = describedClass(session, request.path.className);
  request.instance.properties =
      parseProperties(classData, options.assignments, session.classes(), resolverOf(session));
  request.properties.emplace();
  for (const NamedValue& property : request.instance.properties) {
    request.properties->push_back(property.name);
  }
  request.instance.path = request.path;
  request.instance.addKeysAsProperties();
  session.run(request);
  printPaths(session, {request.path});
  return ExitCode::Ok;
}

ExitCode remove(Session& session) {
  Request request;
  request.operation = Operation::DeleteInstance;
  request.path = session.resolve(session.options().path);
  session.run(request);
  printPaths(session, {request.path});
  return ExitCode::Ok;
}

struct CommandRow {
  const char* name;
  ExitCode (*run)(Session&);
};

constexpr CommandRow commands[] = {{"ein", enumerate}, {"ei", enumerate},  {"gi", get},
                                   {"ai", walk},       {"ain", walk},      {"ri", walk},
                                   {"rin", walk},      {"cm", callMethod}, {"ci", create},
                                   {"mi", modify},     {"di", remove}};

/// What the command line chose: a family's command, or one of the table.
CommandRun chosen(const Options& options) {
  if (options.run) {
    return options.run;
  }
  for (const CommandRow& command : commands) {
    if (options.command == command.name) {
      return command.run;
    }
  }
  throw CommandError(ExitCode::Usage, "unknown command '" + options.command + "'");
}

/// Strict mode's findings are told after a failure too.
ExitCode runWithLibrary(const Options& options, const ClassCatalogue& classes, std::ostream& out,
                        std::ostream& err) {
  const CommandRun run = chosen(options);
  Session session(options, classes, out, err);
  try {
    const ExitCode code = run(session);
    const ExitCode strict = session.finish();
    return code == ExitCode::Ok ? strict : code;
  } catch (const CommandError&) {
    session.finish();
    throw;
  }
}

void reportError(const Options& options, const CommandError& error, std::ostream& out,
                 std::ostream& err) {
  err << "tvxcim: " << error.what() << "\n";
  if (options.format == Format::Json) {
    Json json = jsonHead(options.command);
    json["error"] = {{"exitCode", static_cast<int>(error.code())}, {"message", error.what()}};
    if (error.rc() >= 0) {
      json["error"]["rc"] = error.rc();
      json["error"]["name"] = rcName(error.rc());
    }
    out << json.dump(2) << "\n";
  }
}

}  // namespace

ExitCode runCommand(const Options& options, const ClassCatalogue& classes, std::ostream& out,
                    std::ostream& err) {
  try {
    if (options.command == "classes") {
      describeClasses(options, classes, out);
      return ExitCode::Ok;
    }
    if (options.command == "class") {
      describeClass(options, classes, out);
      return ExitCode::Ok;
    }
    return runWithLibrary(options, classes, out, err);
  } catch (const CommandError& error) {
    reportError(options, error, out, err);
    return error.code();
  } catch (const std::exception& error) {
    reportError(options, CommandError(ExitCode::Internal, error.what()), out, err);
    return ExitCode::Internal;
  }
}

int runProgram(int argc, const char* const* argv, const ClassCatalogue& classes) {
  int exitCode = 0;
  const std::optional<Options> options = parseOptions(argc, argv, exitCode);
  if (!options) {
    return exitCode;
  }
  try {
    prepareEnvironment(*options, argv);
  } catch (const CommandError& error) {
    reportError(*options, error, std::cout, std::cerr);
    return static_cast<int>(error.code());
  }
  const ExitCode code = runCommand(*options, classes, std::cout, std::cerr);
  std::cout.flush();
  return static_cast<int>(code);
}

}  // namespace tvx::host

#include "cli/Session.h"

#include <fmt/format.h>

#include <algorithm>

#include "cli/Places.h"

namespace tvx::host {
namespace {

BrokerOptions brokerOptions(const Options& options, const ClassCatalogue& classes) {
  BrokerOptions result;
  result.version = options.brokerVersion;
  result.strict = options.strict;
  result.classes = &classes;
  return result;
}

ExitCode exitCodeOf(int rc) {
  switch (rc) {
    case CMPI_RC_ERR_INVALID_CLASS:
      return ExitCode::UnknownClass;
    case CMPI_RC_ERR_INVALID_NAMESPACE:
      return ExitCode::UnknownNameSpace;
    case CMPI_RC_ERR_NOT_FOUND:
      return ExitCode::NotFound;
    default:
      return ExitCode::CimError;
  }
}

std::size_t keyCount(const ClassData& classData) {
  const auto all = features(classData);
  return static_cast<std::size_t>(
      std::count_if(all.begin(), all.end(), [](const FeatureData& each) { return each.isKey; }));
}

bool matches(const ObjectPath& candidate, const ObjectPath& wanted) {
  return std::all_of(wanted.keys.begin(), wanted.keys.end(), [&](const NamedValue& key) {
    const Value* value = candidate.keys.find(key.name);
    return value != nullptr && value->display() == key.value.display();
  });
}

}  // namespace

std::string unknownClassText(const ClassCatalogue& classes, const std::string& name) {
  const auto near = classes.nearNames(name);
  const std::string hint = near.empty() ? std::string("; 'tvxcim classes' lists them")
                                        : fmt::format("; did you mean {}?", fmt::join(near, ", "));
  return fmt::format("unknown class '{}'{}", name, hint);
}

Session::Session(const Options& options, const ClassCatalogue& classes, std::ostream& out,
                 std::ostream& err)
    : m_Options(options),
      m_Classes(classes),
      m_Out(out),
      m_Err(err),
      m_Broker(std::make_unique<Broker>(brokerOptions(options, classes))) {
  if (!options.foreignFile.empty()) {
    try {
      m_Broker->addForeignFile(options.foreignFile);
    } catch (const std::exception& error) {
      throw CommandError(ExitCode::File, std::string("--foreign: ") + error.what());
    }
  }
  try {
    m_Broker->load(findProviderLibrary(options));
  } catch (const LoadError& error) {
    throw CommandError(ExitCode::Library, std::string(error.what()) + "; check --lib");
  }
}

const ClassData* Session::requireClass(const std::string& name) {
  const ClassData* classData = m_Classes.find(name);
  if (classData == nullptr && m_Broker->foreignInstances(name).empty()) {
    throw CommandError(ExitCode::UnknownClass, unknownClassText(m_Classes, name),
                       CMPI_RC_ERR_INVALID_CLASS);
  }
  return classData;
}

void Session::fail(const Status& status, const std::string& what) const {
  std::string text = fmt::format("{}: {} ({})", what, rcWords(status.rc), rcName(status.rc));
  if (!status.message.empty()) {
    text += ": " + status.message;
  }
  throw CommandError(exitCodeOf(status.rc), text, status.rc);
}

Reply Session::run(Request request, bool partial) {
  if (request.path.nameSpace.empty()) {
    request.path.nameSpace = m_Options.nameSpace;
  }
  Reply reply = m_Broker->run(request);
  m_Reports.push_back(reply.report);
  if (!reply.status.ok() && !partial) {
    fail(reply.status,
         fmt::format("{} {}", operationName(request.operation), printPath(request.path)));
  }
  return reply;
}

ObjectPath Session::resolve(const std::string& text) {
  try {
    ObjectPath path = parsePath(text, m_Options.nameSpace);
    const ClassData* classData = requireClass(path.className);
    if (classData == nullptr) {
      return path;
    }
    typeKeys(path, m_Classes);
    return path.keys.size() < keyCount(*classData) ? complete(std::move(path), *classData) : path;
  } catch (const PathError& error) {
    throw CommandError(ExitCode::NotFound, error.what());
  }
}

ObjectPath Session::complete(ObjectPath path, const ClassData& classData) {
  Request request;
  request.operation = Operation::EnumerateInstanceNames;
  request.path.className = path.className;
  request.path.nameSpace = path.nameSpace;
  Reply reply = run(request);
  std::erase_if(reply.paths, [&](const ObjectPath& each) { return !matches(each, path); });
  if (reply.paths.size() == 1) {
    return reply.paths.front();
  }
  if (reply.paths.empty()) {
    throw CommandError(ExitCode::NotFound,
                       fmt::format("no instance fits {}; 'tvxcim ein {}' lists them",
                                   printPath(path), classData.name),
                       CMPI_RC_ERR_NOT_FOUND);
  }
  std::string list;
  for (const ObjectPath& each : reply.paths) {
    list += "\n  " + printPath(each);
  }
  throw CommandError(ExitCode::NotFound, fmt::format("{} instances fit {}; add keys:{}",
                                                     reply.paths.size(), printPath(path), list));
}

void Session::keep(const ScopeReport& report) {
  if (report.leaks()) {
    const std::lock_guard lock(m_Mutex);
    m_Reports.push_back(report);
  }
}

ExitCode Session::finish() {
  const Status unloaded = m_Broker->unload(true);
  if (!m_Options.strict) {
    return ExitCode::Ok;
  }
  for (const ScopeReport& each : m_Broker->threadReports()) {
    m_Reports.push_back(each);
  }
  bool leaks = m_Broker->openAttachments() != 0;
  for (const ScopeReport& report : m_Reports) {
    m_Err << report.text();
    leaks = leaks || report.leaks();
  }
  for (const std::string& note : m_Broker->lateNotes()) {
    m_Err << note << "\n";
  }
  if (!unloaded.ok()) {
    m_Err << "cleanup: " << rcWords(unloaded.rc) << "\n";
  }
  m_Err << "strict: " << (leaks ? "something leaked" : "nothing leaked") << "\n";
  return leaks ? ExitCode::Strict : ExitCode::Ok;
}

}  // namespace tvx::host

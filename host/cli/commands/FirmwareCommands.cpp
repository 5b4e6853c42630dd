// `firmware show` and `firmware install`.
#include <fmt/format.h>
#include <unistd.h>

#include <CLI/CLI.hpp>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <optional>

#include "cli/Firmware.h"
#include "cli/Ports.h"
#include "cli/Progress.h"
#include "cli/Requests.h"
#include "cli/Session.h"
#include "cli/Table.h"
#include "cli/commands/Families.h"

namespace tvx::host {
namespace {

namespace fs = std::filesystem;

constexpr const char* installationService = "TVXHBA_SoftwareInstallationService";
constexpr std::uint64_t resetOption = 2;
constexpr std::uint64_t fileNameOption = 32768;

struct FirmwareWords {
  std::string port;
  std::string file;
  bool reset = false;
  bool stream = false;
};

// ---- Where temporary files lie ----

/// A folder of its own for what the provider writes: while it lives it is the working directory,
/// into which the provider fetches files. It goes with all that is left in it.
class WorkFolder {
 public:
  WorkFolder() : m_Before(fs::current_path()) {
    std::string name = (fs::temp_directory_path() / "tvxcim-firmware-XXXXXX").string();
    if (mkdtemp(name.data()) == nullptr) {
      throw CommandError(ExitCode::File, "no folder can be made in " +
                                             fs::temp_directory_path().string() +
                                             "; set TMPDIR to a folder that can be written");
    }
    m_Path = name;
    fs::current_path(m_Path);
  }
  ~WorkFolder() {
    std::error_code ignored;
    fs::current_path(m_Before, ignored);
    fs::remove_all(m_Path, ignored);
  }
  WorkFolder(const WorkFolder&) = delete;
  WorkFolder& operator=(const WorkFolder&) = delete;

  fs::path path(const std::string& name) const { return m_Path / name; }

 private:
  fs::path m_Before;
  fs::path m_Path;
};

// ---- Arguments of the two methods ----

Value numbers(const std::vector<std::uint64_t>& values) {
  Value::List list;
  for (const std::uint64_t value : values) {
    list.push_back(Value::number(CMPI_uint16, value));
  }
  return Value::array(CMPI_uint16, std::move(list));
}

Value texts(const std::vector<std::string>& values) {
  Value::List list;
  for (const std::string& value : values) {
    list.push_back(Value::string(value));
  }
  return Value::array(CMPI_string, std::move(list));
}

/// The bytes of a file. Throws CommandError (File).
Value bytesOf(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  const std::string content((std::istreambuf_iterator<char>(file)), {});
  if (!file) {
    throw CommandError(ExitCode::File, "cannot read " + path);
  }
  Value::List list;
  list.reserve(content.size());
  for (const char c : content) {
    list.push_back(Value::number(CMPI_uint8, static_cast<unsigned char>(c)));
  }
  return Value::array(CMPI_uint8, std::move(list));
}

struct Call {
  const char* method;
  NamedValues arguments;
};

Call callFor(const FirmwareWords& words, const ObjectPath& port, const WorkFolder& folder) {
  const Value target = Value::reference(port);
  if (!words.stream) {
    const std::string uri = isRemote(words.file) ? words.file : localPath(words.file);
    return {"InstallFromURI",
            {{"URI", Value::string(uri)},
             {"Target", target},
             {"InstallOptions", numbers(words.reset ? std::vector<std::uint64_t>{resetOption}
                                                    : std::vector<std::uint64_t>{})},
             {"InstallOptionsValues", texts({})}}};
  }
  std::vector<std::uint64_t> options = {fileNameOption};
  std::vector<std::string> values = {folder.path("stream.fw").string()};
  if (words.reset) {
    options.push_back(resetOption);
    values.emplace_back();
  }
  return {"InstallFromByteStream",
          {{"Image", bytesOf(localPath(words.file))},
           {"Target", target},
           {"InstallOptions", numbers(options)},
           {"InstallOptionsValues", texts(values)}}};
}

void requireReadable(const FirmwareWords& words) {
  if (isRemote(words.file)) {
    if (words.stream) {
      throw CommandError(ExitCode::BadArgument, "--stream needs a local file");
    }
    return;
  }
  const std::string path = localPath(words.file);
  std::error_code ignored;
  if (!fs::is_regular_file(path, ignored) || access(path.c_str(), R_OK) != 0) {
    throw CommandError(ExitCode::File, "cannot read the firmware file " + path);
  }
}

// ---- What is there ----

struct FirmwareRow {
  std::string wwpn;
  std::string operational;
  std::string onFlash;
  std::uint64_t downloadStatus = 0;
};

/// The firmware of a port; the identity of several ports may be one, of the first of them.
FirmwareRow rowOf(const Instance& port, const std::vector<Instance>& identities) {
  FirmwareRow row{wwnText(port.text("DeviceID")), port.text("OperationalFirmware"), {}};
  const Value* const status = port.properties.find("FWDownloadStatus");
  if (status != nullptr && !status->isNull()) {
    row.downloadStatus = status->asUnsigned();
  }
  for (const Instance& identity : identities) {
    if (sameName(identity.text("PortWWN"), port.text("DeviceID"))) {
      row.onFlash = identity.text("FirmwareOnFlash");
      break;
    }
  }
  return row;
}

std::string statusWords(std::uint64_t status) {
  return status == 0 ? "-" : fmt::format("{} ({})", installationWords(status), status);
}

nlohmann::ordered_json rowJson(const FirmwareRow& row) {
  return {{"wwpn", row.wwpn},
          {"operational", row.operational},
          {"onFlash", row.onFlash},
          {"downloadStatus", row.downloadStatus}};
}

ExitCode showFirmware(Session& session, const FirmwareWords& words) {
  const std::vector<Instance> ports = words.port.empty()
                                          ? instancesOf(session, "TVXHBA_FCPort")
                                          : std::vector<Instance>{findPort(session, words.port)};
  const std::vector<Instance> identities = instancesOf(session, "TVXHBA_SoftwareIdentity");
  nlohmann::ordered_json list = nlohmann::ordered_json::array();
  Table table({"WWPN", "OPERATIONAL", "ON FLASH", "LAST DOWNLOAD"});
  for (const Instance& port : ports) {
    const FirmwareRow row = rowOf(port, identities);
    list.push_back(rowJson(row));
    table.add({row.wwpn, row.operational, row.onFlash.empty() ? "-" : row.onFlash,
               statusWords(row.downloadStatus)});
  }
  if (session.options().format == Format::Json) {
    printJson(session, "firmware", std::move(list));
  } else {
    session.out() << (ports.empty() ? "no FC ports\n" : table.text());
  }
  return ExitCode::Ok;
}

// ---- Installing ----

std::uint64_t install(Session& session, const FirmwareWords& words, const Instance& port) {
  constexpr std::chrono::milliseconds terminalStep{1000};
  constexpr std::chrono::milliseconds logStep{10'000};
  const Instance service = onlyInstanceOf(session, installationService);
  const WorkFolder folder;
  Call call = callFor(words, port.path, folder);
  const bool terminal = isatty(STDERR_FILENO) != 0;
  const Progress progress(
      session.err(),
      fmt::format("installing {} on {}{}", shownUri(words.file), wwnText(port.text("DeviceID")),
                  words.reset ? " with a reset" : ""),
      terminal ? terminalStep : logStep, terminal);
  return resultNumber(callMethod(session, service.path, call.method, std::move(call.arguments)));
}

ExitCode installFirmware(Session& session, FirmwareWords words) {
  requireReadable(words);
  if (!isRemote(words.file)) {
    words.file = localPath(words.file);
  }
  const Instance port = findPort(session, words.port);
  const std::uint64_t result = install(session, words, port);
  const FirmwareRow row =
      rowOf(findPort(session, words.port), instancesOf(session, "TVXHBA_SoftwareIdentity"));
  const bool reboot = result == 0 && row.downloadStatus == waitsForReboot;
  const std::string said = installationWords(reboot ? waitsForReboot : result);
  if (session.options().format == Format::Json) {
    // What runs and what is on flash is not told here: the cache may be a refresh behind.
    printJson(session, "installation",
              {{"wwpn", row.wwpn},
               {"result", result},
               {"words", said},
               {"downloadStatus", row.downloadStatus},
               {"rebootNeeded", reboot}});
  } else {
    session.out() << fmt::format("{}: {} ({})\n", row.wwpn, said, result);
  }
  return result == 0 ? ExitCode::Ok : ExitCode::MethodResult;
}

}  // namespace

void addFirmwareCommands(CLI::App& app, const CommandChooser& choose) {
  auto words = std::make_shared<FirmwareWords>();
  CLI::App* firmware = app.add_subcommand("firmware", "firmware of the FC ports");
  firmware->require_subcommand(1);
  CLI::App* show = firmware->add_subcommand("show", "what runs and what is on flash");
  show->add_option("PORT", words->port, portWords);
  choose(show, "firmware show",
         [words](Session& session) { return showFirmware(session, *words); });
  CLI::App* put = firmware->add_subcommand("install", "install a firmware file");
  put->add_option("PORT", words->port, portWords)->required();
  put->add_option("FILE-OR-URI", words->file, "local file, or URI that the provider fetches")
      ->required();
  put->add_flag("--reset", words->reset, "reset the adapter afterwards, to run the new firmware");
  put->add_flag("--stream", words->stream, "send the bytes of a local file with the request");
  choose(put, "firmware install",
         [words](Session& session) { return installFirmware(session, *words); });
}

}  // namespace tvx::host

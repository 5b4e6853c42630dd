// Methods of the service for frame tagging, with the tagging library in the default scope and
// without.
#include <dlfcn.h>

#include <atomic>
#include <cerrno>
#include <cstdlib>
#include <fstream>
#include <new>
#include <rapidxml/rapidxml.hpp>
#include <sstream>
#include <stdexcept>

#include "../logs/Failing_New.h"
#include "Service_Test.h"
#include "services/TVXHBA_FCTagService_Provider.h"

namespace {

/// What the machine's `gethostname` does instead, in a test that looks at its failure.
int (*hostNameFailure)() = nullptr;

}  // namespace

extern "C" int gethostname(char* name, std::size_t size) noexcept {
  if (hostNameFailure) return hostNameFailure();
  using Function = int (*)(char*, std::size_t);
  static const auto real = reinterpret_cast<Function>(::dlsym(RTLD_NEXT, "gethostname"));
  return real(name, size);
}

namespace cimrt::test {
namespace {

class Tag_Service : public Service_Test {
 protected:
  void SetUp() override {
    Service_Test::SetUp();
    m_Library = ::dlopen(TVX_SIM_TVSDM, RTLD_NOW | RTLD_GLOBAL);
    ASSERT_NE(m_Library, nullptr) << ::dlerror();
    state.null = 1;
  }
  void TearDown() override {
    hostNameFailure = nullptr;
    Service_Test::TearDown();
    setDlOperations(nullptr);
    ::dlclose(m_Library);
  }
  /// The first port with so many tags and with its dumps in a folder of the test.
  void buildTags(int entries, const std::string& flag = "5") {
    std::filesystem::create_directories(root / "dumps");
    std::string list;
    for (int i = 0; i < entries; i++)
      list += std::string(i == 0 ? "" : ", ") +
              R"({"source": "10000000000000A1", "target": "50000000000000C1", "tag": )" +
              std::to_string(i + 1) + "}";
    build(R"("dumps": {"directory": ")" + (root / "dumps").string() + R"("}, "qos": {"flag": )" +
          flag + R"(, "entries": [)" + list + "]}");
  }
  const TVXHBA_FCTagService* service() { return agent->m_TVXHBA_FCTagService_map[0]; }
  std::uint32_t getFlag(const TVXHBA_FCPort* target) {
    EXPECT_EQ(provider.GetGlobalFlag(service(), target, state, result), 0);
    return result.value;
  }
  std::uint32_t setFlag(const TVXHBA_FCPort* target, std::uint32_t value) {
    Property<std::uint32_t> wanted{};
    wanted.set(value);
    EXPECT_EQ(provider.SetGlobalFlag(service(), target, wanted, result), 0);
    return result.value;
  }
  static Property<String> textProperty(const std::string& text) {
    Property<String> property{};
    property.set(text.c_str());
    return property;
  }
  std::uint32_t getTable(const TVXHBA_FCPort* target, const std::string& uri) {
    EXPECT_EQ(provider.GetConfigTable(service(), target, textProperty(uri), result), 0);
    return result.value;
  }
  std::uint32_t setTable(const std::string& uri) {
    EXPECT_EQ(provider.SetConfigTable(service(), port(), textProperty(uri), result), 0);
    return result.value;
  }
  std::string read(const std::string& path) {
    std::ostringstream text;
    text << std::ifstream(root / path).rdbuf();
    return text.str();
  }

  TVXHBA_FCTagService_Provider provider;
  Property<std::uint32_t> state{};

 private:
  void* m_Library = nullptr;
};

// --- The flag

TEST_F(Tag_Service, FlagIsReadAndSet) {
  buildTags(0);
  EXPECT_EQ(getFlag(port()), 0u);
  EXPECT_EQ(numberOf(state), 5);
  EXPECT_EQ(setFlag(port(), 77), 0u);
  EXPECT_EQ(getFlag(port()), 0u);
  EXPECT_EQ(numberOf(state), 77);
  const std::string adapter = textOf(port()->AdapterName);
  for (const std::string& text : std::vector<std::string>{
           "TVXHBA_FCTagService_Provider: Inside GetGlobalFlag",
           "TVXHBA_FCTagService_Provider::Successfully got AdapterName," + adapter,
           "TVXHBA_FCTagService_Provider::CPQFC_GetNumberOfAdapters Successful:2",
           "TVXHBA_FCTagService_Provider::GetGlobalFlag Successful",
           "TVXHBA_FCTagService_Provider: Inside SetGlobalFlag",
           "TVXHBA_FCTagService_Provider::SetGlobalFlag Successful"})
    EXPECT_EQ(log.level(text), TVX_DBG) << text;
  EXPECT_EQ(tvxsim_calls("CPQFC_OpenAdapter", nullptr), 3u);
  EXPECT_EQ(tvxsim_calls("CPQFC_CloseAdapter", nullptr), 3u);
}

TEST_F(Tag_Service, FailuresOfTheFlagAreTold) {
  buildTags(0);
  addFault(R"({"call": ["CPQFC_QoSGetGlobalFlag", "CPQFC_QoSSetGlobalFlag"], "status": 9})");
  EXPECT_EQ(getFlag(port()), 1u);
  EXPECT_TRUE(state.is_null());
  EXPECT_EQ(setFlag(port(), 1), 1u);
  EXPECT_EQ(log.level("TVXHBA_FCTagService_Provider::CPQFC_QoSGetGlobalFlag Failed with Error :9"),
            TVX_ERR);
  EXPECT_EQ(log.level("TVXHBA_FCTagService_Provider::CPQFC_QoSSetGlobalFlag Failed with Error :9"),
            TVX_ERR);
  EXPECT_EQ(tvxsim_calls("CPQFC_CloseAdapter", nullptr), 2u);
}

// --- Opening

TEST_F(Tag_Service, StrangersAreRefused) {
  buildTags(0);
  const auto unknown = stranger<TVXHBA_FCTagService>();
  provider.GetGlobalFlag(unknown.get(), port(), state, result);
  EXPECT_EQ(result.value, 33068u);
  EXPECT_EQ(log.level("Invalid instance of FC Tagging Service"), TVX_ERR);
  EXPECT_EQ(getFlag(nullptr), 4097u);
  EXPECT_EQ(setFlag(nullptr, 1), 4097u);
  EXPECT_EQ(getTable(nullptr, "t.xml"), 4097u);
  EXPECT_EQ(log.count("Target has a null pointer"), 3u);
  EXPECT_EQ(log.level("Target has a null pointer"), TVX_ERR);
  EXPECT_EQ(setFlag(pathTo("10000000000000FF").get(), 1), 32968u);
  EXPECT_EQ(log.level("TVXHBA_FCTagService_Provider::Wrong DeviceID passed"), TVX_ERR);
  EXPECT_EQ(tvxsim_calls("CPQFC_GetNumberOfAdapters", nullptr), 0u);
}

TEST_F(Tag_Service, ALibraryWithoutAdaptersIsTold) {
  buildTags(1);
  addFault(R"({"call": "CPQFC_GetNumberOfAdapters", "status": 1})");
  std::ofstream(root / "t.xml") << "<a/>";
  EXPECT_EQ(getFlag(port()), 32768u);
  EXPECT_EQ(setFlag(port(), 1), 32768u);
  EXPECT_EQ(getTable(port(), "t.xml"), 32768u);
  EXPECT_EQ(setTable((root / "t.xml").string()), 32768u);
  const char* text = "TVXHBA_FCTagService_Provider::CPQFC_GetNumberOfAdapters()- No Adapters found";
  EXPECT_EQ(log.count(text), 4u);
  EXPECT_EQ(log.level(text), TVX_DBG);
}

TEST_F(Tag_Service, AnAdapterThatDoesNotOpenIsTold) {
  buildTags(1);
  port()->AdapterName.set("a name of more than thirty-one characters");
  std::ofstream(root / "t.xml") << "<a/>";
  EXPECT_EQ(getFlag(port()), 32968u);
  EXPECT_EQ(setFlag(port(), 1), 32968u);
  EXPECT_EQ(getTable(port(), "t.xml"), 32968u);
  EXPECT_EQ(setTable((root / "t.xml").string()), 32968u);
  const std::string name = "a name of more than thirty-one ";
  for (const char* text :
       {"TVXHBA_FCTagService_Provider::Failed to Open Adapter, Skipping GetGlobalFlag Adapter "
        "Name:",
        "ERROR:TVXHBA_FCTagService_Provider::Failed to Open Adapter, Skipping SetGlobalFlag "
        "Adapter Name:",
        "TVXHBA_FCTagService_Provider::Failed to Open Adapter, Skipping GetConfigTable Adaptor "
        "Name:",
        "TVXHBA_FCTagService_Provider::Failed to Open Adapter, Skipping SetConfigTable Adapter "
        "Name:"})
    EXPECT_EQ(log.level(text + name), TVX_DBG) << text;
  EXPECT_EQ(tvxsim_calls("CPQFC_CloseAdapter", nullptr), 0u);
}

TEST_F(Tag_Service, WithoutTheLibraryEveryCallFails) {
  // Once loaded the library does not leave the process: its names are hidden.
  static const TVX_Dl_Operations& system = dlOperations();
  static const TVX_Dl_Operations hiding = {
      system.open,
      [](void* handle, const char* name) {
        return std::string(name).starts_with("CPQFC_") ? nullptr : system.symbol(handle, name);
      },
      system.close, system.error};
  setDlOperations(&hiding);
  buildTags(1);
  EXPECT_EQ(getFlag(port()), 1u);
  EXPECT_EQ(setFlag(port(), 1), 1u);
  EXPECT_EQ(getTable(port(), "t.xml"), 1u);
}

TEST_F(Tag_Service, TheNameOfTheLastEntryOfAPortIsTaken) {
  buildTags(0);
  const std::string first = textOf(port()->AdapterName);
  Ref<TVXHBA_FCPort> again(static_cast<TVXHBA_FCPort*>(clone(port())));
  again->SystemName.set("another system");
  again->AdapterName.set("no such adapter");
  agent->m_TVXHBA_FCPort_map.insert(again.release());
  EXPECT_EQ(getFlag(port()), 32968u);
  const std::vector<std::string> texts = {
      "TVXHBA_FCTagService_Provider::Successfully got AdapterName," + first,
      "TVXHBA_FCTagService_Provider::Successfully got AdapterName,no such adapter"};
  EXPECT_EQ(log.only(texts), texts);
}

// --- From the library into a file

TEST_F(Tag_Service, TableIsWrittenIntoTheDumpDirectory) {
  buildTags(2);
  EXPECT_EQ(getTable(port(), "table.xml"), 0u);
  const std::string text = read("dumps/table.xml");
  EXPECT_NE(text.find("<Adapter>10000000000000A1</Adapter>"), std::string::npos);
  EXPECT_NE(text.find("<numberOfEntries>2</numberOfEntries>"), std::string::npos);
  EXPECT_NE(text.find("<src_wwpn>10000000000000A1</src_wwpn>"), std::string::npos);
  EXPECT_NE(text.find("<tag>2</tag>"), std::string::npos);
  EXPECT_EQ(text.find("<HostName/>"), std::string::npos);
  const std::string folder = (root / "dumps").string();
  for (const std::string& line : std::vector<std::string>{
           "TVXHBA_FCTagService_Provider::Successfully got DeviceID,10000000000000A1",
           "TVXHBA_FCTagService_Provider::Successfully got DumpPath," + folder, "PrintQoSEntry",
           "TVXHBA_FCTagService_Provider::GetConfigTable",
           "GetConfigTable: filename :" + folder + "/table.xml",
           "TVXHBA_FCTagService_Provider::WriteConfigTablesToFile",
           "TVXHBA_FCTagService_Provider::GetConfigTable Successful"})
    EXPECT_EQ(log.level(line), TVX_DBG) << line;
  EXPECT_EQ(tvxsim_calls("CPQFC_CloseAdapter", nullptr), 1u);
  const std::string opened =
      "TVXHBA_FCTagService_Provider::Successfully Opened Adapter, hbaHandle:";
  std::string handle;
  for (const Logged& each : log.all())
    if (each.level == TVX_DBG && each.text.starts_with(opened))
      handle = each.text.substr(opened.size());
  EXPECT_GT(std::atoi(handle.c_str()), 0) << handle;
}

TEST_F(Tag_Service, APortWithoutDumpSettingsUsesTheLastDirectory) {
  buildTags(2);
  EXPECT_EQ(getTable(port(), "first.xml"), 0u);
  agent->m_TVXHBA_DumpData_map.clear();
  EXPECT_EQ(getTable(port(), "second.xml"), 0u);
  EXPECT_FALSE(read("dumps/second.xml").empty());
}

TEST_F(Tag_Service, AnEmptyDirectoryMeansTheTemporaryOne) {
  buildTags(1);
  agent->m_TVXHBA_DumpData_map[0]->DumpDirectory.set("");
  std::filesystem::create_directories(root / "tmp");
  EXPECT_EQ(getTable(port(), "t.xml"), 0u);
  EXPECT_FALSE(read("tmp/t.xml").empty());
}

TEST_F(Tag_Service, WithoutEntriesThereIsNoFile) {
  buildTags(0);
  EXPECT_EQ(getTable(port(), "table.xml"), 32767u);
  EXPECT_FALSE(std::filesystem::exists(root / "dumps/table.xml"));
  EXPECT_EQ(log.level("TVXHBA_FCTagService_Provider:: CPQFC_QoSGetConfig - No Config Entries set "),
            TVX_DBG);
  EXPECT_EQ(tvxsim_calls("CPQFC_CloseAdapter", nullptr), 1u);
}

TEST_F(Tag_Service, NamesThatLeadOutOfTheFolderAreRefused) {
  buildTags(1);
  for (const char* name : {"../t.xml", "/etc/t.xml", "a/../../t.xml", "..", "a/.."}) {
    EXPECT_EQ(getTable(port(), name), 4097u) << name;
    EXPECT_EQ(log.level("TVXHBA_FCTagService_Provider::GetConfigTable: '" + std::string(name) +
                        "' leads out of the folder of the table"),
              TVX_ERR);
  }
  EXPECT_EQ(getTable(port(), ""), 4097u);
  EXPECT_EQ(log.level("Null sized URI..returning"), TVX_ERR);
  EXPECT_EQ(tvxsim_calls("CPQFC_OpenAdapter", nullptr), 0u);
  EXPECT_EQ(getTable(port(), "..t.xml"), 0u);
  std::filesystem::create_directories(root / "dumps/a..");
  EXPECT_EQ(getTable(port(), "a../t.xml"), 0u);
  EXPECT_FALSE(read("dumps/a../t.xml").empty());
}

TEST_F(Tag_Service, AFileThatCannotBeWrittenShowsInTheLogAlone) {
  buildTags(1);
  EXPECT_EQ(getTable(port(), "no/such/folder.xml"), 0u);
  EXPECT_EQ(log.level("TVXHBA_FCTagService_Provider::file.fail()"), TVX_ERR);
}

TEST_F(Tag_Service, ATableThatCannotBeReadIsTold) {
  buildTags(1);
  addFault(R"({"call": "CPQFC_QoSGetConfig", "nth": 2, "status": 12})");
  EXPECT_EQ(getTable(port(), "t.xml"), 1u);
  EXPECT_EQ(
      log.level("TVXHBA_FCTagService_Provider:: CPQFC_QoSGetConfig failed with an error :12 "),
      TVX_DBG);
  tvxsim_clear_faults();
  addFault(R"({"call": "CPQFC_QoSGetConfig", "returned_size": 4000000000})");
  EXPECT_EQ(getTable(port(), "t.xml"), 1u);
  EXPECT_EQ(log.level("TVXHBA_FCTagService_Provider:: Memory Allocation failed for pQosConfig"),
            TVX_DBG);
  EXPECT_FALSE(std::filesystem::exists(root / "dumps/t.xml"));
  EXPECT_EQ(tvxsim_calls("CPQFC_CloseAdapter", nullptr), 2u);
}

TEST_F(Tag_Service, AMachineWithoutANameGivesAnEmptyOne) {
  buildTags(1);
  hostNameFailure = [] {
    errno = ENAMETOOLONG;
    return -1;
  };
  EXPECT_EQ(getTable(port(), "t.xml"), 0u);
  EXPECT_NE(read("dumps/t.xml").find("<HostName/>"), std::string::npos);
  EXPECT_EQ(
      log.level("TVXHBA_FCTagService_Provider::gethostname() failed err : " +
                std::to_string(ENAMETOOLONG) + " , using 'unknown' for hostname and IP address"),
      TVX_ERR);
}

/// Throws out of the next look at the clock once the document is begun.
class Failing_Clock : public TVX_LoggerInterface {
 public:
  explicit Failing_Clock(void (*thrower)()) {
    s_Now = tvxNow();
    s_Thrower = thrower;
    getLogger().registerInterface(this);
    tvxSetClock(now);
  }
  ~Failing_Clock() override {
    getLogger().unregisterInterface(this);
    s_Armed = false;
  }
  void log(int, const char*, const unsigned*, const char* text) override {
    if (std::string(text) == "TVXHBA_FCTagService_Provider::WriteConfigTablesToFile")
      s_Armed = true;
  }
  void open() override {}
  void close() override {}
  void clear() override {}

 private:
  static std::uint64_t now() {
    if (s_Armed.exchange(false)) s_Thrower();
    return s_Now;
  }
  static inline std::atomic<bool> s_Armed{false};
  static inline std::atomic<std::uint64_t> s_Now{0};
  static inline void (*s_Thrower)() = nullptr;
};

TEST_F(Tag_Service, ExceptionsOfTheWriterAreLogged) {
  buildTags(1);
  const struct {
    void (*thrower)();
    const char* text;
  } rows[] = {{[] { throw std::bad_alloc(); },
               "TVXHBA_FCTagService_Provider: GetConfigTable Memory allocation failed"},
              {[] { throw std::runtime_error("a reason"); },
               "TVXHBA_FCTagService_Provider: GETConfigTable execption: a reason"},
              {[] { throw 5; },
               "TVXHBA_FCTagService_Provider: GetConfigTable unknown exectiion is caught"}};
  for (const auto& each : rows) {
    const Failing_Clock clock(each.thrower);
    EXPECT_EQ(getTable(port(), "t.xml"), 1u);
    EXPECT_EQ(log.level(each.text), TVX_DBG) << each.text;
  }
  EXPECT_EQ(read("dumps/t.xml"), "");
  EXPECT_EQ(tvxsim_calls("CPQFC_CloseAdapter", nullptr), 3u);
}

// --- From a file into the library

TEST_F(Tag_Service, TableIsSetFromItsOwnFile) {
  buildTags(3);
  EXPECT_EQ(getTable(port(), "t.xml"), 0u);
  std::string text = read("dumps/t.xml");
  text.replace(text.find("<tag>2</tag>"), 12, "<tag>300</tag>");
  std::ofstream(root / "new.xml") << text;
  EXPECT_EQ(setTable("file://" + (root / "new.xml").string()), 0u);
  EXPECT_EQ(log.level("TVXHBA_FCTagService_Provider::Entering SetConfigTable"), TVX_DBG);
  EXPECT_EQ(log.level("TVXHBA_FCTagService_Provider::filename is : " + (root / "new.xml").string()),
            TVX_DBG);
  EXPECT_EQ(log.level("TVXHBA_FCTagService_Provider::CPQFC_QoSSetConfig is success"), TVX_ERR);
  EXPECT_TRUE(std::filesystem::exists(root / "new.xml"));
  EXPECT_EQ(getTable(port(), "again.xml"), 0u);
  EXPECT_NE(read("dumps/again.xml").find("<tag>44</tag>"), std::string::npos);
}

TEST_F(Tag_Service, TheDeclaredCountGoesToTheLibrary) {
  buildTags(1);
  EXPECT_EQ(getTable(port(), "t.xml"), 0u);
  std::string text = read("dumps/t.xml");
  text.replace(text.find(">1</numberOfEntries>"), 2, ">3");
  std::ofstream(root / "new.xml") << text;
  EXPECT_EQ(setTable((root / "new.xml").string()), 0u);
  EXPECT_EQ(getTable(port(), "again.xml"), 0u);
  EXPECT_NE(read("dumps/again.xml").find("<numberOfEntries>3</numberOfEntries>"),
            std::string::npos);
  EXPECT_NE(read("dumps/again.xml").find("<src_wwpn>0000000000000000</src_wwpn>"),
            std::string::npos);
}

TEST_F(Tag_Service, ALibraryThatRefusesTheTableIsTold) {
  buildTags(1);
  EXPECT_EQ(getTable(port(), "t.xml"), 0u);
  addFault(R"({"call": "CPQFC_QoSSetConfig", "status": 8})");
  EXPECT_EQ(setTable((root / "dumps/t.xml").string()), 1u);
  EXPECT_EQ(log.level("TVXHBA_FCTagService_Provider::CPQFC_QoSSetConfig failed with an error :8"),
            TVX_ERR);
}

TEST_F(Tag_Service, ADocumentThatCannotBeReadShowsInTheLogAlone) {
  buildTags(1);
  std::ofstream(root / "t.xml") << "<ApexConfig/>";
  EXPECT_EQ(setTable((root / "t.xml").string()), 0u);
  EXPECT_EQ(log.level("theSystemNode is not found or corrupted in the Apex config table"), TVX_DBG);
  std::ofstream(root / "u.xml") << "no XML";
  EXPECT_EQ(setTable((root / "u.xml").string()), 0u);
  EXPECT_EQ(log.level("expected <"), TVX_DBG);
  EXPECT_EQ(setTable(root.string()), 0u);
  EXPECT_EQ(log.level("cannot open file " + root.string()), TVX_DBG);
  EXPECT_EQ(tvxsim_calls("CPQFC_QoSSetConfig", nullptr), 0u);
  EXPECT_EQ(tvxsim_calls("CPQFC_CloseAdapter", nullptr), 3u);
}

TEST_F(Tag_Service, ALackOfMemoryForTheDocumentIsLogged) {
  buildTags(1);
  ASSERT_EQ(getTable(port(), "t.xml"), 0u);
  {
    const Failing_New failing(sizeof(rapidxml::xml_document<char>));
    EXPECT_EQ(setTable((root / "dumps/t.xml").string()), 0u);
  }
  EXPECT_EQ(log.level("SetConfigTable: Memory allocation failed"), TVX_DBG);
  EXPECT_EQ(tvxsim_calls("CPQFC_QoSSetConfig", nullptr), 0u);
  EXPECT_EQ(tvxsim_calls("CPQFC_CloseAdapter", nullptr), 2u);
}

TEST_F(Tag_Service, ALibraryThatThrowsIsLogged) {
  static const TVX_Dl_Operations& system = dlOperations();
  static int (*const throwing)(
      HBA_HANDLE, CPQFC_QoSTable*) = [](HBA_HANDLE, CPQFC_QoSTable*) -> int { throw 5; };
  static const TVX_Dl_Operations hooking = {system.open,
                                            [](void* handle, const char* name) {
                                              return std::string(name) == "CPQFC_QoSSetConfig"
                                                         ? reinterpret_cast<void*>(throwing)
                                                         : system.symbol(handle, name);
                                            },
                                            system.close, system.error};
  setDlOperations(&hooking);
  buildTags(1);
  ASSERT_EQ(getTable(port(), "t.xml"), 0u);
  EXPECT_EQ(setTable((root / "dumps/t.xml").string()), 0u);
  EXPECT_EQ(log.level("unknown exectiion is caught"), TVX_DBG);
  EXPECT_EQ(tvxsim_calls("CPQFC_CloseAdapter", nullptr), 2u);
}

TEST_F(Tag_Service, AFileThatIsNotThereIsTold) {
  buildTags(1);
  EXPECT_EQ(setTable("nosuchfile"), 4107u);
  EXPECT_EQ(log.level("ERROR:TVXHBA_FCTagService_Provider::Configuration file not found"), TVX_ERR);
  EXPECT_EQ(setTable(std::string(5000, 'n')), 5u);
  EXPECT_EQ(log.level("ERROR: TVXHBA_FCTagService_Provider:: Can't stat Configuration file "),
            TVX_ERR);
  EXPECT_EQ(setTable(""), 4097u);
  EXPECT_EQ(log.level("TVXHBA_FCTagService_Provider::Null sized URI"), TVX_ERR);
}

}  // namespace
}  // namespace cimrt::test

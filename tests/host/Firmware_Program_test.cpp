// tvxcim firmware over simulated adapters.
#include <fstream>
#include <nlohmann/json.hpp>

#include "Simulated_Program.h"
#include "support/Firmware_File.h"
#include "support/Loopback_Servers.h"

namespace tvx::host {
namespace {

constexpr const char* port = "10:00:02:54:56:0C:41:10";

class FirmwareProgramTest : public test::Simulated_Program {
 protected:
  /// Makes a file and answers its path.
  std::string file(const std::string& name, const std::string& content) {
    const std::filesystem::path path = m_Temporary / name;
    std::ofstream(path, std::ios::binary) << content;
    return path.string();
  }
  std::string image(const std::string& version, std::size_t size = 320) {
    return file(version + ".fw", tvx::test::firmwareImage(version, "TVX16", size));
  }
  test::Outcome install(const std::string& words) {
    return run("--sim firmware install " + std::string(port) + " " + words);
  }
  /// What the first port shows.
  nlohmann::json shown() {
    return nlohmann::json::parse(
        run("--sim --json firmware show " + std::string(port)).out)["firmware"][0];
  }
  std::size_t leftFolders() const {
    std::size_t count = 0;
    for (const auto& entry : std::filesystem::directory_iterator(m_Temporary)) {
      count += entry.path().filename().string().starts_with("tvxcim-firmware") ? 1 : 0;
    }
    return count;
  }
};

TEST_F(FirmwareProgramTest, ShowsWhatRunsAndWhatIsOnFlash) {
  const test::Outcome result = run("--sim firmware show");
  EXPECT_EQ(result.exitCode, 0) << result.err;
  EXPECT_EQ(lines(result.out), 5U) << result.out;
  EXPECT_NE(result.out.find("2.01a4       2.01a4    -\n"), std::string::npos) << result.out;
  EXPECT_EQ(run("--sim none firmware show").out, "no FC ports\n");
}

TEST_F(FirmwareProgramTest, InstallsAndResets) {
  test::Outcome result = install(image("2.02a1"));
  EXPECT_EQ(result.exitCode, 0) << result.err;
  EXPECT_EQ(result.out, std::string(port) + ": the firmware is installed (0)\n");
  EXPECT_NE(result.err.find(", 0 s\n"), std::string::npos) << result.err;
  EXPECT_EQ(shown()["onFlash"], "2.02a1");
  result = install("file://" + image("2.02a2") + " --reset");
  EXPECT_EQ(result.exitCode, 0) << result.err;
  EXPECT_EQ(shown()["operational"], "2.02a2");
  EXPECT_EQ(leftFolders(), 0U);
}

TEST_F(FirmwareProgramTest, SendsAFileOfSixteenMebibytes) {
  const test::Outcome result = install(image("2.02a3", 16 * 1024 * 1024) + " --stream --reset");
  EXPECT_EQ(result.exitCode, 0) << result.err;
  EXPECT_EQ(shown()["onFlash"], "2.02a3");
  EXPECT_EQ(shown()["operational"], "2.02a3");
  EXPECT_EQ(leftFolders(), 0U);
}

TEST_F(FirmwareProgramTest, TellsAFailureInWordsWithItsNumber) {
  test::Outcome result = install(file("text", "no firmware"));
  EXPECT_EQ(result.exitCode, 9);
  EXPECT_EQ(result.out,
            std::string(port) + ": the adapter's library answered status 145 (40145)\n");
  // What the libraries under libcurl leave behind is not for a leak check of this program.
  result = run("--sim firmware install " + std::string(port) + " http://127.0.0.1:1/image.fw",
               "ASAN_OPTIONS=detect_leaks=0");
  EXPECT_EQ(result.exitCode, 9);
  EXPECT_EQ(result.out, std::string(port) + ": the firmware file is not available (4107)\n");
  EXPECT_EQ(leftFolders(), 0U);
}

/// Installs from a server, over a disk of so many KiB that only this process has.
class FirmwareOnADiskTest : public FirmwareProgramTest {
 protected:
  FirmwareOnADiskTest() : m_Disk(m_Temporary / "disk") {
    std::filesystem::create_directory(m_Disk);
    std::filesystem::create_directory(m_Temporary / "root");
    m_Server.put("new.fw", tvx::test::firmwareImage("2.02a1", "TVX16", 200'000));
  }
  /// A small disk where this account may mount one, else files that cannot grow beyond its size.
  std::string withDisk(unsigned kibibytes, const std::string& command) const {
    const std::string mounted = "unshare --mount --map-root-user sh -c 'mount -t tmpfs -o size=" +
                                std::to_string(kibibytes) + "k tmpfs " + m_Disk.string() + " && ";
    if (test::runShell(mounted + "true'").exitCode == 0) return mounted + command + "'";
    return "sh -c 'trap \"\" XFSZ; ulimit -f " + std::to_string(2 * kibibytes) + "; " + command +
           "'";
  }
  test::Outcome installWithDisk(unsigned kibibytes) const {
    return test::runShell(withDisk(
        kibibytes, "{ env ASAN_OPTIONS=detect_leaks=0 TMPDIR=" + m_Disk.string() +
                       " LD_LIBRARY_PATH=" CURL_FOLDER ":$LD_LIBRARY_PATH TVX_ROOT=" +
                       (m_Temporary / "root").string() + " " TVXCIM " --sim firmware install " +
                       port + " " + m_Server.url("new.fw") + "; result=$?; ls -A " +
                       m_Disk.string() + "; exit $result; }"));
  }

  const std::filesystem::path m_Disk;
  tvx::test::Http_Server m_Server;
};

TEST_F(FirmwareOnADiskTest, ThatIsFullTheFileIsNotAvailableAndNothingIsLeft) {
  test::Outcome result = installWithDisk(64);
  EXPECT_EQ(result.exitCode, 9) << result.err;
  EXPECT_EQ(result.out, std::string(port) + ": the firmware file is not available (4107)\n");
  result = installWithDisk(1024);
  EXPECT_EQ(result.exitCode, 0) << result.err;
  EXPECT_EQ(result.out, std::string(port) + ": the firmware is installed (0)\n");
}

TEST_F(FirmwareProgramTest, TellsThatARebootIsNeeded) {
  const std::string scenario = file("reboot.json", R"({"cards": [{"model": "TVX16002", "ports": [
      {"wwpn": "10000254560C4110", "firmware": {"activation": "reboot"}}]}]})");
  const auto json = nlohmann::json::parse(
      run("--sim=" + scenario + " --json firmware install " + port + " --reset " + image("2.02a1"))
          .out)["installation"];
  EXPECT_EQ(json["result"], 0);
  EXPECT_EQ(json["rebootNeeded"], true);
  EXPECT_EQ(json["downloadStatus"], 40247);
  EXPECT_EQ(json["words"], "the firmware is on flash; reboot the system to activate it");
}

TEST_F(FirmwareProgramTest, RefusesWhatItCannotUse) {
  EXPECT_EQ(install(m_Temporary.string() + "/none").exitCode, 10);
  EXPECT_EQ(install(m_Temporary.string()).exitCode, 10);
  EXPECT_EQ(install("http://127.0.0.1:1/x --stream").exitCode, 8);
  EXPECT_EQ(run("--sim firmware install 1000 " + image("2.02a1")).exitCode, 6);
  EXPECT_EQ(run("--sim firmware install").exitCode, 2);
  EXPECT_EQ(run("--sim firmware").exitCode, 2);
}

}  // namespace
}  // namespace tvx::host

// The document of a table of tags: written, read, and what is wrong with it.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <cstring>
#include <stdexcept>
#include <string>
#include <vector>

#include "services/TVX_ConfigTable.h"
#include "services/TVX_XmlShape.h"
#include "support/Log_Capture.h"
#include "support/Temp_Root.h"

namespace cimrt {
namespace {

using tvx::test::Log_Capture;
using tvx::test::Logged;

CPQFC_QoSEntry entryOf(std::uint8_t last, int tag) {
  CPQFC_QoSEntry entry{};
  entry.source = {{0x10, 0, 0, 0, 0, 0, 0xAB, last}};
  entry.target = {{0x50, 0, 0, 0, 0, 0, 0xCD, last}};
  entry.tag = static_cast<std::int8_t>(tag);
  return entry;
}

std::string row(const std::string& inside) {
  return "<Row>" + inside + "</Row>";
}

const std::string SOURCE = "<src_wwpn>100000000000AB01</src_wwpn>";
const std::string TARGET = "<tgt_wwpn>500000000000cd01</tgt_wwpn>";
const std::string ROW = row(SOURCE + TARGET + "<reserved1>0</reserved1><tag>7</tag>");
const std::string SYSTEM =
    "<theSystem><ApexVersion>1.0</ApexVersion><CreationDate/><HostName/><Adapter/></theSystem>";

/// A document with that configuration.
std::string document(const std::string& configuration, const std::string& system = SYSTEM) {
  return "<?xml version=\"1.0\" encoding=\"utf-8\"?>\n<ApexConfig>" + system + "<Configuration>" +
         configuration + "</Configuration></ApexConfig>";
}

std::string counted(const std::string& count, const std::string& rows) {
  return document("<numberOfEntries>" + count + "</numberOfEntries>" + rows);
}

class Config_Table : public testing::Test {
 protected:
  TVX_QoSTable read(std::string text) { return readConfigTable(text); }
  std::string failure(const std::string& text) {
    try {
      read(text);
    } catch (const std::exception& exception) {
      return exception.what();
    }
    return "none";
  }
  Log_Capture capture;
};

// --- Writing

TEST_F(Config_Table, IsWrittenInItsOrder) {
  TVX_QoSTable table(1);
  table.setEntry(0, entryOf(1, -2));
  EXPECT_EQ(writeConfigTable(table, {"20240101000000.000000+000", "a<host", "100000000000AB01"}),
            "<?xml version=\"1.0\" encoding=\"utf-8\"?>\n"
            "<ApexConfig>\n"
            "\t<theSystem>\n"
            "\t\t<ApexVersion>1.0</ApexVersion>\n"
            "\t\t<CreationDate>20240101000000.000000+000</CreationDate>\n"
            "\t\t<HostName>a&lt;host</HostName>\n"
            "\t\t<Adapter>100000000000AB01</Adapter>\n"
            "\t</theSystem>\n"
            "\t<Configuration>\n"
            "\t\t<numberOfEntries>1</numberOfEntries>\n"
            "\t\t<Row>\n"
            "\t\t\t<src_wwpn>100000000000AB01</src_wwpn>\n"
            "\t\t\t<tgt_wwpn>500000000000CD01</tgt_wwpn>\n"
            "\t\t\t<reserved1>00000000000000000000000000000000</reserved1>\n"
            "\t\t\t<tag>-2</tag>\n"
            "\t\t\t<reserved2>000000</reserved2>\n"
            "\t\t</Row>\n"
            "\t</Configuration>\n"
            "</ApexConfig>\n\n");
}

TEST_F(Config_Table, WhatIsWrittenIsRead) {
  for (const std::uint32_t count : {1u, 1000u}) {
    TVX_QoSTable table(count);
    for (std::uint32_t i = 0; i < count; i++)
      table.setEntry(i, entryOf(static_cast<std::uint8_t>(i), static_cast<int>(i)));
    const TVX_QoSTable again = read(writeConfigTable(table, {"now", "", "a"}));
    ASSERT_EQ(again.size(), count);
    for (std::uint32_t i = 0; i < count; i++) {
      const CPQFC_QoSEntry a = table.entry(i);
      const CPQFC_QoSEntry b = again.entry(i);
      ASSERT_EQ(std::memcmp(&a, &b, sizeof a), 0) << i;
    }
  }
}

TEST_F(Config_Table, EntriesAreLoggedByteByByte) {
  TVX_QoSTable table(1);
  table.setEntry(0, entryOf(0x0F, 200));
  PrintQoSEntry(table);
  const std::vector<Logged> lines = capture.lines();
  ASSERT_EQ(lines.size(), 19u);
  EXPECT_EQ(lines[0], (Logged{5, "PrintQoSEntry"}));
  EXPECT_EQ(lines[1], (Logged{5, "Number Of Entries: 1"}));
  EXPECT_EQ(lines[2], (Logged{5, "src_wwpn:10"}));
  EXPECT_EQ(lines[9], (Logged{5, "src_wwpn:F"}));
  EXPECT_EQ(lines[10], (Logged{5, "tgt_wwpn:50"}));
  EXPECT_EQ(lines[18], (Logged{5, "tag:-56"}));
}

TEST_F(Config_Table, ATableNeverClaimsMoreThanItHolds) {
  const TVX_QoSTable table(2);
  table.get()->numberOfEntries = 0xFFFFFFFF;
  EXPECT_EQ(table.size(), 2u);
  EXPECT_FALSE(TVX_QoSTable(MOST_QOS_ENTRIES + 1));
  EXPECT_FALSE(TVX_QoSTable(0xFFFFFFFF));
}

// --- Reading

TEST_F(Config_Table, RowsAreRead) {
  const TVX_QoSTable table = read(counted("1", ROW));
  ASSERT_EQ(table.size(), 1u);
  const CPQFC_QoSEntry entry = table.entry(0);
  EXPECT_EQ(entry.source.wwn[6], 0xAB);
  EXPECT_EQ(entry.target.wwn[6], 0xCD);
  EXPECT_EQ(entry.tag, 7);
  EXPECT_TRUE(capture.lines().empty());
}

TEST_F(Config_Table, TagsKeepTheirLowByte) {
  const struct {
    const char* text;
    int tag;
  } rows[] = {{"300", 44},
              {"200", -56},
              {"-1", -1},
              {"x", 0},
              {"", 0},
              {" 9 ", 9},
              {"99999999999999999999", -1},
              {"&#51;&#x34;", 34}};
  for (const auto& each : rows) {
    const TVX_QoSTable table =
        read(counted("1", row(SOURCE + TARGET + "<tag>" + each.text + "</tag>")));
    EXPECT_EQ(table.entry(0).tag, each.tag) << each.text;
  }
}

TEST_F(Config_Table, ACountBelowOneGivesATableWithoutEntries) {
  for (const char* count : {"0", "-5", "-99999999999999999999", "", "none"}) {
    const TVX_QoSTable table = read(counted(count, ROW));
    ASSERT_TRUE(table) << count;
    EXPECT_EQ(table.get()->numberOfEntries, 0u) << count;
  }
}

TEST_F(Config_Table, RowsBeyondTheCountAreLeftOut) {
  EXPECT_EQ(read(counted("2", ROW + ROW + ROW)).size(), 2u);
}

TEST_F(Config_Table, EntriesWithoutRowAreZero) {
  const TVX_QoSTable table = read(counted("3", ROW + ROW));
  ASSERT_EQ(table.get()->numberOfEntries, 3u);
  const CPQFC_QoSEntry none{};
  const CPQFC_QoSEntry last = table.entry(2);
  EXPECT_EQ(std::memcmp(&last, &none, sizeof none), 0);
  EXPECT_EQ(read(counted("262144", ROW)).size(), 262144u);
}

TEST_F(Config_Table, CountsThatNoMemoryHoldsAreRefused) {
  for (const char* count :
       {"262145", "4294967296", "9223372036854775807", "99999999999999999999999"}) {
    capture.forget();
    EXPECT_FALSE(read(counted(count, ROW))) << count;
    EXPECT_TRUE(capture.has(5, "SetConfigTable::Memory Allocation Failed "));
  }
}

TEST_F(Config_Table, AMissingElementIsNamed) {
  const std::string behind = " is not found or corrupted in the Apex config table";
  const std::string rows = "<numberOfEntries>1</numberOfEntries>" + ROW;
  const auto system = [](const std::string& inside) {
    return "<theSystem>" + inside + "</theSystem>";
  };
  const std::string version = "<ApexVersion/>";
  EXPECT_EQ(failure("<Other/>"), "apexConfigNode" + behind);
  EXPECT_EQ(failure(""), "apexConfigNode" + behind);
  EXPECT_EQ(failure("<apexconfig/>"), "apexConfigNode" + behind);
  EXPECT_EQ(failure("<ApexConfig/>"), "theSystemNode" + behind);
  EXPECT_EQ(failure(document(rows, system(""))), "apexVersionNode" + behind);
  EXPECT_EQ(failure(document(rows, system(version + "<HostName/><Adapter/>"))),
            "creationTimeNode" + behind);
  EXPECT_EQ(failure(document(rows, system(version + "<CreationDate/><Adapter/>"))),
            "hostNameNode" + behind);
  EXPECT_EQ(failure(document(rows, system(version + "<CreationDate/><HostName/>"))),
            "adapterNode" + behind);
  EXPECT_EQ(failure("<ApexConfig>" + SYSTEM + "</ApexConfig>"), "configurationNode" + behind);
  EXPECT_EQ(failure(document("")), "numberOfEntriesNode" + behind);
  EXPECT_EQ(failure(counted("0", "")), "rowNode" + behind);
}

TEST_F(Config_Table, ElementsInTheWrongOrderAreMissing) {
  const std::string behind = " is not found or corrupted in the Apex config table";
  EXPECT_EQ(failure(document(ROW + "<numberOfEntries>1</numberOfEntries>")), "rowNode" + behind);
  EXPECT_EQ(failure("<ApexConfig><Configuration/>" + SYSTEM + "</ApexConfig>"),
            "configurationNode" + behind);
  const std::string early = "<theSystem><Adapter/><ApexVersion/><CreationDate/><HostName/>";
  EXPECT_EQ(failure(document("", early + "</theSystem>")), "adapterNode" + behind);
}

TEST_F(Config_Table, WhatARowLacksIsLoggedAndZero) {
  const struct {
    std::string inside;
    const char* text;
  } rows[] = {{TARGET + "<tag>7</tag>", "SetConfigTable::malformed src_wwpn field "},
              {SOURCE + "<tag>7</tag>", "SetConfigTable::malformed tgt_wwpn field "},
              {TARGET + SOURCE + "<tag>7</tag>", "SetConfigTable::malformed tgt_wwpn field "},
              {SOURCE + TARGET, "SetConfigTable:: malformed tag field "},
              {SOURCE + "<tag>7</tag>" + TARGET, "SetConfigTable:: malformed tag field "}};
  for (const auto& each : rows) {
    capture.forget();
    const TVX_QoSTable table = read(counted("2", row(each.inside) + ROW));
    EXPECT_EQ(table.entry(0).tag, 0);
    EXPECT_EQ(table.entry(1).tag, 7);
    EXPECT_EQ(capture.lines(), (std::vector<Logged>{{3, each.text}}));
  }
}

TEST_F(Config_Table, NamesThatAreNoneAreLoggedAndZero) {
  const std::string bad = "<src_wwpn>100000000000AB0G</src_wwpn>";
  const TVX_QoSTable table = read(counted("1", row(bad + "<tgt_wwpn></tgt_wwpn><tag>7</tag>")));
  EXPECT_EQ(capture.count(3, "SetConfigTable::unable to convert string to hbaname "), 2u);
  EXPECT_EQ(table.entry(0).source.wwn[0], 0);
  EXPECT_EQ(table.entry(0).target.wwn[0], 0);
  EXPECT_EQ(table.entry(0).tag, 7);
}

TEST_F(Config_Table, AMarkCommentsAndEntitiesArePassedOver) {
  const std::string text = "\xEF\xBB\xBF<!-- <a> --><!DOCTYPE t [<!ENTITY x \"y>\">]>" +
                           counted("&#49;", "<![CDATA[<a>]]><?pi <b>?>" + ROW);
  EXPECT_EQ(read(text).size(), 1u);
}

TEST_F(Config_Table, WhatIsNoXmlIsRefused) {
  for (const char* text : {"not XML", "<", "<a", "<a>", "<a b>", "<a b=c/>", "<!--", "<![CDATA[",
                           "<?xml", "<!DOCTYPE a [", "<a></a", "\xEF\xBB\xBF<", "</a>"})
    EXPECT_NE(failure(text), "none") << text;
  const std::string whole = counted("1", ROW);
  for (std::size_t cut = 40; cut < whole.size(); cut++)
    EXPECT_NE(failure(whole.substr(0, cut)), "none") << cut;
}

TEST_F(Config_Table, DepthAndLengthAreBounded) {
  std::string deep;
  for (int i = 0; i < 5'000'000; i++) deep += "<a>";
  EXPECT_EQ(failure(deep), "the elements of the Apex config table are nested too deeply");
  std::string wide = "<a>";
  for (int i = 0; i < 2'097'152; i++) wide += "<b/>";
  EXPECT_EQ(failure(wide + "</a>"), "the Apex config table has too many elements");
}

// --- Shape

TEST_F(Config_Table, ShapeIsMeasuredAsTheParserSeesIt) {
  const struct {
    const char* text;
    std::size_t depth;
    std::size_t elements;
  } rows[] = {{"", 0, 0},
              {"<a/>", 1, 1},
              {"<a><b/><c><d></d></c></a>", 3, 4},
              {"<a><!--</a>--><b/></a>", 2, 2},
              {"<a><![CDATA[</a>]]><b/></a>", 2, 2},
              {"<a x='/>' y=\"</a>\"><b/></a>", 2, 2},
              {"<a\"><b/></a>", 2, 2},
              {"<?<a>?><!DOCTYPE x [<a>]><!other <a><b/>", 1, 1},
              {"<?><a>?><b/>", 1, 1},
              {"text<a><b>", 0, 0}};
  for (const auto& each : rows) {
    const Xml_Shape shape = measureXml(each.text);
    EXPECT_EQ(shape.depth, each.depth) << each.text;
    EXPECT_EQ(shape.elements, each.elements) << each.text;
  }
}

// --- Files

TEST_F(Config_Table, AWholeFileIsRead) {
  const tvx::test::Temp_Root root;
  const std::string path = root.path("/tmp/table.xml");
  root.write("/tmp/table.xml", std::string("a\0b", 3));
  EXPECT_EQ(readWholeFile(path.c_str()), std::string("a\0b", 3));
  const std::string pipe = root.path("/tmp/pipe");
  ASSERT_EQ(::mkfifo(pipe.c_str(), 0600), 0);
  for (const std::string& none : {root.path("/tmp/none"), root.path("/tmp"), pipe}) {
    try {
      readWholeFile(none.c_str());
      ADD_FAILURE() << none;
    } catch (const std::runtime_error& error) {
      EXPECT_EQ(error.what(), "cannot open file " + none);
    }
  }
}

TEST_F(Config_Table, AFileOfAHundredMegabytesIsRead) {
  const tvx::test::Temp_Root root;
  root.write("/tmp/table.xml", counted("1", ROW + std::string(100U << 20, ' ')));
  std::string text = readWholeFile(root.path("/tmp/table.xml").c_str());
  EXPECT_GT(text.size(), 100U << 20);
  EXPECT_EQ(readConfigTable(text).entry(0).tag, 7);
}

}  // namespace
}  // namespace cimrt

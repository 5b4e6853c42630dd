// The listener over real connections: right requests, wrong ones, slow and aborted clients.
#include "http/Listener.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <thread>
#include <vector>

#include "Fake_Broker.h"
#include "Raw_Client.h"
#include "Test_Classes.h"

namespace tvx::host::http {
namespace {

using test::classParameter;
using test::operation;
using test::RawClient;
using test::requestHead;
using ::testing::HasSubstr;
using ::testing::StartsWith;

const std::string listWidgets = operation("EnumerateInstanceNames", classParameter("FAKE_Widget"));

class ListenerTest : public ::testing::Test {
 protected:
  static ListenerOptions options() {
    ListenerOptions result;
    result.port = 0;
    result.bodyLimit = 4096;
    result.clientLimit = std::chrono::milliseconds(200);
    result.connectionLimit = 128;  // those that went away count until they are noticed
    return result;
  }

  /// Answer to `bytes` on a connection of its own.
  std::string exchange(const std::string& bytes) {
    RawClient client(m_Listener.port());
    EXPECT_TRUE(client.isOpen());
    client.send(bytes);
    return client.receive();
  }
  std::string post(const std::string& body, const std::string& fields = "") {
    return exchange(requestHead(body.size(), fields) + body);
  }
  void expectAlive() {
    const std::string answer = post(listWidgets);
    EXPECT_THAT(answer, StartsWith("HTTP/1.1 200 "));
    EXPECT_THAT(answer, HasSubstr(">widget2<"));
  }

  test::FakeBroker m_Broker;
  CimServer m_Server{m_Broker, test::testClasses()};
  Listener m_Listener{m_Server, options()};
};

TEST_F(ListenerTest, AnswersWithTheFieldsOfTheProtocol) {
  const std::string answer = post(listWidgets,
                                  "CIMProtocolVersion: 1.0\r\n"
                                  "CIMMethod: EnumerateInstanceNames\r\n"
                                  "CIMObject: root%2Ffake\r\n");
  EXPECT_THAT(answer, StartsWith("HTTP/1.1 200 "));
  EXPECT_THAT(answer, HasSubstr("CIMOperation: MethodResponse\r\n"));
  EXPECT_THAT(answer, HasSubstr("Content-Type: application/xml; charset=\"utf-8\"\r\n"));
  EXPECT_EQ(m_Listener.url(), "http://127.0.0.1:" + std::to_string(m_Listener.port()) + "/cimom");
}

TEST_F(ListenerTest, AConnectionCarriesSeveralRequests) {
  RawClient client(m_Listener.port());
  for (int i = 0; i < 3; ++i) {
    client.send(requestHead(listWidgets.size()) + listWidgets);
    EXPECT_THAT(client.receive(), StartsWith("HTTP/1.1 200 "));
  }
}

TEST_F(ListenerTest, MPostCarriesPrefixedFields) {
  const std::string head =
      "M-POST /cimom HTTP/1.1\r\nHost: here\r\nContent-Type: text/xml; charset=utf-8\r\n"
      "Man: http://www.dmtf.org/cim/mapping/http/v1.0 ; ns=73\r\n"
      "73-CIMOperation: MethodCall\r\n73-CIMMethod: Other\r\nContent-Length: ";
  const std::string answer =
      exchange(head + std::to_string(listWidgets.size()) + "\r\n\r\n" + listWidgets);
  EXPECT_THAT(answer, StartsWith("HTTP/1.1 400 "));
  EXPECT_THAT(answer, HasSubstr("CIMError: header-mismatch\r\n"));
}

TEST_F(ListenerTest, ChunkedRequestsAreTaken) {
  std::string bytes =
      "POST /cimom HTTP/1.1\r\nHost: here\r\nContent-Type: text/xml\r\n"
      "CIMOperation: MethodCall\r\nTransfer-Encoding: chunked\r\n\r\n";
  for (const char c : listWidgets) {
    bytes += std::string("1\r\n") + c + "\r\n";
  }
  EXPECT_THAT(exchange(bytes + "0\r\n\r\n"), StartsWith("HTTP/1.1 200 "));
}

struct BadHead {
  const char* name;
  std::string bytes;
  const char* start;
  const char* part;
};

class BadHeadTest : public ListenerTest, public ::testing::WithParamInterface<BadHead> {};

TEST_P(BadHeadTest, IsAnsweredByStatusAndTheServerLives) {
  const std::string answer = exchange(GetParam().bytes);
  EXPECT_THAT(answer, StartsWith(GetParam().start));
  EXPECT_THAT(answer, HasSubstr(GetParam().part));
  expectAlive();
}

std::string deepXml(int depth) {
  std::string open;
  std::string close;
  for (int i = 0; i < depth; ++i) {
    open += "<A>";
    close += "</A>";
  }
  return open + close;
}

const BadHead badHeads[] = {
    {"Get", "GET /cimom HTTP/1.1\r\nHost: h\r\n\r\n", "HTTP/1.1 405 ", "Allow: POST, M-POST\r\n"},
    {"OtherPath", "POST / HTTP/1.1\r\nHost: h\r\nContent-Length: 0\r\n\r\n", "HTTP/1.1 404 ",
     "/cimom"},
    {"NoLength", "POST /cimom HTTP/1.1\r\nHost: h\r\n\r\n", "HTTP/1.1 411 ", "length"},
    {"BadLength", "POST /cimom HTTP/1.1\r\nHost: h\r\nContent-Length: x1\r\n\r\n", "HTTP/1.1 400 ",
     ""},
    {"HugeLength",
     "POST /cimom HTTP/1.1\r\nHost: h\r\nContent-Length: 99999999999999999999999\r\n\r\n",
     "HTTP/1.1 4", ""},
    {"TooLong", requestHead(4097), "HTTP/1.1 413 ", "larger than 4096 bytes"},
    {"OtherContent",
     "POST /cimom HTTP/1.1\r\nHost: h\r\nContent-Type: text/html\r\nCIMOperation: MethodCall\r\n"
     "Content-Length: 0\r\n\r\n",
     "HTTP/1.1 415 ", "application/xml"},
    {"NoOperation",
     "POST /cimom HTTP/1.1\r\nHost: h\r\nContent-Type: text/xml\r\nContent-Length: 0\r\n\r\n",
     "HTTP/1.1 400 ", "CIMError: request-not-valid\r\n"},
    {"OtherOperation",
     "POST /cimom HTTP/1.1\r\nHost: h\r\nContent-Type: text/xml\r\nCIMOperation: Dance\r\n"
     "Content-Length: 0\r\n\r\n",
     "HTTP/1.1 501 ", "CIMError: unsupported-operation\r\n"},
    {"OtherProtocol", requestHead(0, "CIMProtocolVersion: 2.0\r\n"), "HTTP/1.1 501 ",
     "CIMError: unsupported-protocol-version\r\n"},
    {"NoBody", requestHead(0), "HTTP/1.1 400 ", "CIMError: request-not-well-formed\r\n"},
    {"WrongMethod", requestHead(listWidgets.size(), "CIMMethod: GetClass\r\n") + listWidgets,
     "HTTP/1.1 400 ", "CIMError: header-mismatch\r\n"},
    {"WrongObject", requestHead(listWidgets.size(), "CIMObject: root/other\r\n") + listWidgets,
     "HTTP/1.1 400 ", "CIMError: header-mismatch\r\n"},
    {"ShortLength", requestHead(listWidgets.size() - 20) + listWidgets, "HTTP/1.1 400 ",
     "CIMError: request-not-well-formed\r\n"},
    {"TwoLengths",
     "POST /cimom HTTP/1.1\r\nHost: h\r\nContent-Length: 5\r\nContent-Length: 50\r\n\r\n",
     "HTTP/1.1 400 ", "length"},
    {"LengthAndChunks",
     "POST /cimom HTTP/1.1\r\nHost: h\r\nContent-Type: text/xml\r\nCIMOperation: MethodCall\r\n"
     "Content-Length: 5\r\nTransfer-Encoding: chunked\r\n\r\n0\r\n\r\n",
     "HTTP/1.1 400 ", "length"},
    {"NegativeLength", "POST /cimom HTTP/1.1\r\nHost: h\r\nContent-Length: -1\r\n\r\n",
     "HTTP/1.1 400 ", ""},
    {"BadChunk",
     "POST /cimom HTTP/1.1\r\nHost: h\r\nContent-Type: text/xml\r\nCIMOperation: MethodCall\r\n"
     "Transfer-Encoding: chunked\r\n\r\nzz\r\nhello\r\n",
     "HTTP/1.1 400 ", ""},
    {"DeepXml", requestHead(700) + deepXml(100), "HTTP/1.1 400 ",
     "CIMError: request-not-well-formed\r\n"},
    {"OtherRoot", requestHead(7) + "<HTML/>", "HTTP/1.1 400 ", "CIMError: request-not-valid\r\n"},
    {"NoHttp", "\x16\x03\x01 hello\r\n\r\n", "HTTP/1.", ""},
    {"LongHead", "POST /cimom HTTP/1.1\r\nX: " + std::string(100000, 'x') + "\r\n\r\n",
     "HTTP/1.1 4", ""}};

INSTANTIATE_TEST_SUITE_P(All, BadHeadTest, ::testing::ValuesIn(badHeads),
                         [](const auto& each) { return each.param.name; });

TEST_F(ListenerTest, AChunkedBodyOverTheLimitIsRefused) {
  std::string bytes =
      "POST /cimom HTTP/1.1\r\nHost: here\r\nContent-Type: text/xml\r\n"
      "CIMOperation: MethodCall\r\nTransfer-Encoding: chunked\r\n\r\n";
  for (int i = 0; i < 5; ++i) {
    bytes += "400\r\n" + std::string(0x400, ' ') + "\r\n";
  }
  EXPECT_THAT(exchange(bytes + "0\r\n\r\n"), StartsWith("HTTP/1.1 413 "));
  expectAlive();
}

TEST_F(ListenerTest, ABodyOfJustTheLimitIsTaken) {
  const std::size_t limit = options().bodyLimit;
  EXPECT_THAT(post(listWidgets + std::string(limit - listWidgets.size(), ' ')),
              StartsWith("HTTP/1.1 200 "));
}

TEST_F(ListenerTest, AClientThatAsksWhetherToGoOnIsTold) {
  RawClient client(m_Listener.port());
  client.send(requestHead(listWidgets.size(), "Expect: 100-continue\r\n"));
  client.send(listWidgets);
  EXPECT_THAT(client.receive(), StartsWith("HTTP/1.1 100 Continue\r\n\r\nHTTP/1.1 200 "));
}

TEST_F(ListenerTest, OldClientsWithoutAHostAreServed) {
  const std::string head =
      "POST /cimom HTTP/1.0\r\nContent-Type: text/xml\r\nCIMOperation: MethodCall\r\n"
      "Content-Length: ";
  const std::string answer =
      exchange(head + std::to_string(listWidgets.size()) + "\r\n\r\n" + listWidgets);
  EXPECT_THAT(answer, StartsWith("HTTP/1."));
  EXPECT_THAT(answer, HasSubstr(" 200 OK\r\n"));
  EXPECT_THAT(answer, HasSubstr(">widget2<"));
}

TEST_F(ListenerTest, ALengthLargerThanTheBodyTimesOut) {
  RawClient client(m_Listener.port());
  client.send(requestHead(listWidgets.size() + 10) + listWidgets);
  EXPECT_THAT(client.receive(), StartsWith("HTTP/1.1 408 "));
  expectAlive();
}

TEST_F(ListenerTest, AClientThatDripsIsEnded) {
  RawClient client(m_Listener.port());
  client.send(requestHead(1000));
  const auto start = std::chrono::steady_clock::now();
  while (client.send("x") && std::chrono::steady_clock::now() - start < std::chrono::seconds(4)) {
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
  }
  EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(3));
  expectAlive();
}

TEST_F(ListenerTest, ASilentClientIsEndedWithoutAnAnswer) {
  RawClient client(m_Listener.port());
  EXPECT_EQ(client.receive(), "");
  expectAlive();
}

TEST_F(ListenerTest, AClientThatTakesNoAnswersIsEnded) {
  ListenerOptions quick = options();
  quick.clientLimit = std::chrono::milliseconds(20);
  const Listener listener(m_Server, quick);
  RawClient client(listener.port(), 4096);
  const auto start = std::chrono::steady_clock::now();
  while (client.send(requestHead(listWidgets.size()) + listWidgets) &&
         std::chrono::steady_clock::now() - start < std::chrono::seconds(20)) {
  }
  EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(20));
  expectAlive();
}

TEST_F(ListenerTest, ConnectionsOverTheLimitAreClosedUntilOthersEnd) {
  ListenerOptions few = options();
  few.connectionLimit = 3;
  const Listener listener(m_Server, few);
  std::vector<std::unique_ptr<RawClient>> silent;
  for (unsigned i = 0; i < few.connectionLimit; ++i) {
    silent.push_back(std::make_unique<RawClient>(listener.port()));
    silent.back()->send("POST");
  }
  RawClient refused(listener.port());
  refused.send(requestHead(listWidgets.size()) + listWidgets);
  EXPECT_EQ(refused.receive(), "");
  for (const auto& each : silent) {
    each->receive();
  }
  std::string answer;
  for (int i = 0; i < 100 && answer.empty(); ++i) {
    RawClient next(listener.port());
    next.send(requestHead(listWidgets.size()) + listWidgets);
    answer = next.receive();
  }
  EXPECT_THAT(answer, StartsWith("HTTP/1.1 200 "));
}

TEST_F(ListenerTest, AListenerEndsWhileClientsAreConnected) {
  auto listener = std::make_unique<Listener>(m_Server, options());
  RawClient silent(listener->port());
  RawClient slow(listener->port());
  slow.send(requestHead(500) + "<CIM");
  RawClient served(listener->port());
  served.send(requestHead(listWidgets.size()) + listWidgets);
  EXPECT_THAT(served.receive(), StartsWith("HTTP/1.1 200 "));
  listener.reset();
  EXPECT_EQ(silent.receive(), "");
  slow.receive();
  EXPECT_FALSE(slow.send(std::string(100, 'x')) && slow.send("x") && slow.send("x"));
}

TEST_F(ListenerTest, SlowClientsDoNotHinderOthers) {
  std::vector<std::unique_ptr<RawClient>> slow;
  for (int i = 0; i < 10; ++i) {
    slow.push_back(std::make_unique<RawClient>(m_Listener.port()));
    slow.back()->send(requestHead(500) + "<CIM");
  }
  expectAlive();
}

TEST_F(ListenerTest, ClientsThatGoAwayHarmNobody) {
  for (int i = 0; i < 20; ++i) {
    {
      RawClient client(m_Listener.port());
      client.send((requestHead(listWidgets.size()) + listWidgets).substr(0, 40u * (i % 10u + 1)));
    }
    {
      RawClient client(m_Listener.port());
      client.send(requestHead(listWidgets.size()) + listWidgets);
    }
  }
  // As long as the listener has not noticed all who went away, it may be at its limit.
  for (int i = 0; i < 100 && post(listWidgets).empty(); ++i) {
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
  }
  expectAlive();
}

TEST_F(ListenerTest, ManyClientsAreServedAtOnce) {
  std::vector<std::thread> clients;
  for (int i = 0; i < 6; ++i) {
    clients.emplace_back([this] {
      for (int k = 0; k < 5; ++k) {
        expectAlive();
      }
    });
  }
  for (std::thread& each : clients) {
    each.join();
  }
}

TEST_F(ListenerTest, ATakenPortIsTold) {
  ListenerOptions again = options();
  again.port = m_Listener.port();
  try {
    const Listener second(m_Server, again);
    FAIL() << "two listeners on one port";
  } catch (const ListenError& error) {
    EXPECT_THAT(error.what(), HasSubstr("Address already in use"));
  }
}

TEST_F(ListenerTest, AnAddressThatIsNoneIsTold) {
  ListenerOptions wrong = options();
  wrong.address = "here";
  EXPECT_THROW(Listener(m_Server, wrong), ListenError);
}

}  // namespace
}  // namespace tvx::host::http

// The upload form, its URL rules, the byte-exact multipart body, the engine's
// timing, progress, cancel and file faults against a recording connection, and
// the chunk pause setting.
#include <gtest/gtest.h>

#include <fstream>
#include <numeric>
#include <regex>
#include <set>

#include "fixtures.h"
#include "transport/ChunkPause.h"
#include "transport/UploadConnection.h"
#include "transport/UploadEnvironment.h"
#include "transport/UploadProgress.h"
#include "transport/UploadRequest.h"
#include "transport/UploadResult.h"
#include "transport/UploadStatus.h"
#include "transport/Uploader.h"

namespace {

using namespace test_support;
using Lines = std::vector<std::string>;
using Sizes = std::vector<std::size_t>;
constexpr std::uint32_t KiB = 1024, MiB = 1024 * KiB;
constexpr std::size_t kHeaderSizeBelow = 1024;  // pieces this small are part headers

std::filesystem::path Native(const std::wstring& name) {
  return std::filesystem::u8path(platform::WideToUtf8(name));
}

std::wstring MakeFile(const std::wstring& name, const std::string& bytes) {
  std::ofstream(Native(name), std::ios::binary) << bytes;
  return name;
}

// A file of that size that reads as zeros, without taking the disk space.
std::wstring MakeSparseFile(const std::wstring& name, std::uintmax_t size) {
  std::filesystem::resize_file(Native(MakeFile(name, "")), size);
  return name;
}

// The engine's surroundings: a clock that moves only when the engine sleeps or
// writes, and a connection that records every piece and answers as scripted.
struct FakeServer {
  std::uint32_t now = 1000;  // milliseconds
  std::function<std::uint32_t(std::size_t bytes)> writeMs = [](std::size_t) { return 0u; };
  std::function<void()> onStart = [] {};

  std::vector<std::string> headers, writes;
  std::vector<std::uint32_t> sleeps;  // milliseconds of each
  std::optional<std::uint32_t> announced;  // once started
  bool ended = false;

  std::string Body() const { return std::accumulate(writes.begin(), writes.end(), std::string()); }
  std::string Boundary() const { return headers.at(0).substr(headers.at(0).find("boundary=") + 9); }

  transport::UploadEnvironment Environment() {
    auto open = [this](const transport::UploadRequest&, transport::UploadProgress*,
                       std::unique_ptr<transport::UploadConnection>* out) {
      *out = std::make_unique<Connection>(*this);
      return platform::kOk;
    };
    auto sleep = [this](std::uint32_t ms) {
      sleeps.push_back(ms);
      now += ms;
    };
    return transport::UploadEnvironment{[this] { return now; }, sleep, open};
  }

  class Connection : public transport::UploadConnection {
   public:
    explicit Connection(FakeServer& server) : s_(server) {}
    platform::Status AddHeader(const std::string& line) override {
      s_.headers.push_back(line);
      return platform::kOk;
    }
    platform::Status Start(std::uint32_t contentLength) override {
      s_.announced = contentLength;
      s_.onStart();
      return platform::kOk;
    }
    // Like a server, takes no more than announced: a wrong length fails at once.
    platform::Status Write(std::string_view piece) override {
      received_ += piece.size();
      if (received_ > s_.announced.value_or(0)) {
        return platform::StatusFromWin32(platform::kErrorBufferOverflow);
      }
      s_.writes.emplace_back(piece);
      s_.now += s_.writeMs(piece.size());
      return platform::kOk;
    }
    platform::Status End() override {
      s_.ended = true;
      return platform::kOk;
    }
    bool QueryStatusCode(std::uint32_t* code) override {
      *code = 200;
      return true;
    }
    std::string ReadReply() override { return "<uploadTemplate/>"; }

   private:
    FakeServer& s_;
    std::size_t received_ = 0;
  };
};

// Parts as the wire carries them, "{B}" standing for the boundary.
std::string FieldPart(const std::string& name, const std::string& value) {
  return "--{B}\r\nContent-Disposition: form-data; name=\"" + name + "\"\r\n\r\n" + value + "\r\n";
}

std::string FilePart(const std::string& name, const std::string& file, const std::string& bytes) {
  return "--{B}\r\nContent-Disposition: form-data; name=\"" + name + "\"; filename=\"" + file +
         "\"\r\nContent-Type: application/octet-stream\r\n\r\n" + bytes + "\r\n";
}

class Upload : public TempFolderTest {
 protected:
  platform::Status Run() {
    transport::UploadEnvironment environment = server.Environment();
    environment.pauseAfterChunkMs = pauseMs;
    return transport::Uploader(&listener, &request, &result, std::move(environment)).Upload();
  }
  void Fresh() {
    server = FakeServer();
    listener = RecordingListener<transport::UploadProgress>();
    request = transport::UploadRequest();
  }
  Sizes ChunkSizes() const {
    Sizes sizes;
    for (const std::string& piece : server.writes) {
      if (piece.size() >= kHeaderSizeBelow) sizes.push_back(piece.size());
    }
    return sizes;
  }
  // The write of each data piece takes the next of these times.
  void ScriptWriteTimes(std::vector<std::uint32_t> times) {
    server.writeMs = [times, next = std::size_t{0}](std::size_t bytes) mutable {
      return bytes < kHeaderSizeBelow || next >= times.size() ? 0u : times[next++];
    };
  }

  transport::UploadRequest request;
  transport::UploadResult result;
  RecordingListener<transport::UploadProgress> listener;
  FakeServer server;
  std::uint32_t pauseMs = transport::ChunkPause::kDefaultMs;
};

// Fields come first in unsigned byte order, each name once with its last
// value; files keep their order and repeats; file names are UTF-8 with a
// quote or line break escaped. Each upload draws its own boundary.
TEST_F(Upload, BodiesOfEveryShapeAreByteExactAndWhatTheirLengthAnnounced) {
  const std::wstring quoted = MakeFile(L"C:\\a\"\u4E2D\r\n", "12");
  const std::string quotedName = "C:\\a%22\xE4\xB8\xAD%0D%0A";
  MakeFile(L"p", "0123456789");
  MakeFile(L"e", "");
  struct Case {
    std::vector<std::pair<const char*, const char*>> fields;
    std::vector<std::pair<const wchar_t*, std::wstring>> files;
    std::string body;
  };
  const Case cases[] = {
      {{}, {}, "--{B}--\r\n"},
      {{{"title", "v"}, {"\xC3\xA9t\xC3\xA9", "v"}, {"AP", "v"}, {"Version", "v"}, {"title", "Sunset"},
        {"tags", nullptr}, {"AP", "last"}},
       {{L"f", L"p"}},
       FieldPart("AP", "last") + FieldPart("Version", "v") + FieldPart("tags", "") +
           FieldPart("title", "Sunset") + FieldPart("\xC3\xA9t\xC3\xA9", "v") +
           FilePart("f", "p", "0123456789") + "--{B}--\r\n"},
      {{}, {{L"a", quoted}, {L"e", L"e"}, {L"a", quoted}},
       FilePart("a", quotedName, "12") + FilePart("e", "e", "") + FilePart("a", quotedName, "12") +
           "--{B}--\r\n"},
  };
  std::set<std::string> boundaries;
  for (const Case& c : cases) {
    Fresh();
    for (const auto& [name, value] : c.fields) request.AddField(name, value);
    for (const auto& [name, path] : c.files) request.AddFile(name, path.c_str());
    ASSERT_EQ(Run(), platform::kOk);
    const std::string boundary = server.Boundary();
    EXPECT_TRUE(std::regex_match(boundary, std::regex("-{27}[0-9A-F]{12}"))) << boundary;
    EXPECT_TRUE(boundaries.insert(boundary).second) << "a boundary drawn twice";
    EXPECT_EQ(server.headers, Lines{"Content-Type: multipart/form-data; boundary=" + boundary});
    std::string body = c.body;
    for (std::size_t at; (at = body.find("{B}")) != std::string::npos;) body.replace(at, 3, boundary);
    EXPECT_EQ(server.Body(), body);
    EXPECT_EQ(server.Body().size(), server.announced);
    EXPECT_TRUE(server.ended);
  }
}

TEST(UploadUrl, AcceptsOnlyPlainHttpOnPort80WithoutExtras) {
  const std::string k259(259, 'a');
  const std::vector<std::pair<std::string, std::string>> accepted = {
      {"http://ob.example.com:80/s", "ob.example.com /s"}, {"http://ob.example.com", "ob.example.com /"},
      {"http://h/a/../b%20c", "h /a/../b%20c"}, {"http://" + k259 + "/p", k259 + " /p"},
      {"http://h/" + k259.substr(1), "h /" + k259.substr(1)}};
  for (const auto& [url, hostAndPath] : accepted) {
    transport::UploadRequest request;
    EXPECT_TRUE(request.SetUrl(url.c_str())) << url;
    EXPECT_EQ(request.host + " " + request.path, hostAndPath);
  }
  for (const std::string& url : std::vector<std::string>{
           "http://" + k259 + "a/p", "http://h/" + k259, "https://h/p", "HTTP://h/p", "ftp://h/p",
           "http://h:8080/p", "http://user:pw@h/p", "http://h/p?id=1", "http://h/p#top", "http:///p",
           "http:h/p", "//h/p", "", "http://h/a b", "http://h/a\r\nX: y"}) {
    transport::UploadRequest request;
    request.SetUrl("http://before/was");
    EXPECT_FALSE(request.SetUrl(url.c_str())) << url;
    EXPECT_EQ(request.host + request.path, "before/was") << url;
  }
  EXPECT_FALSE(transport::UploadRequest().SetUrl(nullptr));
}

// A write under half a second doubles the chunk up to 16 MiB, one over 1.25 s
// halves it down to 32 KiB; the pause after each chunk, taken once, does not count.
TEST_F(Upload, FastWritesGrowTheChunkToSixteenMebibytesAndSlowOnesHalveItToTheFloor) {
  Sizes growing;
  for (std::uint32_t chunk = 32 * KiB; chunk <= 16 * MiB; chunk *= 2) growing.push_back(chunk);
  growing.insert(growing.end(), {16 * MiB, 16 * MiB});
  const Sizes halving = {32 * KiB, 64 * KiB, 128 * KiB, 64 * KiB, 32 * KiB,
                         32 * KiB, 32 * KiB, 32 * KiB, 32 * KiB, 64 * KiB};
  using WriteTimes = std::vector<std::uint32_t>;
  for (const auto& [chunks, writeTimes, pause] : std::vector<std::tuple<Sizes, WriteTimes, int>>{
           {growing, {}, 50}, {halving, {100, 100, 2000, 1251, 2000, 800, 1250, 500, 499}, 0},
           {{32 * KiB, 64 * KiB, 128 * KiB}, {1, 1, 1}, 1000}}) {
    Fresh();
    pauseMs = pause;
    ScriptWriteTimes(writeTimes);
    const auto size = std::accumulate(chunks.begin(), chunks.end(), std::uintmax_t{0});
    request.AddFile(L"f", MakeSparseFile(L"f", size).c_str());
    ASSERT_EQ(Run(), platform::kOk);
    EXPECT_EQ(ChunkSizes(), chunks);
    EXPECT_EQ(server.sleeps, std::vector<std::uint32_t>(chunks.size(), pause));
  }
}

// Writes of 480 ms, each followed by the 50 ms pause, from t = 1000 ms: the
// half-second number is 2 at the start and rises by one with each chunk, the
// pause included. The final event repeats the last estimates, which the next
// file and the next upload start from; a speed of 0 gives no time left.
TEST_F(Upload, ProgressComesWhenTheHalfSecondChangesAndItsSpeedIsKept) {
  ScriptWriteTimes({480, 480, 480});
  request.AddFile(L"f", MakeSparseFile(L"f", 224 * KiB).c_str());
  request.AddFile(L"g", MakeFile(L"g", "12").c_str());
  ASSERT_EQ(Run(), platform::kOk);
  EXPECT_EQ(listener.events, (Lines{
      "FileBegin f", "FileProgress f 0 229376 40 0 229378 40 5600",
      "FileProgress f 32768 229376 6 32768 229378 6 32768",
      "FileProgress f 98304 229376 2 98304 229378 2 49152",
      "FileProgress f 229376 229376 0 229376 229378 0 76458",
      "FileProgress f 229376 229376 0 229376 229378 0 76458", "FileComplete f 0x00000000",
      "FileBegin g", "FileProgress g 0 2 0 229376 229378 3 76458",
      "FileProgress g 2 2 0 229378 229378 3 76458", "FileComplete g 0x00000000"}));
  for (const std::uint32_t speed : {76458u, 0u}) {
    request.ClearFiles();
    request.AddFile(L"g", L"g");
    if (speed == 0) request.rateEstimate = 0;
    listener.events.clear();
    ASSERT_EQ(Run(), platform::kOk);
    EXPECT_EQ(listener.Only("FileProgress g").at(0), "FileProgress g 0 2 0 0 2 0 " + std::to_string(speed));
  }
}

TEST_F(Upload, ACancelIsPolledAfterEveryChunkAndEndsTheBodyUnfinished) {
  // Polls: a at its start, after its only chunk; b at its start, after each chunk.
  const Lines afterA = {"FileComplete a 0x00000000", "FileComplete b 0x80040301"};
  for (const auto& [cancelledPoll, completions, bodyEnd] : std::vector<std::tuple<int, Lines, std::string>>{
           {1, {"FileComplete a 0x80040301"}, "\r\n\r\n"}, {3, afterA, "\r\n\r\n"},
           {4, afterA, std::string(32, 'b')}, {5, afterA, std::string(32, 'b')}}) {
    SCOPED_TRACE(cancelledPoll);
    Fresh();
    listener.cancelAt = [poll = cancelledPoll](int polled) { return polled == poll; };
    request.AddFile(L"a", MakeFile(L"a", "first").c_str());
    request.AddFile(L"b", MakeFile(L"b", std::string(32 * KiB + 100, 'b')).c_str());
    EXPECT_EQ(Run(), transport::UPLOAD_E_CANCELLED);
    EXPECT_EQ(listener.Only("FileComplete"), completions);
    const std::string body = server.Body();
    EXPECT_EQ(body.substr(body.size() - bodyEnd.size()), bodyEnd);
    EXPECT_FALSE(server.ended);
  }
  Fresh();
  listener.cancelAt = [](int) { return true; };
  EXPECT_EQ(Run(), platform::kOk) << "an upload without files cannot be cancelled";
  EXPECT_EQ(listener.polls, 0);
}

// Each fault ends the upload with its status, unended: a file that cannot be
// opened is not reported begun, nothing of a changed file is sent beyond what
// was counted, no descriptor is kept, and a body of 4 GiB is not started.
TEST_F(Upload, FileFaultsEndTheUploadWithTheirStatus) {
  constexpr std::uintmax_t kFourGiB = std::uintmax_t{4} * 1024 * MiB;
  constexpr std::uint32_t kChanged = 0x800703EEu, kTooLarge = 0x800700DFu;
  const auto sized = [](std::uintmax_t size) { return [size] { MakeSparseFile(L"f1", size); }; };
  const auto none = [] {};
  using Prepare = std::function<void()>;  // the second file, then at the start
  const std::tuple<const char*, Prepare, Prepare, std::uint32_t> cases[] = {
      {"missing", none, none, 0x80070002u},
      {"a folder", [] { std::filesystem::create_directory("f1"); }, none, 0x80070005u},
      {"grown", sized(100 * KiB), [] { std::ofstream(Native(L"f1"), std::ios::app) << "more"; }, kChanged},
      {"shrunk", sized(100 * KiB), [] { std::filesystem::resize_file(Native(L"f1"), 50 * KiB); }, kChanged},
      {"4 GiB", sized(kFourGiB), none, kTooLarge},
      {"4 GiB body", sized(kFourGiB - 100), none, kTooLarge},
  };
  const auto descriptors = [] {
    return std::distance(std::filesystem::directory_iterator("/proc/self/fd"), {});
  };
  const auto before = descriptors();
  for (const auto& [what, makeSecond, atStart, status] : cases) {
    SCOPED_TRACE(what);
    Fresh();
    std::filesystem::remove_all("f1");
    makeSecond();
    request.AddFile(L"a", MakeSparseFile(L"f0", 5).c_str());
    request.AddFile(L"b", L"f1");
    server.onStart = atStart;
    EXPECT_EQ(static_cast<std::uint32_t>(Run()), status);
    const bool started = status != kTooLarge;
    EXPECT_EQ(server.announced.has_value(), started);
    EXPECT_FALSE(server.ended);
    EXPECT_EQ(server.Body().find("more"), std::string::npos);
    EXPECT_EQ(listener.Only("FileComplete f0"), started ? Lines{"FileComplete f0 0x00000000"} : Lines{});
    EXPECT_EQ(listener.Only("FileBegin f1").size(), status == kChanged ? 1u : 0u);
    EXPECT_EQ(descriptors(), before);
  }
}

TEST(ChunkPauseSetting, OnlyDecimalMillisecondsUpToOneSecondAreTaken) {
  for (const auto& [text, ms] : std::vector<std::pair<const char*, std::optional<std::uint32_t>>>{
           {"0", 0}, {"50", 50}, {"1000", 1000}, {"0007", 7}, {"", {}}, {"1001", {}}, {"-1", {}},
           {"+5", {}}, {" 5", {}}, {"5 ", {}}, {"5ms", {}}, {"0x10", {}}, {"1e3", {}}, {"2.5", {}},
           {"4294967346", {}}, {"99999999999999999999", {}}}) {
    EXPECT_EQ(transport::ChunkPause::Parse(text), ms) << '"' << text << '"';
  }
}

}  // namespace

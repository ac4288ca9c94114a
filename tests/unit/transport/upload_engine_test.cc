// The upload form, its URL rules, the byte-exact multipart body, the engine's
// timing, progress, cancel and file faults against a recording connection, and
// the chunk pause setting.
#include <gtest/gtest.h>

#include <fstream>
#include <regex>

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
constexpr std::uint32_t KiB = 1024, MiB = 1024 * KiB;
constexpr std::size_t kHeaderSizeBelow = 1024;  // pieces this small are part headers

std::filesystem::path Native(const std::wstring& name) { return std::filesystem::u8path(platform::WideToUtf8(name)); }

std::wstring MakeFile(const std::wstring& name, const std::string& bytes) {
  return std::ofstream(Native(name), std::ios::binary) << bytes, name;
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
  bool started = false, ended = false;
  std::uint32_t announced = 0;

  std::string Body() const {
    std::string body;
    for (const std::string& piece : writes) body += piece;
    return body;
  }
  std::string Boundary() const { return headers.at(0).substr(headers.at(0).find("boundary=") + 9); }

  transport::UploadEnvironment Environment() {
    return transport::UploadEnvironment{[this] { return now; }, [this](std::uint32_t ms) { sleeps.push_back(ms), now += ms; },
                             [this](const transport::UploadRequest&, transport::UploadProgress*, std::unique_ptr<transport::UploadConnection>* out) {
                               *out = std::make_unique<Connection>(*this);
                               return platform::kOk;
                             }};
  }

  class Connection : public transport::UploadConnection {
   public:
    explicit Connection(FakeServer& server) : s_(server) {}
    platform::Status AddHeader(const std::string& line) override { return s_.headers.push_back(line), platform::kOk; }
    platform::Status Start(std::uint32_t contentLength) override {
      s_.started = true;
      s_.announced = contentLength;
      s_.onStart();
      return platform::kOk;
    }
    platform::Status Write(std::string_view piece) override {
      s_.writes.emplace_back(piece);
      s_.now += s_.writeMs(piece.size());
      return platform::kOk;
    }
    platform::Status End() override { return s_.ended = true, platform::kOk; }
    bool QueryStatusCode(std::uint32_t* code) override { return *code = 200, true; }
    std::string ReadReply() override { return "<uploadTemplate/>"; }

   private:
    FakeServer& s_;
  };
};

// Replaces each "{B}" with the boundary.
std::string WithBoundary(std::string pattern, const std::string& boundary) {
  for (std::size_t at; (at = pattern.find("{B}")) != std::string::npos;) pattern.replace(at, 3, boundary);
  return pattern;
}

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

  std::vector<std::size_t> ChunkSizes() const {
    std::vector<std::size_t> sizes;
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
  void AddSparseFile(const std::vector<std::size_t>& chunks) {
    std::uintmax_t size = 0;
    for (const std::size_t chunk : chunks) size += chunk;
    request.AddFile(L"f", MakeSparseFile(L"f", size).c_str());
  }

  transport::UploadRequest request;
  transport::UploadResult result;
  RecordingListener<transport::UploadProgress> listener;
  FakeServer server;
  std::uint32_t pauseMs = transport::ChunkPause::kDefaultMs;
};

TEST_F(Upload, TheWorkedExampleIsByteExactAndItsLengthAnnounced) {
  request.AddField("title", "Sunset");
  request.AddFile(L"PIPfile", MakeFile(L"C:\\p.xml", "0123456789").c_str());
  transport::Uploader measuring(nullptr, &request, &result, server.Environment());
  const std::string b = "---------------------------0029482318BE";
  std::uint64_t total = 0;
  std::vector<std::uint64_t> sizes;
  EXPECT_EQ(measuring.FieldPartLength(b, "title", "Sunset"), 99u);
  EXPECT_EQ(measuring.ComputeContentLength(b, &total, &sizes), 310u);
  EXPECT_NE(measuring.MakeBoundary(), measuring.MakeBoundary());
  EXPECT_TRUE(std::regex_match(measuring.MakeBoundary(), std::regex("-{27}[0-9A-F]{12}")));
  ASSERT_EQ(Run(), platform::kOk);
  EXPECT_EQ(server.headers, Lines{"Content-Type: multipart/form-data; boundary=" + server.Boundary()});
  EXPECT_EQ(server.announced, 310u);
  EXPECT_EQ(server.Body(), WithBoundary(FieldPart("title", "Sunset") + FilePart("PIPfile", "C:\\p.xml",
                                        "0123456789") + "--{B}--\r\n", server.Boundary()));
  EXPECT_TRUE(server.ended);
}

// Fields come first in unsigned byte order, each name once with its last
// value; files keep their order and repeats; file names are UTF-8 with a
// quote or line break escaped.
TEST_F(Upload, BodiesOfEveryShapeAreWhatTheirLengthAnnounced) {
  struct Case {
    std::function<void(transport::UploadRequest&)> fill;
    std::string body;
  };
  const Case cases[] = {
      {[](transport::UploadRequest&) {}, "--{B}--\r\n"},
      {[](transport::UploadRequest& r) {
         r.AddFile(L"f", MakeFile(L"p", "1").c_str());
         for (const char* name : {"title", "\xC3\xA9t\xC3\xA9", "AP", "Version", "title"}) r.AddField(name, "v");
         r.AddField("tags", nullptr);
         r.AddField("AP", "last");
       },
       FieldPart("AP", "last") + FieldPart("Version", "v") + FieldPart("tags", "") + FieldPart("title", "v") +
           FieldPart("\xC3\xA9t\xC3\xA9", "v") + FilePart("f", "p", "1") + "--{B}--\r\n"},
      {[](transport::UploadRequest& r) {
         const std::wstring path = MakeFile(L"a\"\u4E2D\r\n", "12");
         r.AddFile(L"a", path.c_str());
         r.AddFile(L"e", MakeFile(L"e", "").c_str());
         r.AddFile(L"a", path.c_str());
       },
       FilePart("a", "a%22\xE4\xB8\xAD%0D%0A", "12") + FilePart("e", "e", "") +
           FilePart("a", "a%22\xE4\xB8\xAD%0D%0A", "12") + "--{B}--\r\n"},
  };
  for (const Case& c : cases) {
    request = transport::UploadRequest();
    server = FakeServer();
    c.fill(request);
    ASSERT_EQ(Run(), platform::kOk);
    EXPECT_EQ(server.Body(), WithBoundary(c.body, server.Boundary()));
    EXPECT_EQ(server.Body().size(), server.announced);
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
           "http://" + k259 + "a/p", "http://h/" + k259, "https://h/p", "HTTP://h/p", "ftp://h/p", "http://h:8080/p",
           "http://user:pw@h/p", "http://h/p?id=1", "http://h/p#top", "http:///p", "http:h/p", "//h/p", "",
           "http://h/a b", "http://h/a\r\nX: y"}) {
    transport::UploadRequest request;
    request.SetUrl("http://before/was");
    EXPECT_FALSE(request.SetUrl(url.c_str())) << url;
    EXPECT_EQ(request.host + request.path, "before/was") << url;
  }
  EXPECT_FALSE(transport::UploadRequest().SetUrl(nullptr));
}

TEST_F(Upload, FastWritesGrowTheChunkToSixteenMebibytesAndSlowOnesHalveItToTheFloor) {
  std::vector<std::size_t> growing;
  for (std::uint32_t chunk = 32 * KiB; chunk <= 16 * MiB; chunk *= 2) growing.push_back(chunk);
  growing.insert(growing.end(), {16 * MiB, 16 * MiB});
  AddSparseFile(growing);
  ASSERT_EQ(Run(), platform::kOk);
  EXPECT_EQ(ChunkSizes(), growing);

  const std::vector<std::size_t> halving = {32 * KiB, 64 * KiB, 128 * KiB, 64 * KiB, 32 * KiB,
                                            32 * KiB, 32 * KiB, 32 * KiB, 32 * KiB, 64 * KiB};
  server = FakeServer();
  request.ClearFiles();
  AddSparseFile(halving);
  ScriptWriteTimes({100, 100, 2000, 1251, 2000, 800, 1250, 500, 499});
  ASSERT_EQ(Run(), platform::kOk);
  EXPECT_EQ(ChunkSizes(), halving);
}

// Writes of 300 ms plus the 50 ms pause from t = 1000 ms: the half-second number
// is 2 at the start, still 2 after the first chunk, 3 after the second, 4 after
// the third. The final event repeats the last estimates, which the next file
// and the next upload start from.
TEST_F(Upload, ProgressComesWhenTheHalfSecondChangesAndItsSpeedIsKept) {
  ScriptWriteTimes({300, 300, 300});
  request.AddFile(L"f", MakeSparseFile(L"f", 224 * KiB).c_str());
  request.AddFile(L"g", MakeFile(L"g", "12").c_str());
  ASSERT_EQ(Run(), platform::kOk);
  EXPECT_EQ(listener.events, (Lines{
      "FileBegin f", "FileProgress f 0 229376 40 0 229378 40 5600", "FileProgress f 98304 229376 1 98304 229378 1 98304",
      "FileProgress f 229376 229376 0 229376 229378 0 114688", "FileProgress f 229376 229376 0 229376 229378 0 114688",
      "FileComplete f 0x00000000", "FileBegin g", "FileProgress g 0 2 0 229376 229378 2 114688",
      "FileProgress g 2 2 0 229378 229378 2 114688", "FileComplete g 0x00000000"}));
  request.ClearFiles();
  request.AddFile(L"g", L"g");
  listener.events.clear();
  ASSERT_EQ(Run(), platform::kOk);
  EXPECT_EQ(listener.Only("FileProgress g").at(0), "FileProgress g 0 2 0 0 2 0 114688");
}

// Only the write times size the chunks; the pause after each moves the
// half-second reports, and a cancel polled after a chunk stops behind it.
TEST_F(Upload, ThePauseAfterEachChunkMovesTheReportsButNotTheChunks) {
  for (const auto& [pause, later] : std::vector<std::pair<std::uint32_t, Lines>>{
           {0, {"98304 229376 1 98304 229376 1 98304", "229376 229376 1 229376 229376 1 98304"}},
           {1000, {"32768 229376 12 32768 229376 12 16384", "98304 229376 6 98304 229376 6 19660",
                   "229376 229376 0 229376 229376 0 32768", "229376 229376 0 229376 229376 0 32768"}}}) {
    for (const int cancelledPoll : {0, 3}) {
      server = FakeServer();
      listener = RecordingListener<transport::UploadProgress>();
      listener.cancelAt = [=](int poll) { return poll == cancelledPoll; };
      pauseMs = pause;
      ScriptWriteTimes({300, 300, 300});
      request = transport::UploadRequest();  // the initial speed estimate again
      request.AddFile(L"f", MakeSparseFile(L"f", 224 * KiB).c_str());
      Run();
      const std::size_t chunks = cancelledPoll ? 2 : 3;
      std::vector<std::size_t> sizes = {32 * KiB, 64 * KiB, 128 * KiB};
      sizes.resize(chunks);
      EXPECT_EQ(ChunkSizes(), sizes);
      EXPECT_EQ(server.sleeps, std::vector<std::uint32_t>(chunks, pause));
      if (cancelledPoll) continue;
      Lines progress;
      for (const std::string& values : later) progress.push_back("FileProgress f " + values);
      EXPECT_EQ(listener.Only("FileProgress f 0 "), Lines{"FileProgress f 0 229376 40 0 229376 40 5600"});
      EXPECT_EQ(Lines(listener.events.begin() + 2, listener.events.end() - 1), progress) << pause;
    }
  }
}

TEST_F(Upload, AZeroSpeedGivesNoTimeLeftInsteadOfTrapping) {
  request.rateEstimate = 0;
  ScriptWriteTimes({2000});
  request.AddFile(L"f", MakeFile(L"f", std::string(KiB, 'x')).c_str());
  ASSERT_EQ(Run(), platform::kOk);
  EXPECT_EQ(listener.Only("FileProgress"), (Lines{"FileProgress f 0 1024 0 0 1024 0 0",
                                                  "FileProgress f 1024 1024 0 1024 1024 0 256",
                                                  "FileProgress f 1024 1024 0 1024 1024 0 256"}));
}

TEST_F(Upload, ACancelIsPolledAfterEveryChunkAndEndsTheBodyUnfinished) {
  struct Case {
    int cancelledPoll;
    Lines completions;
    std::string bodyEnd;
  };
  // Polls: a at its start, after its only chunk; b at its start, after each chunk.
  for (const Case& c : {Case{1, {"FileComplete a 0x80040301"}, "\r\n\r\n"},
                        Case{3, {"FileComplete a 0x00000000", "FileComplete b 0x80040301"}, "\r\n\r\n"},
                        Case{4, {"FileComplete a 0x00000000", "FileComplete b 0x80040301"}, std::string(32, 'b')},
                        Case{5, {"FileComplete a 0x00000000", "FileComplete b 0x80040301"}, std::string(32, 'b')}}) {
    SCOPED_TRACE(c.cancelledPoll);
    server = FakeServer();
    listener = RecordingListener<transport::UploadProgress>();
    listener.cancelAt = [&](int poll) { return poll == c.cancelledPoll; };
    request.ClearFiles();
    request.AddFile(L"a", MakeFile(L"a", "first").c_str());
    request.AddFile(L"b", MakeFile(L"b", std::string(32 * KiB + 100, 'b')).c_str());
    EXPECT_EQ(Run(), transport::UPLOAD_E_CANCELLED);
    EXPECT_EQ((std::pair{result.hr, result.httpStatus}), (std::pair{transport::UPLOAD_E_CANCELLED, 0xFFFFFFFFu}));
    EXPECT_EQ(listener.Only("FileComplete"), c.completions);
    const std::string body = server.Body();
    EXPECT_EQ(body.substr(body.size() - c.bodyEnd.size()), c.bodyEnd);
    EXPECT_FALSE(server.ended);
  }
  listener.cancelAt = [](int) { return true; };
  listener.polls = 0;
  request.ClearFiles();
  EXPECT_EQ(Run(), platform::kOk) << "an upload without files cannot be cancelled";
  EXPECT_EQ(listener.polls, 0);
}

std::size_t OpenDescriptors() {
  return std::distance(std::filesystem::directory_iterator("/proc/self/fd"), {});
}

// Each fault ends the upload with its status, unended, no file name of a file
// that cannot be opened reported, nothing of a changed file sent beyond what
// was counted, and no descriptor kept.
TEST_F(Upload, FileFaultsEndTheUploadWithTheirStatus) {
  constexpr std::uintmax_t kFourGiB = std::uintmax_t{4} * 1024 * MiB;
  struct Case {
    const char* what;
    std::function<void()> before, atStart;
    std::uint32_t status;
    bool started;
  };
  auto files = [](std::vector<std::uintmax_t> sizes) {
    return [sizes] {
      for (std::size_t i = 0; i < sizes.size(); ++i) MakeSparseFile(L"f" + std::to_wstring(i), sizes[i]);
    };
  };
  auto grow = [] { std::ofstream(Native(L"f1"), std::ios::app) << "more"; };
  auto shrink = [] { std::filesystem::resize_file(Native(L"f1"), 50 * KiB); };
  const Case cases[] = {
      {"missing", files({5}), [] {}, 0x80070002u, true},
      {"a folder", [] { MakeFile(L"f0", "x"); std::filesystem::create_directory("f1"); }, [] {}, 0x80070005u, true},
      {"grown", files({5, 100 * KiB}), grow, 0x800703EEu, true},
      {"shrunk", files({5, 100 * KiB}), shrink, 0x800703EEu, true},
      {"4 GiB", files({5, kFourGiB}), [] {}, 0x800700DFu, false},
      {"two halves", files({kFourGiB / 2, kFourGiB / 2}), [] {}, 0x800700DFu, false},
      {"4 GiB body", files({5, kFourGiB - 100}), [] {}, 0x800700DFu, false},
  };
  const std::size_t descriptors = OpenDescriptors();
  for (const Case& c : cases) {
    SCOPED_TRACE(c.what);
    server = FakeServer();
    listener.events.clear();
    request.ClearFiles();
    std::filesystem::remove_all("f1");
    c.before();
    request.AddFile(L"a", L"f0");
    request.AddFile(L"b", L"f1");
    server.onStart = c.atStart;
    EXPECT_EQ(static_cast<std::uint32_t>(Run()), c.status);
    EXPECT_EQ(server.started, c.started);
    EXPECT_FALSE(server.ended);
    EXPECT_LE(server.Body().size(), server.announced);
    EXPECT_EQ(server.Body().find("more"), std::string::npos);
    EXPECT_EQ(listener.Only("FileComplete f0"), c.started ? Lines{"FileComplete f0 0x00000000"} : Lines{});
    EXPECT_EQ(listener.Only("FileBegin f1").size(), c.status == 0x800703EEu ? 1u : 0u);
    EXPECT_EQ(OpenDescriptors(), descriptors);
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

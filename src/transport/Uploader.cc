#include "transport/Uploader.h"

#include <algorithm>
#include <limits>

#include "platform/file.h"
#include "transport/UploadProgress.h"
#include "transport/UploadRequest.h"
#include "transport/UploadResult.h"
#include "transport/UploadStatus.h"

namespace transport {

namespace {

// Lengths on the wire are 32-bit: a body or file of 4 GiB or more cannot be sent.
constexpr std::uint64_t kWireLimit = std::numeric_limits<std::uint32_t>::max();

// A speed of 0 (fewer bytes sent than half-seconds elapsed) gives no estimate.
std::uint32_t Divide(std::uint32_t amount, std::uint32_t by) { return by == 0 ? 0 : amount / by; }

bool FitsTheWire(std::uint64_t length, const std::vector<std::uint64_t>& fileSizes) {
  return length <= kWireLimit &&
         std::all_of(fileSizes.begin(), fileSizes.end(),
                     [](std::uint64_t size) { return size <= kWireLimit; });
}

// The file no longer holds the bytes the announced length counted.
platform::Status FileChanged() { return platform::StatusFromWin32(platform::kErrorFileInvalid); }

// Reads the next piece: a chunk, or the `left` bytes if fewer; with nothing left, one byte
// more shows whether the file has grown.
platform::Status ReadNext(platform::File& source, char* buffer, std::uint32_t chunk, std::uint32_t left,
                     std::size_t* count) {
  const std::size_t wanted = left == 0 ? 1 : std::min(chunk, left);
  return source.Read(buffer, wanted, count);
}

// Keeps each write between half a second and 1.25 s.
std::uint32_t NextChunkSize(std::uint32_t chunk, std::uint32_t writeMs) {
  if (writeMs < Uploader::kFastWriteMs) {
    return chunk >= Uploader::kChunkCeiling ? chunk : chunk * 2;
  }
  if (writeMs > Uploader::kSlowWriteMs) return std::max(chunk / 2, Uploader::kChunkFloor);
  return chunk;
}

// What one progress event tells beyond the byte counts.
struct Estimate {
  std::uint32_t fileLeft;
  std::uint32_t allLeft;
  std::uint32_t speed;
};

// Times left at that speed: for this file's remaining bytes and for all files'.
Estimate Remaining(std::uint32_t fileBytes, std::uint32_t allBytes, std::uint32_t speed) {
  return Estimate{Divide(fileBytes, speed), Divide(allBytes, speed), speed};
}

}  // namespace

// Bytes of all files: sent so far, and in all.
struct Uploader::Totals {
  std::uint32_t sent = 0;
  std::uint32_t size = 0;
};

Uploader::Uploader(UploadProgress* listener, UploadRequest* request, UploadResult* result,
                   UploadEnvironment environment)
    : listener(listener), request(request), result(result), environment_(std::move(environment)) {}

Uploader::~Uploader() = default;

platform::Status Uploader::Upload() {
  const platform::Status status = Post();
  result->hr = status;
  return status;
}

// The connection is closed when this returns, on every path; a failure leaves
// the request abandoned, unended.
platform::Status Uploader::Post() {
  std::unique_ptr<UploadConnection> connection;
  platform::Status status = environment_.openConnection(*request, listener, &connection);
  if (platform::Failed(status)) return status;
  const std::string boundary = MakeBoundary();
  status = connection->AddHeader(MakeContentTypeHeader(boundary));
  if (platform::Failed(status)) return status;
  std::uint64_t totalFileSize = 0;
  std::vector<std::uint64_t> fileSizes;
  const std::uint64_t length = ComputeContentLength(boundary, &totalFileSize, &fileSizes);
  if (!FitsTheWire(length, fileSizes)) return platform::StatusFromWin32(platform::kErrorFileTooLarge);
  status = connection->Start(static_cast<std::uint32_t>(length));
  if (platform::Failed(status)) return status;
  status = WriteFields(*connection, boundary);
  if (platform::Failed(status)) return status;
  status = WriteFiles(*connection, boundary, fileSizes, totalFileSize);
  if (platform::Failed(status)) return status;
  status = connection->Write(MakeClosingDelimiter(boundary));
  if (platform::Failed(status)) return status;
  status = connection->End();
  if (platform::Failed(status)) return status;
  ReadReply(*connection);
  return platform::kOk;
}

platform::Status Uploader::WriteFields(UploadConnection& connection, const std::string& boundary) {
  for (const auto& [name, value] : request->fields) {
    const platform::Status status = WriteFieldPart(connection, boundary, name, value);
    if (platform::Failed(status)) return status;
  }
  return platform::kOk;
}

platform::Status Uploader::WriteFieldPart(UploadConnection& connection, const std::string& boundary,
                                     const std::string& name, const std::string& value) {
  for (const std::string& piece : {MakeFieldHeader(boundary, name), value, MakeLineBreak()}) {
    const platform::Status status = connection.Write(piece);
    if (platform::Failed(status)) return status;
  }
  return platform::kOk;
}

platform::Status Uploader::WriteFiles(UploadConnection& connection, const std::string& boundary,
                                 const std::vector<std::uint64_t>& fileSizes,
                                 std::uint64_t totalFileSize) {
  Totals totals;
  totals.size = static_cast<std::uint32_t>(totalFileSize);
  const std::vector<UploadFile>& files = request->files;
  for (std::size_t i = 0; i < files.size(); ++i) {
    const auto size = static_cast<std::uint32_t>(fileSizes[i]);
    const platform::Status status = WriteFilePart(connection, boundary, files[i], size, totals);
    if (platform::Failed(status)) return status;
  }
  return platform::kOk;
}

platform::Status Uploader::WriteFilePart(UploadConnection& connection, const std::string& boundary,
                                    const UploadFile& file, std::uint32_t size, Totals& totals) {
  platform::Status status =
      connection.Write(MakeFileHeader(boundary, file.name, file.path, file.contentType));
  if (platform::Failed(status)) return status;
  platform::File source;
  status = source.Open(file.path);
  if (platform::Failed(status)) return status;
  listener->OnFileBegin(file.path.c_str());
  status = StreamFile(connection, file.path, source, size, totals);
  source.Close();
  listener->OnFileComplete(file.path.c_str(), status);
  if (platform::Failed(status)) return status;
  return connection.Write(MakeLineBreak());
}

// Streams exactly the `size` bytes the announced length counted, in chunks that
// adapt to the time each write takes, with progress at most once a half-second.
platform::Status Uploader::StreamFile(UploadConnection& connection, const std::wstring& path,
                                 platform::File& source, std::uint32_t size, Totals& totals) {
  const wchar_t* name = path.c_str();
  Estimate estimate = Remaining(size, totals.size, request->rateEstimate);
  std::uint32_t sent = 0;
  const std::uint32_t startTick = CurrentTick();
  std::uint32_t lastTick = startTick;
  std::uint32_t chunk = kChunkFloor;
  char* buffer = ChunkBuffer();
  if (buffer == nullptr) return platform::StatusFromWin32(platform::kErrorNotEnoughMemory);
  auto report = [&](std::uint32_t fileSent) {
    listener->OnFileProgress(name, fileSent, size, estimate.fileLeft, totals.sent, totals.size,
                             estimate.allLeft, estimate.speed);
  };
  report(0);
  if (listener->IsCancelled()) return UPLOAD_E_CANCELLED;
  for (;;) {
    std::size_t count = 0;
    platform::Status status = ReadNext(source, buffer, chunk, size - sent, &count);
    if (platform::Failed(status)) return status;
    if (count == 0) {
      if (sent != size) return FileChanged();
      request->rateEstimate = estimate.speed;
      report(size);
      return platform::kOk;
    }
    if (sent == size) return FileChanged();
    const std::uint32_t writeStart = environment_.tickCount();
    const ChunkLog::Stamp logStart = chunkLog_.Begin();
    status = connection.Write(std::string_view(buffer, count));
    const std::uint32_t writeMs = environment_.tickCount() - writeStart;
    chunkLog_.Note(count, logStart);
    if (platform::Failed(status)) return status;
    chunk = NextChunkSize(chunk, writeMs);
    sent += static_cast<std::uint32_t>(count);
    totals.sent += static_cast<std::uint32_t>(count);
    environment_.sleep(environment_.pauseAfterChunkMs);
    const std::uint32_t now = CurrentTick();
    if (now != lastTick) {
      estimate = Remaining(size - sent, totals.size - totals.sent, Divide(sent, now - startTick));
      report(sent);
      lastTick = now;
    }
    if (listener->IsCancelled()) return UPLOAD_E_CANCELLED;
  }
}

void Uploader::ReadReply(UploadConnection& connection) {
  std::uint32_t code = 0;
  if (connection.QueryStatusCode(&code)) result->httpStatus = code;
  reply = connection.ReadReply();
}

// Fresh memory costs a page fault per page when first touched. One block for
// the whole upload, of which each read fills at most the current chunk size,
// touches every page once rather than again at each change of the chunk size,
// and never holds more than the largest chunk used (rounded up to a huge page).
char* Uploader::ChunkBuffer() {
  if (!chunkBuffer_) chunkBuffer_.emplace(kChunkCeiling);
  return chunkBuffer_->data();
}

std::uint32_t Uploader::CurrentTick() const { return environment_.tickCount() / kMsPerTick; }

}  // namespace transport

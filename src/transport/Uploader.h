// Posts one UploadRequest as a multipart/form-data body, streaming each file in
// chunks sized to the connection's speed, reporting connection events and
// progress to a listener, stopping when the listener asks, and keeping the
// server's status code and reply.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "platform/large_buffer.h"
#include "platform/win_error.h"
#include "transport/ChunkLog.h"
#include "transport/UploadEnvironment.h"
#include "transport/UploadFile.h"

namespace platform {
class File;
}

namespace transport {

class UploadProgress;
class UploadRequest;
struct UploadResult;

class Uploader {
 public:
  static constexpr std::uint32_t kChunkFloor = 32 * 1024;
  static constexpr std::uint32_t kChunkCeiling = 16 * 1024 * 1024;
  // A write faster than this doubles the chunk; slower than kSlowWrite halves it.
  static constexpr std::uint32_t kFastWriteMs = 500;
  static constexpr std::uint32_t kSlowWriteMs = 1250;
  static constexpr std::uint32_t kMsPerTick = 500;

  Uploader(UploadProgress* listener, UploadRequest* request, UploadResult* result,
           UploadEnvironment environment);
  virtual ~Uploader();

  // Performs the whole POST; stores the status in result->hr and returns it.
  virtual platform::Status Upload();

  // The multipart encoding; none of it touches the network.
  std::string MakeBoundary() const;
  std::string MakeContentTypeHeader(const std::string& boundary) const;
  std::string MakeFieldHeader(const std::string& boundary, const std::string& name) const;
  std::string MakeFileHeader(const std::string& boundary, const std::wstring& name,
                             const std::wstring& path, const std::wstring& contentType) const;
  std::string MakeLineBreak() const;
  std::string MakeClosingDelimiter(const std::string& boundary) const;
  std::uint64_t FieldPartLength(const std::string& boundary, const std::string& name,
                                const std::string& value) const;
  // Measures the file (0 when it cannot be opened) into `*fileSize`.
  std::uint64_t FilePartLength(const std::string& boundary, const UploadFile& file,
                               std::uint64_t* fileSize) const;
  // The body length, the total of file sizes and each file's size, as measured now.
  std::uint64_t ComputeContentLength(const std::string& boundary, std::uint64_t* totalFileSize,
                                     std::vector<std::uint64_t>* fileSizes) const;

  UploadProgress* listener;  // not owned
  UploadRequest* request;    // not owned
  UploadResult* result;      // not owned
  std::string reply;

 private:
  struct Totals;

  platform::Status Post();
  platform::Status WriteFields(UploadConnection& connection, const std::string& boundary);
  platform::Status WriteFieldPart(UploadConnection& connection, const std::string& boundary,
                             const std::string& name, const std::string& value);
  platform::Status WriteFiles(UploadConnection& connection, const std::string& boundary,
                         const std::vector<std::uint64_t>& fileSizes, std::uint64_t totalFileSize);
  platform::Status WriteFilePart(UploadConnection& connection, const std::string& boundary,
                            const UploadFile& file, std::uint32_t size, Totals& totals);
  platform::Status StreamFile(UploadConnection& connection, const std::wstring& path,
                         platform::File& source, std::uint32_t size, Totals& totals);
  void ReadReply(UploadConnection& connection);
  // Null when it cannot be had.
  char* ChunkBuffer();
  std::uint32_t CurrentTick() const;

  UploadEnvironment environment_;
  ChunkLog chunkLog_;
  std::optional<platform::LargeBuffer> chunkBuffer_;  // kChunkCeiling bytes, made at the first file
};

}  // namespace transport

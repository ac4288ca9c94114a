// The upload events as commands: each keeps a copy of its event's arguments, so
// the raising thread may free its own buffers at once.
#pragma once

#include <cstdint>
#include <string>

#include "platform/text.h"
#include "transport/BackgroundUploadProgress.h"
#include "upload/Command.h"

namespace upload {

class VoidCommand : public UploadProgressCommand {
 public:
  using Method = void (transport::BackgroundUploadProgress::*)();
  VoidCommand(transport::BackgroundUploadProgress* target, Method method)
      : UploadProgressCommand(target), method(method) {}
  void Execute() override { (target->*method)(); }

 private:
  Method method;
};

class StringCommand : public UploadProgressCommand {
 public:
  using Method = void (transport::BackgroundUploadProgress::*)(const wchar_t*);
  StringCommand(transport::BackgroundUploadProgress* target, Method method, const wchar_t* text)
      : UploadProgressCommand(target), method(method), text(platform::WideView(text)) {}
  void Execute() override { (target->*method)(text.c_str()); }

 private:
  Method method;
  std::wstring text;
};

class DwordCommand : public UploadProgressCommand {
 public:
  using Method = void (transport::BackgroundUploadProgress::*)(std::uint32_t);
  DwordCommand(transport::BackgroundUploadProgress* target, Method method, std::uint32_t value)
      : UploadProgressCommand(target), method(method), value(value) {}
  void Execute() override { (target->*method)(value); }

 private:
  Method method;
  std::uint32_t value;
};

class OnFileProgressCommand : public UploadProgressCommand {
 public:
  OnFileProgressCommand(transport::BackgroundUploadProgress* target, const wchar_t* path,
                        std::uint32_t fileSent, std::uint32_t fileSize, std::uint32_t fileTimeLeft,
                        std::uint32_t allSent, std::uint32_t allSize, std::uint32_t allTimeLeft,
                        std::uint32_t speed)
      : UploadProgressCommand(target),
        path(platform::WideView(path)),
        fileSent(fileSent),
        fileSize(fileSize),
        fileTimeLeft(fileTimeLeft),
        allSent(allSent),
        allSize(allSize),
        allTimeLeft(allTimeLeft),
        speed(speed) {}
  void Execute() override {
    target->OnFileProgress(path.c_str(), fileSent, fileSize, fileTimeLeft, allSent, allSize,
                           allTimeLeft, speed);
  }

 private:
  std::wstring path;
  std::uint32_t fileSent;
  std::uint32_t fileSize;
  std::uint32_t fileTimeLeft;
  std::uint32_t allSent;
  std::uint32_t allSize;
  std::uint32_t allTimeLeft;
  std::uint32_t speed;
};

class OnFileCompleteCommand : public UploadProgressCommand {
 public:
  OnFileCompleteCommand(transport::BackgroundUploadProgress* target, const wchar_t* path, std::int32_t result)
      : UploadProgressCommand(target), path(platform::WideView(path)), result(result) {}
  void Execute() override { target->OnFileComplete(path.c_str(), result); }

 private:
  std::wstring path;
  std::int32_t result;
};

}  // namespace upload

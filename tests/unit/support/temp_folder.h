// A fresh folder per test that is also the working directory, so that paths
// such as "C:\p.xml" name files in it.
#pragma once

#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <string>

#include "platform/text.h"

namespace test_support {

inline std::filesystem::path Native(const std::wstring& name) {
  return std::filesystem::u8path(text::WideToUtf8(name));
}

// Makes a file and returns its name as the engine will see it.
inline std::wstring MakeFile(const std::wstring& name, const std::string& bytes) {
  std::ofstream(Native(name), std::ios::binary) << bytes;
  return name;
}

// A file of that size whose bytes read as zero, without taking the disk space.
inline std::wstring MakeSparseFile(const std::wstring& name, std::uintmax_t size) {
  std::ofstream(Native(name), std::ios::binary).close();
  std::filesystem::resize_file(Native(name), size);
  return name;
}

class TempFolderTest : public ::testing::Test {
 protected:
  void SetUp() override {
    previous_ = std::filesystem::current_path();
    folder_ = std::filesystem::temp_directory_path() /
              ("unit_test_" + std::to_string(::getpid()));
    std::filesystem::remove_all(folder_);
    std::filesystem::create_directories(folder_);
    std::filesystem::current_path(folder_);
  }
  void TearDown() override {
    std::filesystem::current_path(previous_);
    std::filesystem::remove_all(folder_);
  }

 private:
  std::filesystem::path previous_;
  std::filesystem::path folder_;
};

}  // namespace test_support

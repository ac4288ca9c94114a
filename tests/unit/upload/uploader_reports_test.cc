// What the preset uploader tells its Python callable, driven event by event.
#include "upload/PyPresetUploader.h"

#include <gtest/gtest.h>

#include <string>

#include "support/embedded_python.h"
#include "support/python_objects.h"

namespace {

using test_support::EvalRepr;
using test_support::RunPython;

struct ProgressCase {
  std::uint32_t allSent;
  std::uint32_t allSize;
  std::uint32_t fileTimeLeft;
  const char* report;
};

class UploaderReportsTest : public ::testing::Test {
 protected:
  void SetUp() override {
    RunPython("reports = []\ndef record(*args): reports.append(args)");
    PyObject* record =
        PyDict_GetItemString(PyModule_GetDict(PyImport_AddModule("__main__")), "record");
    EXPECT_EQ(uploader.SetCallback(record), 1);
  }

  PyPresetUploader uploader{L"api.orbishare.com", L"token", L"5.0", L"Retail", L"uuid"};
};

class ProgressReportsTest : public UploaderReportsTest,
                            public ::testing::WithParamInterface<ProgressCase> {};

TEST_P(ProgressReportsTest, ProgressCarriesTheWholePercentOfAllFilesAndTheFilesTimeLeft) {
  const ProgressCase& c = GetParam();
  uploader.OnFileProgress(L"/tmp/p", 1, 2, c.fileTimeLeft, c.allSent, c.allSize, 3, 4);
  EXPECT_EQ(EvalRepr("reports"),
            std::string("[(u'PROGRESS', u'ProgressChanged', ") + c.report + ")]");
}

INSTANTIATE_TEST_SUITE_P(Percentages, ProgressReportsTest,
                         ::testing::Values(ProgressCase{333, 1000, 9, "33, 9"},
                                           ProgressCase{2, 3, 1, "66, 1"},
                                           ProgressCase{0xFFFFFFFFu, 0xFFFFFFFFu, 0, "100, 0"},
                                           // Nothing to send is all sent, never a division by zero.
                                           ProgressCase{0, 0, 0, "100, 0"}));

TEST_F(UploaderReportsTest, ACompletionWithoutAStatusOrReplyIsAFailureWithEmptyTexts) {
  uploader.OnBackgroundUploadComplete(0);
  EXPECT_EQ(EvalRepr("reports"), "[(u'PROGRESS', u'UploadComplete', 100, 0, u'', u'')]");
  test_support::PyRef url(uploader.GetUploadedFileUrl());
  EXPECT_EQ(PyUnicode_GetSize(url.get()), 0);
}

}  // namespace

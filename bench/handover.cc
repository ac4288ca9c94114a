// The hand-over of progress reports from the upload worker to the UI thread (the
// interpreter's main thread), measured with the system's own classes: the proxy
// window posts, the message queue dispatches through the interpreter's pending
// calls, and the preset uploader calls a Python callable. Prints its figures
// as JSON, which bench/handover lays side by side for each interpreter.
//
//   build/bench/bench_handover
//
// Bursts: the worker posts a burst while the UI thread is busy elsewhere, then
// the UI thread takes them all; each side's thread CPU time is divided by the
// count. Rates: the worker posts at a set rate for a second while the UI thread
// runs a Python loop that sleeps 10 ms between turns, as an idle UI would; the
// UI keeps up when every report has arrived within two turns of the last post.
#include <Python.h>

#include <time.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstdio>
#include <limits>
#include <string>
#include <thread>
#include <vector>

#include "interpreter/PythonApi.h"
#include "upload/CUploadProgressProxyWindow.h"
#include "upload/PyPresetUploader.h"

namespace {

using Clock = std::chrono::steady_clock;

constexpr int kBurstReports = 20000;
constexpr int kBurstRounds = 7;
constexpr double kTargetMicros = 20.0;
constexpr auto kRateWindow = std::chrono::seconds(1);
constexpr auto kPacingStep = std::chrono::microseconds(200);
constexpr double kUiTurnSeconds = 0.010;
constexpr double kKeptUpLagSeconds = 2 * kUiTurnSeconds;
constexpr double kFlatOut = std::numeric_limits<double>::infinity();
constexpr double kIdle = 0;  // the UI thread's turns alone, for their own cost
const double kRates[] = {1e3, 1e4, 3e4, 1e5, 3e5, kFlatOut};

constexpr wchar_t kPresetPath[] = L"/tmp/preset-3fa1/Golden hour.preset";
constexpr std::uint32_t kPresetSize = 100000;

constexpr char kPythonSetUp[] =
    "import time, handover\n"
    "reports = [0]\n"
    "def report(kind, event, percent, left):\n"
    "    reports[0] += 1\n"
    "def follow(turn):\n"
    "    while handover.sample(reports[0]):\n"
    "        time.sleep(turn)\n";

double Seconds(Clock::duration span) { return std::chrono::duration<double>(span).count(); }

double ThreadCpuSeconds() {
  timespec now{};
  ::clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
  return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) * 1e-9;
}

double Median(std::vector<double> values) {
  std::sort(values.begin(), values.end());
  return values[values.size() / 2];
}

// What the worker and the UI thread share during a rate run.
struct RateRun {
  std::atomic<long> posted{0};
  std::atomic<bool> workerDone{false};
  Clock::time_point lastPost;  // written by the worker before workerDone
  Clock::time_point allDelivered;
};

RateRun* g_run = nullptr;

// handover.sample(delivered): false once the worker is done and every report
// it posted has reached the callable.
PyObject* Sample(PyObject*, PyObject* args) {
  long delivered = 0;
  if (!PyArg_ParseTuple(args, "l", &delivered)) return nullptr;
  const bool done = g_run->workerDone.load();
  if (done && delivered >= g_run->posted.load()) {
    g_run->allDelivered = Clock::now();
    Py_RETURN_FALSE;
  }
  Py_RETURN_TRUE;
}

PyMethodDef kHandoverMethods[] = {
    {"sample", &Sample, METH_VARARGS, nullptr},
    {nullptr, nullptr, 0, nullptr},
};

// The interpreter, with this thread as its main thread holding the lock.
class Interpreter {
 public:
  Interpreter() {
    interpreter::StartHostedInterpreter();
    PyObject* handover = interpreter::CreateModule("handover", kHandoverMethods, PYTHON_API_VERSION);
    PyDict_SetItemString(PyImport_GetModuleDict(), "handover", handover);
    PyRun_SimpleString(kPythonSetUp);
  }
  ~Interpreter() { Py_Finalize(); }
  Interpreter(const Interpreter&) = delete;
  Interpreter& operator=(const Interpreter&) = delete;

  // A borrowed reference to a name of __main__.
  static PyObject* Global(const char* name) {
    return PyDict_GetItemString(PyModule_GetDict(PyImport_AddModule("__main__")), name);
  }
  static long Delivered() { return PyLong_AsLong(PyList_GetItem(Global("reports"), 0)); }
  static void ResetDelivered() { PyList_SetItem(Global("reports"), 0, interpreter::NewInt(0)); }
};

// One progress report of a file that streams, as the engine raises it.
void PostReport(upload::CUploadProgressProxyWindow& proxy, long index) {
  const auto sent = static_cast<std::uint32_t>(index % kPresetSize);
  proxy.OnFileProgress(kPresetPath, sent, kPresetSize, 7, sent, kPresetSize, 7, 5600);
}

struct BurstCost {
  double postMicros;      // worker thread CPU per post
  double dispatchMicros;  // UI thread CPU per report
};

// The worker posts a burst while the UI thread waits outside Python; then the
// UI thread runs the pending call that takes them all.
BurstCost MeasureBurst(upload::CUploadProgressProxyWindow& proxy) {
  Interpreter::ResetDelivered();
  double workerCpu = 0;
  std::thread worker([&] {
    const double start = ThreadCpuSeconds();
    for (long i = 0; i < kBurstReports; ++i) PostReport(proxy, i);
    workerCpu = ThreadCpuSeconds() - start;
  });
  worker.join();
  const double start = ThreadCpuSeconds();
  Py_MakePendingCalls();
  const double uiCpu = ThreadCpuSeconds() - start;
  return BurstCost{workerCpu / kBurstReports * 1e6, uiCpu / kBurstReports * 1e6};
}

BurstCost MedianBurst(upload::CUploadProgressProxyWindow& proxy) {
  std::vector<double> post;
  std::vector<double> dispatch;
  for (int round = 0; round < kBurstRounds; ++round) {
    const BurstCost cost = MeasureBurst(proxy);
    post.push_back(cost.postMicros);
    dispatch.push_back(cost.dispatchMicros);
  }
  return BurstCost{Median(post), Median(dispatch)};
}

// Posts at `rate` per second for the window.
void PostAtRate(upload::CUploadProgressProxyWindow& proxy, RateRun& run, double rate) {
  const Clock::time_point start = Clock::now();
  for (Clock::duration elapsed{}; elapsed < kRateWindow; elapsed = Clock::now() - start) {
    const long due = rate == kFlatOut ? run.posted + 1 : static_cast<long>(rate * Seconds(elapsed));
    for (long i = run.posted; i < due; ++i) {
      PostReport(proxy, i);
      run.posted.store(i + 1);
    }
    if (rate != kFlatOut) std::this_thread::sleep_for(kPacingStep);
  }
  run.lastPost = Clock::now();
  run.workerDone.store(true);
}

struct RateResult {
  double achieved;
  double lagSeconds;
  bool keptUp;
  double uiCpuSeconds;
  long posted;
};

RateResult MeasureRate(upload::CUploadProgressProxyWindow& proxy, double rate) {
  Interpreter::ResetDelivered();
  RateRun run;
  g_run = &run;
  std::thread worker([&] { PostAtRate(proxy, run, rate); });
  const double start = ThreadCpuSeconds();
  char format[] = "d";
  PyObject* result = PyObject_CallFunction(Interpreter::Global("follow"), format, kUiTurnSeconds);
  Py_XDECREF(result);
  const double uiCpu = ThreadCpuSeconds() - start;
  worker.join();
  g_run = nullptr;
  const double lag = Seconds(run.allDelivered - run.lastPost);
  return RateResult{run.posted / Seconds(kRateWindow), lag, lag <= kKeptUpLagSeconds, uiCpu,
                    run.posted};
}

std::string RateLabel(double rate) {
  return rate == kFlatOut ? "flat out" : std::to_string(static_cast<long>(rate)) + "/s";
}

template <typename... Values>
std::string Format(const char* format, Values... values) {
  char text[160];
  std::snprintf(text, sizeof text, format, values...);
  return text;
}

// One row of the figures: a label and its cell.
struct Row {
  std::string label;
  std::string cell;
};

void AddBurstRows(const BurstCost& bare, const BurstCost& full, std::vector<Row>& rows) {
  rows.push_back({"burst: worker's post (copy, queue, yield), us", Format("%.2f", full.postMicros)});
  rows.push_back({"burst: UI dispatch and command, no callable, us",
                  Format("%.2f", bare.dispatchMicros)});
  rows.push_back({"burst: UI dispatch and Python call, us", Format("%.2f", full.dispatchMicros)});
}

// What the rate runs show at their worst and best.
struct RateSummary {
  double sustained = 0;     // highest rate the UI kept up with
  double flatOut = 0;       // the worker's own top rate
  double worstUiMicros = 0;  // UI thread CPU per report in a steady flow
};

RateSummary AddRateRows(upload::CUploadProgressProxyWindow& proxy, std::vector<Row>& rows) {
  const double idleCpu = MeasureRate(proxy, kIdle).uiCpuSeconds;
  RateSummary summary;
  for (const double rate : kRates) {
    const RateResult r = MeasureRate(proxy, rate);
    const double uiMicros = (r.uiCpuSeconds - idleCpu) / static_cast<double>(r.posted) * 1e6;
    rows.push_back({"rate asked " + RateLabel(rate),
                    Format("%.0f/s %.1f ms %.2f us %s", r.achieved, r.lagSeconds * 1e3, uiMicros,
                           r.keptUp ? "yes" : "no")});
    if (r.keptUp) summary.sustained = std::max(summary.sustained, r.achieved);
    if (rate == kFlatOut) summary.flatOut = r.achieved;
    summary.worstUiMicros = std::max(summary.worstUiMicros, uiMicros);
  }
  return summary;
}

// The figures as JSON for bench/lib/side_by_side.py; no text here holds a
// character that JSON would escape.
void PrintFigures(const std::vector<Row>& rows, const std::string& ratios) {
  std::printf("{\"title\": \"one progress report from the worker to the UI thread, thread CPU "
              "time, median of %d bursts of %d\",\n \"columns\": [\"measure\", \"figure\"],\n"
              " \"rows\": [",
              kBurstRounds, kBurstReports);
  const char* separator = "";
  for (const Row& row : rows) {
    std::printf("%s\n  [\"%s\", \"%s\"]", separator, row.label.c_str(), row.cell.c_str());
    separator = ",";
  }
  std::printf("],\n \"notes\": [\"rates: the worker posts for %.0f s while the UI thread turns "
              "every %.0f ms; a cell: posted /s, last report's delay, UI thread time per report, "
              "kept up\"],\n \"ratios\": \"%s\"}\n",
              Seconds(kRateWindow), kUiTurnSeconds * 1e3, ratios.c_str());
}

}  // namespace

int main() {
  Interpreter interpreter;
  upload::PyPresetUploader uploader(L"api.orbishare.com", L"0123456789abcdef01234567", L"5.0", L"Retail",
                            L"7f3c2a10-0000-4000-8000-000000000001");
  upload::CUploadProgressProxyWindow proxy(&uploader);
  if (!proxy.CreateHiddenWindow()) return 2;

  uploader.SetCallback(nullptr);
  const BurstCost bare = MedianBurst(proxy);
  uploader.SetCallback(Interpreter::Global("report"));
  const BurstCost full = MedianBurst(proxy);
  if (Interpreter::Delivered() != kBurstReports) {
    std::fprintf(stderr, "FAIL: %ld of %d reports reached the callable\n",
                 Interpreter::Delivered(), kBurstReports);
    return 1;
  }
  std::vector<Row> rows;
  AddBurstRows(bare, full, rows);
  const RateSummary rates = AddRateRows(proxy, rows);

  const double worstUi = std::max(full.dispatchMicros, rates.worstUiMicros);
  // With reports queued up, as at capacity, each costs what a burst shows.
  const double uiCapacity = 1e6 / full.dispatchMicros;
  rows.push_back({Format("UI time per report, worst (target < %.0f us), us", kTargetMicros),
                  Format("%.2f %s", worstUi, worstUi < kTargetMicros ? "met" : "MISSED")});
  rows.push_back({"highest rate the UI kept up with, /s", Format("%.0f", rates.sustained)});
  rows.push_back({"UI capacity at its burst cost, /s", Format("%.0f", uiCapacity)});
  PrintFigures(rows, Format("ui_per_report/target %.3f  python_call/dispatch_only %.2f  "
                            "ui_capacity/worker_flat_out %.2f",
                            worstUi / kTargetMicros, full.dispatchMicros / bare.dispatchMicros,
                            uiCapacity / rates.flatOut));
  return 0;
}

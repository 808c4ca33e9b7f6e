// SPDX-License-Identifier: Apache-2.0
// Whole reports, word for word but for the banner and measured times: the GPUs that are listed once
// per process, the positions, and the ways of the output. report_child prints them.
#include <dlfcn.h>
#include <regex>
#include <stdexcept>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "core/child_process.hpp"
#include "opencl_loader.hpp"

namespace {

using core_test::contents;
using core_test::lines_with;
using core_test::outcome;
using texts = std::vector<std::string>;

const std::string one_virtual_gpu = "LUMEN_VIRTUAL_DEVICES=gpu";
const std::string no_virtual_gpu = "LUMEN_VIRTUAL_DEVICES=";

std::string listed(int number, const std::string& name, const std::string& backend, int units,
                   int tiles, int group) {
  return "TARN_VERBOSE Detected GPU" + std::to_string(number) + " " + name + " Backend:" + backend +
         " VE:" + std::to_string(units) + " Stack:" + std::to_string(tiles) +
         " maxWGsize:" + std::to_string(group) + "\n";
}

/// What the services know of a GPU of lumen's own.
std::string listed_virtual(int number) {
  return listed(number, "Unknown_GPU", "Unknown_backend", 0, 1, 0);
}

/// The list of the driver of the tests: 2 slices of 4 parts of 8 units.
std::string listed_level_zero(int number, const std::string& name, int tiles) {
  return listed(number, name, "Level_Zero", 64, tiles, 512);
}

std::string line(const std::string& call, const std::string& position = "") {
  return "TARN_VERBOSE " + call + " call host:500.00ms device:N/A" + position + "\n";
}

outcome reports(const texts& arguments, texts settings = {one_virtual_gpu},
                const std::string& mode = "1", const std::string& backends = "virtual") {
  settings.push_back("TARN_VERBOSE=" + mode);
  settings.push_back("LUMEN_BACKENDS=" + backends);
  settings.push_back("CUDA_VISIBLE_DEVICES=");
  return core_test::run_child(arguments, settings);
}

/// The banner says what the machine is; it is there, and first.
std::string without_banner(const std::string& text) {
  EXPECT_EQ(text.rfind("TARN_VERBOSE Tarn RNG ", 0), 0u) << text;
  const std::size_t end = text.find('\n');
  return end == std::string::npos ? "" : text.substr(end + 1);
}

TEST(verbose_reports, mode_0_prints_nothing) {
  const outcome child = reports({"cpu", "gpu", "timed:cpu", "threads"}, {one_virtual_gpu}, "0");
  EXPECT_EQ(child.exit_code, 0) << child.err;
  EXPECT_EQ(child.out, "");
  EXPECT_EQ(child.err, "");
}

TEST(verbose_reports, the_gpus_come_once_and_before_the_first_line) {
  const outcome child = reports({"gpu", "cpu", "gpu"}, {"LUMEN_VIRTUAL_DEVICES=gpu;gpu"});
  EXPECT_EQ(child.exit_code, 0) << child.err;
  EXPECT_EQ(without_banner(child.out), listed_virtual(0) + listed_virtual(1) + "\n" +
                                           line("gpu", " GPU0") + line("cpu", " GPU0") +
                                           line("gpu", " GPU0"));
  EXPECT_EQ(child.err, "");
}

TEST(verbose_reports, without_a_gpu_there_is_an_empty_line_and_no_position) {
  const outcome child = reports({"cpu", "cpu"}, {no_virtual_gpu});
  EXPECT_EQ(child.exit_code, 0) << child.err;
  EXPECT_EQ(without_banner(child.out), "\n" + line("cpu") + line("cpu"));
}

/// A setting for so many GPUs, and the list of them.
struct many_gpus {
  std::string devices = "LUMEN_VIRTUAL_DEVICES=gpu";
  std::string list = listed_virtual(0);

  explicit many_gpus(int count) {
    for (int number = 1; number < count; ++number) {
      devices += ";gpu";
      list += listed_virtual(number);
    }
  }
};

TEST(verbose_reports, the_list_is_cut_after_399_characters) {
  const many_gpus gpus(12);
  ASSERT_GT(gpus.list.size(), 399u);
  const outcome child = reports({"gpu:11"}, {gpus.devices});
  EXPECT_EQ(child.exit_code, 0) << child.err;
  EXPECT_EQ(without_banner(child.out), gpus.list.substr(0, 399) + "\n" + line("gpu", " GPU0"));
}

// So many GPUs that all threads come before the list is made.
TEST(verbose_reports, threads_that_come_first_together_see_one_list) {
  const many_gpus gpus(1000);
  const outcome child = reports({"threads"}, {gpus.devices});
  EXPECT_EQ(child.exit_code, 0) << child.err;
  std::string expected = gpus.list.substr(0, 399) + "\n";
  for (int t = 0; t < 16; ++t) {
    expected += line("cpu", " GPU0");
  }
  EXPECT_EQ(without_banner(child.out), expected);
}

TEST(verbose_reports, device_time_is_that_of_the_event) {
  const outcome child = reports({"timed:gpu", "gpu"}, {one_virtual_gpu}, "2");
  EXPECT_EQ(child.exit_code, 0) << child.err;
  const std::regex expected(
      R"(TARN_VERBOSE Detected GPU0 .*\n\n)"
      R"(TARN_VERBOSE gpu call host:500\.00ms device:[0-9.]+(ns|us|ms) GPU0\n)"
      R"(TARN_VERBOSE gpu call host:500\.00ms device:N/A GPU0\n)");
  EXPECT_TRUE(std::regex_match(without_banner(child.out), expected)) << child.out;
}

TEST(verbose_reports, the_banner_names_the_interface) {
  const std::string sycl = "first interface: SYCL\n";
  EXPECT_EQ(lines_with(reports({"cpu"}).out, "first interface: SYCL"), 1);
  EXPECT_EQ(lines_with(reports({"iface:1", "cpu"}).out, "first interface: OpenMP offload"), 1);
  EXPECT_EQ(lines_with(reports({"iface:1", "iface:2", "cpu"}).out, "OpenMP offload"), 1);
  for (const char* ignored : {"iface:0", "iface:2", "iface:3", "iface:-1"}) {
    EXPECT_EQ(lines_with(reports({ignored, "cpu"}).out, "first interface: SYCL"), 1) << ignored;
  }
}

TEST(verbose_reports, all_of_it_goes_to_the_file_which_is_opened_for_each_line) {
  const core_test::scratch_folder folder;
  const std::string file = folder / "report.txt";
  const texts settings = {one_virtual_gpu, "TARN_VERBOSE_OUTPUT_FILE=" + file};
  EXPECT_EQ(reports({"cpu"}, settings).out, "");
  EXPECT_EQ(without_banner(contents(file)), listed_virtual(0) + "\n" + line("cpu", " GPU0"));
  EXPECT_EQ(reports({"gpu", "remove:" + file, "cpu"}, settings).out, "");
  EXPECT_EQ(contents(file), line("cpu", " GPU0"));
}

TEST(verbose_reports, a_file_that_cannot_be_written_is_warned_of_at_each_print) {
  const outcome child =
      reports({"cpu", "gpu"}, {one_virtual_gpu, "TARN_VERBOSE_OUTPUT_FILE=/no/such/folder/file"});
  EXPECT_EQ(without_banner(child.out),
            listed_virtual(0) + "\n" + line("cpu", " GPU0") + line("gpu", " GPU0"));
  std::string warnings;
  for (int prints = 0; prints < 4; ++prints) {
    warnings += "TARN_VERBOSE WARNING: unable to open output file. Print to STDOUT\n";
  }
  EXPECT_EQ(child.err, warnings);
}

/// The processor under PoCL, which the OpenCL layer makes a GPU.
struct opencl_gpu {
  cl_uint units = 0;
  cl_uint tiles = 0;
  std::size_t group = 0;
  cl_uint vendor = 0;

  explicit opencl_gpu(cl_device_id device) {
    const auto ask = [device](cl_device_info what, auto& value) {
      if (opencl_loader::get().clGetDeviceInfo(device, what, sizeof value, &value, nullptr) !=
          CL_SUCCESS) {
        throw std::runtime_error("PoCL does not answer");
      }
    };
    ask(CL_DEVICE_MAX_COMPUTE_UNITS, units);
    ask(CL_DEVICE_PARTITION_MAX_SUB_DEVICES, tiles);
    ask(CL_DEVICE_MAX_WORK_GROUP_SIZE, group);
    ask(CL_DEVICE_VENDOR_ID, vendor);
  }
  std::string listed_as(const std::string& name) const {
    return listed(0, name, "OpenCL", static_cast<int>(units), static_cast<int>(tiles),
                  static_cast<int>(group));
  }
};

constexpr std::uint32_t ip_version(std::uint32_t major, std::uint32_t release) {
  return major << 22 | release << 14;
}

struct named_version {
  std::uint32_t version;
  const char* name;
};
constexpr named_version architectures[] = {
    {ip_version(9, 0), "Brine(R)_Fir"},   {ip_version(11, 0), "Brine(R)_Elm"},
    {ip_version(12, 0), "Brine(R)_Ash"},  {ip_version(12, 50), "Brine(R)_Oak"},
    {ip_version(12, 55), "Brine(R)_Yew"}, {ip_version(12, 60), "Brine(R)_Pine"},
    {ip_version(20, 1), "Brine(R)_Larch"}};

class verbose_reports_opencl : public testing::Test {
 protected:
  void SetUp() override {
    device_ = opencl_loader::first_gpu();
    if (device_ == nullptr) {
      GTEST_SKIP() << "no PoCL";
    }
  }
  opencl_gpu gpu() const { return opencl_gpu(device_); }

  static outcome reports_of(const texts& arguments, const std::string& mode = "1") {
    return reports(arguments, {one_virtual_gpu}, mode, "virtual;opencl");
  }

 private:
  cl_device_id device_ = nullptr;
};

TEST_F(verbose_reports_opencl, lists_every_architecture_by_its_name) {
  for (const named_version& row : architectures) {
    const outcome child = reports_of({"ip_version:" + std::to_string(row.version), "opencl"});
    EXPECT_EQ(child.exit_code, 0) << child.err;
    EXPECT_EQ(without_banner(child.out),
              gpu().listed_as(row.name) + "\n" + line("opencl", " GPU0"));
  }
}

TEST_F(verbose_reports_opencl, keeps_the_devices_of_the_first_queues_backend_for_all) {
  ASSERT_NE(gpu().vendor, 0u) << "the vendor of the devices of lumen's own";
  const outcome opencl = reports_of(
      {"ip_version:" + std::to_string(architectures[4].version), "opencl", "gpu", "cpu"});
  EXPECT_EQ(without_banner(opencl.out), gpu().listed_as("Brine(R)_Yew") + "\n" +
                                            line("opencl", " GPU0") + line("gpu") + line("cpu"));
  const outcome own = reports_of({"gpu", "opencl"});
  EXPECT_EQ(without_banner(own.out),
            listed_virtual(0) + "\n" + line("gpu", " GPU0") + line("opencl"));
}

TEST_F(verbose_reports_opencl, device_time_is_that_of_the_native_event) {
  const outcome child = reports_of({"timed:opencl", "opencl"}, "2");
  EXPECT_EQ(child.exit_code, 0) << child.err;
  const std::regex expected(
      R"(TARN_VERBOSE Detected GPU0 .*\n\n)"
      R"(TARN_VERBOSE opencl call host:500\.00ms device:[0-9.]+(ns|us|ms) GPU0\n)"
      R"(TARN_VERBOSE opencl call host:500\.00ms device:N/A GPU0\n)");
  EXPECT_TRUE(std::regex_match(without_banner(child.out), expected)) << child.out;
}

class verbose_reports_level_zero : public testing::Test {
 protected:
  void SetUp() override {
    if (dlopen("libze_loader.so.1", RTLD_NOW) == nullptr) {
      GTEST_SKIP() << "no Level Zero loader";
    }
  }
  static outcome reports_of(const texts& arguments) {
    return reports(arguments, {one_virtual_gpu}, "1", "virtual;level_zero");
  }
  static std::string device(int vendor, std::uint32_t version, int tiles) {
    return std::to_string(vendor) + "," + std::to_string(version) + "," + std::to_string(tiles);
  }
};

TEST_F(verbose_reports_level_zero, lists_every_architecture_by_its_name) {
  for (const named_version& row : architectures) {
    const outcome child = reports_of({"devices:" + device(7, row.version, 2), "level_zero"});
    EXPECT_EQ(child.exit_code, 0) << child.err;
    EXPECT_EQ(without_banner(child.out),
              listed_level_zero(0, row.name, 2) + "\n" + line("level_zero", " GPU0"));
  }
}

TEST_F(verbose_reports_level_zero, the_position_is_that_of_the_first_device_of_the_vendor) {
  const std::uint32_t oak = architectures[3].version;
  const std::uint32_t pine = architectures[5].version;
  const outcome child =
      reports_of({"devices:" + device(7, oak, 0) + "," + device(8, pine, 4) + "," +
                      device(7, pine, 1) + "," + device(8, oak, 2),
                  "level_zero:0", "level_zero:1", "level_zero:2", "level_zero:3", "cpu"});
  EXPECT_EQ(child.exit_code, 0) << child.err;
  EXPECT_EQ(without_banner(child.out),
            listed_level_zero(0, "Brine(R)_Oak", 1) + listed_level_zero(1, "Brine(R)_Pine", 4) +
                listed_level_zero(2, "Brine(R)_Pine", 1) + listed_level_zero(3, "Brine(R)_Oak", 2) +
                "\n" + line("level_zero", " GPU0") + line("level_zero", " GPU1") +
                line("level_zero", " GPU0") + line("level_zero", " GPU1") + line("cpu"));
}

}  // namespace

// SPDX-License-Identifier: Apache-2.0
// The table of device records, and the one-time decision in a record.
#include <atomic>
#include <stdexcept>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "device_info_table.hpp"
#include "serv_memory.hpp"

namespace {

using namespace kestrel::tarn::gpu;

char places[100];  // stand in for devices

class DeviceTable : public testing::Test {
 protected:
  void TearDown() override {
    table.clear();
    EXPECT_EQ(serv_memory::live_blocks(), blocks);
  }

  device_record* record_of(int device) {
    filled = 0;
    return table.record_of(&places[device], [&](device_record& record) {
      ++filled;
      record.eu_count = device;
    });
  }

  const std::int64_t blocks = serv_memory::live_blocks();
  device_info_table table;
  int filled = 0;
};

TEST_F(DeviceTable, ANewRecordIsFilledOnceAndFoundLater) {
  device_record* const record = record_of(3);
  ASSERT_NE(record, nullptr);
  EXPECT_EQ(filled, 1);
  EXPECT_EQ(record->device_id, &places[3]);
  EXPECT_EQ(record->eu_count, 3);
  EXPECT_EQ(record_of(3), record);
  EXPECT_EQ(filled, 0);
  EXPECT_EQ(table.lock, 0);
}

TEST_F(DeviceTable, BeforeItIsFilledARecordHasOneTileAndNothingElse) {
  const auto look = [](device_record& record) {
    EXPECT_EQ(record.lock, 0);
    EXPECT_FALSE(record.arch_ready);
    EXPECT_EQ(record.arch, 0);
    EXPECT_EQ(record.stepping, 0U);
    EXPECT_FALSE(record.binary_checked);
    EXPECT_FALSE(record.binary_usable);
    EXPECT_EQ(record.tile_count, 1);
    EXPECT_EQ(record.eu_count, 0);
    EXPECT_EQ(record.max_workgroup_size, 0);
    EXPECT_EQ(record.flags, 0U);
    EXPECT_EQ(record.backend, -1);
  };
  EXPECT_NE(table.record_of(nullptr, look), nullptr);
  EXPECT_EQ(table.count, 1);
}

TEST_F(DeviceTable, GrowsByEightWithoutALimitAndRecordsStayWhereTheyAre) {
  std::vector<device_record*> records;
  for (int i = 0; i < 100; ++i) {
    records.push_back(record_of(i));
    ASSERT_EQ(table.capacity, (i / 8 + 1) * 8);
    ASSERT_EQ(table.count, i + 1);
  }
  for (int i = 0; i < 100; ++i) {
    EXPECT_EQ(record_of(i), records[static_cast<std::size_t>(i)]);
    EXPECT_EQ(filled, 0);
  }
}

TEST_F(DeviceTable, RecordsHave48BytesOnCacheLines) {
  record_of(0);
  EXPECT_EQ(serv_memory::last_malloc().size, 48U);
  EXPECT_EQ(serv_memory::last_malloc().alignment, 64U);
  EXPECT_EQ(serv_memory::last_realloc().size, 8 * sizeof(void*));
}

TEST_F(DeviceTable, WithoutMemoryThereIsNoRecord) {
  for (const int after : {0, 1}) {  // the array, the record
    const serv_memory::failure failing(after);
    EXPECT_EQ(record_of(after), nullptr);
    EXPECT_TRUE(failing.happened());
    EXPECT_EQ(filled, 0);
    EXPECT_EQ(table.count, 0);
    EXPECT_EQ(table.lock, 0);
  }
  EXPECT_NE(record_of(0), nullptr);
}

TEST_F(DeviceTable, WhatFillingThrowsLeavesNoRecord) {
  EXPECT_THROW(table.record_of(&places[1], [](device_record&) { throw std::runtime_error(""); }),
               std::runtime_error);
  EXPECT_EQ(table.count, 0);
  EXPECT_EQ(table.lock, 0);
  EXPECT_NE(record_of(1), nullptr);
  EXPECT_EQ(filled, 1);
}

TEST_F(DeviceTable, ClearedItIsEmptyAndWorksAgain) {
  record_of(1);
  table.clear();
  EXPECT_EQ(table.capacity, 0);
  EXPECT_EQ(table.count, 0);
  EXPECT_EQ(table.entries, nullptr);
  record_of(1);
  EXPECT_EQ(filled, 1);
}

TEST_F(DeviceTable, ThreadsThatComeFirstAtOnceGetOneRecord) {
  std::atomic<int> fills{0};
  std::atomic<bool> go{false};
  std::vector<device_record*> found(16);
  std::vector<std::thread> threads;
  for (device_record*& place : found) {
    threads.emplace_back([&] {
      while (!go) {
      }
      place = table.record_of(&places[5], [&](device_record&) { ++fills; });
    });
  }
  go = true;
  for (std::thread& thread : threads) {
    thread.join();
  }
  EXPECT_EQ(fills, 1);
  for (const device_record* record : found) {
    EXPECT_EQ(record, found[0]);
  }
  EXPECT_NE(found[0], nullptr);
}

TEST(DeviceRecord, ACopyHasWhatTheRecordHasButNoLock) {
  device_record record{&places[9]};
  record.tile_count = 2;
  record.eu_count = 3;
  record.max_workgroup_size = 4;
  record.backend = TARN_GPU_BACKEND_LEVEL_ZERO;
  record.binary_checked = true;
  record.binary_usable = true;
  decide_architecture(record, [] {
    return kestrel::tarn::forge::detected_hw{kestrel::tarn::forge::hw_pine, 13, 9};
  });
  record.lock = 1;
  tarn_gpu_device_info_t copy = copy_of(record);
  EXPECT_EQ(copy.device_id, &places[9]);
  EXPECT_EQ(copy.lock, 0);
  EXPECT_TRUE(copy.arch_ready);
  EXPECT_EQ(copy.arch, TARN_GPU_ARCH_PINE);
  EXPECT_EQ(copy.stepping, 9U);
  EXPECT_TRUE(copy.binary_checked);
  EXPECT_TRUE(copy.binary_usable);
  EXPECT_EQ(copy.tile_count, 2);
  EXPECT_EQ(copy.eu_count, 3);
  EXPECT_EQ(copy.max_workgroup_size, 4);
  EXPECT_EQ(copy.flags, 3U);
  EXPECT_EQ(copy.backend, 1);
  record.binary_usable = false;
  copy = copy_of(record);
  EXPECT_TRUE(copy.binary_checked);
  EXPECT_FALSE(copy.binary_usable);
}

TEST(DeviceRecord, AnUndecidedArchitectureIsNotCopied) {
  device_record record;
  record.arch = TARN_GPU_ARCH_ELM;  // as seen while another thread decides
  record.stepping = 5;
  record.flags = 3;
  const tarn_gpu_device_info_t copy = copy_of(record);
  EXPECT_FALSE(copy.arch_ready);
  EXPECT_EQ(copy.arch, 0);
  EXPECT_EQ(copy.stepping, 0U);
  EXPECT_EQ(copy.flags, 0U);
}

TEST(DeviceRecord, AFailedDetectionIsUnknownAndNotRepeated) {
  device_record record;
  int tries = 0;
  const auto detect = [&]() -> kestrel::tarn::forge::detected_hw {
    EXPECT_EQ(record.lock, 1);
    ++tries;
    throw 5;
  };
  decide_architecture(record, detect);
  decide_architecture(record, detect);
  EXPECT_EQ(tries, 1);
  EXPECT_TRUE(record.arch_ready);
  EXPECT_EQ(record.arch, 0);
  EXPECT_EQ(record.stepping, 0U);
  EXPECT_EQ(record.flags, 0U);
  EXPECT_EQ(record.lock, 0);
}

TEST(DeviceRecord, ThreadsDecideOnceAndAllSeeIt) {
  device_record record;
  std::atomic<int> decisions{0};
  std::atomic<int> wrong{0};
  std::vector<std::thread> threads;
  for (int t = 0; t < 16; ++t) {
    threads.emplace_back([&] {
      decide_architecture(record, [&] {
        ++decisions;
        return kestrel::tarn::forge::detected_hw{kestrel::tarn::forge::hw_larch, 14, 7};
      });
      const tarn_gpu_device_info_t copy = copy_of(record);
      const bool right = record.arch == TARN_GPU_ARCH_LARCH && record.stepping == 7 &&
                         copy.arch_ready && copy.flags == 3;
      wrong += right ? 0 : 1;
    });
  }
  for (std::thread& thread : threads) {
    thread.join();
  }
  EXPECT_EQ(decisions, 1);
  EXPECT_EQ(wrong, 0);
}

TEST(Tiles, AreNeverFewerThanOne) {
  EXPECT_EQ(tiles_of(0), 1);
  EXPECT_EQ(tiles_of(1), 1);
  EXPECT_EQ(tiles_of(2), 2);
  EXPECT_EQ(tiles_of(0x7FFFFFFF), 0x7FFFFFFF);
  EXPECT_EQ(tiles_of(0x80000000), 1);
}

}  // namespace

// The record's two views of the document during a run: blocks the filter
// writes change the document, while its reads keep seeing the document as
// the run found it.

#include <gtest/gtest.h>

#include <vector>

#include "host/plugin/BlockExchange.h"
#include "host/plugin/DocumentChannels.h"
#include "host/plugin/HostRecord.h"
#include "host/plugin/RunObserver.h"
#include "tests/support/TestImages.h"

namespace Host {
namespace {

class QuietObserver : public RunObserver {
 public:
  bool AbortRequested() override { return false; }
  void Progress(int32_t, int32_t) override {}
};

TEST(HostRecordTest, ReadsSeeTheDocumentAsTheRunFoundItWhileWritesChangeIt) {
  auto document = testing::RandomDocument(6, 4, ImageMode::kGray, false, 5);
  const auto before = testing::RandomDocument(6, 4, ImageMode::kGray, false, 5);
  QuietObserver observer;
  HostRecord record(*document, {}, observer);
  Tarsa::HostFilterRecord& r = *record.Record();

  // The whole image written over with its negative, and taken back.
  r.outRect16 = {0, 0, 4, 6};
  r.outFirstPlane = r.outLastPlane = 0;
  ASSERT_EQ(record.Blocks().Advance(), 0);
  auto* block = static_cast<uint8_t*>(r.outData);
  for (int y = 0; y < 4; ++y) {
    for (int x = 0; x < 6; ++x)
      block[y * r.outRowBytes + x] = uint8_t(255 - block[y * r.outRowBytes + x]);
  }
  record.Blocks().Commit();

  std::vector<uint8_t> read(24);
  Tarsa::HostPixelMemoryDesc desc = {read.data(), 6 * 8, 8, 0, 8};
  const Tarsa::HostRect32 all = {0, 0, 4, 6};
  Tarsa::HostRect32 wrote = {};
  const auto* info = static_cast<const Tarsa::HostDocumentInfo*>(r.documentInfo);
  ASSERT_EQ(DocumentChannels::Procs()->readPixels(info->targetCompositeChannels->port, nullptr,
                                                  &all, &desc, &wrote),
            0);
  for (int i = 0; i < 24; ++i) {
    EXPECT_EQ(read[i], before->Sample(0, i % 6, i / 6)) << i;
    EXPECT_EQ(document->Sample(0, i % 6, i / 6), 255 - before->Sample(0, i % 6, i / 6)) << i;
  }
}

}  // namespace
}  // namespace Host

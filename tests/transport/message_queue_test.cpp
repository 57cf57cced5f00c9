// The reader queue's bound: the oldest items give way to the newest, a lone item larger
// than the bound is still delivered, and the count stays right as items are taken.
#include <gtest/gtest.h>

#include <string>

#include "transport/message_queue.h"

namespace {

using vexil::MessageQueue;

std::string Item(int index) { return "item " + std::to_string(index) + std::string(100, '.'); }

TEST(MessageQueue, KeepsTheNewestItemsWithinItsLimit) {
  constexpr std::size_t kLimit = 10000;
  MessageQueue queue(kLimit);
  constexpr int kPushed = 1000;
  for (int i = 0; i < kPushed; ++i) queue.Push(Item(i));

  std::size_t kept = queue.Size();
  ASSERT_GT(kept, 10u);
  ASSERT_LT(kept, 100u);
  EXPECT_LE(queue.Bytes(), kLimit);
  EXPECT_GT(queue.Bytes() + MessageQueue::Footprint(Item(kPushed)), kLimit);  // full, not merely shrunk

  std::string item;
  for (std::size_t i = kPushed - kept; i < kPushed; ++i) {
    ASSERT_TRUE(queue.TryPop(item));
    EXPECT_EQ(item, Item(static_cast<int>(i)));
  }
  EXPECT_EQ(queue.Bytes(), 0u);

  // One item larger than the whole limit replaces everything and is still delivered.
  queue.Push(Item(1));
  const std::string huge(3 * kLimit, 'h');
  queue.Push(huge);
  EXPECT_EQ(queue.Size(), 1u);
  ASSERT_TRUE(queue.TryPop(item));
  EXPECT_TRUE(item == huge);
}

}  // namespace

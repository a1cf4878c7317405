// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <memory>
#include <vector>

#include "protlib/TagList.h"
#include "tests/unit/FailingNew.h"
#include "tests/unit/FakeTag.h"

namespace {

// Notes the order in which tags go.
class PassingTag final : public FakeTag {
 public:
  PassingTag(std::vector<int>& gone, int number) : gone_(gone), number_(number) {}
  PassingTag(const PassingTag&) = delete;
  PassingTag& operator=(const PassingTag&) = delete;
  ~PassingTag() override { gone_.push_back(number_); }

 private:
  std::vector<int>& gone_;
  int number_;
};

}  // namespace

TEST(TagListTest, DestroysItsTagsFromTheFront) {
  std::vector<int> gone;
  {
    TagList list;
    for (int i = 0; i < 5; ++i) list.Append(new PassingTag(gone, i));
    EXPECT_TRUE(gone.empty());
  }
  EXPECT_EQ(gone, (std::vector<int>{0, 1, 2, 3, 4}));
}

TEST(TagListTest, RemovedTagBelongsToTheCaller) {
  std::vector<int> gone;
  TagList list;
  auto* first = new PassingTag(gone, 1);
  list.Append(first);
  list.Append(new PassingTag(gone, 2));
  list.Remove(first);
  list.DeleteAll();
  EXPECT_EQ(gone, std::vector<int>{2});
  delete first;
  EXPECT_EQ(gone, (std::vector<int>{2, 1}));
}

TEST(TagListTest, RemovesEveryEntryOfATag) {
  std::vector<int> gone;
  TagList list;
  const auto tag = std::make_unique<PassingTag>(gone, 1);
  list.Append(tag.get());
  list.Append(tag.get());
  list.Remove(tag.get());
  list.DeleteAll();
  EXPECT_TRUE(gone.empty());
}

TEST(TagListTest, RemovingAStrangerChangesNothing) {
  std::vector<int> gone;
  TagList list;
  list.Append(new PassingTag(gone, 1));
  const FakeTag other;
  list.Remove(const_cast<FakeTag*>(&other));
  EXPECT_TRUE(gone.empty());
  list.DeleteAll();
  EXPECT_EQ(gone, std::vector<int>{1});
}

TEST(TagListTest, CanBeUsedAgainAfterDeleteAll) {
  std::vector<int> gone;
  TagList list;
  list.Append(new PassingTag(gone, 1));
  list.DeleteAll();
  list.DeleteAll();
  list.Append(new PassingTag(gone, 2));
  EXPECT_EQ(gone, std::vector<int>{1});
  list.DeleteAll();
  EXPECT_EQ(gone, (std::vector<int>{1, 2}));
}

TEST(TagListTest, TagThatCouldNotBeAppendedStaysWithTheCaller) {
  for (int nth = 1;; ++nth) {
    std::vector<int> gone;
    gone.reserve(2);
    const auto tag = std::make_unique<PassingTag>(gone, 1);
    TagList list;
    bool threw = false;
    {
      const FailingNew noMemory(nth);
      try {
        list.Append(tag.get());
      } catch (const std::bad_alloc&) {
        threw = true;
      }
      if (!noMemory.HasFailed()) {
        EXPECT_GT(nth, 1);
        list.Remove(tag.get());
        break;
      }
    }
    EXPECT_TRUE(threw) << nth;
    list.DeleteAll();
    EXPECT_TRUE(gone.empty()) << nth;
  }
}

// List containers: the built-in cursor (first/next/hasCurrent), appends during a walk, and the
// order in which elements are deleted.
#include "data/list.h"

#include <gtest/gtest.h>

#include <vector>

namespace {

int g_Objects[8];

// Records its id when the list deletes it, to observe the order of deletion.
class RecordedElement : public Object_element {
 public:
  RecordedElement(int id, std::vector<int>* deleted)
      : Object_element(nullptr), m_Id(id), m_Deleted(deleted) {}

 protected:
  ~RecordedElement() override { m_Deleted->push_back(m_Id); }

 private:
  int m_Id;
  std::vector<int>* m_Deleted;
};

/// Walks with next() until null and, separately, while hasCurrent(); both must agree.
std::vector<int*> walk(Object_list& list) {
  std::vector<int*> byObject;
  for (void* object = list.first(); object != nullptr; object = list.next())
    byObject.push_back(static_cast<int*>(object));
  std::vector<int*> byCursor;
  for (void* object = list.first(); list.hasCurrent(); object = list.next())
    byCursor.push_back(static_cast<int*>(object));
  EXPECT_EQ(byObject, byCursor);
  return byObject;
}

TEST(List, CursorWalks) {
  Object_list list;
  EXPECT_TRUE(list.isEmpty());
  EXPECT_EQ(list.first(), nullptr);
  EXPECT_FALSE(list.hasCurrent());
  EXPECT_TRUE(walk(list).empty());

  list.appendObject(&g_Objects[0]);
  EXPECT_FALSE(list.isEmpty());
  EXPECT_FALSE(list.hasCurrent()) << "append must not place the cursor";
  EXPECT_EQ(list.first(), &g_Objects[0]);
  // Appending while the cursor is on the last element extends the walk in progress.
  list.appendObject(&g_Objects[1]);
  EXPECT_EQ(list.next(), &g_Objects[1]);
  EXPECT_EQ(list.next(), nullptr);
  list.appendObject(&g_Objects[2]);
  EXPECT_FALSE(list.hasCurrent()) << "a finished walk stays finished after an append";
  EXPECT_EQ(walk(list), (std::vector<int*>{&g_Objects[0], &g_Objects[1], &g_Objects[2]}));

  std::vector<int*> seen;
  for (void* object = list.first(); object != nullptr; object = list.next()) {
    seen.push_back(static_cast<int*>(object));
    if (seen.size() < 5) list.appendObject(&g_Objects[seen.size() + 2]);
  }
  EXPECT_EQ(seen.size(), 7u) << "appends during a walk are reached by it";
  EXPECT_EQ(seen.back(), &g_Objects[6]);
}

TEST(List, ElementsAreDeletedFromTheTail) {
  std::vector<int> deleted;
  {
    Object_list list;
    for (int id = 1; id <= 4; ++id) {
      auto* element = new RecordedElement(id, &deleted);
      element->m_Next = list.m_Head;  // a stale link, which append must overwrite
      list.append(element);
    }
  }
  EXPECT_EQ(deleted, (std::vector<int>{4, 3, 2, 1}));

  deleted.clear();
  List list;
  for (int id = 1; id <= 3; ++id) list.append(new RecordedElement(id, &deleted));
  List_element* second = list.m_Head->m_Next;
  list.m_Head->m_Next = nullptr;
  second->deleteChain();
  EXPECT_EQ(deleted, (std::vector<int>{3, 2}));
}

}  // namespace

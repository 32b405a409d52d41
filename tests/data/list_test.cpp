// List containers: the built-in cursor (first/next/hasCurrent/atLast), appends during a walk,
// links and the order in which elements are deleted.
#include "data/list.h"

#include <gtest/gtest.h>

#include <utility>
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
  EXPECT_TRUE(list.atLast());
  // Appending while the cursor is on the last element extends the walk in progress.
  list.appendObject(&g_Objects[1]);
  EXPECT_FALSE(list.atLast());
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

TEST(List, AppendLinksBothWays) {
  Object_list list;
  auto* a = new Object_element(&g_Objects[0]);
  auto* b = new Object_element(&g_Objects[1]);
  auto* c = new Object_element(&g_Objects[2]);
  c->m_Next = a;  // stale links of an appended element are overwritten
  list.append(a);
  list.append(b);
  list.append(c);
  EXPECT_EQ(list.m_Head, a);
  const std::vector<std::pair<List_element*, List_element*>> links = {
      {a->m_Prev, nullptr}, {a->m_Next, b}, {b->m_Prev, a},
      {b->m_Next, c},       {c->m_Prev, b}, {c->m_Next, nullptr}};
  for (const auto& [actual, expected] : links) EXPECT_EQ(actual, expected);
}

TEST(List, ElementsAreDeletedFromTheTail) {
  std::vector<int> deleted;
  {
    Object_list list;
    for (int id = 1; id <= 4; ++id) list.append(new RecordedElement(id, &deleted));
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

// List containers: the built-in cursor (first/next/hasCurrent/atLast), appends during a walk,
// links, the order in which elements are deleted, and class names.
#include "data/list.h"

#include <gtest/gtest.h>

#include <string>
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

std::vector<int*> walkByObject(Object_list& list) {
  std::vector<int*> seen;
  for (void* object = list.first(); object != nullptr; object = list.next())
    seen.push_back(static_cast<int*>(object));
  return seen;
}

std::vector<int*> walkByCursor(Object_list& list) {
  std::vector<int*> seen;
  void* object = list.first();
  while (list.hasCurrent()) {
    seen.push_back(static_cast<int*>(object));
    object = list.next();
  }
  return seen;
}

TEST(List, EmptyListHasNothingToWalk) {
  Object_list list;
  EXPECT_TRUE(list.isEmpty());
  EXPECT_FALSE(list.hasCurrent());
  EXPECT_EQ(list.first(), nullptr);
  EXPECT_FALSE(list.hasCurrent());
  EXPECT_TRUE(walkByObject(list).empty());
  EXPECT_TRUE(walkByCursor(list).empty());
}

TEST(List, OneElementWalk) {
  Object_list list;
  list.appendObject(&g_Objects[0]);
  EXPECT_FALSE(list.isEmpty());
  EXPECT_FALSE(list.hasCurrent()) << "append must not place the cursor";
  EXPECT_EQ(list.first(), &g_Objects[0]);
  EXPECT_TRUE(list.hasCurrent());
  EXPECT_TRUE(list.atLast());
  EXPECT_EQ(list.next(), nullptr);
  EXPECT_FALSE(list.hasCurrent());
}

TEST(List, BothWalkFormsVisitInAppendOrder) {
  Object_list list;
  for (int& object : g_Objects) list.appendObject(&object);
  std::vector<int*> expected;
  for (int& object : g_Objects) expected.push_back(&object);
  EXPECT_EQ(walkByObject(list), expected);
  EXPECT_EQ(walkByCursor(list), expected);
  // A walk can be restarted: first() always goes back to the head.
  EXPECT_EQ(walkByObject(list), expected);
}

TEST(List, CursorPersistsAndAppendLeavesItAlone) {
  Object_list list;
  list.appendObject(&g_Objects[0]);
  list.appendObject(&g_Objects[1]);
  list.first();
  list.next();
  ASSERT_TRUE(list.hasCurrent());
  EXPECT_TRUE(list.atLast());
  list.appendObject(&g_Objects[2]);
  EXPECT_EQ(static_cast<Object_element*>(list.m_Current)->m_Object, &g_Objects[1]);
  EXPECT_FALSE(list.atLast());
  EXPECT_EQ(list.next(), &g_Objects[2]);
  EXPECT_EQ(list.next(), nullptr);
  list.appendObject(&g_Objects[3]);
  EXPECT_FALSE(list.hasCurrent()) << "a finished walk stays finished after an append";
}

TEST(List, AppendDuringWalkIsReachedByThatWalk) {
  Object_list list;
  list.appendObject(&g_Objects[0]);
  std::vector<int*> seen;
  for (void* object = list.first(); object != nullptr; object = list.next()) {
    seen.push_back(static_cast<int*>(object));
    if (seen.size() < 4) list.appendObject(&g_Objects[seen.size()]);
  }
  EXPECT_EQ(seen, (std::vector<int*>{&g_Objects[0], &g_Objects[1], &g_Objects[2], &g_Objects[3]}));
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
  EXPECT_EQ(a->m_Prev, nullptr);
  EXPECT_EQ(a->m_Next, b);
  EXPECT_EQ(b->m_Prev, a);
  EXPECT_EQ(b->m_Next, c);
  EXPECT_EQ(c->m_Prev, b);
  EXPECT_EQ(c->m_Next, nullptr);
}

TEST(List, DestroyingAListDeletesItsElementsFromTheTail) {
  std::vector<int> deleted;
  {
    Object_list list;
    for (int id = 1; id <= 4; ++id) list.append(new RecordedElement(id, &deleted));
  }
  EXPECT_EQ(deleted, (std::vector<int>{4, 3, 2, 1}));
}

TEST(List, DeleteChainFreesFromTheElementOnward) {
  std::vector<int> deleted;
  List list;
  for (int id = 1; id <= 3; ++id) list.append(new RecordedElement(id, &deleted));
  List_element* second = list.m_Head->m_Next;
  list.m_Head->m_Next = nullptr;
  second->deleteChain();
  EXPECT_EQ(deleted, (std::vector<int>{3, 2}));
}

TEST(List, ClassNamesAndFactories) {
  List plain;
  Object_list objects;
  const struct {
    const List* list;
    const char* name;
  } lists[] = {{&plain, "List"}, {&objects, "Object_list"}};
  for (const auto& c : lists) EXPECT_STREQ(c.list->className(), c.name);

  EXPECT_EQ(plain.newList(), nullptr);
  List* made = objects.newList();
  ASSERT_NE(made, nullptr);
  EXPECT_STREQ(made->className(), "Object_list");
  EXPECT_TRUE(made->isEmpty());
  EXPECT_FALSE(made->hasCurrent());
  delete made;

  // Elements are owned by a list, so they are examined inside one.
  objects.append(new List_element);
  objects.appendObject(&g_Objects[5]);
  List_element* bare = objects.m_Head;
  auto* carrier = static_cast<Object_element*>(bare->m_Next);
  EXPECT_STREQ(bare->className(), "List_element");
  EXPECT_STREQ(carrier->className(), "Object_element");
  EXPECT_EQ(bare->clone(), nullptr);
  auto* copy = static_cast<Object_element*>(carrier->clone());
  ASSERT_NE(copy, nullptr);
  EXPECT_EQ(copy->m_Object, &g_Objects[5]);
  EXPECT_EQ(copy->m_Next, nullptr);
  EXPECT_EQ(copy->m_Prev, nullptr);
  plain.append(copy);
}

}  // namespace

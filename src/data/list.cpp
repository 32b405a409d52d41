#include "data/list.h"

#include <cstdio>

void List_element::deleteChain() {
  // Iterative, tail first: a recursive walk would overflow the stack on a million-bit design.
  List_element* last = this;
  while (last->m_Next != nullptr) last = last->m_Next;
  for (List_element* e = last; e != this;) {
    List_element* previous = e->m_Prev;
    delete e;
    e = previous;
  }
  delete this;
}

void List_element::print() const { std::fputs("List element", stdout); }

List::~List() {
  if (m_Head != nullptr) m_Head->deleteChain();
}

void List::printCurrent() const {
  if (m_Current != nullptr) m_Current->print();
}

void List::append(List_element* element) {
  element->m_Next = nullptr;
  element->m_Prev = m_Tail;
  if (m_Head == nullptr)
    m_Head = element;
  else
    m_Tail->m_Next = element;
  m_Tail = element;
}

void* Object_list::currentObject() const {
  return m_Current != nullptr ? static_cast<Object_element*>(m_Current)->m_Object : nullptr;
}

void* Object_list::first() {
  m_Current = m_Head;
  return currentObject();
}

void* Object_list::next() {
  m_Current = m_Current->m_Next;
  return currentObject();
}

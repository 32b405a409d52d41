// The program's intrusive doubly linked lists. Each list carries one built-in cursor that
// persists between calls, so a list carries one walk at a time; appends reached by a running
// walk are visited by it.
#pragma once

#include <cstddef>

/// Base of every element: links only. A list owns its elements.
class List_element {
 public:
  List_element() = default;
  List_element(const List_element&) = delete;
  List_element& operator=(const List_element&) = delete;

  virtual const char* className() const { return "List_element"; }
  /// Deletes every element after this one, from the tail back, then this one.
  virtual void deleteChain();
  /// A new unlinked element like this one; null for the bare base.
  virtual List_element* clone() const { return nullptr; }
  /// Writes "List element" to standard output, without a line end.
  virtual void print() const;

  List_element* m_Next = nullptr;
  List_element* m_Prev = nullptr;

 protected:
  // Elements are deleted through deleteChain or their list, never by their owners' pointers.
  virtual ~List_element() = default;
};

/// An element that carries one object pointer; it never owns the object.
class Object_element : public List_element {
 public:
  explicit Object_element(void* object) : m_Object(object) {}
  const char* className() const override { return "Object_element"; }
  List_element* clone() const override { return new Object_element(m_Object); }
  void print() const override {}

  void* m_Object;
};

/// Base of every list: the head, the cursor and (privately) the tail, so that append does not
/// walk the list.
class List {
 public:
  List() = default;
  List(const List&) = delete;
  List& operator=(const List&) = delete;
  virtual ~List();

  virtual const char* className() const { return "List"; }
  /// Calls print() of the current element, if there is one.
  virtual void printCurrent() const;
  virtual bool isEmpty() const { return m_Head == nullptr; }
  virtual bool hasCurrent() const { return m_Current != nullptr; }
  /// True when the current element has no successor. Requires a current element.
  virtual bool atLast() const { return m_Current->m_Next == nullptr; }
  /// A new, empty list of the same kind; the bare base makes none and returns null.
  virtual List* newList() const { return nullptr; }

  /// Links `element` (not null, unlinked) at the tail; the cursor is not touched.
  void append(List_element* element);

  List_element* m_Head = nullptr;
  List_element* m_Current = nullptr;

 private:
  List_element* m_Tail = nullptr;
};

/// A list of Object_elements, walked by the objects they carry.
class Object_list : public List {
 public:
  const char* className() const override { return "Object_list"; }
  List* newList() const override { return new Object_list; }

  /// Puts the cursor on the head; the head's object, or null for an empty list.
  void* first();
  /// Moves the cursor on (requires a current element); the new current object or null.
  void* next();
  /// Wraps `object` in a new element and appends it.
  void appendObject(void* object) { append(new Object_element(object)); }

 protected:
  void* currentObject() const;
};

/// An Object_list that owns objects of type T and frees them before its elements go.
template <typename T>
class OwningObjectList : public Object_list {
 public:
  OwningObjectList() = default;
  ~OwningObjectList() override {
    // Walk the elements rather than the cursor: a null object must not hide those after it.
    for (List_element* e = m_Head; e != nullptr; e = e->m_Next)
      delete static_cast<T*>(static_cast<Object_element*>(e)->m_Object);
  }
  T* first() { return static_cast<T*>(Object_list::first()); }
  T* next() { return static_cast<T*>(Object_list::next()); }
  /// Takes ownership of `object` and appends it.
  void appendOwned(T* object) { appendObject(object); }
};

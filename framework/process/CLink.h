#pragma once

#include <cstddef>

namespace Tarsa {

template <class T>
class CLinkList;

// The links of an intrusive double list: T derives from CLink<T> and sits in
// at most one CLinkList<T> at a time. The list owns nothing; an item leaves
// its list when it is destroyed.
template <class T>
class CLink {
 public:
  CLink(const CLink&) = delete;
  CLink& operator=(const CLink&) = delete;

  T* Next() const { return next_ != nullptr ? static_cast<T*>(next_) : nullptr; }
  T* Previous() const { return prev_ != nullptr ? static_cast<T*>(prev_) : nullptr; }
  bool IsLinked() const { return list_ != nullptr; }

 protected:
  CLink() = default;
  ~CLink() {
    if (list_ != nullptr) list_->Unlink(this);
  }

 private:
  friend class CLinkList<T>;

  CLink* prev_ = nullptr;
  CLink* next_ = nullptr;
  CLinkList<T>* list_ = nullptr;
};

// The head and tail of an intrusive double list of T.
template <class T>
class CLinkList {
 public:
  CLinkList() = default;
  ~CLinkList() { Clear(); }
  CLinkList(const CLinkList&) = delete;
  CLinkList& operator=(const CLinkList&) = delete;

  T* Front() const { return head_ != nullptr ? static_cast<T*>(head_) : nullptr; }
  T* Back() const { return tail_ != nullptr ? static_cast<T*>(tail_) : nullptr; }
  bool IsEmpty() const { return head_ == nullptr; }
  std::size_t Size() const { return size_; }

  // Puts item in front of before, or at the end when before is null; an
  // item already in a list leaves it first.
  void InsertBefore(T* item, T* before) {
    CLink<T>* link = item;
    CLink<T>* next = before;
    if (link == next) return;
    if (link->list_ != nullptr) link->list_->Unlink(link);
    link->list_ = this;
    link->next_ = next;
    link->prev_ = next != nullptr ? next->prev_ : tail_;
    if (link->prev_ != nullptr) {
      link->prev_->next_ = link;
    } else {
      head_ = link;
    }
    if (next != nullptr) {
      next->prev_ = link;
    } else {
      tail_ = link;
    }
    ++size_;
  }

  void PushBack(T* item) { InsertBefore(item, nullptr); }

  // Takes item out of this list; nothing when it is not in it.
  void Unlink(CLink<T>* link) {
    if (link->list_ != this) return;
    if (link->prev_ != nullptr) {
      link->prev_->next_ = link->next_;
    } else {
      head_ = link->next_;
    }
    if (link->next_ != nullptr) {
      link->next_->prev_ = link->prev_;
    } else {
      tail_ = link->prev_;
    }
    link->prev_ = link->next_ = nullptr;
    link->list_ = nullptr;
    --size_;
  }

  void Clear() {
    while (head_ != nullptr) Unlink(head_);
  }

 private:
  CLink<T>* head_ = nullptr;
  CLink<T>* tail_ = nullptr;
  std::size_t size_ = 0;
};

}  // namespace Tarsa

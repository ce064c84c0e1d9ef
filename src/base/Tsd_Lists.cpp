// Reference lists, object lists and their iterators.
#include "tsd/Tsd_BaseObj.h"

#include <cstring>

namespace {

// Clears the first slot of `array` that holds p.
template <class T>
bool clearFirst(Tsd_DArray<T>& array, const T* p) {
    // Null is never held: it must not "remove" a hole.
    if (p == nullptr)
        return false;
    for (int i = 0; i < array.getCount(); ++i) {
        if (array.getAt(i) == p) {
            array.setAt(i, nullptr);
            return true;
        }
    }
    return false;
}

template <class T>
bool allCleared(const Tsd_DArray<T>& array) {
    for (int i = 0; i < array.getCount(); ++i)
        if (array.getAt(i) != nullptr)
            return false;
    return true;
}

// The next non-null slot at or after index, which moves past it.
template <class T>
T* nextSlot(const Tsd_DArray<T>* array, std::int32_t& index) {
    if (array == nullptr)
        return nullptr;
    // The count is read anew on every call: entries appended during a walk
    // are visited, and cleared ones are skipped.
    while (index < array->getCount()) {
        T* p = array->getAt(index++);
        if (p != nullptr)
            return p;
    }
    return nullptr;
}

} // namespace

bool Tsd_RefList::addRef(Tsd_Ref* ref) {
    if (ref == nullptr)
        return false;
    append(ref);
    return true;
}

bool Tsd_RefList::removeRef(Tsd_Ref* ref) {
    return clearFirst(*this, ref);
}

bool Tsd_RefList::isEmpty() const {
    return allCleared(*this);
}

Tsd_Ref* Tsd_RefList::getSingleRef() const {
    Tsd_Ref* single = nullptr;
    for (int i = 0; i < getCount(); ++i) {
        Tsd_Ref* p = getAt(i);
        if (p == nullptr)
            continue;
        if (single != nullptr)
            return nullptr;
        single = p;
    }
    return single;
}

void Tsd_RefList::emptyList() {
    reset(0);
}

void Tsd_RefList::deleteAllRefs() {
    for (int i = 0; i < getCount(); ++i) {
        Tsd_Ref* ref = getAt(i);
        if (ref == nullptr)
            continue;
        // A reference added twice by hand is destroyed once.
        for (int j = i; j < getCount(); ++j)
            if (getAt(j) == ref)
                setAt(j, nullptr);
        delete ref;
    }
    reset(0);
}

bool Tsd_BaseObjList::addObj(Tsd_BaseObj* obj) {
    if (obj == nullptr)
        return false;
    append(obj);
    return true;
}

bool Tsd_BaseObjList::removeObj(Tsd_BaseObj* obj) {
    return clearFirst(*this, obj);
}

bool Tsd_BaseObjList::isEmpty() const {
    return allCleared(*this);
}

void Tsd_BaseObjList::emptyList() {
    reset(0);
}

bool Tsd_BaseObjList::contains(const Tsd_BaseObj* obj) const {
    if (obj == nullptr)
        return false;
    for (int i = 0; i < getCount(); ++i)
        if (getAt(i) == obj)
            return true;
    return false;
}

Tsd_RefListIter::Tsd_RefListIter(Tsd_BaseObj* holder)
    : m_list(holder != nullptr ? holder->getRefList() : nullptr), m_index(0) {}

Tsd_Ref* Tsd_RefListIter::next() {
    return nextSlot(m_list, m_index);
}

Tsd_BaseObj* Tsd_BaseObjListIter::next() {
    return nextSlot(m_list, m_index);
}

void Tsd_String::set(const char* text) {
    if (text == nullptr) {
        m_text.reset();
        return;
    }
    size_t n = std::strlen(text);
    auto copy = std::make_unique<char[]>(n + 1);
    std::memcpy(copy.get(), text, n + 1);
    m_text = std::move(copy);
}

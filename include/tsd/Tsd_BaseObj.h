// The common base of every group and specification, the reference records
// that tools attach to them, and the pointer lists the database is built on.
//
// Lists keep their slots: removal clears a slot and never compacts, and every
// iterator skips cleared slots, so removing while walking is safe and list
// order is insertion order.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <memory>
#include <stdexcept>
#include <vector>

class DumpStream;

class Tsd_BaseObj;
class Tsd_Ref;
class Tsd_Group;
class Tsd_TermGroup;
class Tsd_PredefGroup;
class Tsd_TNMGroup;
class Tsd_UserGroup;
class Tsd_SyncGroup;
class Tsd_ThruGroup;
class Tsd_TIGGroup;
class Tsd_ClkGroup;
class Tsd_Spec;
class Tsd_EndpointSpec;
class Tsd_DelayPath;
class Tsd_Period;
class Tsd_NetTiming;
class Tsd_Offset;
class Tsd_NetOffset;
class Tsd_GroupOffset;
class Tsd_PathControl;
class Tsd_PortTiming;

// An owned copy of a zero-terminated string that may be null: the type of
// every name, TSid, scope and similar text that an object keeps. Texts of up
// to 15 characters are held inside it, so get() points into the object and
// lasts as long as it does (until it is set, assigned or moved from).
class Tsd_String {
public:
    Tsd_String() { setNull(); }
    explicit Tsd_String(const char* text) {
        setNull();
        set(text);
    }
    Tsd_String(const Tsd_String& other) {
        setNull();
        set(other.get());
    }
    Tsd_String& operator=(const Tsd_String& other) {
        if (this != &other)
            set(other.get());
        return *this;
    }
    Tsd_String(Tsd_String&& other) noexcept {
        std::memcpy(m_bytes, other.m_bytes, sizeof m_bytes);
        other.setNull();
    }
    Tsd_String& operator=(Tsd_String&& other) noexcept {
        if (this != &other) {
            release();
            std::memcpy(m_bytes, other.m_bytes, sizeof m_bytes);
            other.setNull();
        }
        return *this;
    }
    ~Tsd_String() { release(); }

    // Replaces the text by a copy of `text` (null stays null); `text` may
    // point into the current text.
    void set(const char* text);
    const char* get() const { return onHeap() ? heap() : reinterpret_cast<const char*>(m_bytes); }
    bool isNull() const { return onHeap() && heap() == nullptr; }

private:
    // The last byte tells the two forms apart: a held text ends with a
    // zero there (its terminator or its padding); kOnHeap marks a text held
    // elsewhere, whose pointer (null for a null string) stands first.
    static constexpr unsigned char kOnHeap = 0xFF;
    static constexpr std::size_t kHeld = 15;

    bool onHeap() const { return m_bytes[kHeld] == kOnHeap; }
    char* heap() const {
        char* p;
        std::memcpy(&p, m_bytes, sizeof p);
        return p;
    }
    void setHeap(char* p) {
        std::memcpy(m_bytes, &p, sizeof p);
        m_bytes[kHeld] = kOnHeap;
    }
    void setNull() { setHeap(nullptr); }
    void release() {
        if (onHeap())
            delete[] heap();
    }

    alignas(char*) unsigned char m_bytes[kHeld + 1];
};

namespace tsd_detail {
class LinkGraph;
class NameIndex;
} // namespace tsd_detail

// Where the pointers of a large array stand: for each pointer held, the first
// slot holding it and how many slots hold it. Internal to Tsd_DArray.
class Tsd_SlotIndex {
public:
    // Records that `slot` now holds p (p not null).
    void add(const void* p, std::int32_t slot);
    // Records that `slot`, which held p, no longer does. True when p is still
    // held elsewhere and `slot` was its first: the caller then finds the next
    // slot holding p and tells it with setFirst.
    bool remove(const void* p, std::int32_t slot);
    void setFirst(const void* p, std::int32_t slot);
    // The first slot holding p, or -1.
    std::int32_t first(const void* p) const;
    // Room for n pointers without growing again.
    void reserve(std::size_t n);

private:
    struct Entry {
        const void* key;
        std::int32_t first;
        std::int32_t count;
    };
    std::size_t probe(const void* p) const;
    void rehash(std::size_t size);

    std::vector<Entry> m_table; // open addressing; a null key is a free entry
    std::size_t m_used = 0;
};

// A growable array of pointers that never owns what its slots point to.
// Slots 0 to getCount()-1 may be read; a slot may hold null.
//
// It counts the slots that hold a pointer, so emptiness is known at once, and
// an array that grows past a few dozen slots and is asked where a pointer
// stands builds an index of its pointers, kept up to date from then on; small
// arrays, and arrays never asked, carry no index.
template <class T>
class Tsd_DArray {
public:
    // Nothing is allocated here, nor for the first slot: most lists of a
    // large design hold one pointer, or none.
    explicit Tsd_DArray(int /*initialCapacity*/ = 10) {}
    Tsd_DArray(const Tsd_DArray& other) : m_live(other.m_live) { copySlots(other); }
    Tsd_DArray& operator=(const Tsd_DArray& other) {
        if (this != &other) {
            copySlots(other);
            m_live = other.m_live;
            m_index.reset();
            ++m_shape;
        }
        return *this;
    }
    Tsd_DArray(Tsd_DArray&& other) noexcept
        : m_heap(std::move(other.m_heap)), m_one(other.m_one), m_count(other.m_count),
          m_capacity(other.m_capacity), m_live(other.m_live), m_shape(other.m_shape),
          m_index(std::move(other.m_index)) {
        other.forget();
    }
    Tsd_DArray& operator=(Tsd_DArray&& other) noexcept {
        if (this != &other) {
            m_heap = std::move(other.m_heap);
            m_one = other.m_one;
            m_count = other.m_count;
            m_capacity = other.m_capacity;
            m_live = other.m_live;
            m_index = std::move(other.m_index);
            ++m_shape;
            other.forget();
        }
        return *this;
    }
    ~Tsd_DArray() = default;

    int getCount() const { return m_count; }
    // Slot i, or null when i is outside 0..getCount()-1.
    T* getAt(int i) const { return i >= 0 && i < m_count ? slots()[i] : nullptr; }
    T* operator[](int i) const { return getAt(i); }
    // Stores p in slot i; ignored when i is outside 0..getCount()-1.
    void setAt(int i, T* p) {
        if (i < 0 || i >= getCount())
            return;
        T*& slot = slots()[i];
        T* old = slot;
        if (old == p)
            return;
        slot = p;
        if (old != nullptr) {
            --m_live;
            if (m_index != nullptr && m_index->remove(old, i)) {
                // Only a pointer stored twice by hand gets here.
                int next = i + 1;
                while (next < getCount() && slots()[next] != old)
                    ++next;
                m_index->setFirst(old, next);
            }
        }
        if (p != nullptr) {
            ++m_live;
            if (m_index != nullptr)
                m_index->add(p, i);
            // Only clearing a slot keeps the layout that name lookups rely on.
            ++m_shape;
        }
    }
    void append(T* p) {
        if (m_count == m_capacity)
            grow(static_cast<std::size_t>(m_capacity) * 2);
        slots()[m_count++] = p;
        if (p != nullptr) {
            ++m_live;
            if (m_index != nullptr)
                m_index->add(p, getCount() - 1);
        }
    }
    // Sets the count (the storage is kept); new slots, if any, are null.
    void reset(int count) {
        const int n = count > 0 ? count : 0;
        for (int i = n; i < m_count; ++i)
            if (slots()[i] != nullptr)
                --m_live;
        if (n > m_capacity)
            grow(static_cast<std::size_t>(n));
        for (int i = m_count; i < n; ++i)
            slots()[i] = nullptr;
        m_count = n;
        m_index.reset();
        ++m_shape;
    }
    // Removes slot i; the later slots move up by one.
    void removeAt(int i) {
        if (i < 0 || i >= getCount())
            return;
        T** s = slots();
        if (s[i] != nullptr)
            --m_live;
        for (int k = i + 1; k < m_count; ++k)
            s[k - 1] = s[k];
        --m_count;
        m_index.reset();
        ++m_shape;
    }

protected:
    // How many slots hold a pointer.
    int getLiveCount() const { return m_live; }
    // The first slot holding p, or -1 (also for null).
    int firstSlotOf(const T* p) const {
        if (p == nullptr || m_live == 0)
            return -1;
        if (m_index == nullptr) {
            if (getCount() <= kScanLimit) {
                for (int i = 0; i < getCount(); ++i)
                    if (slots()[i] == p)
                        return i;
                return -1;
            }
            buildIndex();
        }
        return m_index->first(p);
    }

private:
    friend class tsd_detail::LinkGraph;
    friend class tsd_detail::NameIndex;

    // Arrays up to this size are scanned; an index would cost more.
    static constexpr int kScanLimit = 32;

    T** slots() { return m_heap != nullptr ? m_heap.get() : &m_one; }
    T* const* slots() const { return m_heap != nullptr ? m_heap.get() : &m_one; }

    // Room for at least `capacity` slots, the first m_count kept.
    void grow(std::size_t capacity) {
        if (capacity < 4)
            capacity = 4;
        if (capacity > static_cast<std::size_t>(INT32_MAX))
            throw std::length_error("Tsd_DArray: too many slots");
        auto grown = std::make_unique<T*[]>(capacity);
        T* const* old = slots();
        for (int i = 0; i < m_count; ++i)
            grown[static_cast<std::size_t>(i)] = old[i];
        m_heap = std::move(grown);
        m_capacity = static_cast<std::int32_t>(capacity);
    }
    void copySlots(const Tsd_DArray& other) {
        m_heap.reset();
        m_capacity = 1;
        m_count = 0;
        if (other.m_count > 1)
            grow(static_cast<std::size_t>(other.m_count));
        T* const* from = other.slots();
        for (int i = 0; i < other.m_count; ++i)
            slots()[i] = from[i];
        m_count = other.m_count;
    }
    // Leaves a moved-from array empty.
    void forget() {
        m_heap.reset();
        m_one = nullptr;
        m_count = 0;
        m_capacity = 1;
        m_live = 0;
        m_index.reset();
        ++m_shape;
    }
    void buildIndex() const {
        m_index = std::make_unique<Tsd_SlotIndex>();
        m_index->reserve(static_cast<std::size_t>(m_live));
        for (int i = 0; i < getCount(); ++i)
            if (T* p = slots()[i])
                m_index->add(p, i);
    }
    // Changes whenever the array changes other than by appending or by
    // clearing a slot.
    std::uint32_t getShape() const { return m_shape; }

    std::unique_ptr<T*[]> m_heap; // the slots, once there is more than one
    T* m_one = nullptr;           // the slot of an array that never grew
    std::int32_t m_count = 0;
    std::int32_t m_capacity = 1;
    std::int32_t m_live = 0;
    std::uint32_t m_shape = 0;
    mutable std::unique_ptr<Tsd_SlotIndex> m_index;
};

using DARRAY_Tsd_RefPtr = Tsd_DArray<Tsd_Ref>;
using DARRAY_Tsd_BaseObjPtr = Tsd_DArray<Tsd_BaseObj>;

class Tsd_RefList : public DARRAY_Tsd_RefPtr {
public:
    explicit Tsd_RefList(int initialCapacity = 10) : DARRAY_Tsd_RefPtr(initialCapacity) {}

    bool addRef(Tsd_Ref* ref);     // false for null; duplicates are stored again
    bool removeRef(Tsd_Ref* ref);  // clears the first slot holding ref
    bool isEmpty() const;          // no slot, or every slot cleared
    Tsd_Ref* getSingleRef() const; // the one non-null slot, else null
    void emptyList();              // count 0; the references are untouched

    // Destroys every reference still held (each once, even if it stands in
    // several slots) and empties the list. Used by the owners' destructors.
    void deleteAllRefs();
};

class Tsd_BaseObjList : public DARRAY_Tsd_BaseObjPtr {
public:
    explicit Tsd_BaseObjList(int initialCapacity = 10) : DARRAY_Tsd_BaseObjPtr(initialCapacity) {}

    bool addObj(Tsd_BaseObj* obj);
    bool removeObj(Tsd_BaseObj* obj);
    bool isEmpty() const;
    void emptyList();
    // True when obj stands in a slot (compared by address); false for null.
    bool contains(const Tsd_BaseObj* obj) const;
};

class Tsd_RefListIter {
public:
    explicit Tsd_RefListIter(const Tsd_RefList* list) : m_list(list), m_index(0) {}
    // Walks holder->getRefList(); an object without references yields nothing.
    explicit Tsd_RefListIter(Tsd_BaseObj* holder);

    Tsd_Ref* next();

private:
    const Tsd_RefList* m_list;
    std::int32_t m_index;
};

class Tsd_BaseObjListIter {
public:
    explicit Tsd_BaseObjListIter(const Tsd_BaseObjList* list) : m_list(list), m_index(0) {}
    virtual ~Tsd_BaseObjListIter() = default;

    Tsd_BaseObj* next();

protected:
    const Tsd_BaseObjList* getObjArray() const { return m_list; }

private:
    const Tsd_BaseObjList* m_list;
    std::int32_t m_index;
};

class Tsd_BaseObj {
public:
    virtual ~Tsd_BaseObj();

    virtual Tsd_RefList* getRefList();
    virtual Tsd_Group* getGroup();
    virtual Tsd_TermGroup* getTermGroup();
    virtual Tsd_PredefGroup* getPredefGroup();
    virtual Tsd_TNMGroup* getTNMGroup();
    virtual Tsd_UserGroup* getUserGroup();
    virtual Tsd_SyncGroup* getSyncGroup();
    virtual Tsd_ThruGroup* getThruGroup();
    virtual Tsd_TIGGroup* getTIGGroup();
    virtual Tsd_ClkGroup* getClkGroup();
    virtual Tsd_Spec* getSpec();
    virtual Tsd_EndpointSpec* getEndpointSpec();
    virtual Tsd_DelayPath* getDelayPath();
    virtual Tsd_Period* getPeriod();
    virtual Tsd_NetTiming* getNetTiming();
    virtual Tsd_Offset* getOffset();
    virtual Tsd_NetOffset* getNetOffset();
    virtual Tsd_GroupOffset* getGroupOffset();
    virtual Tsd_PathControl* getPathControl();
    virtual Tsd_PortTiming* getPortTiming();
    // The canonical property; the texts stay valid until the next getProp of
    // the same family (groups or specifications).
    virtual bool getProp(const char*& name, const char*& value) const;
    // "name=value" with ':' as blanks; valid until the next getUserString.
    virtual const char* getUserString() const;
    virtual const char* getTIGid() const;
    virtual void dump(DumpStream& stream, short indent) const;

    // True for the eight classes that hold references.
    bool refOwner() const;
    void addRef(Tsd_Ref* ref);
    void trimRef(Tsd_Ref* ref, bool report);

protected:
    Tsd_BaseObj() = default;
    Tsd_BaseObj(const Tsd_BaseObj&) = default;
    Tsd_BaseObj& operator=(const Tsd_BaseObj&) = delete;
};

// A reference record: the caller's object for one design element that carries
// a reference property. It belongs to at most one owner, which destroys it.
class Tsd_Ref {
public:
    virtual ~Tsd_Ref();
    // Whether both stand for the same design element; false in the base.
    virtual bool isEqual(const Tsd_Ref* other) const;
    virtual void dump(DumpStream& stream, short indent) const;

    Tsd_BaseObj* getOwner() const { return m_owner; }
    // Leaves the old owner's list (a hole stays) and joins newOwner's.
    void setOwner(Tsd_BaseObj* newOwner);

    // Leave the owner and destroy this reference; it must not be used after.
    void trim();
    void trimNoReport();

    bool isTIG() const;
    bool isSync() const;
    bool isTNM() const;
    bool isThru() const;
    const char* getTIGid() const;
    const char* getUserString() const;

protected:
    Tsd_Ref() : m_owner(nullptr) {}
    // A copy starts unowned; copyTo makes it join the original's owner.
    Tsd_Ref(const Tsd_Ref&) : m_owner(nullptr) {}
    Tsd_Ref& operator=(const Tsd_Ref&) = delete;

    void copyTo(Tsd_Ref* copy) const;
    bool isRedundant(const Tsd_Ref* other) const;

private:
    // The owner, required by the owner queries and trimming.
    Tsd_BaseObj& requireOwner(const char* operation) const;
    void trimWith(bool report);

    Tsd_BaseObj* m_owner;
};

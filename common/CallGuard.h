// Objects that outlive the calls into them. A call into the plug-in can run script of the page, which can end
// the very object that the call is in: it removes the element, or drops the last reference. The end of such
// an object waits until its outermost call returns. Browser thread only.
#ifndef TELIX_COMMON_CALLGUARD_H
#define TELIX_COMMON_CALLGUARD_H

// The base of an object that calls can be in.
class CallGuarded {
public:
    CallGuarded(const CallGuarded&) = delete;
    CallGuarded& operator=(const CallGuarded&) = delete;

protected:
    CallGuarded() = default;
    ~CallGuarded() = default;

private:
    friend class CallGuard;

    unsigned m_calls = 0;
    void (*m_end)(CallGuarded& object) = nullptr; // what the last call has to do
};

// A call into an object, for as long as this lives.
class CallGuard {
public:
    explicit CallGuard(CallGuarded& object) : m_object(object) { ++m_object.m_calls; }
    CallGuard(const CallGuard&) = delete;
    CallGuard& operator=(const CallGuard&) = delete;
    ~CallGuard() {
        if (--m_object.m_calls == 0 && m_object.m_end) {
            m_object.m_end(m_object);
        }
    }

    // Calls `end`, which deletes the object: now if no call is in it, else when the outermost one returns.
    static void endAfterCalls(CallGuarded& object, void (*end)(CallGuarded& object)) {
        if (object.m_calls == 0) {
            end(object);
        } else {
            object.m_end = end;
        }
    }

private:
    CallGuarded& m_object;
};

// Deletes the object by its own type, now or when the outermost call into it returns.
template <class Object>
void deleteAfterCalls(Object& object) {
    CallGuard::endAfterCalls(object, [](CallGuarded& guarded) { delete static_cast<Object*>(&guarded); });
}

#endif

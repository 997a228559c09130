// A Java runtime of the tests' own: objects, arrays, exceptions and callbacks behind a JNIEnv that watches its caller.
//
// Arrays are handed out as copies at the odd alignment that a real runtime may give, so that a missing release, a write
// through a read-only view and a write past the end all show. Recorded as violations: any call but a critical one while
// an array is pinned; a call with a pending exception that JNI forbids then; a second or wrong release; a null where an
// object must be. verify() turns them, and whatever was not given back, into test failures.
//
// JNI functions that the library has no business with end the program.
#pragma once

#include <jni.h>

#include <cstring>
#include <deque>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <typeinfo>
#include <vector>

struct fake_object;
struct fake_env;

class fake_java {
 public:
  fake_java();
  ~fake_java();
  fake_java(const fake_java&) = delete;
  fake_java& operator=(const fake_java&) = delete;

  // The calling thread's environment, attached when it is first asked for.
  JNIEnv* env();
  operator JNIEnv*() { return env(); }

  // --- Objects --------------------------------------------------------------------------------------------------

  jobject new_object(const char* class_name);
  jlong nativeid(jobject object) const;
  void set_nativeid(jobject object, jlong value);
  void collect(jobject object);  // clears the weak references to it, as the garbage collector does

  jintArray new_ints(const std::vector<jint>& values) { return new_array<jintArray>(values); }
  jshortArray new_shorts(const std::vector<jshort>& values) { return new_array<jshortArray>(values); }
  jbyteArray new_bytes(const std::vector<jbyte>& values) { return new_array<jbyteArray>(values); }
  jfloatArray new_floats(const std::vector<jfloat>& values) { return new_array<jfloatArray>(values); }
  jobjectArray new_objects(const std::vector<jobject>& values) { return new_array<jobjectArray>(values); }
  template <class Array, class T>
  Array new_array(const std::vector<T>& values) {
    return static_cast<Array>(make_array(typeid(T), values.data(), values.size(), sizeof(T)));
  }

  std::vector<jint> ints(jintArray array) const { return contents<jint>(array); }
  template <class T>
  std::vector<T> contents(jarray array) const {
    std::vector<T> values(bytes_of(array).size() / sizeof(T));
    if (!values.empty()) std::memcpy(values.data(), bytes_of(array).data(), bytes_of(array).size());
    return values;
  }

  // --- The client's callbacks, on class "ja"; unset ones answer false and null ------------------------------------

  std::function<jboolean(jshort)> request_texture;  // SA
  std::function<void()> garbagecollect;             // h
  std::function<jobject()> createshadow;            // WA

  // --- Exceptions of the calling thread ---------------------------------------------------------------------------

  // What Throwable.toString() gives of the pending exception, which is cleared: "java.lang.Error: text", or just the
  // class where the message is null. "" when there is none.
  std::string take_exception();
  void raise(const std::string& class_name, const std::string& message);  // as a callback would

  // --- What was seen ------------------------------------------------------------------------------------------------

  // Reports as test failures, and forgets: violations, arrays not given back, monitors held, a pending exception.
  void verify();

  const std::vector<std::string>& log() const { return history; }  // the functions called, over all threads
  int calls(const std::string& function) const;
  int weak_references() const { return live_weak; }
  int arrays_out() const { return static_cast<int>(out.size()); }  // handed out, not given back

  // Makes NewIntArray, Get<Type>ArrayElements and GetPrimitiveArrayCritical, counted together, number `n` from now
  // answer null with an OutOfMemoryError pending; 0 for none.
  void fail_array_access(int n) { array_access_failure = n; }

 private:
  friend struct fake_calls;
  template <auto Function>
  friend struct slot;

  struct handed_out {
    fake_object* array;
    std::unique_ptr<unsigned char[]> storage;
    bool critical;
    JNIEnv* owner;
  };

  void violation(const std::string& text) { violations.push_back(text); }
  fake_object* make(const std::string& class_name);
  jobject make_array(const std::type_info& element, const void* elements, std::size_t count, std::size_t element_size);
  const std::vector<unsigned char>& bytes_of(jarray array) const;
  void enter(JNIEnv* caller, const char* function, unsigned int rules);
  void* hand_out(jarray array, const std::type_info& type);
  void give_back(jarray array, void* elements, jint mode, bool critical);
  bool out_of_memory();

  mutable std::recursive_mutex lock;
  JNIInvokeInterface_ vm_functions{};
  JavaVM vm{};
  std::map<std::thread::id, std::unique_ptr<fake_env>> environments;
  std::deque<std::unique_ptr<fake_object>> objects;
  std::map<std::string, fake_object*> classes;
  std::map<void*, handed_out> out;
  std::vector<std::string> history;
  std::vector<std::string> violations;
  int live_weak = 0;
  int monitors = 0;
  int array_access_failure = 0;
};

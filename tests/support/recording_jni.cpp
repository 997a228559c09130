#include "support/recording_jni.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdarg>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <optional>
#include <set>
#include <type_traits>
#include <utility>

#include "natives/jniarray.h"

struct fake_object {
  std::string class_name;
  jlong nativeid = 0;                       // its only field
  const std::type_info* element = nullptr;  // of an array
  std::size_t length = 0;                   // of an array
  std::vector<unsigned char> bytes;         // of an array: its elements
  fake_object* target = nullptr;            // of a weak reference, whose class_name is "weak"
  std::optional<std::string> message;       // of an exception; of a class its name
};

struct fake_env {
  JNIEnv jni{};  // first, so that a JNIEnv* is a fake_env*
  fake_java* java = nullptr;
  fake_object* pending = nullptr;
  int pins = 0;
};

namespace {

// Name and signature of a member. Ids live as long as the process: the library keeps them in globals, over many tests.
using member = std::pair<std::string, std::string>;

template <class Id>
Id intern(const char* name, const char* signature) {
  static std::mutex lock;
  static std::set<member> ids;
  const std::lock_guard guard(lock);
  const void* const id = &*ids.emplace(name, signature).first;
  return static_cast<Id>(const_cast<void*>(id));
}

std::string described(const void* id) {
  const auto* const known = static_cast<const member*>(id);
  return known == nullptr ? "(none)" : known->first + known->second;
}

fake_object* of(jobject reference) { return static_cast<fake_object*>(static_cast<void*>(reference)); }
template <class Reference = jobject>
Reference as(fake_object* object) {
  return static_cast<Reference>(static_cast<void*>(object));
}

// The object itself of any reference to it; null of one that was collected.
fake_object* strong(jobject reference) {
  return reference != nullptr && of(reference)->class_name == "weak" ? of(reference)->target : of(reference);
}

fake_env& state(JNIEnv* env) { return *static_cast<fake_env*>(static_cast<void*>(env)); }

#if defined(__SANITIZE_ADDRESS__)
constexpr std::size_t guard_bytes = 0;  // the sanitizer watches the end, reads too
#else
constexpr std::size_t guard_bytes = 32;
#endif
constexpr unsigned char guard_byte = 0xA7;
// A 32-bit runtime puts elements 12 bytes behind an 8-byte boundary.
constexpr std::size_t odd_offset = 4;

template <std::size_t Slot>
void JNICALL no_such_function() {
  std::fprintf(stderr, "slot %zu of the JNI function table was called, which the library has no business with\n", Slot);
  std::abort();
}

template <std::size_t... Slots>
void fill(void** table, std::index_sequence<Slots...>) {
  ((table[Slots] = reinterpret_cast<void*>(&no_such_function<Slots>)), ...);
}

// What a function of the table allows besides what all do.
enum rule : unsigned int { while_pending = 1, while_pinned = 2, of_null = 4, calls_back = 8 };

}  // namespace

// An entry of the table around a function below: notes the call, and makes it unless a real runtime would not live on.
template <auto Function>
struct slot;
template <class Result, class... Arguments, Result (*Function)(fake_java&, Arguments...)>
struct slot<Function> {
  static inline const char* name;
  static inline unsigned int rules;

  static Result JNICALL call(JNIEnv* env, Arguments... arguments) {
    fake_java& java = *state(env).java;
    std::unique_lock guard(java.lock);
    java.enter(env, name, rules);
    if (!present(java, arguments...)) return Result();
    if ((rules & calls_back) != 0) guard.unlock();
    return Function(java, arguments...);
  }

 private:
  static bool present(fake_java&) { return true; }
  template <class First>
  static bool present(fake_java& java, First first, auto...) {
    if constexpr (std::is_convertible_v<First, jobject>) {
      if (strong(first) == nullptr && (rules & of_null) == 0)
        return java.violation(name + std::string(" of null")), false;
    }
    return true;
  }
};

// The functions of the table.
struct fake_calls {
  static jint GetJavaVM(fake_java& java, JavaVM** out) {
    *out = &java.vm;
    return JNI_OK;
  }
  static jclass FindClass(fake_java& java, const char* name) {
    fake_object*& found = java.classes[name];
    if (found == nullptr) {
      found = java.make("java/lang/Class");
      found->message = name;
    }
    return as<jclass>(found);
  }
  static jclass GetObjectClass(fake_java& java, jobject object) {
    return FindClass(java, strong(object)->class_name.c_str());
  }
  template <class Id>
  static Id member_of(fake_java&, jclass, const char* name, const char* signature) {
    return intern<Id>(name, signature);
  }
  static jlong GetLongField(fake_java& java, jobject object, jfieldID field) {
    return expect_member(java, field, "nativeidJ") ? strong(object)->nativeid : 0;
  }
  static void SetLongField(fake_java& java, jobject object, jfieldID field, jlong value) {
    if (expect_member(java, field, "nativeidJ")) strong(object)->nativeid = value;
  }

  static jweak NewWeakGlobalRef(fake_java& java, jobject object) {
    if (object == nullptr) return nullptr;
    fake_object* const weak = java.make("weak");
    weak->target = strong(object);
    ++java.live_weak;
    return as<jweak>(weak);
  }
  static void DeleteWeakGlobalRef(fake_java& java, jweak reference) {
    if (reference == nullptr || of(reference)->class_name != "weak")
      return java.violation("deletion of no weak reference");
    of(reference)->class_name = "deleted weak reference";
    --java.live_weak;
  }
  static jobject NewLocalRef(fake_java&, jobject reference) { return as(strong(reference)); }
  static void DeleteLocalRef(fake_java&, jobject) {}

  static jint ThrowNew(fake_java& java, jclass java_class, const char* message) {
    fake_object* const exception = java.make(*of(java_class)->message);
    if (message != nullptr) exception->message = message;
    return Throw(java, as<jthrowable>(exception));
  }
  static jint Throw(fake_java& java, jthrowable exception) {
    state(java.env()).pending = of(exception);
    return JNI_OK;
  }
  static jboolean ExceptionCheck(fake_java& java) {
    return state(java.env()).pending != nullptr ? JNI_TRUE : JNI_FALSE;
  }
  // Knows one constructor: that of an index exception, with the text that the Java class makes of the index.
  static jobject NewObjectV(fake_java& java, jclass java_class, jmethodID constructor, std::va_list arguments) {
    if (!expect_member(java, constructor, "<init>(I)V")) return nullptr;
    fake_object* const made = java.make(*of(java_class)->message);
    made->message = "Array index out of range: " + std::to_string(va_arg(arguments, jint));
    return as(made);
  }

  static void CallVoidMethodV(fake_java& java, jobject object, jmethodID method, std::va_list) {
    if (expect_member(java, method, "h()V", object) && java.garbagecollect) java.garbagecollect();
  }
  static jboolean CallBooleanMethodV(fake_java& java, jobject object, jmethodID method, std::va_list arguments) {
    if (!expect_member(java, method, "SA(S)Z", object) || !java.request_texture) return JNI_FALSE;
    const jint id = va_arg(arguments, jint);
    if (id != static_cast<jshort>(id)) java.violation("SA with an argument that is no short");
    return java.request_texture(static_cast<jshort>(id));
  }
  static jobject CallObjectMethodV(fake_java& java, jobject object, jmethodID method, std::va_list) {
    if (!expect_member(java, method, "WA()Ljava/lang/Object;", object) || !java.createshadow) return nullptr;
    return java.createshadow();
  }
  static jint MonitorEnter(fake_java& java, jobject) {
    ++java.monitors;
    return JNI_OK;
  }
  static jint MonitorExit(fake_java& java, jobject) {
    if (--java.monitors < 0) java.violation("MonitorExit, not held");
    return JNI_OK;
  }

  static jsize GetArrayLength(fake_java&, jarray array) { return static_cast<jsize>(of(array)->length); }
  static jobject GetObjectArrayElement(fake_java& java, jobjectArray array, jsize index) {
    return java.contents<jobject>(array).at(static_cast<std::size_t>(index));
  }
  static jintArray NewIntArray(fake_java& java, jsize length) {
    return java.out_of_memory() ? nullptr : java.new_ints(std::vector<jint>(static_cast<std::size_t>(length)));
  }
  // T is void for the critical calls.
  template <class Array, class T>
  static T* elements_of(fake_java& java, Array array, jboolean* is_copy) {
    if (is_copy != nullptr) *is_copy = JNI_TRUE;
    return static_cast<T*>(java.hand_out(array, typeid(T)));
  }
  template <class Array, class T>
  static void release(fake_java& java, Array array, T* elements, jint mode) {
    java.give_back(array, elements, mode, std::is_void_v<T>);
  }

  static const JNINativeInterface_* table() {
    static const JNINativeInterface_ functions = [] {
      JNINativeInterface_ t;
      constexpr std::size_t slots = sizeof t / sizeof(void*);
      void* entries[slots];
      fill(entries, std::make_index_sequence<slots>());
      std::memcpy(&t, entries, sizeof t);
      const auto set = []<class Slot>(auto& entry, Slot, const char* name, unsigned int rules = 0) {
        Slot::name = name;
        Slot::rules = rules;
        entry = &Slot::call;
      };
#define VELMARK5_SET(name, ...) set(t.name, slot<&name>(), #name __VA_OPT__(, ) __VA_ARGS__)
#define VELMARK5_SET_ELEMENTS(suffix, Array, type, while_pinned)                      \
  set(t.Get##suffix, slot<&elements_of<Array, type>>(), "Get" #suffix, while_pinned); \
  set(t.Release##suffix, slot<&release<Array, type>>(), "Release" #suffix, while_pending | while_pinned)
      VELMARK5_SET(GetJavaVM), VELMARK5_SET(FindClass), VELMARK5_SET(GetObjectClass);
      set(t.GetFieldID, slot<&member_of<jfieldID>>(), "GetFieldID");
      set(t.GetMethodID, slot<&member_of<jmethodID>>(), "GetMethodID");
      VELMARK5_SET(GetLongField), VELMARK5_SET(SetLongField);
      VELMARK5_SET(NewWeakGlobalRef, of_null), VELMARK5_SET(DeleteWeakGlobalRef, while_pending | of_null);
      VELMARK5_SET(NewLocalRef, of_null), VELMARK5_SET(DeleteLocalRef, while_pending | of_null);
      VELMARK5_SET(ThrowNew), VELMARK5_SET(Throw), VELMARK5_SET(NewObjectV),
          VELMARK5_SET(ExceptionCheck, while_pending);
      VELMARK5_SET(CallVoidMethodV, calls_back), VELMARK5_SET(CallBooleanMethodV, calls_back);
      VELMARK5_SET(CallObjectMethodV, calls_back);
      VELMARK5_SET(MonitorEnter), VELMARK5_SET(MonitorExit, while_pending);
      VELMARK5_SET(GetArrayLength), VELMARK5_SET(GetObjectArrayElement), VELMARK5_SET(NewIntArray);
      VELMARK5_SET_ELEMENTS(IntArrayElements, jintArray, jint, 0);
      VELMARK5_SET_ELEMENTS(ShortArrayElements, jshortArray, jshort, 0);
      VELMARK5_SET_ELEMENTS(ByteArrayElements, jbyteArray, jbyte, 0);
      VELMARK5_SET_ELEMENTS(BooleanArrayElements, jbooleanArray, jboolean, 0);
      VELMARK5_SET_ELEMENTS(FloatArrayElements, jfloatArray, jfloat, 0);
      VELMARK5_SET_ELEMENTS(PrimitiveArrayCritical, jarray, void, while_pinned);
#undef VELMARK5_SET
#undef VELMARK5_SET_ELEMENTS
      return t;
    }();
    return &functions;
  }

 private:
  // Methods are called on the toolkit's peer alone.
  static bool expect_member(fake_java& java, const void* id, const char* expected, jobject called_on = nullptr) {
    const std::string class_name = called_on == nullptr ? "ja" : strong(called_on)->class_name;
    if (described(id) == expected && class_name == "ja") return true;
    java.violation("use of " + described(id) + " of " + class_name + " instead of " + expected);
    return false;
  }
};

fake_java::fake_java() {
  vm_functions.reserved0 = this;
  vm_functions.GetEnv = [](JavaVM* machine, void** caller, jint version) -> jint {
    fake_java& self = *static_cast<fake_java*>(machine->functions->reserved0);
    *caller = self.env();
    if (version != 0x10001) self.violation("GetEnv of another version");
    return JNI_OK;
  };
  vm.functions = &vm_functions;
}

fake_java::~fake_java() = default;

JNIEnv* fake_java::env() {
  const std::lock_guard guard(lock);
  std::unique_ptr<fake_env>& found = environments[std::this_thread::get_id()];
  if (found == nullptr) {
    found = std::make_unique<fake_env>();
    found->jni.functions = fake_calls::table();
    found->java = this;
  }
  return &found->jni;
}

void fake_java::collect(jobject object) {
  for (const auto& other : objects) {
    if (other->class_name == "weak" && other->target == of(object)) other->target = nullptr;
  }
}

fake_object* fake_java::make(const std::string& class_name) {
  const std::lock_guard guard(lock);
  objects.push_back(std::make_unique<fake_object>());
  objects.back()->class_name = class_name;
  return objects.back().get();
}

jobject fake_java::new_object(const char* class_name) { return as(make(class_name)); }
jlong fake_java::nativeid(jobject object) const { return of(object)->nativeid; }
void fake_java::set_nativeid(jobject object, jlong value) { of(object)->nativeid = value; }

jobject fake_java::make_array(const std::type_info& element, const void* elements, std::size_t count,
                              std::size_t element_size) {
  fake_object* const array = make(std::string(element.name()) + "[]");
  array->element = &element;
  array->length = count;
  const auto* const first = static_cast<const unsigned char*>(elements);
  if (count > 0) array->bytes.assign(first, first + count * element_size);
  return as(array);
}

const std::vector<unsigned char>& fake_java::bytes_of(jarray array) const { return of(array)->bytes; }

void fake_java::enter(JNIEnv* caller, const char* function, unsigned int rules) {
  history.push_back(function);
  const fake_env& current = state(caller);
  const std::string call = function;
  if (caller != env()) violation(call + " with the environment of another thread");
  if (current.pins > 0 && (rules & while_pinned) == 0) violation(call + " while an array is pinned");
  if (current.pending != nullptr && (rules & while_pending) == 0) {
    violation(call + " with a pending " + current.pending->class_name);
  }
}

bool fake_java::out_of_memory() {
  if (array_access_failure == 0 || --array_access_failure > 0) return false;
  state(env()).pending = make("java/lang/OutOfMemoryError");
  return true;
}

void* fake_java::hand_out(jarray reference, const std::type_info& type) {
  fake_object* const array = of(reference);
  const bool critical = type == typeid(void);
  if (array->element == nullptr || *array->element == typeid(jobject) || (!critical && *array->element != type)) {
    violation("wrong kind of elements of " + array->class_name);
    return nullptr;
  }
  if (out_of_memory()) return nullptr;
  auto storage = std::make_unique<unsigned char[]>(odd_offset + array->bytes.size() + guard_bytes);
  unsigned char* const elements = storage.get() + odd_offset;
  std::ranges::copy(array->bytes, elements);
  std::fill_n(elements + array->bytes.size(), guard_bytes, guard_byte);
  out[elements] = {array, std::move(storage), critical, env()};
  if (critical) ++state(env()).pins;
  return elements;
}

void fake_java::give_back(jarray reference, void* elements, jint mode, bool critical) {
  const auto found = out.find(elements);
  if (found == out.end() || found->second.array != of(reference) || found->second.critical != critical) {
    return violation("release of elements that were not handed out so");
  }
  fake_object& array = *found->second.array;
  const auto* const bytes = static_cast<const unsigned char*>(elements);
  const std::size_t size = array.bytes.size();
  if (std::count(bytes + size, bytes + size + guard_bytes, guard_byte) != guard_bytes) {
    violation("a write past the end of " + array.class_name);
  }
  if (mode != JNI_ABORT) std::copy(bytes, bytes + size, array.bytes.begin());
  if (critical) {
    if (found->second.owner != env()) violation("release of another thread's pinned array");
    --state(env()).pins;
  }
  out.erase(found);
}

void fake_java::raise(const std::string& class_name, const std::string& message) {
  fake_object* const exception = make(class_name);
  exception->message = message;
  state(env()).pending = exception;
}

std::string fake_java::take_exception() {
  const fake_object* const exception = std::exchange(state(env()).pending, nullptr);
  if (exception == nullptr) return "";
  std::string text = exception->class_name;
  std::replace(text.begin(), text.end(), '/', '.');
  return exception->message ? text + ": " + *exception->message : text;
}

int fake_java::calls(const std::string& function) const {
  return static_cast<int>(std::count(history.begin(), history.end(), function));
}

void fake_java::verify() {
  for (const std::string& text : std::exchange(violations, {})) ADD_FAILURE() << "JNI misused: " << text;
  for (const auto& [elements, entry] : out) ADD_FAILURE() << "not released: elements of " << entry.array->class_name;
  out.clear();
  for (const auto& [thread, environment] : environments) {
    if (const fake_object* const pending = std::exchange(environment->pending, nullptr)) {
      ADD_FAILURE() << "pending: " << pending->class_name << ": " << pending->message.value_or("");
    }
  }
  EXPECT_EQ(monitors, 0) << "monitors held";
  EXPECT_EQ(pin_count.load(), 0);
}

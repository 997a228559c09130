#include "support/recording_jni.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdarg>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <set>
#include <utility>

#include "natives/jniarray.h"

struct fake_object {
  std::string class_name;
  std::map<std::string, jlong> longs;  // fields
  std::string type;                    // of an array: "Int", "Object", ...
  std::size_t element_size = 0;
  std::vector<unsigned char> bytes;  // of an array of primitives
  std::vector<jobject> elements;     // of an array of objects
  fake_object* target = nullptr;     // of a weak reference, whose class_name is "weak"
  std::string message;               // of an exception
  bool has_message = false;

  std::size_t length() const { return type == "Object" ? elements.size() : bytes.size() / element_size; }
};

struct fake_env {
  JNIEnv jni{};  // first, so that a JNIEnv* is a fake_env*
  fake_java* java = nullptr;
  fake_object* pending = nullptr;
  int pins = 0;
};

namespace {

// Ids live as long as the process: the library keeps them in globals, over many tests.
struct member_id {
  std::string name, signature;
  bool operator<(const member_id& other) const {
    return std::tie(name, signature) < std::tie(other.name, other.signature);
  }
};

template <class Id>
Id intern(const char* name, const char* signature) {
  static std::mutex lock;
  static std::set<member_id> ids;
  const std::lock_guard guard(lock);
  const void* const id = &*ids.insert({name, signature}).first;
  return static_cast<Id>(const_cast<void*>(id));
}

const member_id& described(const void* id) {
  static const member_id none{"(none)", ""};
  return id == nullptr ? none : *static_cast<const member_id*>(id);
}

fake_object* of(jobject reference) { return static_cast<fake_object*>(static_cast<void*>(reference)); }
template <class Reference = jobject>
Reference as(fake_object* object) {
  return static_cast<Reference>(static_cast<void*>(object));
}

fake_object* strong(fake_object* object) {
  return object != nullptr && object->class_name == "weak" ? object->target : object;
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

}  // namespace

// The functions of the table.
struct fake_calls {
  static fake_java& java(JNIEnv* env) { return *state(env).java; }

  static jint JNICALL GetEnv(JavaVM* vm, void** out, jint version) {
    fake_java& self = *static_cast<fake_java*>(vm->functions->reserved0);
    *out = self.env();
    if (version != 0x10001) self.violation("GetEnv of another version");
    return JNI_OK;
  }
  static jint JNICALL GetJavaVM(JNIEnv* env, JavaVM** out) {
    java(env).enter(env, "GetJavaVM");
    *out = &java(env).vm;
    return JNI_OK;
  }
  static jclass JNICALL FindClass(JNIEnv* env, const char* name) {
    java(env).enter(env, "FindClass");
    return class_named(java(env), name);
  }
  static jclass JNICALL GetObjectClass(JNIEnv* env, jobject object) {
    java(env).enter(env, "GetObjectClass");
    if (!present(env, object, "GetObjectClass")) return nullptr;
    return class_named(java(env), strong(of(object))->class_name);
  }
  static jfieldID JNICALL GetFieldID(JNIEnv* env, jclass owner, const char* name, const char* signature) {
    java(env).enter(env, "GetFieldID");
    present(env, owner, "GetFieldID");
    return intern<jfieldID>(name, signature);
  }
  static jmethodID JNICALL GetMethodID(JNIEnv* env, jclass owner, const char* name, const char* signature) {
    java(env).enter(env, "GetMethodID");
    present(env, owner, "GetMethodID");
    return intern<jmethodID>(name, signature);
  }
  static jlong JNICALL GetLongField(JNIEnv* env, jobject object, jfieldID field) {
    java(env).enter(env, "GetLongField");
    if (!is_long(env, object, field, "GetLongField")) return 0;
    return strong(of(object))->longs[described(field).name];
  }
  static void JNICALL SetLongField(JNIEnv* env, jobject object, jfieldID field, jlong value) {
    java(env).enter(env, "SetLongField");
    if (is_long(env, object, field, "SetLongField")) strong(of(object))->longs[described(field).name] = value;
  }
  static jweak JNICALL NewWeakGlobalRef(JNIEnv* env, jobject object) {
    fake_java& self = java(env);
    self.enter(env, "NewWeakGlobalRef");
    if (object == nullptr) return nullptr;
    fake_object* const weak = self.make("weak");
    weak->target = strong(of(object));
    ++self.live_weak;
    return as<jweak>(weak);
  }
  static void JNICALL DeleteWeakGlobalRef(JNIEnv* env, jweak reference) {
    java(env).enter(env, "DeleteWeakGlobalRef", true);
    if (reference == nullptr || of(reference)->class_name != "weak") {
      java(env).violation("DeleteWeakGlobalRef of no weak reference");
      return;
    }
    of(reference)->class_name = "deleted weak reference";
    --java(env).live_weak;
  }
  static jobject JNICALL NewLocalRef(JNIEnv* env, jobject reference) {
    java(env).enter(env, "NewLocalRef");
    return reference == nullptr ? nullptr : as(strong(of(reference)));
  }
  static void JNICALL DeleteLocalRef(JNIEnv* env, jobject) { java(env).enter(env, "DeleteLocalRef", true); }
  static jsize JNICALL GetArrayLength(JNIEnv* env, jarray array) {
    java(env).enter(env, "GetArrayLength");
    return present(env, array, "GetArrayLength") ? static_cast<jsize>(of(array)->length()) : 0;
  }
  static jobject JNICALL GetObjectArrayElement(JNIEnv* env, jobjectArray array, jsize index) {
    java(env).enter(env, "GetObjectArrayElement");
    if (!present(env, array, "GetObjectArrayElement")) return nullptr;
    if (index < 0 || static_cast<std::size_t>(index) >= of(array)->elements.size()) {
      java(env).raise("java/lang/ArrayIndexOutOfBoundsException", std::to_string(index).c_str());
      return nullptr;
    }
    return of(array)->elements[static_cast<std::size_t>(index)];
  }
  static jintArray JNICALL NewIntArray(JNIEnv* env, jsize length) {
    java(env).enter(env, "NewIntArray");
    if (length < 0) {
      java(env).raise("java/lang/NegativeArraySizeException", std::to_string(length).c_str());
      return nullptr;
    }
    if (java(env).out_of_memory(env)) return nullptr;
    return java(env).new_ints(std::vector<jint>(static_cast<std::size_t>(length)));
  }
  static jint JNICALL ThrowNew(JNIEnv* env, jclass java_class, const char* message) {
    fake_java& self = java(env);
    self.enter(env, "ThrowNew");
    if (!present(env, java_class, "ThrowNew")) return JNI_ERR;
    fake_object* const exception = self.make(of(java_class)->message);
    exception->has_message = message != nullptr;
    if (message != nullptr) exception->message = message;
    self.throw_object(env, exception);
    return JNI_OK;
  }
  static jint JNICALL Throw(JNIEnv* env, jthrowable exception) {
    java(env).enter(env, "Throw");
    if (!present(env, exception, "Throw")) return JNI_ERR;
    java(env).throw_object(env, of(exception));
    return JNI_OK;
  }
  static jboolean JNICALL ExceptionCheck(JNIEnv* env) {
    java(env).enter(env, "ExceptionCheck", true);
    return state(env).pending != nullptr ? JNI_TRUE : JNI_FALSE;
  }
  // Knows one constructor: that of an index exception, with the text that the Java class makes of the index.
  static jobject JNICALL NewObjectV(JNIEnv* env, jclass java_class, jmethodID constructor, std::va_list arguments) {
    fake_java& self = java(env);
    self.enter(env, "NewObject");
    if (!present(env, java_class, "NewObject")) return nullptr;
    if (described(constructor).name != "<init>" || described(constructor).signature != "(I)V") {
      self.violation("NewObject with " + described(constructor).name + described(constructor).signature);
      return nullptr;
    }
    fake_object* const made = self.make(of(java_class)->message);
    made->message = "Array index out of range: " + std::to_string(va_arg(arguments, jint));
    made->has_message = true;
    return as(made);
  }
  static void JNICALL CallVoidMethodV(JNIEnv* env, jobject object, jmethodID method, std::va_list) {
    if (!callable(env, object, method, "h", "()V")) return;
    if (java(env).garbagecollect) java(env).garbagecollect();
  }
  static jboolean JNICALL CallBooleanMethodV(JNIEnv* env, jobject object, jmethodID method, std::va_list arguments) {
    if (!callable(env, object, method, "SA", "(S)Z") || !java(env).request_texture) return JNI_FALSE;
    const jint id = va_arg(arguments, jint);
    if (id != static_cast<jshort>(id)) java(env).violation("SA with an argument that is no short");
    return java(env).request_texture(static_cast<jshort>(id));
  }
  static jobject JNICALL CallObjectMethodV(JNIEnv* env, jobject object, jmethodID method, std::va_list) {
    if (!callable(env, object, method, "WA", "()Ljava/lang/Object;") || !java(env).createshadow) return nullptr;
    return java(env).createshadow();
  }
  static jint JNICALL MonitorEnter(JNIEnv* env, jobject object) {
    java(env).enter(env, "MonitorEnter");
    if (present(env, object, "MonitorEnter")) ++java(env).monitors;
    return JNI_OK;
  }
  static jint JNICALL MonitorExit(JNIEnv* env, jobject object) {
    java(env).enter(env, "MonitorExit", true);
    if (present(env, object, "MonitorExit") && --java(env).monitors < 0) java(env).violation("MonitorExit, not held");
    return JNI_OK;
  }
  static void* JNICALL GetPrimitiveArrayCritical(JNIEnv* env, jarray array, jboolean* is_copy) {
    java(env).enter(env, "GetPrimitiveArrayCritical", false, true);
    if (is_copy != nullptr) *is_copy = JNI_TRUE;
    return java(env).hand_out(env, array, true, nullptr);
  }
  static void JNICALL ReleasePrimitiveArrayCritical(JNIEnv* env, jarray array, void* elements, jint mode) {
    java(env).enter(env, "ReleasePrimitiveArrayCritical", true, true);
    java(env).give_back(env, array, elements, mode, true);
  }

#define VELMARK5_ELEMENT_CALLS(Name, type)                                                                      \
  static type* JNICALL Get##Name##ArrayElements(JNIEnv* env, type##Array array, jboolean* is_copy) {            \
    java(env).enter(env, "Get" #Name "ArrayElements");                                                          \
    if (is_copy != nullptr) *is_copy = JNI_TRUE;                                                                \
    return static_cast<type*>(java(env).hand_out(env, array, false, #Name));                                    \
  }                                                                                                             \
  static void JNICALL Release##Name##ArrayElements(JNIEnv* env, type##Array array, type* elements, jint mode) { \
    java(env).enter(env, "Release" #Name "ArrayElements", true);                                                \
    java(env).give_back(env, array, elements, mode, false);                                                     \
  }
  VELMARK5_ELEMENT_CALLS(Int, jint)
  VELMARK5_ELEMENT_CALLS(Short, jshort)
  VELMARK5_ELEMENT_CALLS(Byte, jbyte)
  VELMARK5_ELEMENT_CALLS(Boolean, jboolean)
  VELMARK5_ELEMENT_CALLS(Float, jfloat)
#undef VELMARK5_ELEMENT_CALLS

  static const JNINativeInterface_* table() {
    static const JNINativeInterface_ functions = [] {
      JNINativeInterface_ t;
      constexpr std::size_t slots = sizeof t / sizeof(void*);
      void* entries[slots];
      fill(entries, std::make_index_sequence<slots>());
      std::memcpy(&t, entries, sizeof t);
#define VELMARK5_SET(name) t.name = &name
      VELMARK5_SET(GetJavaVM), VELMARK5_SET(FindClass), VELMARK5_SET(GetObjectClass), VELMARK5_SET(GetFieldID);
      VELMARK5_SET(GetMethodID), VELMARK5_SET(GetLongField), VELMARK5_SET(SetLongField);
      VELMARK5_SET(NewWeakGlobalRef), VELMARK5_SET(DeleteWeakGlobalRef), VELMARK5_SET(DeleteLocalRef);
      VELMARK5_SET(NewLocalRef);
      VELMARK5_SET(GetArrayLength), VELMARK5_SET(GetObjectArrayElement), VELMARK5_SET(NewIntArray);
      VELMARK5_SET(ThrowNew), VELMARK5_SET(Throw), VELMARK5_SET(ExceptionCheck), VELMARK5_SET(NewObjectV);
      VELMARK5_SET(CallVoidMethodV), VELMARK5_SET(CallBooleanMethodV), VELMARK5_SET(CallObjectMethodV);
      VELMARK5_SET(MonitorEnter), VELMARK5_SET(MonitorExit);
      VELMARK5_SET(GetPrimitiveArrayCritical), VELMARK5_SET(ReleasePrimitiveArrayCritical);
      VELMARK5_SET(GetIntArrayElements), VELMARK5_SET(ReleaseIntArrayElements);
      VELMARK5_SET(GetShortArrayElements), VELMARK5_SET(ReleaseShortArrayElements);
      VELMARK5_SET(GetByteArrayElements), VELMARK5_SET(ReleaseByteArrayElements);
      VELMARK5_SET(GetBooleanArrayElements), VELMARK5_SET(ReleaseBooleanArrayElements);
      VELMARK5_SET(GetFloatArrayElements), VELMARK5_SET(ReleaseFloatArrayElements);
#undef VELMARK5_SET
      return t;
    }();
    return &functions;
  }

  static jclass class_named(fake_java& self, const std::string& name) {
    const std::lock_guard guard(self.lock);
    fake_object*& found = self.classes[name];
    if (found == nullptr) {
      found = self.make("java/lang/Class");
      found->message = name;
    }
    return as<jclass>(found);
  }
  static bool present(JNIEnv* env, jobject object, const char* function) {
    if (object != nullptr && strong(of(object)) != nullptr) return true;
    java(env).violation(std::string(function) + " of null");
    return false;
  }
  static bool is_long(JNIEnv* env, jobject object, jfieldID field, const char* function) {
    if (!present(env, object, function)) return false;
    if (described(field).name == "nativeid" && described(field).signature == "J") return true;
    java(env).violation(std::string(function) + " of field " + described(field).name);
    return false;
  }
  static bool callable(JNIEnv* env, jobject object, jmethodID method, const char* name, const char* signature) {
    java(env).enter(env, name);
    if (!present(env, object, name)) return false;
    const member_id& called = described(method);
    if (called.name == name && called.signature == signature && strong(of(object))->class_name == "ja") return true;
    java(env).violation("call of " + called.name + called.signature + " on " + strong(of(object))->class_name);
    return false;
  }
};

fake_java::fake_java() {
  vm_functions.reserved0 = this;
  vm_functions.GetEnv = &fake_calls::GetEnv;
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
  const std::lock_guard guard(lock);
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
jlong fake_java::nativeid(jobject object) const { return of(object)->longs["nativeid"]; }
void fake_java::set_nativeid(jobject object, jlong value) { of(object)->longs["nativeid"] = value; }

template <class Array, class T>
Array fake_java::make_array(const char* type, const std::vector<T>& values) {
  fake_object* const array = make(std::string(type) + "[]");
  array->type = type;
  array->element_size = sizeof(T);
  array->bytes.resize(values.size() * sizeof(T));
  if (!values.empty()) std::memcpy(array->bytes.data(), values.data(), array->bytes.size());
  return as<Array>(array);
}

jobjectArray fake_java::new_objects(const std::vector<jobject>& values) {
  fake_object* const array = make("Object[]");
  array->type = "Object";
  array->elements = values;
  return as<jobjectArray>(array);
}

#define VELMARK5_ARRAYS(type, Name, name)                                          \
  type##Array fake_java::new_##name(const std::vector<type>& values) {             \
    return make_array<type##Array>(#Name, values);                                 \
  }                                                                                \
  std::vector<type> fake_java::name(type##Array array) const {                     \
    const auto& bytes_ = of(array)->bytes;                                         \
    std::vector<type> values(bytes_.size() / sizeof(type));                        \
    if (!values.empty()) std::memcpy(values.data(), bytes_.data(), bytes_.size()); \
    return values;                                                                 \
  }
VELMARK5_ARRAYS(jint, Int, ints)
VELMARK5_ARRAYS(jshort, Short, shorts)
VELMARK5_ARRAYS(jbyte, Byte, bytes)
VELMARK5_ARRAYS(jboolean, Boolean, booleans)
VELMARK5_ARRAYS(jfloat, Float, floats)
#undef VELMARK5_ARRAYS

void fake_java::enter(JNIEnv* caller, const char* function, bool legal_with_exception, bool legal_when_pinned) {
  const std::lock_guard guard(lock);
  ++call_counts[function];
  history.push_back(function);
  const fake_env& current = state(caller);
  if (caller != env()) violation(std::string(function) + " with the environment of another thread");
  if (current.pins > 0 && !legal_when_pinned) violation(std::string(function) + " while an array is pinned");
  if (current.pending != nullptr && !legal_with_exception) {
    violation(std::string(function) + " with a pending " + current.pending->class_name);
  }
}

bool fake_java::out_of_memory(JNIEnv* caller) {
  if (array_access_failure == 0 || --array_access_failure > 0) return false;
  throw_object(caller, make("java/lang/OutOfMemoryError"));
  return true;
}

void* fake_java::hand_out(JNIEnv* caller, jobject reference, bool critical, const char* type) {
  const std::lock_guard guard(lock);
  if (reference == nullptr) {
    violation("elements of a null array");
    return nullptr;
  }
  fake_object* const array = of(reference);
  if (array->type.empty() || array->type == "Object" || (type != nullptr && array->type != type)) {
    violation(std::string(type != nullptr ? type : "primitive") + " elements of " + array->class_name);
    return nullptr;
  }
  if (out_of_memory(caller)) return nullptr;
  auto storage = std::make_unique<unsigned char[]>(odd_offset + array->bytes.size() + guard_bytes);
  unsigned char* const elements = storage.get() + odd_offset;
  std::copy(array->bytes.begin(), array->bytes.end(), elements);
  std::fill_n(elements + array->bytes.size(), guard_bytes, guard_byte);
  out[elements] = {array, std::move(storage), critical, caller};
  if (critical) ++state(caller).pins;
  return elements;
}

void fake_java::give_back(JNIEnv* caller, jobject reference, void* elements, jint mode, bool critical) {
  const std::lock_guard guard(lock);
  const auto found = out.find(elements);
  if (found == out.end() || as(found->second.array) != reference || found->second.critical != critical) {
    violation("release of elements that were not handed out so");
    return;
  }
  fake_object& array = *found->second.array;
  const auto* const bytes = static_cast<const unsigned char*>(elements);
  const std::size_t size = array.bytes.size();
  if (std::any_of(bytes + size, bytes + size + guard_bytes, [](unsigned char b) { return b != guard_byte; })) {
    violation("a write past the end of " + array.class_name);
  }
  if (mode != JNI_ABORT) std::copy(bytes, bytes + size, array.bytes.begin());
  if (mode == JNI_COMMIT) return;
  if (critical) {
    if (found->second.owner != caller) violation("release of another thread's pinned array");
    --state(caller).pins;
  }
  out.erase(found);
}

void fake_java::throw_object(JNIEnv* caller, fake_object* exception) { state(caller).pending = exception; }

void fake_java::raise(const char* class_name, const char* message) {
  fake_object* const exception = make(class_name);
  exception->message = message;
  exception->has_message = true;
  throw_object(env(), exception);
}

std::string fake_java::take_exception() {
  const fake_object* const exception = std::exchange(state(env()).pending, nullptr);
  if (exception == nullptr) return "";
  std::string text = exception->class_name;
  std::replace(text.begin(), text.end(), '/', '.');
  return exception->has_message ? text + ": " + exception->message : text;
}

void fake_java::violation(const std::string& text) {
  const std::lock_guard guard(lock);
  violations.push_back(text);
}

std::vector<std::string> fake_java::take_violations() {
  const std::lock_guard guard(lock);
  return std::exchange(violations, {});
}

int fake_java::calls(const std::string& function) const {
  const std::lock_guard guard(lock);
  const auto found = call_counts.find(function);
  return found == call_counts.end() ? 0 : found->second;
}

int fake_java::arrays_out() const {
  const std::lock_guard guard(lock);
  return static_cast<int>(out.size());
}

void fake_java::verify() {
  const std::lock_guard guard(lock);
  for (const std::string& text : take_violations()) ADD_FAILURE() << "JNI misused: " << text;
  for (const auto& [elements, entry] : out) ADD_FAILURE() << "not released: elements of " << entry.array->class_name;
  out.clear();
  for (const auto& [thread, environment] : environments) {
    if (environment->pending == nullptr) continue;
    ADD_FAILURE() << "pending: " << environment->pending->class_name << ": " << environment->pending->message;
    environment->pending = nullptr;
  }
  EXPECT_EQ(monitors, 0) << "monitors held";
  EXPECT_EQ(pin_count.load(), 0);
}

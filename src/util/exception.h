// The failures of the library. They are made with new and thrown by pointer; the native frame turns each into the
// pending Java exception of its class and deletes it. What they do in Java is in natives/exception.cpp.
#pragma once

struct JNIEnv_;

class Exception {
 public:
  Exception();
  explicit Exception(const char* text);  // copies the text
  virtual ~Exception();
  virtual void throwJavaException(JNIEnv_* env);

  Exception(const Exception&) = delete;
  Exception& operator=(const Exception&) = delete;

  const char* text() const { return message; }

 protected:
  char* message;  // owned, never null before destruction
};

// Declares a failure that differs from Exception only in its Java class.
#define VELMARK5_FAILURE(name)                           \
  class name : public Exception {                        \
   public:                                               \
    name() = default;                                    \
    explicit name(const char* text) : Exception(text) {} \
    void throwJavaException(JNIEnv_* env) override;      \
  }

VELMARK5_FAILURE(RuntimeException);
VELMARK5_FAILURE(ClassCastException);
VELMARK5_FAILURE(NullPointerException);  // always reaches Java with the empty message
VELMARK5_FAILURE(OutOfMemory);
VELMARK5_FAILURE(IllegalArgumentException);
VELMARK5_FAILURE(IllegalStateException);
VELMARK5_FAILURE(NumberFormatException);
VELMARK5_FAILURE(NativeError);  // also prints its message to standard output

#undef VELMARK5_FAILURE

class ArrayIndexOutOfBoundsException : public Exception {
 public:
  ArrayIndexOutOfBoundsException(int bad_index, int array_length) : index(bad_index), length(array_length) {}
  void throwJavaException(JNIEnv_* env) override;

 private:
  int index;
  int length;  // kept for the debugger; only the index reaches Java
};

// A JNI call or a callback has left a Java exception pending: unwind, and leave that one as it is.
class JavaExceptionPending : public Exception {
 public:
  void throwJavaException(JNIEnv_* env) override;
};

#include "util/exception.h"

#include <cstring>

Exception::Exception() : Exception("") {}

Exception::Exception(const char* text) : message(new char[std::strlen(text) + 1]) { std::strcpy(message, text); }

Exception::~Exception() {
  delete[] message;
  message = nullptr;
}

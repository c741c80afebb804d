// Opened plug-in files, shared by the scan and the routine calls.
#pragma once

#include <ADDIN/addin.h>

#include <string>

struct ADDIN_File {
  void* library;  // of dlopen
  const ZR_ModuleDescriptor* descriptor;
  i32 users;  // the scan, and each registered routine; the last one closes the file
};

// Opens and checks a file; null with the reason when it is refused. The caller is its first user.
ADDIN_File* ADDINp_OpenFile(const char* path, std::string* reason);
void ADDINp_LeaveFile(ADDIN_File* file);
bool ADDINp_HasRoutineOfKind(const ADDIN_File* file, u32 kind);

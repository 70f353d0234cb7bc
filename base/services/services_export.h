// Export macro of the service layer (libdwxservices).
#pragma once

#if defined(_WIN32)
#if defined(DWXSERVICES_BUILDING)
#define DWXSERVICES_API __declspec(dllexport)
#else
#define DWXSERVICES_API __declspec(dllimport)
#endif
#else
#define DWXSERVICES_API __attribute__((visibility("default")))
#endif

// A program that only initialises and uninitialises COM, as every start of
// qmMrvONI.exe must: the floor below which its start-up cannot go.
#include <windows.h>
#include <objbase.h>

int WINAPI wWinMain(HINSTANCE, HINSTANCE, LPWSTR, int) {
    CoInitialize(nullptr);
    CoUninitialize();
    return 0;
}

// A module with hidden visibility, as a plug-in is one.

#include "notification/DeregisterWeakCallbackException.h"

class VExceptionOfTheModule : public std::exception
{
};

extern "C" __attribute__((visibility("default"))) void ThrowDeregisterWeakCallback()
{
    throw KVR::VDeregisterWeakCallbackException();
}

extern "C" __attribute__((visibility("default"))) void ThrowExceptionOfTheModule()
{
    throw VExceptionOfTheModule();
}

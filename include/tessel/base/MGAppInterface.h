// The application interface: an object of the host's that tells the library what application it runs in.
#ifndef TESSEL_BASE_MGAPPINTERFACE_H
#define TESSEL_BASE_MGAPPINTERFACE_H

#include <tessel/base/Types.h>

#ifdef __cplusplus
namespace tessel {

// The host derives from it and overrides what applies. The slots and their order are fixed; those without a name are
// not called.
class TESSEL_API MGAppInterface {
public:
    virtual uintptr_t Slot0() { return 0; }
    // The application's name, for the configuration.
    virtual CStr ApplicationName() { return ""; }
    // The application's name in its other edition, for the configuration.
    virtual CStr ApplicationAltName() { return ""; }
    // The version of this interface.
    virtual uint32 AppAPIVersion() { return 0; }
    // The version of the application's editor.
    virtual uint32 AppEditorVersion() { return 0; }
    virtual uintptr_t Slot5() { return 0; }
    virtual uintptr_t Slot6() { return 0; }
    virtual uintptr_t Slot7() { return 0; }
    virtual uintptr_t Slot8() { return 0; }
    // The name of the preference file, without ".ini".
    virtual CStr PreferenceBaseName() { return ""; }
    virtual uintptr_t Slot10() { return 0; }
    // Not 0: it is a top-level application.
    virtual int32 IsTopLevel() { return 0; }
    // Not 0: it is a built application.
    virtual int32 IsBoundApp() { return 0; }
    // Not 0: it is a run-time engine.
    virtual int32 IsRunTime() { return 0; }
    // Not 0: it is a run-time engine with all features.
    virtual int32 IsFullFeatureRunTime() { return 0; }
    virtual uintptr_t Slot15() { return 0; }
    virtual uintptr_t Slot16() { return 0; }
    virtual uintptr_t Slot17() { return 0; }
    virtual uintptr_t Slot18() { return 0; }
    virtual uintptr_t Slot19() { return 0; }
    virtual uintptr_t Slot20() { return 0; }
    virtual uintptr_t Slot21() { return 0; }
    virtual uintptr_t Slot22() { return 0; }
    // The application's resource file; 0: none.
    virtual RsrcFile AppResourceFile() { return 0; }
    virtual ~MGAppInterface() = default;
};

}  // namespace tessel
typedef tessel::MGAppInterface* MGAppInterfacePtr;
#else
typedef struct tessel_MGAppInterface* MGAppInterfacePtr;
#endif

TESSEL_BEGIN_C

// Installs the object, which stays the host's; null takes it away. At start, before other threads ask.
TESSEL_API void MGAppInterfaceSet(MGAppInterfacePtr app);

// The object installed; null when there is none. Any thread.
TESSEL_API MGAppInterfacePtr MGApp(void);

// What the object, or for null the installed one, answers; 0 without any.
TESSEL_API uint32 MGGetAppAPIVersion(MGAppInterfacePtr app);
// The version of the application's editor; 0 without an object.
TESSEL_API uint32 MGGetAppEditorVersion(MGAppInterfacePtr app);
// Whether it is a top-level application; 0 without an object.
TESSEL_API int32 MGGetIsTopLevel(MGAppInterfacePtr app);
// Whether it is a built application; 0 without an object.
TESSEL_API int32 MGGetIsBoundApp(MGAppInterfacePtr app);
// Whether it is a run-time engine; 0 without an object.
TESSEL_API int32 MGGetIsRunTime(MGAppInterfacePtr app);
// Whether it is a run-time engine with all features; 0 without an object.
TESSEL_API int32 MGGetIsFullFeatureRunTime(MGAppInterfacePtr app);

TESSEL_END_C

#endif

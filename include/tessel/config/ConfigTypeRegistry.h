// The types that settings can have: how a value of each is read from text and written as text.
//
// A type is a signed 32-bit number, most often four characters. The library's own are in config/ConfigCoreTypes.h; a
// host registers more. What a value is, is a matter of the type: its two procedures get the pointer that the caller
// gave. Text is in the active code page.
//
// One table a process, made when the configuration starts and destroyed when it stops. Any thread; the mutex of the
// table is not held while a procedure runs.
#ifndef TESSEL_CONFIG_CONFIGTYPEREGISTRY_H
#define TESSEL_CONFIG_CONFIGTYPEREGISTRY_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>

// Makes a value from `length` bytes of text (no terminator is counted on). Not null. kConfigTextErr when the text is
// none of the type; then the value should be as it was. Must not throw.
typedef MgErr (*ConfigFromTextProc)(const char* text, int32 length, void* value);

// Writes a value into *text, a string handle that is made when it is null. A text with one pair of double quotes
// around it is read again without them, blanks at its ends intact. Must not throw.
typedef MgErr (*ConfigToTextProc)(const void* value, LStrHandle* text);

TESSEL_BEGIN_C

// Makes the table, empty, and destroys it with what it holds: done by the start and the stop of the configuration.
// kGenericErr when there is one already, or none; kMemFullErr. For the start-up thread.
TESSEL_API MgErr InitConfigTypeRegistry(void);
// Destroys the table with what it holds; as above.
TESSEL_API MgErr UninitConfigTypeRegistry(void);

// Adds a type. kGenericErr when it is registered (the first procedures stay) or there is no table; kMemFullErr.
TESSEL_API MgErr RegisterConfigType(int32 type, ConfigFromTextProc fromText, ConfigToTextProc toText);

// Takes a type out. kConfigTypeErr when it is not registered, kGenericErr without a table.
TESSEL_API MgErr UnregisterConfigType(int32 type);

// Converts with the procedures of the type. kGenericErr without a table, kConfigTypeErr for a type that is not
// registered, else the procedure's result. Null text is empty. *text is made when it is null, and belongs to the
// caller.
TESSEL_API MgErr ConfigTypeFromString(int32 type, const char* text, int32 length, void* value);
// The text of a value, as above.
TESSEL_API MgErr ConfigTypeToString(int32 type, const void* value, LStrHandle* text);

TESSEL_END_C

#endif

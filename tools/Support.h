// What the commands share: failures, arguments, files, the library's objects that dispose of themselves.
#ifndef TESSEL_TOOLS_SUPPORT_H
#define TESSEL_TOOLS_SUPPORT_H

#include <tessel/tessel.h>

#include <string>
#include <vector>

namespace tool {

// Wrong usage: exit 2 with a pointer to the help.
struct UsageError {
    std::string message;
};

// What the library refused: exit 1 with "tessel: SUBJECT: OPERATION: <cause> (<code>)". The cause is what the system
// said, or what the code means.
struct Refusal {
    Refusal(const std::string& itsSubject, const char* itsOperation, MgErr itsCode)
        : subject(itsSubject), operation(itsOperation), code(itsCode), cause(FErrorText(itsCode)) {}
    std::string subject, operation;
    MgErr code;
    std::string cause;
};

inline void Check(MgErr err, const std::string& subject, const char* operation) {
    if (err) throw Refusal(subject, operation, err);
}

// Arguments of a command: options by name, and what is left in order.
class Arguments {
public:
    // `flags` stand alone, `options` take a value. "--" ends them.
    Arguments(const std::vector<std::string>& words, const std::vector<std::string>& flags,
              const std::vector<std::string>& options);

    bool Has(const std::string& name) const;
    std::string Option(const std::string& name, const std::string& otherwise) const;
    // The positional ones, which must be as many as `names`.
    std::vector<std::string> Expect(const std::vector<std::string>& names) const;

private:
    struct Option_ {
        std::string name;
        std::string value;
    };
    std::vector<Option_> options_;
    std::vector<std::string> positional_;
};

// Decimal, or hexadecimal with 0x.
long long ParseNumber(const std::string& text, const char* what, long long least, long long most);
int32 ParseID(const std::string& text);
// Four characters (fewer are padded with blanks), or 0x and eight digits: the four bytes as they stand in the file.
FourCC ParseFourCC(const std::string& text, const char* what);
// The four bytes of a code.
std::string FourCCText(FourCC code);

// The library between start and stop.
class Session {
public:
    Session();
    ~Session();
    Session(const Session&) = delete;
    Session& operator=(const Session&) = delete;
};

class OwnedPath {
public:
    explicit OwnedPath(const std::string& native);
    ~OwnedPath();
    OwnedPath(const OwnedPath&) = delete;
    OwnedPath& operator=(const OwnedPath&) = delete;
    Path get() const { return path_; }

private:
    Path path_ = nullptr;
};

class OpenRsrc {
public:
    OpenRsrc(const std::string& file, int32 mode);
    ~OpenRsrc();
    OpenRsrc(const OpenRsrc&) = delete;
    OpenRsrc& operator=(const OpenRsrc&) = delete;

    RsrcFile get() const { return refnum_; }
    // Writes what was changed, and closes.
    void Close();

private:
    std::string file_;
    RsrcFile refnum_ = 0;
};

std::string BytesOf(UHandle data);
std::string ReadStandardInput();
void WriteStandardOutput(const std::string& bytes);
std::string ReadWholeFile(const std::string& file);

}  // namespace tool

#endif

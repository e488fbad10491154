// How PathRef::ToAbbreviatedDisplayStrings shortens paths that are too long to be shown.
#ifndef TESSEL_PATHS_PATHABBREVIATION_H
#define TESSEL_PATHS_PATHABBREVIATION_H

#include <tessel/paths/PathRef.h>

#ifdef __cplusplus

namespace tessel {

// Says which text is too long to be shown.
class TESSEL_API PathRef::MeasurementStyle {
public:
    virtual ~MeasurementStyle();
    // Whether the text is too long to be shown.
    virtual bool StringIsTooLong(const StringType& text) const = 0;
};

// More than `maximum` characters are too long; a multi-byte character is one.
class TESSEL_API PathRef::CharCountMeasurementStyle : public PathRef::MeasurementStyle {
public:
    // Lets texts of at most `maximum` characters pass.
    explicit CharCountMeasurementStyle(uint32 maximum);
    ~CharCountMeasurementStyle() override;
    bool StringIsTooLong(const StringType& text) const override;

private:
    uint32 maximum_;
};

// Makes the texts, one for each path, in their order. kArgErr for a null `out`; raises what a writer raises.
class TESSEL_API PathRef::AbbreviationStyle {
public:
    // Whole paths are not forced.
    AbbreviationStyle();
    virtual ~AbbreviationStyle();
    // Stores a text for each path that `measure` lets pass.
    virtual MgErr PerformAbbreviation(const std::list<PathRef>& paths, std::vector<StringType>* out,
                                      const MeasurementStyle& measure) const = 0;

    // Whether whole paths are shown also where the last names would do.
    virtual bool GetForceFullPathStrings() const;
    // Says whether whole paths are shown also where the last names would do; false at first.
    virtual void SetForceFullPathStrings(bool force);

private:
    bool forceFullPathStrings_ = false;
};

// Shows the last names when they all differ, else the whole paths; too long a text loses its front to "...".
class TESSEL_API PathRef::TrimFromFrontAbbreviationStyle : public PathRef::AbbreviationStyle {
public:
    // Whole paths are not forced.
    TrimFromFrontAbbreviationStyle();
    ~TrimFromFrontAbbreviationStyle() override;
    MgErr PerformAbbreviation(const std::list<PathRef>& paths, std::vector<StringType>* out,
                              const MeasurementStyle& measure) const override;
};

}  // namespace tessel
#endif

#endif

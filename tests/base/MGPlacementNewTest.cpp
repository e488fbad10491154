#include "support/Test.h"
#include <tessel/base/MGPlacementNew.h>

#include <new>

namespace tessel::test {
namespace {

std::string theEnds;

struct Singleton {
    explicit Singleton(char name_) : name(name_) {}
    ~Singleton() { theEnds += name; }
    char name;
};

TEST(MGPlacementNew, ObjectsEndNewestFirstAndOnce) {
    alignas(Singleton) static char places[2][sizeof(Singleton)];
    for (int i = 0; i < 2; ++i) {
        auto* object = new (places[i]) Singleton(static_cast<char>('A' + i));
        MGPlacementNewRegisterDeletor(new MGPlacementDelete<Singleton>(object));
    }
    EXPECT_EQ("", theEnds);
    MGPlacementNewRunCleanup();
    EXPECT_EQ("BA", theEnds);
    MGPlacementNewRunCleanup();
    MGPlacementNewRegisterDeletor(nullptr);
    EXPECT_EQ("BA", theEnds);
}

}  // namespace
}  // namespace tessel::test

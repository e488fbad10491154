#include "support/ReportRecorder.h"
#include <tessel/frame/ServiceRegistry.h>

#include <gtest/gtest.h>
#include <memory>
#include <new>
#include <string>
#include <vector>

namespace tessel {
namespace {

using test::ReportRecorder;
using Texts = std::vector<std::string>;

std::string theLog;  // "+A -A": A was started, then stopped

class Service : public IServiceObject {
public:
    explicit Service(const char* name, std::vector<IServiceObject*> needs = {}) : name_(name), needs_(needs) {}
    MgErr Init() override {
        theLog += std::string("+") + name_ + ' ';
        if (initResult == kThrows) throw std::bad_alloc();
        return initResult;
    }
    MgErr Uninit() override {
        theLog += std::string("-") + name_ + ' ';
        return uninitResult;
    }
    const char* GetName() override { return name_; }
    void GetDependencies(IServiceDependencyList& list) override {
        for (IServiceObject* need : needs_) list.AddDependency(need);
    }
    void Needs(IServiceObject* service) { needs_.push_back(service); }

    static constexpr MgErr kThrows = -99;
    MgErr initResult = kNoErr;
    MgErr uninitResult = kNoErr;

private:
    const char* name_;
    std::vector<IServiceObject*> needs_;
};

struct Releaser {
    void operator()(IServiceRegistry* registry) const { registry->Release(); }
};
using Registry = std::unique_ptr<IServiceRegistry, Releaser>;

Registry MakeRegistry(std::vector<IServiceObject*> services) {
    services.push_back(nullptr);
    return Registry(CreateServiceRegistry(services.data()));
}

class ServiceRegistryTest : public testing::Test {
protected:
    void SetUp() override { theLog.clear(); }
    ReportRecorder recorder;
    Service c{"C"}, b{"B", {&c}}, a{"A", {&b}}, free{"F"};
};

TEST_F(ServiceRegistryTest, EmptyAndNull) {
    EXPECT_EQ(nullptr, CreateServiceRegistry(nullptr));
    const Registry registry = MakeRegistry({});
    EXPECT_EQ(kNoErr, registry->UninitServices());
    EXPECT_EQ(kNoErr, registry->InitServices());
    EXPECT_EQ(kNoErr, registry->UninitServices());
}

TEST_F(ServiceRegistryTest, StartsDependenciesFirstAndStopsInReverse) {
    const std::vector<std::vector<IServiceObject*>> orders = {{&a, &b, &c}, {&a, &c, &b}, {&b, &a, &c},
                                                              {&b, &c, &a}, {&c, &a, &b}, {&c, &b, &a}};
    for (const auto& order : orders) {
        theLog.clear();
        const Registry registry = MakeRegistry(order);
        EXPECT_EQ(kNoErr, registry->InitServices());
        EXPECT_EQ(kNoErr, registry->UninitServices());
        EXPECT_EQ("+C +B +A -A -B -C ", theLog);
        EXPECT_EQ(kNoErr, registry->InitServices()) << "may be started again";
        EXPECT_EQ(kNoErr, registry->UninitServices());
        EXPECT_EQ("+C +B +A -A -B -C +C +B +A -A -B -C ", theLog);
    }
    EXPECT_EQ(Texts{}, recorder.Texts());
}

TEST_F(ServiceRegistryTest, OfThoseReadyTheFirstRegisteredGoesFirst) {
    Service d("D"), e("E", {&d, &d});
    const Registry registry = MakeRegistry({&e, &a, &d, &free, &b, &c});
    EXPECT_EQ(kNoErr, registry->InitServices());
    EXPECT_EQ("+D +E +F +C +B +A ", theLog);
    registry->UninitServices();
}

TEST_F(ServiceRegistryTest, RegistrationIsRefusedWhileStarted) {
    const Registry registry = MakeRegistry({&c, &b});
    EXPECT_EQ(kArgErr, registry->AddService(nullptr));
    EXPECT_EQ(kArgErr, registry->AddService(&c));
    EXPECT_EQ(kArgErr, registry->RemoveService(nullptr));
    EXPECT_EQ(kArgErr, registry->RemoveService(&a));
    EXPECT_EQ(kNoErr, registry->InitServices());
    EXPECT_EQ(kGenericErr, registry->AddService(&a));
    EXPECT_EQ(kGenericErr, registry->RemoveService(&b));
    EXPECT_EQ(kGenericErr, registry->InitServices());
    EXPECT_EQ(kNoErr, registry->UninitServices());
    EXPECT_EQ(kNoErr, registry->AddService(&a));
    EXPECT_TRUE(registry->HasService(&a));
    EXPECT_EQ(kNoErr, registry->RemoveService(&a));
    EXPECT_FALSE(registry->HasService(&a));
    EXPECT_EQ(Texts{}, recorder.Texts());
}

// A service that uses its registry whenever it is called.
class Meddler : public Service {
public:
    Meddler() : Service("M") {}
    MgErr Init() override { return Meddle(), Service::Init(); }
    MgErr Uninit() override { return Meddle(), Service::Uninit(); }
    void GetDependencies(IServiceDependencyList&) override { Meddle(); }
    IServiceRegistry* registry = nullptr;
    int calls = 0;

private:
    void Meddle() {
        EXPECT_EQ(kGenericErr, registry->AddService(&other_));
        EXPECT_EQ(kGenericErr, registry->RemoveService(this));
        EXPECT_EQ(kGenericErr, registry->InitServices());
        EXPECT_EQ(kGenericErr, registry->UninitServices());
        ++calls;
    }
    Service other_{"O"};
};

TEST_F(ServiceRegistryTest, AServiceCannotChangeARegistryThatIsStartingIt) {
    Meddler meddler;
    const Registry registry = MakeRegistry({&meddler, &free});
    meddler.registry = registry.get();
    EXPECT_EQ(kNoErr, registry->InitServices());
    EXPECT_EQ(kNoErr, registry->UninitServices());
    EXPECT_EQ("+M +F -F -M ", theLog);
    EXPECT_EQ(3, meddler.calls);
}

TEST_F(ServiceRegistryTest, AServiceThatStandsTwiceIsHeldOnce) {
    const Registry registry = MakeRegistry({&c, &c});
    EXPECT_EQ(Texts{"ServiceRegistry: A service has already been registered that has the name \"C\"."},
              recorder.Texts(kDebugFatal));
    registry->InitServices();
    registry->UninitServices();
    EXPECT_EQ("+C -C ", theLog);
}

TEST_F(ServiceRegistryTest, ADependencyMayRunInAnotherRegistry) {
    const Registry lower = MakeRegistry({&c});
    const Registry upper = MakeRegistry({&free, &b});
    const Texts missing = {"ServiceRegistry: Service \"B\" has a dependency \"C\" that does not exist!"};
    EXPECT_EQ(kNoErr, upper->InitServices());
    EXPECT_EQ(missing, recorder.Texts(kDebugFatal));
    EXPECT_EQ("", theLog) << "nothing is started";

    lower->InitServices();
    EXPECT_EQ(kNoErr, upper->InitServices());
    EXPECT_EQ("+C +F +B ", theLog);
    upper->UninitServices();

    const Registry other = MakeRegistry({&c});
    c.initResult = Service::kThrows;
    EXPECT_EQ(kMemFullErr, other->InitServices());
    EXPECT_TRUE(recorder.Has(kDebugInfo, "ServiceRegistry: Service C init failed with error 2"));
    c.initResult = kNoErr;
    other->InitServices();
    other->UninitServices();
    EXPECT_EQ(kNoErr, upper->InitServices());
    EXPECT_EQ("+C +F +B -B -F +C +C -C +F +B ", theLog) << "C runs while one registry runs it";
    upper->UninitServices();

    lower->UninitServices();
    recorder.Clear();
    theLog.clear();
    EXPECT_EQ(kNoErr, upper->InitServices());
    EXPECT_EQ(missing, recorder.Texts(kDebugFatal));
    EXPECT_EQ("", theLog);
}

TEST_F(ServiceRegistryTest, ACycleDropsTheRegistrationsButStartsTheOthers) {
    c.Needs(&a);
    const Registry registry = MakeRegistry({&a, &b, &c, &free});
    EXPECT_EQ(kNoErr, registry->InitServices());
    EXPECT_EQ(Texts{"ServiceRegistry: Service dependencies form a cycle."}, recorder.Texts(kDebugFatal));
    for (Service* service : {&a, &b, &c, &free}) EXPECT_FALSE(registry->HasService(service));
    EXPECT_EQ(kNoErr, registry->UninitServices());
    EXPECT_EQ("+F -F ", theLog);
}

TEST_F(ServiceRegistryTest, AFailedStartStaysHalfWay) {
    Service s1("1"), s2("2"), s3("3"), s4("4");
    s3.initResult = 77;
    const Registry registry = MakeRegistry({&s1, &s2, &s3, &s4});
    EXPECT_EQ(77, registry->InitServices());
    EXPECT_EQ(Texts{"ServiceRegistry: Service 3 init failed with error 77"}, recorder.Texts(kDebugInfo));
    EXPECT_EQ(kGenericErr, registry->AddService(&a));
    EXPECT_EQ(kNoErr, registry->UninitServices());
    EXPECT_EQ("+1 +2 +3 -2 -1 ", theLog);
}

TEST_F(ServiceRegistryTest, AFailedStopCanBeTriedAgain) {
    b.uninitResult = 9;
    const Registry registry = MakeRegistry({&a, &b, &c});
    registry->InitServices();
    EXPECT_EQ(9, registry->UninitServices());
    EXPECT_EQ(Texts{"ServiceRegistry: Service B uninit failed with error 9"}, recorder.Texts(kDebugInfo));
    EXPECT_EQ(kGenericErr, registry->AddService(&free));
    b.uninitResult = kNoErr;
    EXPECT_EQ(kNoErr, registry->UninitServices());
    EXPECT_EQ("+C +B +A -A -B -B -C ", theLog);
}

TEST_F(ServiceRegistryTest, DependencyListRefusesNullTooManyAndOutOfRange) {
    ServiceDependencyList list;
    list.AddDependency(nullptr);
    EXPECT_EQ(Texts{"Cannot add null service dependency to dependency list."}, recorder.Texts(kDebugWarning));
    list.AddDependency(&a);
    EXPECT_EQ(nullptr, list.GetAt(1));
    EXPECT_EQ(nullptr, list.GetAt(-1));
    EXPECT_EQ((Texts{"Service dependency index 1 not in range 0..1", "Service dependency index -1 not in range 0..1"}),
              recorder.Texts(kDebugFatal));
    recorder.Clear();
    for (int i = 1; i < 1024; ++i) list.AddDependency(&b);
    EXPECT_EQ(0u, recorder.Count());
    list.AddDependency(&c);
    EXPECT_EQ(Texts{"Too many service dependencies (1024)."}, recorder.Texts(kDebugFatal));
    EXPECT_EQ(1024, list.GetCount());
    EXPECT_EQ(&a, list.GetAt(0));
    EXPECT_EQ(&b, list.GetAt(1023));
}

// ---- the reference-counted base -------------------------------------------------------------------------------------

class Counted final : public RefcountedServiceObject_T<Counted> {
public:
    ~Counted() override { theLog += "~ "; }
    const char* GetName() override { return "Counted"; }
    void GetDependencies(IServiceDependencyList&) override {}
    static inline MgErr startResult = kNoErr;

protected:
    MgErr DoInit() override {
        theLog += "start ";
        EXPECT_EQ(kGenericErr, Init()) << "the start is still running";
        EXPECT_EQ(kNoErr, Uninit());
        return startResult;
    }
    MgErr DoUninit() override {
        theLog += "stop ";
        return 5;
    }
};

TEST(RefcountedServiceObject, TheFirstUseStartsAndTheLastEnds) {
    theLog.clear();
    Counted* const service = Counted::Object();
    EXPECT_EQ(service, Counted::Object());
    EXPECT_EQ(kGenericErr, service->Status());
    EXPECT_EQ(kNoErr, service->Init());
    EXPECT_EQ(kNoErr, service->Init());
    EXPECT_EQ(kNoErr, service->Uninit());
    EXPECT_EQ("start ", theLog);
    EXPECT_EQ(5, service->Uninit());
    EXPECT_EQ("start stop ~ ", theLog);

    Counted::startResult = 7;
    EXPECT_EQ(kGenericErr, Counted::Object()->Status());
    EXPECT_EQ(7, Counted::Object()->Init());
    EXPECT_EQ(7, Counted::Object()->Init()) << "a failed start keeps its error";
    EXPECT_EQ(2, Counted::Object()->UseCount());
    Counted::Object()->Uninit();
    Counted::Object()->Uninit();
}

}  // namespace
}  // namespace tessel

#include "support/Test.h"
#include <tessel/frame/ServiceRegistry.h>

#include <new>

namespace tessel::test {
namespace {

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
    MgErr initResult = kNoErr, uninitResult = kNoErr;

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
    EXPECT_EACH(registry->UninitServices() == kNoErr, registry->InitServices() == kNoErr,
                registry->UninitServices() == kNoErr);
}

TEST_F(ServiceRegistryTest, StartsDependenciesFirstAndStopsInReverse) {
    const std::vector<std::vector<IServiceObject*>> orders = {{&a, &b, &c}, {&a, &c, &b}, {&b, &a, &c},
                                                              {&b, &c, &a}, {&c, &a, &b}, {&c, &b, &a}};
    for (const auto& order : orders) {
        theLog.clear();
        const Registry registry = MakeRegistry(order);
        EXPECT_EACH(registry->InitServices() == kNoErr, registry->UninitServices() == kNoErr,
                    theLog == "+C +B +A -A -B -C ");
        EXPECT_EQ(kNoErr, registry->InitServices()) << "may be started again";
        EXPECT_EACH(registry->UninitServices() == kNoErr, theLog == "+C +B +A -A -B -C +C +B +A -A -B -C ");
    }
    EXPECT_EQ(Texts{}, recorder.Texts());
}

TEST_F(ServiceRegistryTest, OfThoseReadyTheFirstRegisteredGoesFirstAndOnce) {
    Service d("D"), e("E", {&d, &d});
    const Registry registry = MakeRegistry({&e, &a, &d, &free, &b, &c, &c});
    EXPECT_EACH(Texts{"ServiceRegistry: A service has already been registered that has the name \"C\"."} ==
                    recorder.Texts(kDebugFatal),
                registry->InitServices() == kNoErr, theLog == "+D +E +F +C +B +A ");
    registry->UninitServices();
}

TEST_F(ServiceRegistryTest, RegistrationIsRefusedWhileStarted) {
    const Registry registry = MakeRegistry({&c, &b});
    EXPECT_EACH(registry->AddService(nullptr) == kArgErr, registry->AddService(&c) == kArgErr,
                registry->RemoveService(nullptr) == kArgErr, registry->RemoveService(&a) == kArgErr,
                registry->InitServices() == kNoErr, registry->AddService(&a) == kGenericErr,
                registry->RemoveService(&b) == kGenericErr, registry->InitServices() == kGenericErr,
                registry->UninitServices() == kNoErr, registry->AddService(&a) == kNoErr, registry->HasService(&a),
                registry->RemoveService(&a) == kNoErr, !registry->HasService(&a), recorder.Texts() == Texts{});
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
        EXPECT_EACH(registry->AddService(&other_) == kGenericErr, registry->RemoveService(this) == kGenericErr,
                    registry->InitServices() == kGenericErr, registry->UninitServices() == kGenericErr);
        ++calls;
    }
    Service other_{"O"};
};

TEST_F(ServiceRegistryTest, AServiceCannotChangeARegistryThatIsStartingIt) {
    Meddler meddler;
    const Registry registry = MakeRegistry({&meddler, &free});
    meddler.registry = registry.get();
    EXPECT_EACH(registry->InitServices() == kNoErr, registry->UninitServices() == kNoErr, theLog == "+M +F -F -M ",
                meddler.calls == 3);
}

TEST_F(ServiceRegistryTest, ADependencyMayRunInAnotherRegistry) {
    const Registry lower = MakeRegistry({&c}), upper = MakeRegistry({&free, &b});
    const Texts missing = {"ServiceRegistry: Service \"B\" has a dependency \"C\" that does not exist!"};
    EXPECT_EACH(upper->InitServices() == kNoErr, missing == recorder.Texts(kDebugFatal));
    EXPECT_EQ("", theLog) << "nothing is started";

    lower->InitServices();
    EXPECT_EACH(upper->InitServices() == kNoErr, theLog == "+C +F +B ");
    upper->UninitServices();

    const Registry other = MakeRegistry({&c});
    c.initResult = Service::kThrows;
    EXPECT_EACH(other->InitServices() == kMemFullErr,
                recorder.Has(kDebugInfo, "ServiceRegistry: Service C init failed with error 2"));
    c.initResult = kNoErr;
    other->InitServices();
    other->UninitServices();
    EXPECT_EQ(kNoErr, upper->InitServices());
    EXPECT_EQ("+C +F +B -B -F +C +C -C +F +B ", theLog) << "C runs while one registry runs it";
    upper->UninitServices();

    lower->UninitServices();
    recorder.Clear();
    theLog.clear();
    EXPECT_EACH(upper->InitServices() == kNoErr, missing == recorder.Texts(kDebugFatal), theLog == "");
}

TEST_F(ServiceRegistryTest, ACycleDropsTheRegistrationsButStartsTheOthers) {
    c.Needs(&a);
    const Registry registry = MakeRegistry({&a, &b, &c, &free});
    EXPECT_EACH(registry->InitServices() == kNoErr,
                recorder.Texts(kDebugFatal) == Texts{"ServiceRegistry: Service dependencies form a cycle."});
    for (Service* service : {&a, &b, &c, &free}) EXPECT_FALSE(registry->HasService(service));
    EXPECT_EACH(registry->UninitServices() == kNoErr, theLog == "+F -F ");
}

TEST_F(ServiceRegistryTest, AFailedStartStaysHalfWayAndAFailedStopCanBeTriedAgain) {
    b.initResult = 77;
    const Registry registry = MakeRegistry({&a, &b, &c, &free});
    EXPECT_EACH(registry->InitServices() == 77, registry->AddService(&free) == kGenericErr,
                registry->UninitServices() == kNoErr, theLog == "+C +B -C ");
    b.initResult = kNoErr;
    b.uninitResult = 9;
    theLog.clear();
    EXPECT_EACH(registry->InitServices() == kNoErr, registry->UninitServices() == 9,
                registry->AddService(&free) == kGenericErr);
    b.uninitResult = kNoErr;
    EXPECT_EACH(registry->UninitServices() == kNoErr, theLog == "+C +B +A +F -F -A -B -B -C ",
                (Texts{"ServiceRegistry: Service B init failed with error 77",
                       "ServiceRegistry: Service B uninit failed with error 9"}) == recorder.Texts(kDebugInfo));
}

TEST_F(ServiceRegistryTest, DependencyListRefusesNullTooManyAndOutOfRange) {
    ServiceDependencyList list;
    list.AddDependency(nullptr);
    EXPECT_EQ(Texts{"Cannot add null service dependency to dependency list."}, recorder.Texts(kDebugWarning));
    list.AddDependency(&a);
    EXPECT_EACH(list.GetAt(1) == nullptr, list.GetAt(-1) == nullptr,
                recorder.Texts(kDebugFatal) == (Texts{"Service dependency index 1 not in range 0..1",
                                                      "Service dependency index -1 not in range 0..1"}));
    recorder.Clear();
    for (int i = 1; i < 1024; ++i) list.AddDependency(&b);
    EXPECT_EQ(0u, recorder.Count());
    list.AddDependency(&c);
    EXPECT_EACH(recorder.Texts(kDebugFatal) == Texts{"Too many service dependencies (1024)."}, list.GetCount() == 1024,
                &a == list.GetAt(0), &b == list.GetAt(1023));
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
    EXPECT_EACH(service == Counted::Object(), service->Status() == kGenericErr, service->Init() == kNoErr,
                service->Init() == kNoErr, service->Uninit() == kNoErr, theLog == "start ", service->Uninit() == 5,
                theLog == "start stop ~ ");

    Counted::startResult = 7;
    EXPECT_EACH(Counted::Object()->Status() == kGenericErr, Counted::Object()->Init() == 7);
    EXPECT_EQ(7, Counted::Object()->Init()) << "a failed start keeps its error";
    EXPECT_EQ(2, Counted::Object()->UseCount());
    Counted::Object()->Uninit();
    Counted::Object()->Uninit();
}

}  // namespace
}  // namespace tessel::test

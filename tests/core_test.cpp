#include <gtest/gtest.h>

#include <boost/lexical_cast.hpp>
#include <sstream>

#include "pells/core/check_memory.h"
#include "pells/core/class_name.h"
#include "pells/core/factory.h"
#include "pells/core/named_object.h"
#include "pells/core/prefs.h"
#include "pells/core/singleton.h"
#include "pells/core/smart_base.h"
#include "pells/core/strings.h"
#include "pells/core/version.h"
#include "support/test_prefs.h"

namespace {

using pells::Singleton;
using pells::SingletonList;
using pells::Version;

std::vector<std::string> deaths;

template <char Name>
class Tracked : public Singleton<Tracked<Name>> {
public:
    ~Tracked() override {
        deaths.push_back(std::string(1, Name));
        if (onDeath)
            onDeath();
    }

    static void (*onDeath)();
};

template <char Name>
void (*Tracked<Name>::onDeath)() = nullptr;

TEST(Singletons, AreFreedNewestFirstThoseMadeMeanwhileIncluded) {
    Tracked<'X'>& x = Tracked<'X'>::instance();
    EXPECT_EQ(&Tracked<'X'>::instance(), &x);
    Tracked<'Y'>::instance();
    Tracked<'Z'>::instance();
    Tracked<'Y'>::onDeath = [] { Tracked<'W'>::instance(); };

    SingletonList::freeSingletons();

    EXPECT_EQ(deaths, (std::vector<std::string>{"Z", "Y", "W", "X"}));
    EXPECT_FALSE(Tracked<'X'>::singleton);
    EXPECT_FALSE(Tracked<'W'>::singleton);
    EXPECT_FALSE(SingletonList::singleton);
}

TEST(Singletons, ThatAreDeletedDirectlyLeaveTheListAndComeBack) {
    Tracked<'A'>::instance();
    Tracked<'B'>::instance();
    delete Tracked<'A'>::singleton;
    EXPECT_FALSE(Tracked<'A'>::singleton);
    Tracked<'A'>::instance();  // now the newest
    Tracked<'B'>::instance().deleteSelf();
    Tracked<'B'>::instance();

    SingletonList::freeSingletons();

    EXPECT_EQ(deaths, (std::vector<std::string>{"A", "B", "B", "A"}));
}

class Throwing : public Singleton<Throwing> {
public:
    Throwing() {
        if (attempts++ == 0)
            throw std::runtime_error("not yet");
    }
    static int attempts;
};
int Throwing::attempts = 0;

TEST(Singletons, WhoseConstructorThrowsAreTriedAgain) {
    EXPECT_THROW(Throwing::instance(), std::runtime_error);
    EXPECT_FALSE(Throwing::singleton);
    EXPECT_NO_THROW(Throwing::instance());
    SingletonList::freeSingletons();
    EXPECT_FALSE(Throwing::singleton);
}

class Stubborn : public pells::SingletonBase {
public:
    void deleteSelf() override { ++calls; }
    int calls = 0;
};

TEST(SingletonList, CallsAnEntryThatDoesNotRemoveItselfOnce) {
    Stubborn stubborn;
    SingletonList::addSingleton(&stubborn);
    SingletonList::freeSingletons();
    EXPECT_EQ(stubborn.calls, 1);
    SingletonList::freeSingletons();  // nothing tracked: the list comes and goes
    EXPECT_FALSE(SingletonList::singleton);
}

class Part : public pells::NamedObject<Part> {
public:
    explicit Part(const std::string& partName) : NamedObject(partName) {}
};

TEST(NamedObjects, KeepTheFirstOfANameUntilAnyOfThatNameDies) {
    Part first("n");
    {
        Part second("n");
        EXPECT_EQ(Part::findp("n"), &first);
    }
    EXPECT_EQ(Part::findp("n"), nullptr);
    EXPECT_THROW(Part::find("n"), Part::NotFound);
}

TEST(NamedObjects, ThatAreForgottenLeaveTheirSuccessorAlone) {
    auto old = std::make_unique<Part>("n");
    Part::forget("n");
    Part::forget("n");
    const Part successor("n");
    old.reset();
    EXPECT_EQ(&Part::find("n"), &successor);
}

TEST(NamedObjects, AreListedInNameOrder) {
    EXPECT_TRUE(Part::getAll().empty());
    Part b("b");
    Part a("a");
    EXPECT_EQ(Part::getAll(), (std::vector<Part*>{&a, &b}));
    EXPECT_EQ((std::vector<Part*>(Part::begin(), Part::end())), Part::getAll());
}

class OnDemand : public pells::DemandNamedObject<OnDemand> {
public:
    explicit OnDemand(const std::string& objectName) : DemandNamedObject(objectName) {}
};

TEST(DemandNamedObjects, AreMadeByTheFirstLookUp) {
    OnDemand& made = OnDemand::find("n");
    EXPECT_EQ(made.getName(), "n");
    EXPECT_EQ(OnDemand::findp("n"), &made);
    delete &made;
}

class Shape {
public:
    virtual ~Shape() = default;
};
class Circle : public Shape {};
class Tool {
public:
    virtual ~Tool() = default;
};

TEST(Factories, CreateByNameForTheirOwnBaseOnly) {
    typedef pells::AbstractFactory<Shape> ShapeFactory;
    const std::string undeclared = std::string("** No declared Factory<") + typeid(Shape).name() +
                                   ", " + typeid(Circle).name() + ">! **";
    {
        const pells::Factory<Shape, Circle> factory("circle");
        const std::unique_ptr<Shape> one(ShapeFactory::createByName("circle"));
        const std::unique_ptr<Shape> other(ShapeFactory::createByName("circle"));
        EXPECT_TRUE(dynamic_cast<Circle*>(one.get()));
        EXPECT_NE(one, other);
        EXPECT_EQ(ShapeFactory::classNameOf(typeid(Circle).name()), "circle");
        EXPECT_EQ(pells::AbstractFactory<Tool>::createByName("circle"), nullptr);
        EXPECT_TRUE(pells::AbstractFactory<Tool>::findCreator("circle").empty());
    }
    EXPECT_EQ(ShapeFactory::createByName("circle"), nullptr);
    EXPECT_EQ(ShapeFactory::classNameOf(typeid(Circle).name()), undeclared);
}

TEST(Factories, OfOneClassNameShareTheFateOfTheEntry) {
    const pells::Factory<Shape, Circle> first("circle");
    {
        const pells::Factory<Shape, Shape> second("circle");
        const std::unique_ptr<Shape> made(pells::AbstractFactory<Shape>::createByName("circle"));
        EXPECT_TRUE(dynamic_cast<Circle*>(made.get()));
    }
    EXPECT_EQ(pells::AbstractFactory<Shape>::createByName("circle"), nullptr);
}

TEST(Prefs, WithoutAFactoryAreMissedByEveryCall) {
    EXPECT_EQ(pells::Prefs::instance().getString("absent"), "");
    pells::SingletonList::freeSingletons();
    pells::FactoryByName::forget("Prefs");
    EXPECT_THROW(pells::Prefs::instance(), pells::Prefs::NoImplementation);
    EXPECT_THROW(pells::Prefs::instance(), pells::Prefs::NoImplementation);
    EXPECT_FALSE(pells::Prefs::singleton);
}

class Counted : public pells::smart_base {
public:
    ~Counted() override { ++destroyed; }
    static int destroyed;
};
int Counted::destroyed = 0;

TEST(SmartBase, DiesWithItsLastPointerAndCopiesStartUncounted) {
    boost::intrusive_ptr<Counted> first(new Counted);
    {
        const boost::intrusive_ptr<Counted> copy(new Counted(*first));
        *copy = *first;
    }
    EXPECT_EQ(Counted::destroyed, 1);
    const boost::intrusive_ptr<Counted> second(first);
    first.reset();
    EXPECT_EQ(Counted::destroyed, 1);
}

TEST(Version, ReadsOneOrTwoNumbersOfSixteenBits) {
    const struct {
        const char* text;
        const char* printed;
    } good[] = {{"2", "2.0"},           {"1.5", "1.5"},      {"-1.-2", "-1.-2"},
                {"32767.0", "32767.0"}, {"007.010", "7.10"}, {"-32768", "-32768.0"}};
    for (const auto& each : good) {
        std::ostringstream out;
        out << Version(std::string(each.text));
        EXPECT_EQ(out.str(), each.printed);
    }
    for (const char* bad : {"", ".", "1.", ".5", "1.5.3", "32768", "1.99999", "a", " 1", "1 "})
        EXPECT_THROW(Version{std::string(bad)}, boost::bad_lexical_cast) << bad;
}

TEST(Version, IsOrderedByMajorThenMinorNumber) {
    const Version ascending[] = {{-1, 0}, {0, -1}, {0, 0}, {1, 9}, {2, 0}};
    for (std::size_t i = 0; i < std::size(ascending); ++i) {
        for (std::size_t j = 0; j < std::size(ascending); ++j) {
            const Version& a = ascending[i];
            const Version& b = ascending[j];
            EXPECT_EQ(a < b, i < j);
            EXPECT_EQ(a <= b, i <= j);
            EXPECT_EQ(a == b, i == j);
            EXPECT_EQ(a != b, i != j);
            EXPECT_EQ(a >= b, i >= j);
            EXPECT_EQ(a > b, i > j);
        }
    }
    EXPECT_EQ(Version(Version::Pair(3, 4)).getPair(), Version::Pair(3, 4));
}

TEST(StringSplit, GivesTheNonEmptyPieces) {
    const struct {
        const char* text;
        const char* separators;
        std::vector<std::string> pieces;
    } cases[] = {{",,a,,b,", ",", {"a", "b"}},       {"", ",", {}},        {",,", ",", {}},
                 {"a b\tc", " \t", {"a", "b", "c"}}, {"a b", "", {"a b"}}, {"", "", {}}};
    std::vector<std::string> out{"left over"};
    for (const auto& each : cases) {
        EXPECT_EQ(pells::string_split(each.text, each.separators, out), each.pieces.size());
        EXPECT_EQ(out, each.pieces) << each.text;
    }
    out = {"x,y"};
    EXPECT_EQ(pells::string_split(out[0], ",", out), 2u);
    EXPECT_EQ(out[1], "y");
}

TEST(SingularName, FollowsTheLastLetters) {
    const std::pair<const char*, const char*> cases[] = {{"categories", "category"},
                                                         {"entries", "entry"},
                                                         {"files", "file"},
                                                         {"classes", "classe"},
                                                         {"stack", "stackItem"},
                                                         {"series", "sery"},
                                                         {"ies", "y"},
                                                         {"es", "e"},
                                                         {"s", ""},
                                                         {"imageEntries", "imageEntry"},
                                                         {"", "Item"}};
    for (const auto& each : cases)
        EXPECT_EQ(pells::getSingularName(each.first), each.second);
}

TEST(ClassName, DropsTheLibrarysNamespaceOnly) {
    EXPECT_EQ(pells::className(typeid(pells::Prefs)), "Prefs");
    EXPECT_EQ(pells::className(typeid(pells::AbstractFactory<pells::Prefs>)),
              "AbstractFactory<Prefs>");
    EXPECT_EQ(pells::className(typeid(pells_test::TestPrefs)), "pells_test::TestPrefs");
}

TEST(CheckMemory, KeepsQuiet) {
    pells::CheckMemory::startMemCheck();
    pells::CheckMemory::breakAt(7);
    pells::CheckMemory::dumpMemory("absent");
    pells::CheckMemory::setMemTracking("here");
    pells::CheckMemory::setMemTracking("here");
    pells::CheckMemory::removeMemTracking("here");
    pells::CheckMemory::removeMemTracking("here");
}

}  // namespace

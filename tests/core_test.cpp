#include <boost/lexical_cast.hpp>
#include <sstream>

#include "pells/core/class_name.h"
#include "pells/core/factory.h"
#include "pells/core/named_object.h"
#include "pells/core/prefs.h"
#include "pells/core/singleton.h"
#include "pells/core/smart_base.h"
#include "pells/core/strings.h"
#include "pells/core/version.h"
#include "support/test_prefs.h"

using namespace pells;
using pells_test::Lines;

namespace {

std::string deaths;

template <char Name>
class Tracked : public Singleton<Tracked<Name>> {
public:
    ~Tracked() override {
        deaths += Name;
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
    EXPECT_EQ(deaths, "ZYWX");
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
    deaths.clear();
    SingletonList::freeSingletons();
    EXPECT_EQ(deaths, "BA");
}

struct Stubborn : SingletonBase {
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

struct Part : NamedObject<Part> {
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
    Part successor("n");
    old.reset();
    EXPECT_EQ(&Part::find("n"), &successor);
    Part a("a");
    EXPECT_EQ(Part::getAll(), (std::vector<Part*>{&a, &successor})) << "in name order";
    EXPECT_EQ((std::vector<Part*>(Part::begin(), Part::end())), Part::getAll());
}

struct Shape {
    virtual ~Shape() = default;
};
struct Circle : Shape {};
struct Tool {
    virtual ~Tool() = default;
};

TEST(Factories, CreateByNameForTheirOwnBaseUntilOneOfTheNameDies) {
    typedef AbstractFactory<Shape> ShapeFactory;
    const std::string undeclared = std::string("** No declared Factory<") + typeid(Shape).name() +
                                   ", " + typeid(Circle).name() + ">! **";
    {
        const Factory<Shape, Circle> factory("circle");
        {
            const Factory<Shape, Shape> second("circle");
            const std::unique_ptr<Shape> one(ShapeFactory::createByName("circle"));
            const std::unique_ptr<Shape> other(ShapeFactory::createByName("circle"));
            EXPECT_TRUE(dynamic_cast<Circle*>(one.get()));
            EXPECT_NE(one, other);
            EXPECT_EQ(AbstractFactory<Tool>::createByName("circle"), nullptr);
            EXPECT_TRUE(AbstractFactory<Tool>::findCreator("circle").empty());
        }
        EXPECT_EQ(ShapeFactory::createByName("circle"), nullptr);
        EXPECT_EQ(ShapeFactory::classNameOf(typeid(Circle).name()), "circle");
    }
    EXPECT_EQ(ShapeFactory::classNameOf(typeid(Circle).name()), undeclared);
}

struct CircleAndToolFactory : Factory<Shape, Circle>, Factory<Tool, Tool> {
    CircleAndToolFactory() : Factory<Shape, Circle>("circle"), Factory<Tool, Tool>("tool") {}
};

TEST(Factories, OfSeveralBasesAnswerUnderAnyOfTheirNames) {
    const CircleAndToolFactory factory;
    for (const char* const name : {"circle", "tool"}) {
        EXPECT_TRUE(std::unique_ptr<Shape>(AbstractFactory<Shape>::createByName(name))) << name;
        EXPECT_TRUE(std::unique_ptr<Tool>(AbstractFactory<Tool>::createByName(name))) << name;
    }
}

struct Counted : smart_base {
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

TEST(Versions, ReadOneOrTwoNumbersOfSixteenBits) {
    const std::pair<const char*, const char*> good[] = {
        {"2", "2.0"},           {"1.5", "1.5"},      {"-1.-2", "-1.-2"},
        {"32767.0", "32767.0"}, {"007.010", "7.10"}, {"-32768", "-32768.0"}};
    for (const auto& each : good) {
        std::ostringstream out;
        out << Version(std::string(each.first));
        EXPECT_EQ(out.str(), each.second);
    }
    for (const char* bad : {"", ".", "1.", ".5", "1.5.3", "32768", "1.99999", "a", " 1", "1 "})
        EXPECT_THROW(Version{std::string(bad)}, boost::bad_lexical_cast) << bad;
    EXPECT_EQ(Version(Version::Pair(3, 4)).getPair(), Version::Pair(3, 4));
}

TEST(Versions, AreOrderedByMajorThenMinorNumber) {
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
}

TEST(Strings, SplitIntoTheirNonEmptyPieces) {
    const struct {
        const char* text;
        const char* separators;
        Lines pieces;
    } cases[] = {{",,a,,b,", ",", {"a", "b"}},       {"", ",", {}},        {",,", ",", {}},
                 {"a b\tc", " \t", {"a", "b", "c"}}, {"a b", "", {"a b"}}, {"", "", {}}};
    Lines out{"left over"};
    for (const auto& each : cases) {
        EXPECT_EQ(string_split(each.text, each.separators, out), each.pieces.size());
        EXPECT_EQ(out, each.pieces) << each.text;
    }
    out = {"x,y"};
    EXPECT_EQ(string_split(out[0], ",", out), 2u);
    EXPECT_EQ(out[1], "y");
}

TEST(Strings, HaveASingularThatFollowsTheLastLetters) {
    const std::pair<const char*, const char*> cases[] = {{"categories", "category"},
                                                         {"files", "file"},
                                                         {"classes", "classe"},
                                                         {"stack", "stackItem"},
                                                         {"ies", "y"},
                                                         {"es", "e"},
                                                         {"s", ""},
                                                         {"", "Item"},
                                                         {"imageEntries", "imageEntry"}};
    for (const auto& each : cases)
        EXPECT_EQ(getSingularName(each.first), each.second);
}

TEST(ClassName, DropsTheLibrarysNamespaceOnly) {
    EXPECT_EQ(className(typeid(Prefs)), "Prefs");
    EXPECT_EQ(className(typeid(AbstractFactory<Prefs>)), "AbstractFactory<Prefs>");
    EXPECT_EQ(className(typeid(pells_test::TestPrefs)), "pells_test::TestPrefs");
}

}  // namespace

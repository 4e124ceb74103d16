#include <boost/lexical_cast.hpp>
#include <boost/smart_ptr/intrusive_ptr.hpp>
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

namespace mypells {
struct Inner {};
}  // namespace mypells

using namespace pells;
using pells_test::Lines;

namespace {

std::string deaths;

template <char Name>
class Tracked : public Singleton<Tracked<Name>> {
public:
    ~Tracked() override {
        deaths += Name;
        if constexpr (Name == 'Y')
            Tracked<'W'>::instance();
    }
};

struct Stubborn : SingletonBase {
    void deleteSelf() override { deaths += '!'; }
};

TEST(Singletons, AreFreedOnceNewestFirstThoseMadeMeanwhileIncluded) {
    Tracked<'X'>& x = Tracked<'X'>::instance();
    EXPECT_EQ(&Tracked<'X'>::instance(), &x);
    Stubborn stays;
    SingletonList::addSingleton(&stays);
    SingletonList::addSingleton(&stays);
    Tracked<'Y'>::instance();
    Tracked<'Z'>::instance();
    delete Tracked<'X'>::singleton;
    EXPECT_FALSE(Tracked<'X'>::singleton);
    Tracked<'X'>::instance();
    Tracked<'Z'>::instance().deleteSelf();
    deaths.clear();
    SingletonList::freeSingletons();
    EXPECT_EQ(deaths, "XYW!") << "X came back as the newest, and the death of Y makes W";
    EXPECT_FALSE(Tracked<'W'>::singleton);
    EXPECT_FALSE(SingletonList::singleton);
}

struct Part : NamedObject<Part> {
    explicit Part(const std::string& partName) : NamedObject(partName) {}
};

TEST(NamedObjects, KeepTheFirstOfANameUntilOneOfThatNameDiesThatIsNotForgotten) {
    auto forgotten = std::make_unique<Part>("n");
    Part::forget("n");
    Part::forget("n");
    Part first("n");
    forgotten.reset();
    Part a("a");
    {
        const Part second("n");
        EXPECT_EQ(&Part::find("n"), &first);
        EXPECT_EQ(Part::getAll(), (std::vector<Part*>{&a, &first})) << "in name order";
    }
    EXPECT_EQ(Part::findp("n"), nullptr);
    EXPECT_THROW(Part::find("n"), Part::NotFound);
}

struct Counted : smart_base {
    ~Counted() override { deaths += 'c'; }
};

TEST(Factories, CreateByNameForTheirOwnBaseUntilOneOfTheNameDies) {
    typedef AbstractFactory<smart_base> Factories;
    const std::string type = typeid(Counted).name();
    {
        const Factory<smart_base, Counted> factory("counted");
        {
            const Factory<Prefs, pells_test::TestPrefs> second("counted");
            const boost::intrusive_ptr<smart_base> made(Factories::createByName("counted"));
            EXPECT_TRUE(dynamic_cast<Counted*>(made.get()));
            EXPECT_EQ(AbstractFactory<Prefs>::createByName("counted"), nullptr);
        }
        EXPECT_EQ(Factories::createByName("counted"), nullptr);
        EXPECT_EQ(Factories::classNameOf(type), "counted");
    }
    EXPECT_EQ(Factories::classNameOf(type), std::string("** No declared Factory<") +
                                                typeid(smart_base).name() + ", " + type + ">! **");
}

TEST(SmartBase, DiesWithItsLastPointerAndCopiesStartUncounted) {
    deaths.clear();
    boost::intrusive_ptr<Counted> first(new Counted);
    {
        const boost::intrusive_ptr<Counted> copy(new Counted(*first));
        *copy = *first;
    }
    EXPECT_EQ(deaths, "c");
    const boost::intrusive_ptr<Counted> second(first);
    first.reset();
    EXPECT_EQ(deaths, "c");
}

TEST(Versions, ReadOneOrTwoNumbersOfSixteenBits) {
    std::ostringstream out;
    for (const std::string good : {"2", "-1.-2", "32767.010"})
        out << Version(good) << ' ';
    EXPECT_EQ(out.str(), "2.0 -1.-2 32767.10 ");
    for (const std::string bad : {"", "1.", ".5", "1.5.3", "1..5", "32768", "1.99999", "a", " 1"})
        EXPECT_THROW(Version{bad}, boost::bad_lexical_cast) << bad;
}

TEST(Versions, AreOrderedByMajorThenMinorNumber) {
    const Version low(-1, 9);
    const Version high(Version::Pair(0, -2));
    EXPECT_LT(low, high);
    EXPECT_LE(high, Version());
    EXPECT_GT(high, low);
    EXPECT_GE(low, low);
    EXPECT_FALSE(low < low || low > low || high <= low || low >= high || low == high);
}

TEST(Strings, SplitIntoTheirNonEmptyPieces) {
    Lines out{"left over"};
    EXPECT_EQ(string_split(",,a\t,b,", "\t,", out), 2u);
    EXPECT_EQ(out, (Lines{"a", "b"}));
    EXPECT_EQ(string_split("a b", "", out), 1u);
    EXPECT_EQ(string_split(out[0], " ", out), 2u) << "the output may hold the text";
    EXPECT_EQ(out, (Lines{"a", "b"}));
    EXPECT_EQ(string_split(",", ",", out), 0u);
}

TEST(Strings, HaveASingularThatFollowsTheLastLetters) {
    EXPECT_EQ(getSingularName("categories"), "category");
    EXPECT_EQ(getSingularName("classes"), "classe");
    EXPECT_EQ(getSingularName("stack"), "stackItem");
    EXPECT_EQ(getSingularName("ies"), "y");
    EXPECT_EQ(getSingularName("s"), "");
    EXPECT_EQ(getSingularName(""), "Item");
}

TEST(CheckMemory, TakesAnyNameWithoutAnAllocatorThatCounts) {
    CheckMemory::startMemCheck();
    CheckMemory::breakAt(7);
    CheckMemory::removeMemTracking("none");
    CheckMemory::setMemTracking("some");
    CheckMemory::dumpMemory("some");
    CheckMemory::removeMemTracking("some");
}

TEST(ClassName, LosesTheOutermostNamespaceOfTheLibraryAlone) {
    EXPECT_EQ(className(typeid(smart_base)), "smart_base");
    EXPECT_EQ(className(typeid(mypells::Inner)), "mypells::Inner");
    EXPECT_EQ(className(typeid(std::pair<smart_base, mypells::Inner>)),
              "std::pair<smart_base, mypells::Inner>");
}

TEST(Errors, SayInWordsWhatIsMissing) {
    EXPECT_STREQ(NamedObject<FactoryByName>::NotFound().what(),
                 "no object is registered under the name");
}

}  // namespace

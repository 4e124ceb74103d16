#include <cmath>
#include <cstring>
#include <iomanip>
#include <locale>
#include <random>
#include <set>
#include <sstream>

#include "pells/core/named_object.h"
#include "pells/log/log.h"
#include "pells/serial/enum.h"
#include "pells/serial/member_field.h"
#include "support/documents.h"
#include "support/test_prefs.h"

using namespace pells;
using namespace pells_test;

namespace {

using boost::intrusive_ptr;

/// Members of every type that is written as text or attributes.
struct Values : Serializable {
    float x = 7;
    double d = 7;
    bool b = true;
    int i = 7;
    unsigned u = 7;
    long long l = 7;
    std::string s = "old";
    Color c{1, 0.5f, 0.25f, 1};

    intrusive_ptr<Field> getField(const std::string& name) override {
        return makeComposite(name,
                             ClassDesc(Serializable::getField("super"), makeField("x", &Values::x),
                                       makeField("d", &Values::d), makeField("b", &Values::b),
                                       makeField("i", &Values::i), makeField("u", &Values::u),
                                       makeField("l", &Values::l), makeField("s", &Values::s),
                                       makeField("c", &Values::c)));
    }
};

/// The saved lines that differ from those of fresh values.
std::string changes(Values& values) {
    Values fresh;
    std::istringstream before(saved(fresh));
    std::istringstream after(saved(values));
    std::string found;
    for (std::string was, is; std::getline(before, was) && std::getline(after, is);)
        found += was == is ? "" : is.substr(4);
    return found;
}

class SerialTest : public LibraryTest {};

TEST_F(SerialTest, ReadsValuesFromTextAndAttributesAndNamesWhatIsWrong) {
    const char scan[] = "Failed to scan text value";
    const char close[] = "Malformed XML: bad close tag";
    const char end[] = "Malformed XML: premature EOF";
    const struct {
        const char* content;
        const char* change;
        const char* message;
    } cases[] = {
        {"ignored<super><x>1</x></super><x></x><x/><i/><x>abc</x><s></s>", "", ""},
        {"<x>1e999</x><x>1e</x><x>inf</x><x>-nan</x><b>true</b><b>false</b><b>2</b>", "", ""},
        {"<i>2147483648</i><u>-1</u><u>4294967296</u><l>9223372036854775808</l>", "", ""},
        {"<x>1</x><x>  2.5\t\n\v\f\r </x><i> -12 </i><s/>", "<x>2.5</x><i>-12</i><s></s>", ""},
        {"<x>1<y/>2<!-- -->5</x><b> 00\n</b><i>+12</i>", "<x>25</x><b>0</b><i>12</i>", ""},
        {"<x>+.5e+1</x><d>-1.</d>", "<x>5</x><d>-1</d>", ""},
        {"<x>0.333333343</x><d>1e300</d>", "<x>0.333333</x><d>1e+300</d>", ""},
        {"<x>16777217e0</x><u>4294967295</u><l>-9223372036854775808</l>",
         "<x>1.67772e+07</x><u>4294967295</u><l>-9223372036854775808</l>", ""},
        {"<s>  a &lt; b  </s>", "<s>a &lt; b  </s>", ""},
        {"<s class='x'>one<b/>two</s>", "<s>two</s>", ""},
        {"<c r=' 0.5 ' g='x' b='' extra='1' a='0.123456789'>1<x><y/></x></c>",
         "<c a=\"0.123457\" b=\"0.25\" g=\"0.5\" r=\"0.5\"/>", ""},
        {"<x>2.5\xA0</x>", "<x>2.5</x>", scan},
        {"<x>2.5cm</x>", "<x>2.5</x>", scan},
        {"<x>1.2.3</x>", "<x>1.2</x>", scan},
        {"<x>0x10</x>", "<x>0</x>", scan},
        {"<x>1,5</x>", "<x>1</x>", scan},
        {"<i>1.5</i>", "<i>1</i>", scan},
        {"<b>0 1</b>", "<b>0</b>", scan},
        {"<c r='0.5' g='1.0.0'/>", "", scan},
        {"<s>new</s", "<s>new</s>", end},
        {"<s>new&", "<s>new</s>", end},
        {"<s>new", "<s>new</s>", close},
        {"</rot>", "", close},
        {"<none><x></none></x>", "", close},
        {"<none><x>&", "", end},
        {"<!DOCTYPE x>", "", end},
    };
    for (const auto& each : cases) {
        Values values;
        EXPECT_EQ(failure(values, "<root x='1'>" + std::string(each.content) + "</root>"),
                  each.message)
            << each.content;
        EXPECT_EQ(changes(values), each.change) << each.content;
    }
    Values values;
    load(values, "<root/>");
    EXPECT_EQ(changes(values), "");
}

struct Base : Serializable {
    bool y = true;

    intrusive_ptr<Field> getField(const std::string& name) override {
        return makeComposite(name,
                             ClassDesc(Serializable::getField("super"), makeField("y", &Base::y)));
    }
};

struct Derived : Base {
    float x = 0.5f;
    std::string s = "hi";

    intrusive_ptr<Field> getField(const std::string& name) override {
        return makeComposite(name, ClassDesc(Base::getField("super"), makeField("x", &Derived::x),
                                             makeField("s", &Derived::s)));
    }
};

TEST_F(SerialTest, SavesTheBaseFirstAndLoadsInAnyOrder) {
    Derived object;
    EXPECT_EQ(saved(object),
              "<root>\n    <super>\n        <y>1</y>\n    </super>\n    <x>0.5</x>\n"
              "    <s>hi</s>\n</root>\n");
    EXPECT_EQ(logLines().at(0), "mac: FieldPtr less being called.");
    load(object, "<root><s>a&amp;b</s><x>2</x><super><y>0</y></super></root>");
    EXPECT_EQ(compact(saved(object)), "<root><super><y>0</y></super><x>2</x><s>a&amp;b</s></root>");
}

TEST_F(SerialTest, LogsEveryTokenAndWhatItDoesNotKnow) {
    prefs() = {{"log", "load error"}};
    Derived object;
    load(object, "<root><one a='1'><two/></one><x>1</x><one/></root>");
    EXPECT_EQ(
        logLines(),
        (Lines{"load: Processing Token: 2 (T_OPEN) <one a=\"1\">",
               "load.warn: Unrecognized tag <one>", "load.warn:     valid ones are:",
               "load.warn:     <s>", "load.warn:     <super>", "load.warn:     <x>",
               "load: Processing Token: 1 (T_SINGLE) <two/>", "load.warn: Unrecognized tag <two/>",
               "load.warn:     valid ones are:", "load: Processing Token: 3 (T_CLOSE) </one>",
               "load: Processing Token: 2 (T_OPEN) <x>", "load: Processing Token: 4 (T_TEXT) \"1\"",
               "load: Processing Token: 3 (T_CLOSE) </x>",
               "load: Processing Token: 1 (T_SINGLE) <one/>", "load.warn: Unrecognized tag <one/>",
               "load: Processing Token: 3 (T_CLOSE) </root>"}));
}

/// An unrecognised element at any depth warns of its own names once, as the ones around it do.
TEST_F(SerialTest, WarnsOncePerElementAtEveryDepth) {
    prefs() = {{"log", "load.warn log.dumptags"}};
    Derived object;
    load(object, "<root><x><a><b/><c><d/><e>t</e></c><f/></a><g/></x><h/></root>");
    Log::instance().dumpTags();
    const std::string line = "Unrecognized tag ";
    const std::string list = "    valid ones are:";
    EXPECT_EQ(logLines("load.warn: "),
              (Lines{line + "<a>", list, "    <>", line + "<b/>", list, line + "<c>", line + "<d/>",
                     list, line + "<e>", line + "<f/>", line + "<g/>", line + "<h/>", list,
                     "    <s>", "    <super>", "    <x>"}));
    // Each place that logs asks for its tag once, and each probe asks for its own.
    EXPECT_EQ(logLines("log.dumptags: "),
              (Lines{"available log message tags:", "off   1  load", "on    3  load.warn",
                     "on    1  log.dumptags", "off   1  log.flush", "off  15  time.detail.parser",
                     "-- end of log tags --"}));
}

struct Undescribed : Serializable {};

TEST_F(SerialTest, LogsItsErrors) {
    Undescribed mute;
    EXPECT_THROW(saved(mute), Serializable::LoadFail);
    EXPECT_EQ(failure(mute, "<root/>"), "No load() method");
    Values values;
    for (const char* bad : {"<root><x>1</root>", "<root><none><deep></none></root>",
                            "<root><x>1</x>", "<root><none><deep>"})
        failure(values, bad);
    const std::vector<Serializable::SaveFail> copies(2, Serializable::SaveFail("full"));
    EXPECT_STREQ(copies[1].what(), "full");
    const std::string where =
        "(anonymous namespace)::Undescribed must override either Serializable::";
    EXPECT_EQ(
        logLines("error: "),
        (Lines{where + "save() or Serializable::getField()!", "LoadFail: No save() method",
               where + "load() or Serializable::getField()!", "LoadFail: No load() method",
               "Malformed XML: <x> paired with </root>", "LoadFail: Malformed XML: bad close tag",
               "Malformed XML: <deep> paired with </none>",
               "LoadFail: Malformed XML: bad close tag",
               "Malformed XML! Reached EOF without seeing close </root>",
               "LoadFail: Malformed XML: premature EOF",
               "Malformed XML! Reached EOF without seeing close </deep>",
               "LoadFail: Malformed XML: premature EOF", "SaveFail: full"}));
}

struct Shape : Serializable {
    static std::set<Shape*> alive;
    std::string title;

    Shape() { alive.insert(this); }
    ~Shape() override { alive.erase(this); }
    Shape(const Shape&) = delete;
    Shape& operator=(const Shape&) = delete;
    intrusive_ptr<Field> getField(const std::string& name) override {
        return makeComposite(name, ClassDesc(makeField("title", &Shape::title)));
    }
};
std::set<Shape*> Shape::alive;
class Circle : public Shape {};
class Square : public Shape {};

struct Step : Serializable, smart_base {
    int number = 0;
    intrusive_ptr<Field> getField(const std::string& name) override {
        return makeComposite(name, ClassDesc(makeField("number", &Step::number)));
    }
};

const SerializableFactory<Circle> circleFactory("Circle");
const SerializableFactory<Step> stepFactory("Step");
const SerializableFactory<Values> valuesFactory("Values");

struct Drawing : Serializable {
    Shape* shape = nullptr;
    intrusive_ptr<Step> step;
    std::vector<Shape*> shapes;
    std::vector<intrusive_ptr<Step>> stack;
    Derived nested;
    std::vector<Derived> entries;
    std::vector<float> sizes;
    std::vector<std::string> names;
    std::vector<std::vector<int>> rows;

    Drawing() = default;
    Drawing(const Drawing&) = delete;
    Drawing& operator=(const Drawing&) = delete;
    ~Drawing() override {
        delete shape;
        for (Shape* each : shapes)
            delete each;
    }
    intrusive_ptr<Field> getField(const std::string& name) override {
        return makeComposite(
            name,
            ClassDesc(makeField("shape", &Drawing::shape), makeField("step", &Drawing::step),
                      makeField("shapes", &Drawing::shapes), makeField("stack", &Drawing::stack),
                      makeField("nested", &Drawing::nested),
                      makeField("entries", &Drawing::entries), makeField("sizes", &Drawing::sizes),
                      makeField("names", &Drawing::names), makeField("rows", &Drawing::rows)));
    }
};

const std::string fullDrawing =
    "<root><shape class=\"Circle\"><title>big</title></shape>"
    "<step class=\"Step\"><number>3</number></step>"
    "<shapes><shape class=\"Circle\"><title>small</title></shape></shapes>"
    "<stack><stackItem class=\"Step\"><number>4</number></stackItem></stack>"
    "<nested><super><y>0</y></super><x>2</x><s>in</s></nested>"
    "<entries><entry><super><y>1</y></super><x>0.5</x><s>hi</s></entry></entries>"
    "<sizes><size>0.5</size><size>-3</size></sizes><names><name>a</name></names>"
    "<rows><row><rowItem>1</rowItem><rowItem>2</rowItem></row><row/></rows></root>";

TEST_F(SerialTest, RoundTripsObjectsPointersAndSequences) {
    Drawing drawing;
    load(drawing, fullDrawing);
    EXPECT_EQ(compact(saved(drawing)), fullDrawing);

    drawing.shapes.push_back(nullptr);
    EXPECT_EQ(compact(saved(drawing)), fullDrawing);
    load(drawing, "<root><sizes>text<size>8</size><other>9</other></sizes><shapes/></root>");
    EXPECT_EQ(drawing.sizes, (std::vector<float>{0.5, -3, 8}));
    EXPECT_EQ(drawing.shapes.size(), 2u);
}

TEST_F(SerialTest, MakesOnlyObjectsOfTheRightClass) {
    {
        Drawing drawing;
        const std::string end = "' in element <shape>";
        EXPECT_EQ(failure(drawing,
                          "<root><shape class='Circle'><title>t</title></shape><shapes>"
                          "<shape class='None'/></shapes></root>"),
                  "Bad class='None" + end);
        EXPECT_EQ(drawing.shapes, std::vector<Shape*>{nullptr});
        EXPECT_EQ(drawing.shape->title, "t");
        delete drawing.shape;
        EXPECT_EQ(failure(drawing, "<root><shape class='Values'/></root>"),
                  "Bad class='Values" + end);
        EXPECT_EQ(drawing.shape, nullptr);
        EXPECT_EQ(failure(drawing, "<root><shape/></root>"), "Bad class='" + end);

        drawing.shape = new Square;
        const std::string document = saved(drawing);
        EXPECT_NE(document.find("<shape class=\"** No declared Factory&lt;" +
                                std::string(typeid(Serializable).name()) + ", " +
                                typeid(Square).name() + ">! **\">"),
                  std::string::npos)
            << document;
    }
    EXPECT_TRUE(Shape::alive.empty());
}

/// Whatever happens to its bytes, a document is loaded or refused with a LoadFail.
TEST(Documents, SurviveEveryCutAndEveryFlippedByte) {
    for (std::size_t at = 0; at < fullDrawing.size(); ++at) {
        std::string flipped = fullDrawing;
        flipped[at] = static_cast<char>(flipped[at] ^ (1 << at % 8));
        for (const std::string& bad : {fullDrawing.substr(0, at), flipped}) {
            Drawing drawing;
            failure(drawing, bad);
        }
        // A second element of one name replaces a raw pointer, whose object is the owner's.
        while (!Shape::alive.empty())
            delete *Shape::alive.begin();
    }
    SUCCEED();
}

TEST(Floats, AreWrittenWithThePrecisionOfTheStream) {
    std::mt19937 random(9);
    for (int i = 0; i < 2000; ++i) {
        Values values;
        const std::uint32_t bits = static_cast<std::uint32_t>(random());
        std::memcpy(&values.x, &bits, sizeof values.x);
        if (!std::isfinite(values.x))
            continue;
        Values loaded;
        load(loaded, saved(values, 9));
        EXPECT_EQ(loaded.x, values.x);
        std::ostringstream byStream;
        byStream << std::setprecision(9) << "<x>" << values.x << "</x>";
        EXPECT_NE(saved(values, 9).find(byStream.str()), std::string::npos) << values.x;
    }
}

struct Comma : std::numpunct<char> {
    char do_decimal_point() const override { return ','; }
    char do_thousands_sep() const override { return '.'; }
    std::string do_grouping() const override { return "\3"; }
};

TEST(Numbers, HaveOneFormInEveryLocaleAndStream) {
    const std::locale before = std::locale::global(std::locale(std::locale(), new Comma));
    Values values;
    load(values, "<root><x>+1234.5</x><i>+12345</i><c r='+.333333343'/></root>");
    std::ostringstream out;
    out << std::fixed << std::setprecision(1) << std::hex << std::boolalpha << std::showpos;
    OutTag tag(out, "root");
    values.save(tag);
    std::locale::global(before);
    EXPECT_EQ(compact(out.str()),
              "<root><x>+1234.5</x><d>+7.0</d><b>1</b><i>12345</i><u>7</u><l>7</l><s>old</s>"
              "<c a=\"1\" b=\"0.25\" g=\"0.5\" r=\"0.333333\"/></root>");
}

struct Angle {
    double degrees = 0;
};
std::ostream& operator<<(std::ostream& out, const Angle& angle) {
    return out << angle.degrees << '<';
}
std::istream& operator>>(std::istream& in, Angle& angle) {
    char unit = 0;
    if (in >> angle.degrees >> unit && unit != '<')
        in.setstate(std::ios_base::failbit);
    return in;
}

struct Size {
    int width = 0;
};

}  // namespace

template <>
class pells::SimpleTypeHandler<Angle> : public pells::TextTypeHandler<Angle> {};

template <>
class pells::SimpleTypeHandler<Size> : public pells::TypeHandler<Size> {
public:
    void save(const Size& size, pells::OutTag& tag) override {
        tag.setAttr("width", std::to_string(size.width));
        tag.writeSingleTag();
    }
    void load(Size& size, pells::InTag& tag) override {
        size.width = std::atoi(tag.getAttr("width").c_str());
        tag.parseContents(nullptr, pells::ClassDesc());
    }
};

namespace {

struct Page : Serializable {
    Angle angle;
    std::vector<Size> sizes;

    intrusive_ptr<Field> getField(const std::string& name) override {
        return makeComposite(
            name, ClassDesc(makeField("angle", &Page::angle), makeField("sizes", &Page::sizes)));
    }
};

TEST_F(SerialTest, HandlesTypesOfTheApplication) {
    Page page;
    const std::string document =
        "<root><angle>1.5&lt;</angle><sizes><size width=\"3\"/><size width=\"4\"/></sizes></root>";
    load(page, document);
    EXPECT_EQ(compact(saved(page)), document);
    EXPECT_EQ(page.sizes.at(1).width, 4);
    EXPECT_EQ(failure(page, "<root><angle>2 degrees</angle></root>"), "");
    EXPECT_EQ(page.angle.degrees, 1.5);
    EXPECT_EQ(failure(page, "<root><angle>2&lt; x</angle></root>"), "Failed to scan text value");
}

struct Named : Field {
    using Field::Field;
    void load(Serializable* /*obj*/, InTag& /*tag*/) override {}
};

TEST(Descriptions, OrderFieldsByNameAndNumberThemAsAdded) {
    const intrusive_ptr<Field> zeta = new Named("zeta");
    const intrusive_ptr<Field> alpha = new Named("alpha");
    ClassDesc desc(zeta, nullptr, alpha);
    EXPECT_EQ(zeta->getOrder(), 0);
    EXPECT_EQ(alpha->getOrder(), 1);
    EXPECT_EQ(desc.getFields(), (std::vector<intrusive_ptr<Field>>{alpha, zeta}));
    EXPECT_EQ(desc.get("zeta"), zeta);
    EXPECT_EQ(desc.get("none"), nullptr);

    const ClassDesc copy(desc);
    const intrusive_ptr<Field> second = new Named("alpha");
    desc.add(second);
    EXPECT_EQ(desc.get("alpha"), second);
    EXPECT_EQ(second->getOrder(), 2);
    EXPECT_EQ(copy.get("alpha"), alpha);
    EXPECT_EQ(makeComposite("empty", ClassDesc()), nullptr);

    std::ostringstream out;
    OutTag tag(out, "name");
    CompositeField("name", ClassDesc()).save(nullptr, tag);
    IgnoreField().save(nullptr, tag);
    EXPECT_EQ(out.str(), "<name/>\n");
}

struct Planet : NamedObject<Planet> {
    explicit Planet(const std::string& planet) : NamedObject<Planet>(planet) {}
};

TEST(Enums, NameAnObjectOrFail) {
    Planet mars("Mars");
    EXPECT_EQ(Enum<Planet>("Mars").get(), &mars);
    EXPECT_EQ(Enum<Planet>("Mars")->getName(), "Mars");
    EXPECT_EQ(thrown<BadEnum>([] { Enum<Planet>("Vulcan"); }),
              "No Enum value 'Vulcan' for Enum<(anonymous namespace)::Planet>");
}

}  // namespace

#include <gtest/gtest.h>

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
#include "support/test_prefs.h"

namespace {

using boost::intrusive_ptr;
using pells::ClassDesc;
using pells::Color;
using pells::Field;
using pells::makeComposite;
using pells::makeField;
using pells::OpenTag;
using pells::OutTag;
using pells::Serializable;
using pells::SingleTag;
using pells::XMLTokenizer;

std::string saved(Serializable& object, const std::string& name = "root") {
    std::ostringstream out;
    OutTag tag(out, name);
    object.save(tag);
    return out.str();
}

void load(Serializable& object, const std::string& document) {
    std::istringstream in(document);
    XMLTokenizer tokenizer(in);
    const XMLTokenizer::Token token = tokenizer.getToken();
    if (token.type == XMLTokenizer::Token::T_SINGLE) {
        SingleTag root(tokenizer, token);
        object.load(root, nullptr);
    } else {
        OpenTag root(tokenizer, token);
        object.load(root, nullptr);
    }
}

/// "" or the message of the LoadFail.
std::string failure(Serializable& object, const std::string& document) {
    try {
        load(object, document);
    } catch (const Serializable::LoadFail& fail) {
        return fail.what();
    }
    return "";
}

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

const char freshValues[] =
    "<root>\n    <x>7</x>\n    <d>7</d>\n    <b>1</b>\n    <i>7</i>\n    <u>7</u>\n    <l>7</l>\n"
    "    <s>old</s>\n    <c a=\"1\" b=\"0.25\" g=\"0.5\" r=\"1\"/>\n</root>\n";

/// The document of fresh values after one line was replaced.
std::string freshBut(const std::string& oldLine, const std::string& newLine) {
    std::string document = freshValues;
    return document.replace(document.find(oldLine), oldLine.size(), newLine);
}

struct Case {
    const char* content;
    const char* oldLine;
    const char* newLine;
};

TEST(Values, AreReadFromTextAndAttributes) {
    const Case cases[] = {
        {"", "<x>7<", "<x>7<"},
        {"<x>  2.5  </x>", "<x>7<", "<x>2.5<"},
        {"<x>1</x><x>2</x>", "<x>7<", "<x>2<"},
        {"<x>1<y/>2<!-- -->5</x>", "<x>7<", "<x>25<"},
        {"<x>abc</x>", "<x>7<", "<x>7<"},
        {"<x></x>", "<x>7<", "<x>7<"},
        {"<x/>", "<x>7<", "<x>7<"},
        {"<x>1e999</x>", "<x>7<", "<x>7<"},
        {"<x>1e</x>", "<x>7<", "<x>7<"},
        {"<x>inf</x>", "<x>7<", "<x>7<"},
        {"<x>-nan</x>", "<x>7<", "<x>7<"},
        {"<x>+.5e+1</x>", "<x>7<", "<x>5<"},
        {"<x>-1.</x>", "<x>7<", "<x>-1<"},
        {"<x>0.333333343</x>", "<x>7<", "<x>0.333333<"},
        {"<x>16777217e0</x>", "<x>7<", "<x>1.67772e+07<"},
        {"<d>1e300</d>", "<d>7<", "<d>1e+300<"},
        {"<b>0</b>", "<b>1<", "<b>0<"},
        {"<b> 00\n</b>", "<b>1<", "<b>0<"},
        {"<b>true</b><b>false</b><b>2</b>", "<b>1<", "<b>1<"},
        {"<i> -12 </i>", "<i>7<", "<i>-12<"},
        {"<i>+12</i>", "<i>7<", "<i>12<"},
        {"<i>2147483648</i>", "<i>7<", "<i>7<"},
        {"<u>4294967295</u>", "<u>7<", "<u>4294967295<"},
        {"<u>-1</u>", "<u>7<", "<u>7<"},
        {"<l>-9223372036854775808</l>", "<l>7<", "<l>-9223372036854775808<"},
        {"<s>  a &lt; b  </s>", "<s>old<", "<s>a &lt; b  <"},
        {"<s/>", "<s>old<", "<s><"},
        {"<s></s>", "<s>old<", "<s>old<"},
        {"<s>one<b/>two</s>", "<s>old<", "<s>two<"},
        {"<s class='x'>new</s>", "<s>old<", "<s>new<"},
        {"<c r=' 0.5 ' g='x' b='' extra='1'/>", "g=\"0.5\" r=\"1\"", "g=\"0.5\" r=\"0.5\""},
        {"<c r='0.123456789'>1<deep><deeper/></deep></c>", "r=\"1\"", "r=\"0.123457\""},
        {"ignored<super><x>1</x></super>", "<x>7<", "<x>7<"},
    };
    for (const Case& each : cases) {
        Values values;
        load(values, "<root x='1'>" + std::string(each.content) + "</root>");
        EXPECT_EQ(saved(values), freshBut(each.oldLine, each.newLine)) << each.content;
    }
    Values values;
    load(values, "<root/>");
    EXPECT_EQ(saved(values), freshValues);
}

class SerialTest : public pells_test::LibraryTest {};

TEST_F(SerialTest, NamesWhatIsWrongAndKeepsWhatWasRead) {
    const char scan[] = "Failed to scan text value";
    const char close[] = "Malformed XML: bad close tag";
    const char end[] = "Malformed XML: premature EOF";
    struct {
        const char* content;
        const char* message;
        const char* oldLine;
        const char* newLine;
    } const cases[] = {
        {"<x>2.5cm</x></root>", scan, "<x>7<", "<x>2.5<"},
        {"<x>1.2.3</x></root>", scan, "<x>7<", "<x>1.2<"},
        {"<x>0x10</x></root>", scan, "<x>7<", "<x>0<"},
        {"<x>1,5</x></root>", scan, "<x>7<", "<x>1<"},
        {"<i>1.5</i></root>", scan, "<i>7<", "<i>1<"},
        {"<b>0 1</b></root>", scan, "<b>1<", "<b>0<"},
        {"<c r='0.5' g='1.0.0'/></root>", scan, "", ""},
        {"<s>new</s", end, "<s>old<", "<s>new<"},
        {"<s>new", end, "<s>old<", "<s>new<"},
        {"<s>new</root>", close, "<s>old<", "<s>new<"},
        {"</rot>", close, "", ""},
        {"<none><x></none></x></root>", close, "", ""},
        {"<none><x>", end, "", ""},
        {"<!DOCTYPE x></root>", end, "", ""},
    };
    for (const auto& each : cases) {
        Values values;
        EXPECT_EQ(failure(values, "<root>" + std::string(each.content)), each.message)
            << each.content;
        EXPECT_EQ(saved(values), freshBut(each.oldLine, each.newLine)) << each.content;
    }
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

const char sevenLines[] =
    "<root>\n"
    "    <super>\n"
    "        <y>1</y>\n"
    "    </super>\n"
    "    <x>0.5</x>\n"
    "    <s>hi</s>\n"
    "</root>\n";

TEST_F(SerialTest, SavesTheBaseFirstAndLoadsInAnyOrder) {
    Derived object;
    EXPECT_EQ(saved(object), sevenLines);

    load(object, "<root><s>a&amp;b</s><x>2</x><super><y>0</y></super></root>");
    EXPECT_EQ(object.s, "a&b");
    EXPECT_EQ(object.x, 2);
    EXPECT_FALSE(object.y);
    load(object, sevenLines);
    EXPECT_EQ(saved(object), sevenLines);
}

TEST_F(SerialTest, LogsEveryTokenAndWhatItDoesNotKnow) {
    pells_test::prefs() = {{"log", "load error"}};
    Derived object;
    load(object, "<root><one a='1'><two/></one><x>1</x><one/></root>");
    EXPECT_EQ(
        pells_test::logLines(),
        (std::vector<std::string>{
            "load: Processing Token: 2 (T_OPEN) <one a=\"1\">", "load.warn: Unrecognized tag <one>",
            "load.warn:     valid ones are:", "load.warn:     <s>", "load.warn:     <super>",
            "load.warn:     <x>", "load: Processing Token: 1 (T_SINGLE) <two/>",
            "load.warn: Unrecognized tag <two/>", "load.warn:     valid ones are:",
            "load: Processing Token: 3 (T_CLOSE) </one>", "load: Processing Token: 2 (T_OPEN) <x>",
            "load: Processing Token: 4 (T_TEXT) \"1\"", "load: Processing Token: 3 (T_CLOSE) </x>",
            "load: Processing Token: 1 (T_SINGLE) <one/>", "load.warn: Unrecognized tag <one/>",
            "load: Processing Token: 3 (T_CLOSE) </root>"}));
}

/// An unrecognised element at any depth warns of its own names once, as the ones around it do.
TEST_F(SerialTest, WarnsOncePerElementAtEveryDepth) {
    pells_test::prefs() = {{"log", "load.warn log.dumptags"}};
    Derived object;
    load(object, "<root><x><a><b/><c><d/><e>t</e></c><f/></a><g/></x><h/></root>");
    pells::Log::instance().dumpTags();
    const std::string line = "load.warn: Unrecognized tag ";
    const std::string list = "load.warn:     valid ones are:";
    EXPECT_EQ(
        pells_test::logLines(),
        (std::vector<std::string>{
            line + "<a>", list, "load.warn:     <>", line + "<b/>", list, line + "<c>",
            line + "<d/>", list, line + "<e>", line + "<f/>", line + "<g/>", line + "<h/>", list,
            "load.warn:     <s>", "load.warn:     <super>", "load.warn:     <x>",
            "log.dumptags: available log message tags:",
            // Each place that logs asks for its tag once, and each probe asks for its own.
            "log.dumptags: off   1  load", "log.dumptags: on    3  load.warn",
            "log.dumptags: on    1  log.dumptags", "log.dumptags: off   1  log.flush",
            "log.dumptags: off  15  time.detail.parser", "log.dumptags: -- end of log tags --"}));
}

struct Undescribed : Serializable {};

TEST_F(SerialTest, LogsItsErrors) {
    Undescribed mute;
    EXPECT_THROW(saved(mute), Serializable::LoadFail);
    EXPECT_EQ(failure(mute, "<root/>"), "No load() method");
    Values values;
    failure(values, "<root><x>1</root>");
    failure(values, "<root><none><deep></none></root>");
    failure(values, "<root><x>1</x>");
    failure(values, "<root><none><deep>");
    const std::vector<Serializable::SaveFail> copies(2, Serializable::SaveFail("full"));
    EXPECT_STREQ(copies[1].what(), "full");
    std::vector<std::string> errors;
    for (const std::string& line : pells_test::logLines()) {
        if (line.compare(0, 7, "error: ") == 0)
            errors.push_back(line.substr(7));
    }
    const std::string where = " must override either Serializable::";
    EXPECT_EQ(
        errors,
        (std::vector<std::string>{
            "(anonymous namespace)::Undescribed" + where + "save() or Serializable::getField()!",
            "LoadFail: No save() method",
            "(anonymous namespace)::Undescribed" + where + "load() or Serializable::getField()!",
            "LoadFail: No load() method",
            "Malformed XML: <x> paired with </root>",
            "LoadFail: Malformed XML: bad close tag",
            "Malformed XML: <deep> paired with </none>",
            "LoadFail: Malformed XML: bad close tag",
            "Malformed XML! Reached EOF without seeing close </root>",
            "LoadFail: Malformed XML: premature EOF",
            "Malformed XML! Reached EOF without seeing close </deep>",
            "LoadFail: Malformed XML: premature EOF",
            "SaveFail: full",
        }));
}

class Shape : public Serializable {
public:
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

class Step : public Serializable, public pells::smart_base {
public:
    int number = 0;
    intrusive_ptr<Field> getField(const std::string& name) override {
        return makeComposite(name, ClassDesc(makeField("number", &Step::number)));
    }
};

const pells::SerializableFactory<Circle> circleFactory("Circle");
const pells::SerializableFactory<Step> stepFactory("Step");
const pells::SerializableFactory<Values> valuesFactory("Values");

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

const char fullDrawing[] =
    "<root>\n"
    "    <shape class=\"Circle\">\n"
    "        <title>big</title>\n"
    "    </shape>\n"
    "    <step class=\"Step\">\n"
    "        <number>3</number>\n"
    "    </step>\n"
    "    <shapes>\n"
    "        <shape class=\"Circle\">\n"
    "            <title>small</title>\n"
    "        </shape>\n"
    "    </shapes>\n"
    "    <stack>\n"
    "        <stackItem class=\"Step\">\n"
    "            <number>4</number>\n"
    "        </stackItem>\n"
    "    </stack>\n"
    "    <nested>\n"
    "        <super>\n"
    "            <y>0</y>\n"
    "        </super>\n"
    "        <x>2</x>\n"
    "        <s>in</s>\n"
    "    </nested>\n"
    "    <entries>\n"
    "        <entry>\n"
    "            <super>\n"
    "                <y>1</y>\n"
    "            </super>\n"
    "            <x>0.5</x>\n"
    "            <s>hi</s>\n"
    "        </entry>\n"
    "    </entries>\n"
    "    <sizes>\n"
    "        <size>0.5</size>\n"
    "        <size>-3</size>\n"
    "    </sizes>\n"
    "    <names>\n"
    "        <name>a</name>\n"
    "    </names>\n"
    "    <rows>\n"
    "        <row>\n"
    "            <rowItem>1</rowItem>\n"
    "            <rowItem>2</rowItem>\n"
    "        </row>\n"
    "        <row/>\n"
    "    </rows>\n"
    "</root>\n";

TEST_F(SerialTest, RoundTripsObjectsPointersAndSequences) {
    Drawing drawing;
    load(drawing, fullDrawing);
    EXPECT_EQ(saved(drawing), fullDrawing);

    drawing.shapes.push_back(nullptr);
    EXPECT_EQ(saved(drawing), fullDrawing);
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
        ASSERT_EQ(drawing.shapes.size(), 1u);
        EXPECT_EQ(drawing.shapes[0], nullptr);
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
    const std::string good = fullDrawing;
    for (std::size_t at = 0; at < good.size(); ++at) {
        std::string flipped = good;
        flipped[at] = static_cast<char>(flipped[at] ^ (1 << at % 8));
        for (const std::string& bad : {good.substr(0, at), flipped}) {
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
        std::ostringstream out;
        out << std::setprecision(9);
        OutTag tag(out, "root");
        values.save(tag);
        Values loaded;
        load(loaded, out.str());
        EXPECT_EQ(loaded.x, values.x);
        std::ostringstream byStream;
        byStream << std::setprecision(9) << values.x;
        EXPECT_NE(out.str().find("<x>" + byStream.str() + "</x>"), std::string::npos) << values.x;
    }
    Values values;
    values.x = 1.0f / 3;
    values.c.r = values.x;
    std::ostringstream out;
    out << std::fixed << std::setprecision(2) << std::hex << std::boolalpha << std::showpos;
    OutTag tag(out, "root");
    values.save(tag);
    EXPECT_NE(out.str().find("<x>+0.33</x>\n    <d>+7.00</d>\n    <b>1</b>\n    <i>7</i>"),
              std::string::npos)
        << out.str();
    EXPECT_NE(out.str().find("r=\"0.333333\""), std::string::npos);
}

struct Comma : std::numpunct<char> {
    char do_decimal_point() const override { return ','; }
    char do_thousands_sep() const override { return '.'; }
    std::string do_grouping() const override { return "\3"; }
};

TEST(Numbers, HaveOneFormInEveryLocale) {
    const std::locale before = std::locale::global(std::locale(std::locale(), new Comma));
    Values values;
    load(values, "<root><x>+1234.5</x><i>+12345</i><c r='+.5'/></root>");
    std::ostringstream out;
    out << std::fixed << std::setprecision(1);
    OutTag tag(out, "root");
    values.save(tag);
    std::locale::global(before);
    EXPECT_EQ(values.x, 1234.5f);
    EXPECT_EQ(values.c.r, 0.5f);
    EXPECT_NE(out.str().find("<x>1234.5</x>\n    <d>7.0</d>\n    <b>1</b>\n    <i>12345</i>"),
              std::string::npos)
        << out.str();
    EXPECT_NE(out.str().find("r=\"0.5\""), std::string::npos) << out.str();
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
    page.angle.degrees = 1.5;
    page.sizes = {Size{3}, Size{4}};
    const std::string document =
        "<root>\n    <angle>1.5&lt;</angle>\n    <sizes>\n        <size width=\"3\"/>\n"
        "        <size width=\"4\"/>\n    </sizes>\n</root>\n";
    EXPECT_EQ(saved(page), document);
    Page loaded;
    load(loaded, document);
    EXPECT_EQ(saved(loaded), document);
    EXPECT_EQ(failure(loaded, "<root><angle>2 degrees</angle></root>"), "");
    EXPECT_EQ(loaded.angle.degrees, 1.5);
    EXPECT_EQ(failure(loaded, "<root><angle>2&lt; x</angle></root>"), "Failed to scan text value");
}

struct Named : Field {
    using Field::Field;
    void load(Serializable* /*obj*/, pells::InTag& /*tag*/) override {}
};

TEST(Descriptions, OrderFieldsByNameAndNumberThemAsAdded) {
    const intrusive_ptr<Field> zeta = new Named("zeta");
    const intrusive_ptr<Field> alpha = new Named("alpha");
    ClassDesc desc(zeta, nullptr, alpha);
    EXPECT_EQ(desc.size(), 2u);
    EXPECT_EQ(zeta->getOrder(), 0);
    EXPECT_EQ(alpha->getOrder(), 1);
    EXPECT_EQ(desc.getFields(), (std::vector<intrusive_ptr<Field>>{alpha, zeta}));
    EXPECT_EQ(*desc.begin(), alpha);
    EXPECT_EQ(desc.get("zeta"), zeta);
    EXPECT_EQ(desc.get("none"), nullptr);

    const ClassDesc copy(desc);
    const intrusive_ptr<Field> second = new Named("alpha");
    desc.add(second);
    EXPECT_EQ(desc.get("alpha"), second);
    EXPECT_EQ(second->getOrder(), 2);
    EXPECT_EQ(copy.get("alpha"), alpha);
    EXPECT_TRUE(ClassDesc().empty());
    EXPECT_EQ(makeComposite("empty", ClassDesc()), nullptr);
}

TEST_F(SerialTest, SavesACompositeWithoutFieldsAsAnEmptyElement) {
    std::ostringstream out;
    OutTag tag(out, "name");
    pells::CompositeField("name", ClassDesc()).save(nullptr, tag);
    pells::IgnoreField().save(nullptr, tag);
    EXPECT_EQ(out.str(), "<name/>\n");
}

TEST_F(SerialTest, LogsTheComparisonsOfItsSort) {
    pells_test::prefs() = {{"log", "mac"}};
    Derived object;
    saved(object);
    const std::vector<std::string> lines = pells_test::logLines();
    ASSERT_GE(lines.size(), 2u);
    EXPECT_EQ(lines[0], "mac: FieldPtr less being called.");
}

struct Planet : pells::NamedObject<Planet> {
    explicit Planet(const std::string& planet) : pells::NamedObject<Planet>(planet) {}
};

TEST(Enums, NameAnObjectOrFail) {
    Planet mars("Mars");
    EXPECT_EQ(pells::Enum<Planet>("Mars").get(), &mars);
    EXPECT_EQ(pells::Enum<Planet>("Mars")->getName(), "Mars");
    try {
        pells::Enum<Planet> none("Vulcan");
        FAIL();
    } catch (const pells::BadEnum& bad) {
        EXPECT_STREQ(bad.what(), "No Enum value 'Vulcan' for Enum<(anonymous namespace)::Planet>");
    }
}

}  // namespace

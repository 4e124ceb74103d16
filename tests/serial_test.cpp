#include <complex>
#include <iomanip>
#include <locale>

#include "pells/core/named_object.h"
#include "pells/serial/enum.h"
#include "pells/serial/member_field.h"
#include "support/everything.h"
#include "support/test_prefs.h"

using namespace pells;
using namespace pells_test;

namespace {

using boost::intrusive_ptr;

struct Preset : Everything {
    Preset() {
        pells_test::load(*this,
                         "<root><f>7</f><d>7</d><b>1</b><i>7</i><u>7</u><l>7</l><s>old</s>"
                         "<c r='1' g='0.5' b='0.25' a='1'/></root>");
    }
};

/// The saved lines that differ from those of fresh values.
std::string changes(Preset& values) {
    Preset fresh;
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
        {"ignored<none><f>1</f></none><f></f><f/><i/><f>abc</f><s></s>", "", ""},
        {"<f>1e999</f><f>1e</f><f>inf</f><f>-nan</f><b>false</b><b>2</b>", "", ""},
        {"<i>2147483648</i><u>-1</u><u>4294967296</u><l>9223372036854775808</l>", "", ""},
        {"<f>1</f><f>  2.5\t\n\v\f\r </f><i> -12 </i><s/>", "<f>2.5</f><i>-12</i><s></s>", ""},
        {"<f>1<y/>2<!-- -->5</f><b> 00\n</b><i>+12</i>", "<f>25</f><b>0</b><i>12</i>", ""},
        {"<f>+.5e+1</f><d>1e300</d><u>4294967295</u><l>-9223372036854775808</l>",
         "<f>5</f><d>1e+300</d><u>4294967295</u><l>-9223372036854775808</l>", ""},
        {"<s>  a &lt; b  </s>", "<s>a &lt; b  </s>", ""},
        {"<s class='x'>one<b/>two</s>", "<s>two</s>", ""},
        {"<c r=' 0.5 ' g='x' b='' extra='1' a='0.123456789'>1<x><y/></x></c>",
         "<c a=\"0.123457\" b=\"0.25\" g=\"0.5\" r=\"0.5\"/>", ""},
        {"<f>2.5\xA0</f>", "<f>2.5</f>", scan},
        {"<f>0x10</f>", "<f>0</f>", scan},
        {"<i>1.5</i>", "<i>1</i>", scan},
        {"<b>0 1</b>", "<b>0</b>", scan},
        {"<c r='0.5' g='1.0.0'/>", "", scan},
        {"<s>new&", "<s>new</s>", end},
        {"<s>new", "<s>new</s>", close},
        {"<none><x></none></x>", "", close},
        {"<none><x>&", "", end},
    };
    for (const auto& each : cases) {
        Preset values;
        EXPECT_EQ(failure(values, "<root x='1'>" + std::string(each.content) + "</root>"),
                  each.message)
            << each.content;
        EXPECT_EQ(changes(values), each.change) << each.content;
    }
}

TEST_F(SerialTest, SavesInTheOrderOfDeclarationAndLoadsInAnyOrder) {
    CountingStep step;
    step.label = "hi";
    EXPECT_EQ(saved(step),
              "<root>\n    <super>\n        <redoSuppressed>0</redoSuppressed>\n    </super>\n"
              "    <label>hi</label>\n</root>\n");
    EXPECT_EQ(logLines().at(0), "mac: FieldPtr less being called.");

    // What an element begins with, and what ends it.
    const std::pair<std::string, std::string> elements[] = {
        {"<f>2.5</f><d>-1</d><b>1</b><i>-12</i><u>3</u><l>4</l><s>a &lt; b</s>", ""},
        {"<material><ambient a=\"1\" b=\"0\" g=\"0\" r=\"0.5\"/>", "</material>"},
        {"<history><stack><stackItem class=\"CountingStep\"><super>",
         "</super></stackItem></stack></history>"},
        {"<child class=\"Everything\"><f>8</f>", "</child>"},
        {"<ints><int>0</int><int>-3</int></ints><words><word>a</word></words>", ""},
        {"<matrices><matrice><matriceItem>1</matriceItem></matrice><matrice/></matrices>", ""},
        {"<materials><material><ambient a=\"0\"", "/></material></materials>"},
        {"<children><childrenItem class=\"Everything\"><f>9</f>", "</childrenItem></children>"}};
    std::string reversed;
    for (const auto& element : elements)
        reversed.insert(0, element.first + element.second);
    Everything object;
    load(object, "<root>" + reversed + "</root>");
    object.children.push_back(nullptr);
    const std::string text = compact(saved(object));
    std::size_t at = 0;
    for (const auto& element : elements) {
        at = text.find(element.first, at);
        EXPECT_NE(at, std::string::npos) << element.first << " in its place in " << text;
    }
    Everything copy;
    load(copy, text);
    EXPECT_EQ(compact(saved(copy)), text);
    load(copy, "<root><ints>text<int>8</int><other>9</other></ints><words/></root>");
    EXPECT_EQ(copy.ints, (std::vector<int>{0, -3, 8}));
    EXPECT_EQ(copy.words.size(), 1u);
}

TEST_F(SerialTest, LogsEveryTokenAndWhatItDoesNotKnow) {
    prefs() = {{"log", "load time.detail.parser"}};
    CountingStep step;
    load(step, "<root><label>1<a x='1'><b/><c><d/></c><e>t</e></a><f/></label><g/></root>");
    const std::string line = "Unrecognized tag ";
    const std::string list = "    valid ones are:";
    // Every element warns of its own names once, whatever happens inside it.
    EXPECT_EQ(
        logLines("load.warn: "),
        (Lines{line + "<a>", list, "    <>", line + "<b/>", list, line + "<c>", line + "<d/>", list,
               line + "<e>", line + "<f/>", line + "<g/>", list, "    <label>", "    <super>"}));
    const Lines tokens = logLines("load: ");
    ASSERT_GE(tokens.size(), 3u);
    EXPECT_EQ(tokens[0], "Processing Token: 2 (T_OPEN) <label>");
    EXPECT_EQ(tokens[2], "Processing Token: 2 (T_OPEN) <a x=\"1\">");
    EXPECT_EQ(logLines("time.detail.parser: Entering next token"), Lines(tokens.size()));
}

// The innermost open element is known, however long its name and the names around it are.
TEST_F(SerialTest, SkipsUnknownElementsWithNamesOfAnyLength) {
    Everything object;
    std::string open = "<root>";
    std::string close = "<i>5</i></root>";
    for (const std::size_t length :
         {1u, 31u, 32u, 63u, 64u, 65u, 5000u, 2u, 70000u, 8191u, 8192u}) {
        const std::string name(length, 'n');
        open += '<' + name + '>';
        close.insert(0, "<n/></" + name + '>');
        EXPECT_EQ(failure(object, open + close), "") << length;
        EXPECT_EQ(failure(object, std::string(open).append("</x>")),
                  "Malformed XML: bad close tag");
        EXPECT_EQ(logLines("error: Malformed XML: <").back(), name + "> paired with </x>");
    }
    EXPECT_EQ(object.i, 5);
}

struct Undescribed : Serializable {};

TEST_F(SerialTest, LogsItsErrors) {
    Undescribed mute;
    EXPECT_THROW(saved(mute), Serializable::LoadFail);
    EXPECT_EQ(failure(mute, "<root/>"), "No load() method");
    Everything object;
    for (const char* bad :
         {"<root><f>1</root>", "<root><none><deep></none></root>", "<root><none><deep>"})
        failure(object, bad);
    EXPECT_STREQ(Serializable::SaveFail("full").what(), "full");
    const std::string where =
        "(anonymous namespace)::Undescribed must override either Serializable::";
    EXPECT_EQ(
        logLines("error: "),
        (Lines{where + "save() or Serializable::getField()!", "LoadFail: No save() method",
               where + "load() or Serializable::getField()!", "LoadFail: No load() method",
               "Malformed XML: <f> paired with </root>", "LoadFail: Malformed XML: bad close tag",
               "Malformed XML: <deep> paired with </none>",
               "LoadFail: Malformed XML: bad close tag",
               "Malformed XML! Reached EOF without seeing close </deep>",
               "LoadFail: Malformed XML: premature EOF", "SaveFail: full"}));
}

class Unregistered : public Everything {};

TEST_F(SerialTest, MakesOnlyObjectsOfTheRightClass) {
    Everything object;
    for (const std::string name : {"None", "CountingStep", ""}) {
        object.child = new Everything;
        EXPECT_EQ(failure(object, "<root><child class='" + name + "'/></root>"),
                  "Bad class='" + name + "' in element <child>");
        EXPECT_EQ(object.child, nullptr);
    }
    EXPECT_NE(failure(object, "<root><i>3</i><children><childrenItem/></children></root>"), "");
    EXPECT_EQ(object.i, 3);
    EXPECT_EQ(object.children.size(), 1u);

    object.child = new Unregistered;
    const std::string document = saved(object);
    EXPECT_NE(document.find("<child class=\"** No declared Factory&lt;" +
                            std::string(typeid(Serializable).name()) + ", " +
                            typeid(Unregistered).name() + ">! **\">"),
              std::string::npos)
        << document;
}

TEST(Floats, AreWrittenWithThePrecisionOfTheStream) {
    Everything object;
    for (const float value : {0.1f, 1.0f / 3, 16777216.0f, -1e-45f, 3.40282347e38f, 100000.0f}) {
        object.f = value;
        for (const int precision : {1, 6, 9}) {
            std::ostringstream wanted;
            wanted << std::setprecision(precision) << "<root><f>" << value << "</f>";
            EXPECT_EQ(compact(saved(object, precision)).find(wanted.str()), 0u) << wanted.str();
        }
    }
}

struct Comma : std::numpunct<char> {
    char do_decimal_point() const override { return ','; }
    char do_thousands_sep() const override { return '.'; }
    std::string do_grouping() const override { return "\3"; }
};

TEST(Numbers, HaveOneFormInEveryLocaleAndStream) {
    const std::locale before = std::locale::global(std::locale(std::locale(), new Comma));
    Preset values;
    load(values, "<root><f>+1234.5</f><i>+12345</i><c r='+.333333343'/></root>");
    std::ostringstream out;
    out << std::fixed << std::setprecision(1) << std::hex << std::boolalpha << std::showpos;
    OutTag tag(out, "root");
    values.save(tag);
    std::locale::global(before);
    const std::string wanted =
        "<root><f>+1234.5</f><d>+7.0</d><b>1</b><i>12345</i><u>7</u><l>7</l><s>old</s>"
        "<c a=\"1\" b=\"0.25\" g=\"0.5\" r=\"0.333333\"/>";
    EXPECT_EQ(compact(out.str()).find(wanted), 0u) << out.str();
}

}  // namespace

template <>
class pells::SimpleTypeHandler<std::complex<float>>
    : public pells::TextTypeHandler<std::complex<float>> {};

namespace {

struct Roots : Serializable {
    std::vector<std::complex<float>> roots;

    intrusive_ptr<Field> getField(const std::string& name) override {
        return makeComposite(name, ClassDesc(makeField("roots", &Roots::roots)));
    }
};

TEST_F(SerialTest, HandlesTypesOfTheApplication) {
    Roots object;
    EXPECT_EQ(failure(object, "<root><roots><root>(1.5,-2)</root><root>x</root></roots></root>"),
              "");
    EXPECT_EQ(compact(saved(object)),
              "<root><roots><root>(1.5,-2)</root><root>(0,0)</root></roots></root>");
    EXPECT_EQ(failure(object, "<root><roots><root>(2,1) x</root></roots></root>"),
              "Failed to scan text value");
}

TEST(Descriptions, OrderFieldsByNameAndNumberThemAsAdded) {
    const intrusive_ptr<Field> zeta = makeField("zeta", &Everything::i);
    const intrusive_ptr<Field> alpha = makeField("alpha", &Everything::i);
    const intrusive_ptr<Field> other = makeField("alpha", &Everything::u);
    ClassDesc desc(zeta, nullptr, alpha);
    EXPECT_EQ(alpha->getOrder(), 1);
    EXPECT_EQ(desc.getFields(), (std::vector<intrusive_ptr<Field>>{alpha, zeta}));
    const ClassDesc copy(desc);
    desc.add(other);
    EXPECT_EQ(desc.get("alpha"), other);
    EXPECT_EQ(other->getOrder(), 2);
    EXPECT_EQ(copy.get("alpha"), alpha);
    EXPECT_EQ(copy.get("none"), nullptr);

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

struct Numbered : pells::Serializable {
    int number = 0;
};

struct ReadOnlyField : pells::Field {
    using Field::Field;
    void load(pells::Serializable* /*obj*/, pells::InTag& /*tag*/) override {}
};

TEST(PartsOfFields, DoNothingInTheDirectionThatTheyAreNotFor) {
    std::ostringstream out;
    pells::OutTag tag(out, "x");
    pells::IgnoreField().save(nullptr, tag);
    ReadOnlyField("x").save(nullptr, tag);
    pells::TextTypeHandler<int>::TextReader().save(1, tag);
    EXPECT_EQ(out.str(), "");
    std::vector<int> numbers{1};
    pells::InPlaceSequenceLoader<std::vector<int>> loader(&numbers);
    EXPECT_FALSE(loader.hasMore(nullptr));
    EXPECT_EQ(*loader.next(nullptr), 0);
    std::vector<std::string> texts{"a"};
    EXPECT_EQ(*pells::InPlaceSequenceLoader<std::vector<std::string>>(&texts).next(nullptr), "");
    typedef pells::SequenceTypeHandler<std::vector<int>>::SequenceSaver<const int*> Saver;
    EXPECT_NE(Saver(numbers.data(), numbers.data() + 1).target(nullptr), numbers.data());
    pells::MemberAccessor<Numbered, int> accessor(&Numbered::number);
    EXPECT_THROW(accessor.target(nullptr), std::bad_cast);
    const pells::ClassDesc desc(pells::makeField("number", &Numbered::number));
    Numbered object;
    pells::CompositeField("x", desc).save(&object, tag);
    EXPECT_EQ(out.str(), "<x>\n    <number>0</number>\n</x>\n");
}

TEST(PartsOfFields, ThatAreIgnoredReadTheirElementToItsEnd) {
    std::istringstream in("<root><a>1</a><b/></root><next/>");
    pells::XMLTokenizer tokenizer(in);
    pells::OpenTag root(tokenizer, tokenizer.getToken());
    pells::IgnoreField().load(nullptr, root);
    EXPECT_EQ(tokenizer.getToken().value, "next");
}

}  // namespace

// Saves a small scene as XML, prints it, loads it back, and shows what loading does with documents
// that are older, newer or broken.

#include <pells/pells.h>

#include <iostream>
#include <istream>
#include <ostream>
#include <sstream>
#include <string>
#include <vector>

/// A value type of the application: an angle, in XML "90deg".
struct Angle {
    float degrees = 0;
};

std::ostream& operator<<(std::ostream& out, const Angle& angle) {
    return out << angle.degrees << "deg";
}

std::istream& operator>>(std::istream& in, Angle& angle) {
    char unit[4] = "";
    if (in >> angle.degrees && in.get(unit, sizeof unit) && std::string(unit) != "deg")
        in.setstate(std::ios_base::failbit);
    return in;
}

// A type with operators << and >> is written as text. Members of type Angle are persistent now.
template <>
class pells::SimpleTypeHandler<Angle> : public pells::TextTypeHandler<Angle> {};

namespace {

/// Whatever stands in a scene. A persistent class derives from Serializable and describes its
/// members in getField().
class Thing : public pells::Serializable, public pells::smart_base {
public:
    boost::intrusive_ptr<pells::Field> getField(const std::string& name) override {
        return pells::makeComposite(name,
                                    pells::ClassDesc(pells::Serializable::getField("super"),
                                                     pells::makeField("title", &Thing::title)));
    }

    std::string title;
};

/// Its own fields come after those of its base, which form the element "super".
class Lamp : public Thing {
public:
    boost::intrusive_ptr<pells::Field> getField(const std::string& name) override {
        return pells::makeComposite(name, pells::ClassDesc(Thing::getField("super"),
                                                           pells::makeField("color", &Lamp::color),
                                                           pells::makeField("cone", &Lamp::cone),
                                                           pells::makeField("on", &Lamp::on)));
    }

    pells::Color color;
    Angle cone;
    bool on = true;
};

// Objects behind pointers are made by the class name in the document: these names.
const pells::SerializableFactory<Thing> thingFactory("Thing");
const pells::SerializableFactory<Lamp> lampFactory("Lamp");

class Scene : public pells::Serializable {
public:
    boost::intrusive_ptr<pells::Field> getField(const std::string& name) override {
        return pells::makeComposite(name,
                                    pells::ClassDesc(pells::Serializable::getField("super"),
                                                     pells::makeField("selected", &Scene::selected),
                                                     pells::makeField("things", &Scene::things),
                                                     pells::makeField("sizes", &Scene::sizes)));
    }

    boost::intrusive_ptr<Thing> selected;             // of any class derived from Thing, or null
    std::vector<boost::intrusive_ptr<Thing>> things;  // one element "thing" each
    std::vector<float> sizes;
};

void save(Scene& scene, std::ostream& out) {
    pells::OutTag root(out, "scene");
    scene.save(root);
}

/// What was in the scene stays: sequences grow, and members that the document leaves out keep their
/// values.
void load(Scene& scene, std::istream& in) {
    pells::XMLTokenizer tokenizer(in);
    const pells::XMLTokenizer::Token token = tokenizer.getToken();
    if (token.value != "scene")
        throw pells::Serializable::LoadFail("not a scene");
    if (token.type == pells::XMLTokenizer::Token::T_SINGLE) {
        pells::SingleTag root(tokenizer, token);
        scene.load(root, nullptr);
    } else {
        pells::OpenTag root(tokenizer, token);
        scene.load(root, nullptr);
    }
}

void show(const std::string& document) {
    Scene scene;
    std::istringstream in(document);
    try {
        load(scene, in);
        std::cout << "loaded";
    } catch (const pells::Serializable::LoadFail& failure) {
        std::cout << failure.what();  // what came before the fault is loaded
    }
    std::cout << ": " << scene.things.size() << " things, " << scene.sizes.size() << " sizes\n";
}

/// The library asks the application for its settings, here for the log tags that are on.
class Settings : public pells::Prefs {
public:
    std::string getString(const std::string& key) override {
        return key == "logdefault" ? "error load.warn" : "";
    }
};
const pells::Factory<pells::Prefs, Settings> settingsFactory("Prefs");

}  // namespace

int main() {
    Scene scene;
    const boost::intrusive_ptr<Lamp> lamp(new Lamp);
    lamp->title = "Spot & \"friends\"";
    lamp->color = pells::Color{1, 0.5f, 0.25f, 1};
    lamp->cone.degrees = 22.5f;
    scene.things.push_back(lamp);
    scene.things.emplace_back(new Thing);
    scene.things.back()->title = "Table";
    scene.sizes = {0.5f, 3};

    std::stringstream file;
    save(scene, file);
    std::cout << file.str();

    Scene loaded;
    load(loaded, file);
    const Lamp* const copy = dynamic_cast<const Lamp*>(loaded.things.at(0).get());
    std::cout << "first thing: " << (copy ? copy->title : "no lamp") << ", cone "
              << (copy ? copy->cone : Angle()) << '\n';

    // Elements may come in any order, be missing, or be unknown: pells.log names the unknown ones.
    show("<scene><sizes><size>1</size></sizes><fog>thick</fog><things/></scene>");
    show("<scene/>");
    show("<scene><sizes><size>1cm</size></sizes></scene>");
    show("<scene><things><thing class='Thing'/><thing class='Boat'/></things></scene>");
    show("<scene><things><thing class='Thing'></things>");
    pells::SingletonList::freeSingletons();
    return 0;
}

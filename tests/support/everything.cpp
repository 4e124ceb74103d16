#include "support/everything.h"

#include "pells/core/factory.h"

namespace pells_test {

namespace {

const pells::SerializableFactory<CountingStep> stepFactory("CountingStep");
const pells::SerializableFactory<Everything> everythingFactory("Everything");

}  // namespace

using pells::makeField;

boost::intrusive_ptr<pells::Field> CountingStep::getField(const std::string& name) {
    return pells::makeComposite(name, pells::ClassDesc(UndoableStep::getField("super"),
                                                       makeField("label", &CountingStep::label)));
}

boost::intrusive_ptr<pells::Field> Everything::getField(const std::string& name) {
    return pells::makeComposite(
        name, pells::ClassDesc(makeField("f", &Everything::f), makeField("d", &Everything::d),
                               makeField("b", &Everything::b), makeField("i", &Everything::i),
                               makeField("u", &Everything::u), makeField("l", &Everything::l),
                               makeField("s", &Everything::s), makeField("c", &Everything::c),
                               makeField("material", &Everything::material),
                               makeField("history", &Everything::history),
                               makeField("child", &Everything::child),
                               makeField("ints", &Everything::ints),
                               makeField("words", &Everything::words),
                               makeField("matrices", &Everything::matrices),
                               makeField("materials", &Everything::materials),
                               makeField("children", &Everything::children)));
}

}  // namespace pells_test

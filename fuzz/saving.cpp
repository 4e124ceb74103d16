// Objects of any value, saved with full precision and loaded back equal.

#include <fuzzer/FuzzedDataProvider.h>

#include <cmath>

#include "fuzz/support/fuzz.h"
#include "support/everything.h"

using pells_test::Everything;

namespace {

/// A text that loading keeps: without white space at its start, and not empty.
std::string anyText(FuzzedDataProvider& source) {
    return 'x' + source.ConsumeRandomLengthString(40);
}

/// A number that text can hold: infinities and NaN have no form.
template <class T>
T anyNumber(FuzzedDataProvider& source) {
    T value = 0;
    const std::string bytes = source.ConsumeBytesAsString(sizeof value);
    bytes.copy(reinterpret_cast<char*>(&value), sizeof value);
    return std::isfinite(value) ? value : T(0);
}

void fill(Everything& object, FuzzedDataProvider& source, int depth) {
    object.f = anyNumber<float>(source);
    object.d = anyNumber<double>(source);
    object.b = source.ConsumeBool();
    object.i = source.ConsumeIntegral<int>();
    object.u = source.ConsumeIntegral<unsigned>();
    object.l = source.ConsumeIntegral<long long>();
    object.s = anyText(source);
    while (source.ConsumeBool())
        object.ints.push_back(source.ConsumeIntegral<int>());
    while (source.ConsumeBool())
        object.words.push_back(anyText(source));
    while (source.ConsumeBool())
        object.matrices.emplace_back(source.ConsumeIntegralInRange(0, 3), anyNumber<float>(source));
    object.material.setTextureData(anyText(source), anyNumber<float>(source), 0);
    while (source.ConsumeBool()) {
        boost::intrusive_ptr<pells_test::CountingStep> step(new pells_test::CountingStep);
        step->label = anyText(source);
        object.history.addUndoable(step);
    }
    while (depth < 5 && source.ConsumeBool()) {
        object.children.emplace_back(new Everything);
        fill(*object.children.back(), source, depth + 1);
    }
}

bool equal(const Everything& one, const Everything& other) {
    if (one.f != other.f || one.d != other.d || one.b != other.b || one.i != other.i ||
        one.u != other.u || one.l != other.l || one.s != other.s || one.ints != other.ints ||
        one.words != other.words || one.matrices != other.matrices ||
        one.material.textureName() != other.material.textureName() ||
        one.material.textureScale() != other.material.textureScale() ||
        one.history.getUndoStackSize() != other.history.getUndoStackSize() ||
        one.children.size() != other.children.size())
        return false;
    for (std::size_t at = 0; at < one.children.size(); ++at) {
        if (!equal(*one.children[at], *other.children[at]))
            return false;
    }
    return true;
}

}  // namespace

void fuzzOne(const std::string& input) {
    FuzzedDataProvider source(reinterpret_cast<const std::uint8_t*>(input.data()), input.size());
    Everything object;
    fill(object, source, 0);
    Everything loaded;
    pells_test::load(loaded, pells_test::saved(object, 17));
    pells_fuzz::require(equal(object, loaded), "what is saved loads back equal");
}

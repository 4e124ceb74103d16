#pragma once

#include <boost/smart_ptr/intrusive_ptr.hpp>
#include <string>
#include <vector>

#include "pells/core/smart_base.h"
#include "pells/material/material.h"
#include "pells/serial/member_field.h"
#include "pells/undo/undo_redo_sequence.h"
#include "support/documents.h"

namespace pells_test {

/// A step of a history that counts how often it is replayed.
class CountingStep : public pells::UndoableStep {
public:
    bool undo() override { return --count >= 0; }
    bool redo() override { return ++count > 0; }
    bool isValid() const override { return label != "invalid"; }
    boost::intrusive_ptr<pells::Field> getField(const std::string& name) override;

    std::string label;
    int count = 0;
};

/// An object with a member of every kind that can be saved.
class Everything : public pells::Serializable, public pells::smart_base {
public:
    boost::intrusive_ptr<pells::Field> getField(const std::string& name) override;

    float f = 0;
    double d = 0;
    bool b = false;
    int i = 0;
    unsigned u = 0;
    long long l = 0;
    std::string s;
    pells::Color c;
    pells::Material material;
    pells::UndoRedoSequence history;
    boost::intrusive_ptr<Everything> child;
    std::vector<int> ints;
    std::vector<std::string> words;
    std::vector<std::vector<float>> matrices;
    std::vector<pells::Material> materials;
    std::vector<boost::intrusive_ptr<Everything>> children;
};

}  // namespace pells_test

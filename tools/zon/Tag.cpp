#include "Command.h"
#include "Console.h"
#include "JsonReport.h"
#include "PositionRule.h"
#include "TagTable.h"
#include "ZonFile.h"

#include <veldrin/geometry/GeoProperties.h>
#include <veldrin/object/Properties.h>
#include <veldrin/tags/TagData.h>
#include <veldrin/tags/TagResolver.h>
#include <veldrin/tags/TagToken.h>

#include <CLI/CLI.hpp>
#include <fmt/format.h>

#include <algorithm>
#include <map>
#include <memory>
#include <optional>
#include <set>
#include <sstream>

namespace Zon {

namespace {

    using namespace Veldrin;
    using MaskPtr = Nexil::Ptr<Nexil::Array<bool>>;

    /// More words that resolve to nothing are counted only.
    constexpr std::size_t kMostToldOf = 20;

    struct Options {
        std::string input;
        std::optional<std::string> expression;
        std::optional<std::string> rule;
        std::optional<std::string> tag;
        std::string output;
        bool wantsIndices = false;
        bool isStrict = false;
        bool wantsJson = false;
    };

    struct Selection {
        MaskPtr mask;             ///< null when nothing resolved
        Nexil::String component;  ///< "" then
        std::string storedName{}; ///< "" when it was not stored
        std::vector<std::string> warnings{};
    };

    /// What the expression asks an object for: the names and patterns of tags, and the functions.
    struct Words {
        std::set<std::string> tags;
        std::set<std::string> functions;
    };

    Nexil::String toString(std::string_view text)
    {
        return Nexil::String(text);
    }

    Words wordsOf(std::string const& expression)
    {
        using namespace VLD::Utils::Internal;
        std::istringstream stream(expression);
        Words words;
        for (auto token = nextToken(stream); token.kind != TokenKind::End;) {
            auto next = nextToken(stream);
            if (token.kind == TokenKind::Name && next.kind == TokenKind::LeftParen)
                words.functions.insert(token.text);
            else if (token.kind == TokenKind::Name || token.kind == TokenKind::Pattern)
                words.tags.insert(token.text);
            token = std::move(next);
        }
        return words;
    }

    bool resolves(std::string const& word, Object const& object)
    {
        Geometry::TagResolver resolver;
        Nexil::String component;
        (void)resolver.parses(toString(word));
        (void)resolver.resolve(object, component);
        return !component.empty();
    }

    bool isTagName(std::string_view text)
    {
        return !text.empty() &&
               std::ranges::all_of(text, [](char c) { return c != '*' && VLD::Utils::Internal::isNameChar(c); });
    }

    /// Tells of words that resolve to nothing. Looks for names alike only when there is such a word.
    class Missing {
    public:
        explicit Missing(Object const& object) : object_(object) {}

        [[nodiscard]] std::string warningAbout(std::string const& word)
        {
            MaskPtr mask;
            Nexil::String component;
            if (Geometry::getTagData(object_, toString(word), mask, component))
                return component.empty()
                           ? fmt::format("'{}' is a tag of no component", word)
                           : fmt::format("'{}' is a tag of '{}', a component that expressions do not know", word,
                                         printable(component.view()));
            if (!usable_)
                usable_ = usableTags();
            std::string plain = word;
            std::erase(plain, '*');
            auto const nearest = nearestNames(plain, *usable_);
            bool const isPattern = plain.size() < word.size();
            return fmt::format("{}; {}", isPattern ? "no tag matches '" + word + "'" : "'" + word + "' is no tag",
                               nearest.empty() ? "there are no tags"
                                               : fmt::format("nearest: {}", fmt::join(nearest, ", ")));
        }

    private:
        /// Those that an expression can name and that resolve.
        [[nodiscard]] std::vector<Tag> usableTags() const
        {
            auto tags = tagsOf(object_);
            std::erase_if(tags, [&](Tag const& tag) { return !isTagName(tag.name) || !resolves(tag.name, object_); });
            return tags;
        }

        Object const& object_;
        std::optional<std::vector<Tag>> usable_;
    };

    /// One expression or rule, asked of one object after the other.
    class Question {
    public:
        explicit Question(Options const& options)
        {
            if (options.rule) {
                rule_.emplace(*options.rule);
                return;
            }
            if (auto const status = resolver_.parses(toString(*options.expression)); !status)
                failAt("expression", *options.expression, status.byteOffset, status.message.view());
            words_ = wordsOf(*options.expression);
        }

        [[nodiscard]] Selection ask(Object const& object) const
        {
            Selection selection;
            if (rule_) {
                selection.mask = rule_->select(object);
                selection.component = selection.mask ? Geometry::sPointComp : "";
                if (!selection.mask)
                    selection.warnings.emplace_back("there are no positions");
                return selection;
            }
            selection.mask = resolver_.resolve(object, selection.component);
            if (selection.component.empty())
                selection.mask.reset();
            Missing missing(object);
            std::size_t untold = 0;
            for (auto const& word : words_.tags)
                if (!resolves(word, object)) {
                    if (selection.warnings.size() < kMostToldOf)
                        selection.warnings.push_back(missing.warningAbout(word));
                    else
                        ++untold;
                }
            if (untold != 0)
                selection.warnings.push_back(fmt::format("{} more that resolve to nothing", counted(untold, "name")));
            for (auto const& function : words_.functions)
                if (function != "v" && function != "f" && function != "fv" && function != "s")
                    selection.warnings.push_back(
                        fmt::format("'{}' is no function and changes nothing; functions are v, f, fv and s", function));
            return selection;
        }

    private:
        std::optional<PositionRule> rule_;
        Geometry::TagResolver resolver_;
        Words words_;
    };

    /// Puts the selection into the object as a tag; says in the selection what became of it.
    void store(std::string const& tag, Nexil::Ptr<Object>& object, Selection& selection)
    {
        if (!selection.mask)
            return;
        if (!object->hasProperty(selection.component)) {
            selection.warnings.push_back(fmt::format("not stored: there is no {}", selection.component.view()));
            return;
        }
        if (selection.mask->size() != Geometry::getElementCount(*object, selection.component)) {
            selection.warnings.push_back(fmt::format("not stored: {} for a component of {}",
                                                     counted(selection.mask->size(), "flag"),
                                                     Geometry::getElementCount(*object, selection.component)));
            return;
        }
        auto const name = Geometry::createTagName(selection.component, toString(tag));
        MaskPtr existing;
        Nexil::String component;
        if (object->hasProperty(name) && !Geometry::getTagData(*object, name, existing, component))
            throw Failure(fmt::format("--store: '{}' is there and no tag", printable(name.view())));
        auto property = createObject();
        Geometry::populateTag(selection.component, selection.mask, *property);
        Nexil::MutablePtr<Object> own(std::move(object));
        setProperty(*own, name, std::move(property));
        object = std::move(own);
        selection.storedName = std::string(name.view());
    }

    /// Runs of selected elements: first and last of each.
    std::vector<std::pair<std::uint64_t, std::uint64_t>> rangesOf(Nexil::Array<bool> const& mask)
    {
        std::vector<std::pair<std::uint64_t, std::uint64_t>> ranges;
        for (std::uint64_t i = 0; i < mask.size(); ++i) {
            if (!mask[i])
                continue;
            if (!ranges.empty() && ranges.back().second + 1 == i)
                ranges.back().second = i;
            else
                ranges.emplace_back(i, i);
        }
        return ranges;
    }

    void print(std::size_t number, Selection const& selection, bool wantsIndices)
    {
        if (!selection.mask) {
            fmt::print("object {}: nothing resolved\n", number);
            return;
        }
        auto const selected = countSelected(*selection.mask);
        fmt::print("object {}: {}: {} of {} selected, {}\n", number, selection.component.view(), selected,
                   selection.mask->size(), shareText(selected, selection.mask->size()));
        if (wantsIndices) {
            std::string text;
            for (auto const& [first, last] : rangesOf(*selection.mask))
                text += (text.empty() ? "" : ", ") +
                        (first == last ? fmt::format("{}", first) : fmt::format("{}-{}", first, last));
            fmt::print("    {}\n", text.empty() ? "none" : text);
        }
        if (!selection.storedName.empty())
            fmt::print("    stored as {}\n", printable(selection.storedName));
    }

    Json toJson(Selection const& selection, bool wantsIndices)
    {
        auto const orNull = [](std::string_view text) { return text.empty() ? Json() : Json(text); };
        Json json{{"component", orNull(selection.component.view())},
                  {"selected", selection.mask ? countSelected(*selection.mask) : 0},
                  {"elements", selection.mask ? selection.mask->size() : 0}};
        if (wantsIndices)
            json["ranges"] = selection.mask ? Json(rangesOf(*selection.mask)) : Json::array();
        json["stored"] = orNull(selection.storedName);
        json["warnings"] = selection.warnings;
        return json;
    }

    std::vector<Selection> askAll(Options const& options, Objects& objects)
    {
        Question const question(options);
        std::vector<Selection> selections;
        // An object that stands in the list twice stays one object.
        std::map<Object const*, std::size_t> met;
        auto const given = objects;
        for (std::size_t i = 0; i < objects.size(); ++i) {
            auto const [place, isNew] = met.try_emplace(given[i].get(), i);
            if (!isNew) {
                objects[i] = objects[place->second];
                selections.push_back(selections[place->second]);
                continue;
            }
            selections.push_back(objects[i] ? question.ask(*objects[i]) : Selection{nullptr, "", "", {"is null"}});
            if (options.tag)
                store(*options.tag, objects[i], selections.back());
        }
        return selections;
    }

    ExitCode runTag(Options const& options)
    {
        if (options.expression.has_value() == options.rule.has_value())
            throw Failure("an expression or --where, one of the two");
        if (options.tag && !isTagName(*options.tag))
            throw Failure("--store: a tag's name holds letters, digits, '.', ':' and '_'");
        auto objects = readZon(options.input);
        auto const selections = askAll(options, objects);
        bool isComplete = true;
        bool isStored = false;
        for (std::size_t i = 0; i < selections.size(); ++i) {
            for (auto const& warning : selections[i].warnings)
                warn(fmt::format("object {}: {}", i, warning));
            isComplete = isComplete && selections[i].warnings.empty();
            isStored = isStored || !selections[i].storedName.empty();
        }
        bool const isRefused = options.isStrict && !isComplete;
        if (isStored && !isRefused)
            rewriteZon(objects, options.input, options.output);
        Json list = Json::array();
        for (std::size_t i = 0; i < selections.size(); ++i) {
            auto selection = selections[i];
            if (isRefused)
                selection.storedName.clear();
            if (options.wantsJson)
                list.push_back(toJson(selection, options.wantsIndices));
            else
                print(i, selection, options.wantsIndices);
        }
        if (options.wantsJson)
            printReport(Json{{"file", options.input}, {"objects", list}});
        return isRefused || (options.tag && !isStored) ? kFindings : kDone;
    }

} // namespace

void addTag(CLI::App& app, Run& run)
{
    auto const options = std::make_shared<Options>();
    auto* const command = app.add_subcommand("tag", "Selects elements by tags or positions, and stores them as a tag");
    command->add_option("file", options->input, "zon file")->required();
    auto* const expression =
        command->add_option("expression", options->expression,
                            "Tags and how to combine them, as in 'point_a_tag ^ !face_b*'; behind '--' when it "
                            "begins with '-'");
    command->add_option("--where", options->rule, "Points by position instead, as in 'y > 0.1 & x <= 3'")
        ->excludes(expression);
    auto* const tag = command->add_option("--store", options->tag, "Store the selection as a tag of this name");
    command->add_option("-o,--output", options->output, "zon file to write instead of changing the one read")
        ->needs(tag);
    command->add_flag("--indices", options->wantsIndices, "Show which elements are selected");
    command->add_flag("--strict", options->isStrict,
                      "End with exit code 1, and store nothing, when there is any warning about an object");
    command->add_flag("--json", options->wantsJson, "Report as JSON on stdout");
    command->callback([options, &run] { run = [options] { return runTag(*options); }; });
}

} // namespace Zon

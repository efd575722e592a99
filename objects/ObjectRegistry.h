#pragma once

#include <cstddef>
#include <memory>
#include <optional>
#include <string>
#include <unordered_map>
#include <utility>

#include "objects/ObjectAccount.h"
#include "threads/MutexProtected.h"

namespace tarn {

/// Objects of one kind by the identifier that the client chose for them, and by the media object that they
/// stand for. Any thread may call.
///
/// Lookups take the same time however many there are, and give owning copies. What a change displaces is
/// destroyed after the lock is let go, since its destructor may come back here.
///
/// `Object` has `const void* mediaObject() const`: what it stands for, by identity. No two objects of a
/// registry stand for the same one.
template <class Object>
class ObjectRegistry final {
public:
    /// Null when there is none; also when there is no identifier.
    std::shared_ptr<Object> objectWithIdentifier(const std::optional<std::string>& identifier) const {
        if (!identifier)
            return nullptr;
        return maps_.withLocked([&](const Maps& maps) -> std::shared_ptr<Object> {
            auto found = maps.identifierToObjectMap.find(*identifier);
            return found == maps.identifierToObjectMap.end() ? nullptr : found->second.object;
        });
    }

    std::shared_ptr<Object> objectForMediaObject(const void* mediaObject) const {
        return maps_.withLocked([&](const Maps& maps) -> std::shared_ptr<Object> {
            auto found = maps.entryOfMediaObject.find(mediaObject);
            return found == maps.entryOfMediaObject.end() ? nullptr : found->second->second.object;
        });
    }

    std::optional<std::string> identifierForMediaObject(const void* mediaObject) const {
        return maps_.withLocked([&](const Maps& maps) -> std::optional<std::string> {
            auto found = maps.entryOfMediaObject.find(mediaObject);
            if (found == maps.entryOfMediaObject.end())
                return std::nullopt;
            return found->second->first;
        });
    }

    /// Takes the place of the object that had the identifier, if there was one. `charge` is given back when
    /// the object is no longer here.
    void setObject(const std::string& identifier, std::shared_ptr<Object> object,
                   ObjectAccount::Charge charge = {}) {
        Held held{std::move(object), std::move(charge)};
        maps_.withLocked([&](Maps& maps) {
            if (maps.closed)
                return;
            auto& entry = *maps.identifierToObjectMap.try_emplace(identifier).first;
            maps.forgetMediaObjectOf(entry);
            maps.entryOfMediaObject[held.object->mediaObject()] = &entry;
            std::swap(entry.second, held);
        });
    }

    /// An unknown identifier is ignored.
    void removeObject(const std::string& identifier) {
        Held displaced;
        maps_.withLocked([&](Maps& maps) {
            auto entry = maps.identifierToObjectMap.find(identifier);
            if (entry == maps.identifierToObjectMap.end())
                return;
            maps.forgetMediaObjectOf(*entry);
            displaced = std::move(entry->second);
            maps.identifierToObjectMap.erase(entry);
        });
    }

    /// Lets go of everything, and of whatever is set from now on.
    void close() {
        Maps displaced;
        maps_.withLocked([&](Maps& maps) {
            std::swap(maps, displaced);
            maps.closed = true;
        });
    }

private:
    struct Held {
        std::shared_ptr<Object> object;
        ObjectAccount::Charge charge;
    };
    using IdentifierToObjectMap = std::unordered_map<std::string, Held>;
    using Entry = typename IdentifierToObjectMap::value_type;

    struct Maps {
        IdentifierToObjectMap identifierToObjectMap;
        /// Entries stay where they are when the map grows.
        std::unordered_map<const void*, Entry*> entryOfMediaObject;
        bool closed = false;

        void forgetMediaObjectOf(const Entry& entry) {
            if (entry.second.object)
                entryOfMediaObject.erase(entry.second.object->mediaObject());
        }
    };

    MutexProtected<Maps> maps_;
};

} // namespace tarn

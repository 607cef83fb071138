#!/usr/bin/env python3
"""Writes the archives of this folder with Python's plistlib; run it here after a change.

The foreign-*.plist files come from foreign-archiver.m instead.
"""
import datetime
import plistlib
import struct
from plistlib import UID


class Archive:
    """The objects of one keyed archive, in the order in which they are added."""

    def __init__(self):
        self.objects = ["$null"]
        self.classes = {}

    def add(self, thing):
        self.objects.append(thing)
        return UID(len(self.objects) - 1)

    def of_class(self, name, *ancestors):
        if name not in self.classes:
            self.classes[name] = self.add({"$classname": name, "$classes": [name, *ancestors, "NSObject"]})
        return self.classes[name]

    def dictionary(self, entries):
        """`entries` maps texts, or UIDs of keys, to UIDs."""
        return self.add(self.dictionary_content(entries))

    def dictionary_content(self, entries):
        return {"NS.keys": [key if isinstance(key, UID) else self.add(key) for key in entries],
                "NS.objects": list(entries.values()),
                "$class": self.of_class("NSDictionary")}

    def plist(self, root, **changes):
        return {"$archiver": "NSKeyedArchiver", "$version": 100000, "$objects": self.objects,
                "$top": {"root": root}} | changes


def save(name, plist):
    data = plistlib.dumps(plist, fmt=plistlib.FMT_BINARY)
    with open(name + ".plist", "wb") as file:
        file.write(data)
    return data


def with_uids_as_dictionaries(plist):
    """The form that UIDs have in XML, which plistlib doesn't write by itself."""
    if isinstance(plist, UID):
        return {"CF$UID": plist.data}
    if isinstance(plist, list):
        return [with_uids_as_dictionaries(element) for element in plist]
    if isinstance(plist, dict):
        return {key: with_uids_as_dictionaries(value) for key, value in plist.items()}
    return plist


def save_xml(name, plist):
    data = plistlib.dumps(with_uids_as_dictionaries(plist), fmt=plistlib.FMT_XML)
    lines = data.splitlines(keepends=True)
    with open(name + ".plist", "wb") as file:
        file.writelines(line for line in lines if not line.startswith(b"<!DOCTYPE"))


def project(trailer):
    """A document with or without a trailer; nil is a trailer that is archived as the null object."""
    archive = Archive()
    info = {"title": archive.add("Summer")}
    if trailer == "nil":
        info["trailer"] = UID(0)
    elif trailer:
        info["trailer"] = archive.dictionary({"theme": archive.add("Grüße \U0001F3AC")})
    return archive.plist(archive.dictionary({"editInfo": archive.dictionary(info),
                                             "frames": archive.add(1.5),
                                             "made": archive.add(datetime.datetime(2008, 12, 31, 23, 59, 59))}))


def cyclic():
    archive = Archive()
    root = archive.dictionary({})
    archive.objects[root.data] = archive.dictionary_content({"self": root, "name": archive.add("circle")})
    return archive.plist(root)


def shared():
    archive = Archive()
    child = archive.dictionary({"name": archive.add("child")})
    return archive.plist(archive.dictionary({"one": child, "other": child}))


def unknown_class():
    archive = Archive()
    thing = archive.add({"name": archive.add("a thing"), "count": 3,
                         "$class": archive.of_class("RLXThing", "RLXBase")})
    return archive.plist(archive.dictionary({"thing": thing, "plain": archive.add("plain")}))


def string_keys():
    """Keys that are string objects, one of them by bytes, and one that two dictionaries share."""
    archive = Archive()
    text = archive.add({"NS.string": "editInfo", "$class": archive.of_class("NSMutableString", "NSString")})
    data = archive.add({"NS.bytes": "größe".encode(), "$class": archive.of_class("NSString")})
    inner = archive.dictionary({text: archive.add("inner")})
    return archive.plist(archive.dictionary({text: inner, data: archive.add("by bytes")}))


def root_is(thing):
    archive = Archive()
    return archive.plist(archive.add(thing))


def values():
    """Every class that is decoded without help."""
    archive = Archive()

    def boxed(name, **fields):
        return archive.add({key.replace("_", "."): value for key, value in fields.items()} |
                           {"$class": archive.of_class(name)})

    list_of = [archive.add("a"), archive.add(2)]
    things = {"array": boxed("NSArray", NS_objects=list_of), "set": boxed("NSSet", NS_objects=list_of),
              "date": boxed("NSDate", NS_time=0.0), "data": boxed("NSMutableData", NS_data=b"\x00\xff"),
              "true": archive.add(True), "integer": archive.add(-7), "real": archive.add(0.1),
              "boxed": boxed("NSNumber", NS_intval=12), "null": boxed("NSNull"),
              "url": boxed("NSURL", NS_base=UID(0), NS_relative=archive.add("file:///a")),
              "uuid": boxed("NSUUID", NS_uuidbytes=bytes(range(16)))}
    return archive.plist(archive.dictionary(things))


binary = save("with-trailer", project(trailer=True))
save_xml("with-trailer-xml", project(trailer=True))
save("without-trailer", project(trailer=False))
save("nil-trailer", project(trailer="nil"))
save("cyclic", cyclic())
save("shared", shared())
save("unknown-class", unknown_class())
save("string-keys", string_keys())
save("values", values())
save("root-is-text", root_is("no dictionary"))
save("other-archiver", project(trailer=True) | {"$archiver": "SomeArchiver"})
save("other-version", project(trailer=True) | {"$version": 100001})
with open("truncated.plist", "wb") as file:
    file.write(binary[:len(binary) * 2 // 3])
with open("trailing-garbage.plist", "wb") as file:
    file.write(binary + b"garbage")
# An array whose only element is itself.
with open("self-reference.plist", "wb") as file:
    file.write(b"bplist00" + b"\xa1\x00" + b"\x08" + bytes(6) + struct.pack(">BBQQQ", 1, 1, 1, 0, 10))

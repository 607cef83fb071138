// Makes foreign.plist and foreign-xml.plist with the keyed archiver of another library, Debian's
// libgnustep-base-dev:
//
//   gcc $(gnustep-config --objc-flags) foreign-archiver.m -o archiver $(gnustep-config --base-libs)
//   ./archiver foreign.plist && ./archiver foreign-xml.plist xml && sed -i '/<!DOCTYPE/d' foreign-xml.plist
#import <Foundation/Foundation.h>

@interface Unknown : NSObject <NSCoding>
@end
@implementation Unknown
- (void)encodeWithCoder:(NSCoder*)coder {
    [coder encodeObject:@"a thing" forKey:@"name"];
    [coder encodeInt:3 forKey:@"count"];
}
- (id)initWithCoder:(NSCoder*)coder {
    return self;
}
@end

int main(int argc, char** argv) {
    NSAutoreleasePool* pool = [NSAutoreleasePool new];
    NSDictionary* editInfo = [NSMutableDictionary
        dictionaryWithObjectsAndKeys:@"yes", @"trailer", [NSDate dateWithTimeIntervalSinceReferenceDate:86400],
                                     @"date", nil];
    NSArray* list = [NSArray arrayWithObjects:[NSNumber numberWithInt:7], [NSNumber numberWithDouble:1.5],
                                              [NSNumber numberWithBool:YES], [NSNull null], nil];
    NSDictionary* root = [NSDictionary
        dictionaryWithObjectsAndKeys:editInfo, @"editInfo", editInfo, @"sameEditInfo", list, @"list",
                                     [Unknown new], @"unknown", [NSSet setWithObject:@"one"], @"set",
                                     [NSMutableString stringWithString:@"changeable"], @"mutableString",
                                     [NSString stringWithUTF8String:"Gr\303\274\303\237e"], @"text",
                                     [NSMutableData dataWithBytes:"hello" length:5], @"data",
                                     [NSURL URLWithString:@"http://example.org/"], @"url", nil];
    NSMutableData* data = [NSMutableData data];
    NSKeyedArchiver* archiver = [[NSKeyedArchiver alloc] initForWritingWithMutableData:data];
    if (argc > 2)
        [archiver setOutputFormat:NSPropertyListXMLFormat_v1_0];
    [archiver encodeObject:root forKey:@"root"];
    [archiver finishEncoding];
    [data writeToFile:[NSString stringWithUTF8String:argv[1]] atomically:NO];
    [pool release];
    return 0;
}

// The objects of the plug-in. Made by tools/make_reference.py from names.toml and the tables of the plug-in.
declare namespace telix {
    /** The embedded object `application/oipfApplicationManager`. */
    interface ApplicationManager extends HTMLObjectElement {
        /** Stored only: it is never called (quirk 13). */
        onLowMemory: (() => void) | null;
        /** Stored only: it is never called (quirk 14). */
        onApplicationLoaded: ((application: Application) => void) | null;
        /** Stored only: it is never called (quirk 14). */
        onApplicationUnloaded: ((application: Application) => void) | null;
        /** Stored only: it is never called (quirk 14). */
        onApplicationLoadError: ((application: Application) => void) | null;
        /** The application of the page: a new object at every call (quirk 15), `null` if the document has no location. */
        getOwnerApplication(document: Document): Application | null;
    }

    /** An application, from `getOwnerApplication` or `createApplication`. */
    interface Application {
        /** The data of the application, made at the first read. */
        readonly privateData: ApplicationPrivateData | null;
        /** The same object as `privateData`. */
        readonly private: ApplicationPrivateData | null;
        /** Stored only: it is never called (quirk 17) and cannot be cleared (quirk 16). */
        onKeyPress: ((event: KeyboardEvent) => void) | null;
        /** Stored only, as `onKeyPress`. */
        onKeyUp: ((event: KeyboardEvent) => void) | null;
        /** Stored only, as `onKeyPress`. */
        onKeyDown: ((event: KeyboardEvent) => void) | null;
        /** Stored only, as `onKeyPress`. */
        onApplicationShown: ((application: Application) => void) | null;
        /** Stored only, as `onKeyPress`. */
        onApplicationHidden: ((application: Application) => void) | null;
        /** Has the browser start the application at the URL; `null` if it refuses. The second argument has no effect (quirk 18). */
        createApplication(uri: string, createChild: boolean): Application | null;
        /** Has the browser end the application. The object can still be used (quirk 20). */
        destroyApplication(): void;
        /** Has the browser show the application. */
        show(): void;
        /** Has the browser hide the application. */
        hide(): void;
    }

    /** What an application alone may know of the set. */
    interface ApplicationPrivateData {
        /** The keys that the application receives, made at the first read. */
        readonly keyset: Keyset | null;
        /** Free memory, in the unit of the set; the last figure if the set refuses. */
        getFreeMem(): number;
        /** The channel that the set presents; without one see quirk 21. */
        readonly currentChannel: Channel | null;
    }

    /** Groups of keys of the remote control, as a mask of the constants. It is the `keyset` of an application's private data; that of `application/oipfConfiguration` is inert (quirk 22). */
    interface Keyset {
        /** The mask that was set last (quirk 23); before, the mask of the set. */
        readonly value: number;
        /** Asks for groups of keys and returns those that the set grants. The second argument has no effect (quirk 24). */
        setValue(mask: number, otherKeys?: number): number;
        /** The red key. */
        readonly RED: 1;
        /** The green key. */
        readonly GREEN: 2;
        /** The yellow key. */
        readonly YELLOW: 4;
        /** The blue key. */
        readonly BLUE: 8;
        /** Arrow keys, OK and back. */
        readonly NAVIGATION: 16;
        /** Play, pause, stop, rewind, fast forward. */
        readonly VCR: 32;
        /** Page up and page down. */
        readonly SCROLL: 64;
        /** The info key. */
        readonly INFO: 128;
        /** The digits. */
        readonly NUMERIC: 256;
        /** Letters. */
        readonly ALPHA: 512;
    }

    /** The embedded object `video/broadcast`. Do not use it once its element has left the page (quirk 97). */
    interface VideoBroadcast extends Omit<HTMLObjectElement, 'height' | 'width'> {
        /** Width of the video plane in pixels. A write takes effect a turn of the main loop later (quirk 83). */
        width: number;
        /** Height of the video plane in pixels, as `width`. */
        height: number;
        /** Whether the video covers the whole page. */
        readonly fullScreen: boolean;
        /** 0 unrealized, 1 connecting, 2 presenting, 3 stopped. A write asks the set for that state (quirk 84). */
        playState: number;
        /** Called with the new state by `setFullScreen`, and without arguments by the report of the set (quirk 82). */
        onFullScreenChange: ((fullScreen?: boolean) => void) | null;
        /** The channel is presented. */
        onChannelChangeSucceeded: ((channel: Channel) => void) | null;
        /** The channel cannot be presented. The number is the error code of OIPF DAE that the set gives, such as 1 for no signal. */
        onChannelChangeError: ((channel: Channel, error: number) => void) | null;
        /** The play state has changed; the error is `undefined` if there is none. */
        onPlayStateChange: ((state: number, error?: number) => void) | null;
        /** The programmes of the channel have changed. */
        onProgrammesChanged: (() => void) | null;
        /** The parental rating has changed, or cannot be evaluated (quirk 78). Any value but an object clears the handler (quirk 79); without programmes it is not called (quirk 81). */
        onParentalRatingChange: ((contentId: string | null, rating: ParentalRating, drmSystemId: string | null) => void) | null;
        /** Stored only: it is never called (quirk 78). Do not clear it (quirk 80). */
        onParentalRatingError: ((contentId: string | null, rating: ParentalRating, drmSystemId: string | null) => void) | null;
        /** The present programme and those that follow; `null` until the set has some. The collection stays as it was first read (quirk 87). */
        readonly programmes: ProgrammeCollection | null;
        /** The channel that the object presents. */
        readonly currentChannel: Channel | null;
        /** The way to the channel list. */
        getChannelConfig(): ChannelConfig | null;
        /** Tunes to a service by its DVB ids. The plug-in has it beyond the standards. */
        setChannelByTriplet(onid: number, tsid: number | null, sid: number): void;
        setChannelByTriplet(onid: number, sid: number): void;
        /** Presents the current channel of the set. Returns nothing (quirk 85). */
        bindToCurrentChannel(): void;
        /** Tunes to a channel; `null` is none. The outcome is an event. */
        setChannel(channel: Channel | null, trickPlay?: boolean): void;
        /** Tunes to the channel before in the list. `currentChannel` changes in place (quirk 86). */
        prevChannel(): void;
        /** Tunes to the channel after in the list, as `prevChannel`. */
        nextChannel(): void;
        /** Covers the whole page with the video, or returns it to its rectangle (quirk 62). */
        setFullScreen(fullScreen: boolean): void;
        /** Releases tuner and video plane (quirk 88). */
        release(): void;
        /** Always fails (quirk 90). */
        addCarouselListener(url: string, listener: object, name: string): never;
        /** Subscribes to a stream event: the listener gets the `StreamEvent`s of the element (quirk 94). The URL is that of the description of the event (quirks 92 and 93). The form with four strings subscribes without a description and belongs to the plug-in (quirk 91). */
        addStreamEventListener(url: string, name: string, listener: (event: StreamEvent) => void): void;
        addStreamEventListener(url: string, name: string, id: string, componentTag: string): void;
        /** Ends the last subscription of that URL (quirk 95). */
        removeStreamEventListener(url: string, name: string, listener: (event: StreamEvent) => void): void;
        /** Presents a component instead of the one of its type that is presented. */
        selectComponent(component: AVComponent): void;
        /** Stops presenting a component (quirk 89). */
        unselectComponent(component: AVComponent): void;
        /** A channel that need not be in the channel list (quirk 96). */
        createChannelObject(idType: number, onid: number, tsid: number, sid: number): Channel | null;
        createChannelObject(idType: number, onid: number, sid: number): Channel | null;
        createChannelObject(idType: number, dsd: string, sid: number): Channel | null;
        /** Type of video components. */
        readonly COMPONENT_TYPE_VIDEO: 0;
        /** Type of audio components. */
        readonly COMPONENT_TYPE_AUDIO: 1;
        /** Type of subtitle components. */
        readonly COMPONENT_TYPE_SUBTITLE: 2;
        /** The components of a type, as at the first successful call (quirk 36). */
        getComponents(type: number): AVComponentList | null;
        /** The components of a type that are presented now. */
        getCurrentActiveComponents(type: number): AVComponentList | null;
        /** Stops the presentation. */
        stop(): void;
    }

    /** The channels of the set, from `getChannelConfig`. */
    interface ChannelConfig {
        /** All channels, as at the first successful read (quirk 30). */
        readonly channelList: ChannelList | null;
    }

    /** A list of channels in the order of the set. */
    interface ChannelList {
        /** The channel of the list with these DVB ids; `null` leaves the transport stream open. */
        getChannelByTriplet(onid: number, tsid: number | null, sid: number): Channel | null;
        /** The channel at an index from 0. */
        item(index: number): Channel | null;
        /** The channel of the list with this `ccid`. */
        getChannel(ccid: string): Channel | null;
        /** Number of channels. */
        readonly length: number;
        readonly [index: number]: Channel | undefined;
    }

    /** A channel. What has been read of it stays, but for `channelType` (quirk 29). */
    interface Channel {
        /** DVB original network id; 0 if unknown. */
        readonly onid: number;
        /** DVB transport stream id; 0 if unknown. */
        readonly tsid: number;
        /** DVB service id; 0 if unknown. */
        readonly sid: number;
        /** One of the constants; 3 while it is not known (quirk 27). */
        readonly channelType: number;
        /** Id of the channel, for `getChannel`, as long as the set runs (quirk 28). */
        readonly ccid: string | null;
        /** Name of the channel. */
        readonly name: string | null;
        /** Delivery system descriptor. */
        readonly dsd: string | null;
        /** A television channel. */
        readonly TYPE_TV: 0;
        /** A radio channel. */
        readonly TYPE_RADIO: 1;
        /** A channel of another type, such as data. */
        readonly TYPE_OTHER: 2;
    }

    /** Programmes of a channel, the present one first. */
    interface ProgrammeCollection {
        /** The programme at an index from 0. */
        item(index: number): Programme | null;
        /** Number of programmes. */
        readonly length: number;
        readonly [index: number]: Programme | undefined;
    }

    /** A programme. Its values are those of the set at the moment of the read; a write asks the set to change them (quirk 32). */
    interface Programme {
        /** Title, at most 255 bytes (quirk 31). */
        name: string | null;
        /** Start in seconds since 1970 (UTC). */
        startTime: number;
        /** Duration in seconds. */
        duration: number;
        /** Description, at most 255 bytes (quirk 31). */
        description: string | null;
        /** The `ccid` of the channel. */
        channelID: string | null;
        /** The parental ratings, as at the first successful read (quirk 33). */
        readonly parentalRating: ParentalRatingCollection | null;
    }

    /** The embedded A/V control object. */
    interface AVControl extends Omit<HTMLObjectElement, 'data' | 'height' | 'width'> {
        /** URL of the media. A write stops playback; it reads back absolute and encoded (quirk 63). */
        data: string | null;
        /** Position in milliseconds (quirks 56 and 57). */
        readonly playPosition: number;
        /** Duration of the media in milliseconds; 0 if unknown. */
        readonly playTime: number;
        /** 0 stopped, 1 playing, 2 paused, 3 connecting, 4 buffering, 5 finished, 6 error, 7 next clip of a playlist (quirk 52). */
        readonly playState: number;
        /** Reason of state 6: 0 format not supported, 1 connection, 2 unidentified, 5 content not available; `undefined` before the first error. */
        readonly error: number | undefined;
        /** Speed of playback; 0 is paused (quirks 54 and 55). */
        readonly speed: number;
        /** Whether the video covers the whole page. */
        readonly fullScreen: boolean;
        /** The play state has changed; called without arguments (quirk 48). */
        onPlayStateChange: (() => void) | null;
        /** Number of clips of the playlist, 0 without a playlist (quirk 70). */
        readonly nrTracks: number;
        /** Index from 1 of the clip of the playlist that plays, 0 without a playlist; a write plays another clip. */
        currentTrackIndex: number;
        /** Stored only: it has no effect (quirk 60). */
        persist: boolean;
        /** Width of the element in pixels (quirk 61). */
        width: number;
        /** Height of the element in pixels, as `width`. */
        height: number;
        /** Called by `setFullScreen` with the new state. Do not clear it with `null` (quirk 50). */
        onFullScreenChange: ((fullScreen: boolean) => void) | null;
        /** The speed has changed; called without arguments (quirk 48). */
        onPlaySpeedChanged: (() => void) | null;
        /** Called after `seek` and at the end of a clip, without arguments (quirk 48). */
        onPlayPositionChanged: (() => void) | null;
        /** Plays, pauses (0) or resumes (1); whether playback was begun or paused (quirks 53, 54 and 55). */
        play(speed: number): boolean;
        /** Goes to a position; false if the set refuses (quirk 58). */
        seek(milliseconds: number): boolean;
        /** Stops playback. */
        stop(): void;
        /** Plays the clip after in the playlist. */
        next(): void;
        /** Plays the clip before in the playlist. */
        previous(): void;
        /** The components of a type, as at the first successful call (quirk 36). */
        getComponents(type: number): AVComponentList | null;
        /** The components of a type that are presented now. */
        getCurrentActiveComponents(type: number): AVComponentList | null;
        /** Presents a component instead of the one of its type that is presented. */
        selectComponent(component: AVComponent): void;
        /** Stops presenting a component. */
        unselectComponent(component: AVComponent): void;
        /** Sets the volume, 0 to 100; false for other numbers or if the set refuses. */
        setVolume(volume: number): boolean;
        /** Covers the whole page with the video, or returns it to its rectangle (quirk 62). */
        setFullScreen(fullScreen: boolean): void;
        /** Type of video components. */
        readonly COMPONENT_TYPE_VIDEO: 0;
        /** Type of audio components. */
        readonly COMPONENT_TYPE_AUDIO: 1;
        /** Type of subtitle components. */
        readonly COMPONENT_TYPE_SUBTITLE: 2;
        /** Plays a URL after the present media; `null` empties the queue (quirk 59). */
        queue(url: string | null): boolean;
        /** Rights are missing (state 0) or invalid (state 1). The element needs an `id` (quirk 75). */
        onDRMRightsError: ((state: number, contentId: string | null, drmSystemId: string | null, rightsIssuerUrl: string | null) => void) | null;
    }

    /** Components of one type, of media or of a channel. */
    interface AVComponentList {
        /** The component at an index from 0. */
        item(index: number): AVComponent | null;
        /** Number of components. */
        readonly length: number;
        readonly [index: number]: AVComponent | undefined;
    }

    /** A video, audio or subtitle stream. What has been read of it stays (quirk 34). */
    interface AVComponent {
        /** One of the constants `COMPONENT_TYPE_…` of the object that it comes from. */
        readonly type: number;
        /** Name of the coding; empty if unknown (quirk 35). */
        readonly encoding: string;
        /** Whether the stream is encrypted. */
        readonly encrypted: boolean;
        /** Of video: width by height, with two decimals; 0 if unknown. */
        readonly aspectRatio: number;
        /** Of audio and subtitles: ISO code of the language; empty if unknown (quirk 35). */
        readonly language: string;
        /** Of audio: whether it has an audio description. */
        readonly audioDescription: boolean;
        /** Of audio: number of channels; 0 if unknown. */
        readonly audioChannels: number;
        /** Of subtitles: whether they are for viewers who are hard of hearing. */
        readonly hearingImpaired: boolean;
    }

    /** The embedded object `application/oipfConfiguration`. */
    interface OipfConfiguration extends HTMLObjectElement {
        /** Inert (quirk 22): use the key set of the application. */
        readonly keyset: Keyset | null;
        /** The settings, made at the first read. */
        readonly configuration: Configuration | null;
    }

    /** Settings of the viewer. What has been read stays (quirk 25). */
    interface Configuration {
        /** Preferred language of audio, an ISO code of three letters. */
        readonly preferredAudioLanguage: string | null;
        /** Preferred language of subtitles, an ISO code of three letters. */
        readonly preferredSubtitleLanguage: string | null;
        /** Country, an ISO code of three letters. */
        readonly countryId: string | null;
    }

    /** The embedded object `application/oipfCapabilities`. */
    interface Capabilities extends HTMLObjectElement {
        /** The capabilities of the set as an XML document (quirk 26). */
        readonly xmlCapabilities: Document | null;
        /** Whether the set supports a profile. */
        hasCapability(profile: string): boolean;
        /** Number of further SD videos that the set could decode now. */
        readonly extraSDVideoDecodes: number;
        /** Number of further HD videos that the set could decode now. */
        readonly extraHDVideoDecodes: number;
    }

    /** The embedded object `application/oipfParentalControlManager`. */
    interface ParentalControlManager extends HTMLObjectElement {
        /** The rating schemes, as at the first successful read (quirk 42). */
        readonly parentalRatingSchemes: ParentalRatingSchemeCollection | null;
    }

    /** The rating schemes of the set. */
    interface ParentalRatingSchemeCollection {
        /** Number of schemes. */
        readonly length: number;
        /** The scheme at an index from 0. */
        item(index: number): ParentalRatingScheme | null;
        /** The first scheme of exactly this name. */
        getParentalRatingScheme(name: string): ParentalRatingScheme | null;
        readonly [index: number]: ParentalRatingScheme | undefined;
    }

    /** A rating scheme: names of ratings in ascending order. */
    interface ParentalRatingScheme {
        /** Name of the scheme, such as `dvb-si`. */
        readonly name: string | null;
        /** Number of ratings; 0 for `dvb-si` (quirk 40). */
        readonly length: number;
        /** The limit of the viewer: a new object at every read (quirk 39) with the limit as `value` (quirk 38). */
        readonly threshold: ParentalRating | null;
        /** Index of a rating; -1 if there is none of this name. */
        indexOf(name: string): number;
        /** Name of the rating at an index from 0. */
        item(index: number): string | null;
        /** URL of the icon of a rating (quirk 41). */
        iconUri(index: number): string | null;
    }

    /** The parental ratings of a programme. */
    interface ParentalRatingCollection {
        /** The rating at an index from 0. */
        item(index: number): ParentalRating | null;
        /** Number of ratings. */
        readonly length: number;
        readonly [index: number]: ParentalRating | undefined;
    }

    /** A parental rating, or a limit (quirk 38). */
    interface ParentalRating {
        /** Name of the rating. */
        readonly name: string | null;
        /** Name of its scheme. */
        readonly scheme: string | null;
        /** The rating as a number of the scheme. */
        readonly value: number;
        /** Bits for kinds of content, which the set defines. */
        readonly labels: number;
        /** Region of the rating, an ISO code (quirk 37). */
        readonly region: string | undefined;
    }

    /** The embedded object `application/oipfDrmAgent`. */
    interface DRMAgent extends HTMLObjectElement {
        /** The result of a message; 0 is success. */
        onDRMMessageResult: ((id: string | null, message: string | null, result: number) => void) | null;
        /** Sends a message to a DRM system and returns its id (quirk 45). The outcome comes as a result. */
        sendDRMMessage(type: string, message: string, drmSystemId: string): string | null;
    }

    /** The event of a subscription to a stream event. */
    interface StreamEvent extends Event {
        /** Name of the event. */
        readonly name: string;
        /** Payload as hexadecimal digits. */
        readonly data: string;
        /** Payload as a string; without a payload the property is missing. */
        readonly text?: string;
        /** `trigger` or `error`. */
        readonly status: string;
    }
}

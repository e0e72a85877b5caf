package tarnwick;

import hl.Bytes;
import hl.NativeArray;

/**
	The primitives of `tarnwick.hdll`, one declaration per primitive, typed
	exactly as the library describes them. The VM checks each declaration
	against the library when it loads the bytecode and stops with
	"Invalid signature for function tarnwick@..." on any difference, so the
	types here must not change (the signature of each is given beside it).

	Strings are NUL-terminated UTF-8 `hl.Bytes`; strings coming back are VM
	copies that include their terminating zero, or null. Closures may be null:
	the request is still made and nothing is called back.

	These are raw natives; `tarnwick.Eos` is the typed API over them.
**/
@:keep
class Natives {
	/**
		Starts the SDK and the platform, then the sign-in. Returns true when the
		Auth login was started. `onLogin` later receives (result code, Epic
		account id or null, display name, access token or null).
		Signature `POBBBBBBBBBBiib_PiBBB_v_b`.
	**/
	@:hlNative("tarnwick", "init")
	public static function init(config:InitConfig, onLogin:(Int, Bytes, Bytes, Bytes) -> Void):Bool {
		return false;
	}

	/**
		Subscribes to received lobby invitations, replacing any earlier
		subscription: `onInvite` receives (invite id, sender's display name).
		Signature `PPBB_v_v`.
	**/
	@:hlNative("tarnwick", "notify_invite_received")
	public static function notify_invite_received(onInvite:(Bytes, Bytes) -> Void):Void {}

	/**
		Subscribes to invitations accepted in the overlay: `onAccepted`
		receives (lobby id, connection key). Signature `PPBB_v_v`.
	**/
	@:hlNative("tarnwick", "notify_invite_accepted")
	public static function notify_invite_accepted(onAccepted:(Bytes, Bytes) -> Void):Void {}

	/** Ticks the platform; every callback runs inside this call. Signature `P_v`. **/
	@:hlNative("tarnwick", "update")
	public static function update():Void {}

	/** Unlocks one achievement by id. Signature `PB_v`. **/
	@:hlNative("tarnwick", "set_achievement")
	public static function set_achievement(achievementId:Bytes):Void {}

	/**
		Asks which of the catalogue items the player owns: `onOwned` receives
		the owned ids, or null when the query failed. Signature `PAPA_v_v`.
	**/
	@:hlNative("tarnwick", "query_ownership")
	public static function query_ownership(itemIds:NativeArray<Bytes>, onOwned:NativeArray<Bytes> -> Void):Void {}

	/**
		Lists the player's achievements: `onAchievements` receives an array of
		dynamic objects `{id, unlock}` (a slot is null where a copy failed).
		Signature `PPA_v_v`.
	**/
	@:hlNative("tarnwick", "query_achievements")
	public static function query_achievements(onAchievements:NativeArray<Dynamic> -> Void):Void {}

	/** Opens the friends view of the overlay. Signature `P_v`. **/
	@:hlNative("tarnwick", "show_friends")
	public static function show_friends():Void {}

	/**
		Lists the friends: `onFriends` receives an array of dynamic objects
		`{epicId, name, online, productId}` (fields may be absent, a slot is null
		for an invalid friend id), or null when the query failed.
		Signature `PPA_v_v`.
	**/
	@:hlNative("tarnwick", "query_friends")
	public static function query_friends(onFriends:NativeArray<Dynamic> -> Void):Void {}

	/** Invites a product user id to a lobby. Signature `PBB_v`. **/
	@:hlNative("tarnwick", "send_invite")
	public static function send_invite(targetUserId:Bytes, lobbyId:Bytes):Void {}

	/** Turns down a received invitation. Signature `PB_v`. **/
	@:hlNative("tarnwick", "reject_invite")
	public static function reject_invite(inviteId:Bytes):Void {}

	/**
		Accepts an invitation by joining its lobby: `onJoined` receives
		(lobby id, connection key). Signature `PBPBB_v_v`.
	**/
	@:hlNative("tarnwick", "accept_invite")
	public static function accept_invite(inviteId:Bytes, onJoined:(Bytes, Bytes) -> Void):Void {}

	/**
		Creates an invite-only lobby publishing `connectionKey` (at most 255
		bytes are kept): `onCreated` receives the lobby id, or null.
		Signature `PBPB_v_v`.
	**/
	@:hlNative("tarnwick", "create_lobby")
	public static function create_lobby(connectionKey:Bytes, onCreated:Bytes -> Void):Void {}

	/** Leaves a lobby: `onLeft` receives the result code. Signature `PBPi_v_v`. **/
	@:hlNative("tarnwick", "leave_lobby")
	public static function leave_lobby(lobbyId:Bytes, onLeft:Int -> Void):Void {}

	/** Destroys a lobby: `onDestroyed` receives the result code. Signature `PBPi_v_v`. **/
	@:hlNative("tarnwick", "destroy_lobby")
	public static function destroy_lobby(lobbyId:Bytes, onDestroyed:Int -> Void):Void {}

	/** Releases the platform; no other primitive may be called afterwards. Signature `P_v`. **/
	@:hlNative("tarnwick", "exit")
	public static function exit():Void {}

	/** Opens the store checkout for one offer id. Signature `PB_v`. **/
	@:hlNative("tarnwick", "store_checkout")
	public static function store_checkout(offerId:Bytes):Void {}
}
